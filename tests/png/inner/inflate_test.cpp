// Decompressing: blocks of every kind, where it stops, what it refuses, and the memory it takes.
#include <gtest/gtest.h>

#include "tests/png/inner/inflating.h"

namespace pelm::test {

namespace {

// Every kind of block and of element, more than a window's worth of bytes.
struct Mixed {
    Bytes stream, bytes;
    std::vector<size_t> block_ends; // bytes produced by then
};

Mixed mixed_stream() {
    Mixed mixed;
    Deflate deflate;
    const auto add = [&](const Bytes &bytes) {
        mixed.bytes.insert(mixed.bytes.end(), bytes.begin(), bytes.end());
        mixed.block_ends.push_back(mixed.bytes.size());
    };
    const Bytes first = noise_bytes(300, 1);
    deflate.stored(first, Last::no);
    add(first);
    deflate.stored({}, Last::no);
    add({});
    const auto compressed = [&](const Tokens &tokens, bool dynamic, Last last) {
        dynamic ? deflate.dynamic(tokens, last) : deflate.fixed(tokens, last);
        add(expand(tokens, mixed.bytes));
    };
    compressed({literal('a'), match(258, 1), literal('b'), match(3, 300), match(100, 7)}, false, Last::no);
    compressed({}, false, Last::no);
    Tokens tokens = literals(noise_bytes(2000, 2));
    for (uint32_t i = 0; i < 150; ++i)
        tokens.push_back(match(3 + i * 17 % 256, 1 + i * 97 % 2000));
    compressed(tokens, true, Last::no);
    compressed({}, true, Last::no);
    const Bytes many = noise_bytes(40000, 3);
    deflate.stored(many, Last::no);
    add(many);
    compressed({match(258, 32768), match(258, 32767), match(10, 20000)}, true, Last::no);
    compressed({match(5, 1), literal(0)}, false, Last::yes);
    mixed.stream = zlib_stream(deflate);
    return mixed;
}

} // namespace

TEST(Inflate, a_stored_block_is_copied_as_it_is) {
    for (const size_t size : {0u, 1u, 2u, 100u, 32767u, 32768u, 32769u, 65535u}) {
        const Bytes data = noise_bytes(size, 1);
        Deflate deflate;
        deflate.stored(data, Last::yes);
        expect_inflates_to(zlib_stream(deflate), data);
        expect_inflates_to(zlib_stream(deflate), data, {.piece = 5});
    }
}

TEST(Inflate, an_empty_stored_block_writes_nothing_and_the_next_block_follows) {
    Deflate deflate;
    deflate.stored({}, Last::no, 0, 0xFFFF);
    deflate.fixed({literal('x')}, Last::no);
    deflate.stored({}, Last::no);
    deflate.stored({}, Last::no);
    deflate.stored({'y'}, Last::yes);
    expect_inflates_to(zlib_stream(deflate), {'x', 'y'});
}

TEST(Inflate, stored_blocks_begin_at_the_next_byte_wherever_the_block_before_ends) {
    for (size_t count = 0; count < 9; ++count) {
        Deflate deflate;
        deflate.fixed(literals(Bytes(count, 200)), Last::no); // nine bits each
        deflate.stored({1, 2, 3}, Last::yes);
        expect_inflates_to(zlib_stream(deflate), joined({Bytes(count, 200), {1, 2, 3}}));
        expect_inflates_to(zlib_stream(deflate), joined({Bytes(count, 200), {1, 2, 3}}), {.piece = 1});
    }
}

TEST(Inflate, the_bits_that_are_skipped_before_a_stored_block_may_be_set) {
    Deflate deflate;
    deflate.bits.put(1, 3);
    deflate.bits.put(31, 5);
    deflate.bits.put(2, 16);
    deflate.bits.put(0xFFFD, 16);
    deflate.bits.put_bytes({7, 8});
    expect_inflates_to(zlib_stream(deflate), {7, 8});
}

TEST(Inflate, every_literal_in_fixed_and_dynamic_blocks) {
    Bytes all(256);
    for (size_t i = 0; i < all.size(); ++i)
        all[i] = static_cast<uint8_t>(i);
    Deflate fixed, dynamic;
    fixed.fixed(literals(all), Last::yes);
    dynamic.dynamic(literals(all), Last::yes);
    expect_inflates_to(zlib_stream(fixed), all);
    expect_inflates_to(zlib_stream(dynamic), all);
}

TEST(Inflate, codes_of_15_bits_are_read) {
    // Literals 0 to 14 and the end have codes of 1, 2, ... 15, 15 bits.
    DynamicCodes codes;
    codes.literal_lengths = Bytes(257);
    for (uint8_t i = 0; i < 15; ++i)
        codes.literal_lengths[i] = static_cast<uint8_t>(i + 1);
    codes.literal_lengths[256] = 15;
    codes.distance_lengths = {1};
    Bytes data;
    for (uint8_t i = 0; i < 200; ++i)
        data.push_back(static_cast<uint8_t>(i * 7 % 15));
    Deflate deflate;
    deflate.dynamic(codes, literals(data), Last::yes);
    for (const ptrdiff_t piece : {0, 1, 3})
        expect_inflates_to(zlib_stream(deflate), data, {.piece = piece});
}

TEST(Inflate, a_mix_of_all_blocks) {
    const Mixed mixed = mixed_stream();
    for (const ptrdiff_t piece : {0, 1, 2, 3, 7, 12, 1000})
        expect_inflates_to(mixed.stream, mixed.bytes, {.piece = piece});
}

TEST(Inflate, rows_that_stop_after_every_few_bytes_get_the_same_bytes) {
    const Mixed mixed = mixed_stream();
    for (const uint32_t stop_after : {1u, 2u, 3u, 5u, 100u, 257u, 258u, 259u, 32767u, 32768u, 32769u, 40000u})
        for (const ptrdiff_t piece : {0, 1, 5})
            for (const bool pause : {false, true}) {
                const Options options = {.piece = piece, .stop_after = stop_after, .pause_at_blocks = pause};
                const Outcome got = inflated(mixed.stream, options);
                EXPECT_EQ(got.stop, Stop::finished) << "every " << stop_after;
                EXPECT_TRUE(got.bytes == mixed.bytes) << "every " << stop_after << " piece " << piece;
                EXPECT_EQ(got.stops, mixed.bytes.size() / stop_after);
                EXPECT_EQ(got.pauses.size(), pause ? mixed.block_ends.size() - 1 : 0);
            }
}

TEST(Inflate, pauses_at_the_end_of_every_block_but_the_last_with_its_bytes_delivered) {
    const Mixed mixed = mixed_stream();
    for (const ptrdiff_t piece : {0, 1, 5}) {
        const Outcome got = inflated(mixed.stream, {.piece = piece, .pause_at_blocks = true});
        EXPECT_EQ(got.stop, Stop::finished);
        EXPECT_TRUE(got.bytes == mixed.bytes);
        EXPECT_EQ(got.pauses, std::vector<size_t>(mixed.block_ends.begin(), mixed.block_ends.end() - 1));
    }
}

TEST(Inflate, an_ended_stream_stays_ended) {
    Deflate deflate;
    deflate.stored({1, 2}, Last::yes);
    Inflater good(zlib_stream(deflate));
    EXPECT_EQ(good.call(), Stop::finished);
    EXPECT_EQ(good.call(), Stop::finished);
    EXPECT_EQ(good.rows.bytes.size(), 2u);

    Deflate bad;
    bad.fixed({literal(1)}, Last::no);
    bad.block_header(3, Last::no);
    Inflater wrong(zlib_stream(bad));
    EXPECT_EQ(wrong.call(), Stop::bad_stream);
    EXPECT_EQ(wrong.call(), Stop::bad_stream);
    EXPECT_EQ(wrong.rows.bytes.size(), 1u);
}

TEST(Inflate, a_restart_begins_the_stream_anew_and_forgets_the_window) {
    Deflate deflate; // a match before the beginning shows what the window holds
    deflate.fixed({match(3, 5), literal('z')}, Last::yes);
    Bytes stream = zlib_stream(deflate);
    Inflater inflater(stream);
    ASSERT_EQ(inflater.call(), Stop::finished);
    std::memset(inflater.state.window.bytes, 0x55, window_allocation);
    restart(inflater.state);
    inflater.rows.bytes.clear();
    GuardedBuffer memory;
    uint8_t *const copy = memory.take(stream.size(), Edge::end);
    std::copy(stream.begin(), stream.end(), copy);
    MemoryInput input = {copy, copy + stream.size()};
    EXPECT_EQ(inflate(inflater.state, input, inflater.rows, inflater.pool, false), Stop::finished);
    EXPECT_EQ(inflater.rows.bytes, (Bytes{0, 0, 0, 'z'}));
}

TEST(Inflate, bytes_before_a_failure_are_delivered_first) {
    for (const uint32_t stop_after : {0u, 1u, 3u}) {
        Deflate deflate;
        deflate.fixed(literals(text_bytes("before")), Last::no);
        deflate.block_header(3, Last::yes);
        const Outcome got = inflated(zlib_stream(deflate), {.stop_after = stop_after});
        EXPECT_EQ(got.stop, Stop::bad_stream);
        EXPECT_EQ(got.bytes, text_bytes("before"));
    }
}

TEST(Inflate, the_zlib_header_decides_about_method_window_and_dictionary_only) {
    Deflate deflate;
    deflate.stored({42}, Last::yes);
    for (uint32_t cmf = 0; cmf < 256; ++cmf)
        for (uint32_t flg = 0; flg < 256; ++flg) {
            const bool right = (cmf & 15) == 8 && cmf >> 4 <= 7 && (flg & 0x20) == 0;
            const Bytes stream =
                zlib_stream(deflate.bytes(), {42}, static_cast<uint8_t>(cmf), static_cast<uint8_t>(flg));
            const Outcome got = inflated(stream);
            ASSERT_EQ(got.stop, right ? Stop::finished : Stop::bad_stream) << "header " << cmf << ' ' << flg;
            ASSERT_EQ(got.bytes, right ? Bytes{42} : Bytes{});
        }
}

TEST(Inflate, the_checksum_is_neither_compared_nor_missed) {
    Deflate deflate;
    deflate.fixed(literals(text_bytes("no checksum")), Last::yes);
    expect_inflates_to(joined({{0x78, 0x9C}, deflate.bytes()}), text_bytes("no checksum"));
    expect_inflates_to(joined({{0x78, 0x9C}, deflate.bytes(), {1, 2, 3, 4}}), text_bytes("no checksum"));
    expect_inflates_to(joined({{0x78, 0x9C}, deflate.bytes()}), text_bytes("no checksum"), {.piece = 1});
}

TEST(Inflate, what_follows_the_last_block_is_not_looked_at) {
    Deflate deflate;
    deflate.fixed(literals(text_bytes("the end")), Last::yes);
    Bytes stream = zlib_stream(deflate);
    stream.insert(stream.end(), 1000, 0xFF);
    expect_inflates_to(stream, text_bytes("the end"));
}

TEST(Inflate, block_type_3_is_bad) {
    for (const Last last : {Last::no, Last::yes}) {
        Deflate deflate;
        deflate.block_header(3, last);
        expect_fails(deflate, Stop::bad_stream);
    }
}

TEST(Inflate, a_stored_length_must_match_its_complement_in_every_bit) {
    for (uint32_t bit = 0; bit < 16; ++bit) {
        Deflate deflate;
        deflate.stored({1, 2, 3}, Last::yes, 3, (~3u ^ 1u << bit) & 0xFFFF);
        expect_fails(deflate, Stop::bad_stream);
    }
}

TEST(Inflate, length_symbols_286_and_287_are_bad_codes) {
    for (const uint32_t value : {286u, 287u}) {
        Deflate fixed;
        fixed.fixed({literal('a'), symbol(value)}, Last::yes);
        expect_fails(fixed, Stop::bad_code, {'a'});
        Deflate dynamic;
        dynamic.dynamic({literal('a'), symbol(value)}, Last::yes);
        expect_fails(dynamic, Stop::bad_code, {'a'});
    }
}

TEST(Inflate, distance_symbols_30_and_31_of_fixed_blocks_are_bad_codes) {
    for (const uint32_t value : {30u, 31u}) {
        Deflate deflate;
        deflate.fixed({literal('a'), match_of_symbols(257, 0, value, 0)}, Last::yes);
        expect_fails(deflate, Stop::bad_code, {'a'});
    }
}

TEST(Inflate, a_code_that_no_symbol_has_is_bad) {
    DynamicCodes codes; // 'a' 0, end 10; 11 is nobody's
    codes.literal_lengths = Bytes(257);
    codes.literal_lengths['a'] = 1;
    codes.literal_lengths[256] = 2;
    codes.distance_lengths = {1};
    Deflate literal_code;
    literal_code.dynamic(codes, {literal('a')}, Last::yes, EndOfBlock::left_out);
    literal_code.bits.put_code(3, 2);
    expect_fails(literal_code, Stop::bad_code, {'a'});

    codes.literal_lengths.resize(258); // 'a' 0, end 10, length 3: 11; distance 1: 0
    codes.literal_lengths[257] = 2;
    Deflate distance_code;
    distance_code.dynamic(codes, {literal('a'), symbol(257)}, Last::yes, EndOfBlock::left_out);
    distance_code.bits.put_code(1, 1);
    expect_fails(distance_code, Stop::bad_code, {'a'});

    DynamicCodes length_code; // only symbol 0 of the code-length code, as 0; 1 is nobody's
    length_code.literal_lengths = Bytes(257);
    length_code.distance_lengths = {0};
    length_code.code_length_lengths = Bytes(19);
    (*length_code.code_length_lengths)[0] = 1;
    length_code.sequence = {{{0, 0}}};
    Deflate header;
    header.block_header(2, Last::yes);
    header.dynamic_header(length_code);
    header.bits.put(1, 1);
    expect_fails(header, Stop::bad_code);
}

TEST(Inflate, memory_for_trees_and_tables_is_taken_once_and_with_the_first_block_that_needs_it) {
    Deflate stored, fixed, dynamic;
    stored.stored({1}, Last::yes);
    Inflater of_stored(zlib_stream(stored));
    EXPECT_EQ(of_stored.call(), Stop::finished);
    EXPECT_EQ(TestHost::get().allocations, std::vector<uint32_t>({window_allocation}));

    for (int i = 0; i < 3; ++i)
        fixed.fixed({literal(1)}, i == 2 ? Last::yes : Last::no);
    Inflater of_fixed(zlib_stream(fixed));
    EXPECT_EQ(of_fixed.call(), Stop::finished);
    EXPECT_EQ(TestHost::get().allocations, std::vector<uint32_t>({window_allocation, sizeof(BlockCodes)}));

    for (int i = 0; i < 3; ++i)
        dynamic.dynamic({literal(1)}, i == 2 ? Last::yes : Last::no);
    Inflater of_dynamic(zlib_stream(dynamic));
    EXPECT_EQ(of_dynamic.call(), Stop::finished);
    EXPECT_EQ(TestHost::get().allocations, std::vector<uint32_t>({window_allocation, 50008, sizeof(BlockCodes)}));
}

TEST(Inflate, without_memory_for_trees_or_tables_it_says_which) {
    Deflate fixed, dynamic;
    fixed.fixed({literal(1)}, Last::yes);
    dynamic.dynamic({literal(1)}, Last::yes);
    const auto stop_with_failing = [](const Deflate &deflate, int allocation) {
        Inflater inflater(zlib_stream(deflate));
        TestHost::get().faults.failing_allocation = allocation;
        const Stop stop = inflater.call();
        EXPECT_TRUE(inflater.rows.bytes.empty());
        return stop;
    };
    EXPECT_EQ(stop_with_failing(fixed, 2), Stop::no_lookup_memory);
    EXPECT_EQ(stop_with_failing(dynamic, 2), Stop::no_memory);
    EXPECT_EQ(stop_with_failing(dynamic, 3), Stop::no_lookup_memory);
    EXPECT_TRUE(TestHost::get().live_blocks().empty());
    EXPECT_TRUE(TestHost::get().violations.empty());
}

} // namespace pelm::test
