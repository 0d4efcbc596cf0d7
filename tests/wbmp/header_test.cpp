// Which headers are accepted and what they say; sizes that lie, data that is cut anywhere, reads that fall short.
#include "tests/support/quick.h"
#include "tests/wbmp/decoding.h"

namespace pelm::test {
namespace {

using WbmpHeaders = HostedTest;

const WbmpRequest roomy = {1, 0, 40, 40};

// Decodes at its own size or fitted; expects success and these sides, none of which is 0.
void expect_sides(const Bytes &bytes, int32_t width, int32_t height, const WbmpRequest &request = roomy) {
    for (const uint32_t kind : wbmp_kinds) {
        TestHost::get().reset();
        TestSource source(kind, bytes);
        const WbmpDecode decode = decode_wbmp(source, request);
        EXPECT_EQ(decode.result, 1) << "kind " << kind;
        EXPECT_EQ(decode.info.outputWidth, width) << "kind " << kind;
        EXPECT_EQ(decode.info.outputHeight, height) << "kind " << kind;
        EXPECT_EQ(decode.misbehaviour, "");
    }
}

// Success without a pixel.
void expect_nothing_drawn(const Bytes &bytes, const WbmpRequest &request = roomy) {
    for (const uint32_t kind : wbmp_kinds) {
        TestHost::get().reset();
        TestSource source(kind, bytes);
        const WbmpDecode decode = decode_wbmp(source, request);
        EXPECT_EQ(decode.result, 1) << "kind " << kind;
        EXPECT_TRUE(decode.is_untouched()) << "kind " << kind;
        EXPECT_EQ(decode.misbehaviour, "");
    }
}

void expect_refused(const Bytes &bytes, const WbmpRequest &request = roomy) {
    for (const uint32_t kind : wbmp_kinds)
        EXPECT_TRUE(is_refused(bytes, kind, request));
}

TEST_F(WbmpHeaders, other_types_are_refused) {
    for (int type = 1; type < 256; ++type) {
        WbmpFile file = noise_wbmp(8, 8);
        file.type = static_cast<uint8_t>(type);
        expect_refused(file_bytes(file));
    }
}

TEST_F(WbmpHeaders, extension_headers_are_refused_and_other_fix_header_bits_are_not) {
    for (int fix_header = 0; fix_header < 256; ++fix_header) {
        WbmpFile file = noise_wbmp(8, 8);
        file.fix_header = static_cast<uint8_t>(fix_header);
        if (fix_header < 128)
            expect_sides(file_bytes(file), 8, 8);
        else
            expect_refused(file_bytes(file));
    }
}

TEST_F(WbmpHeaders, inputs_below_4_bytes_are_refused) {
    for (size_t size = 0; size < 4; ++size)
        expect_refused(Bytes(size));
    expect_nothing_drawn(Bytes(4));
}

TEST_F(WbmpHeaders, inputs_of_negative_size_are_refused) {
    for (const uint32_t kind : wbmp_kinds) {
        TestSource source(kind, file_bytes(noise_wbmp(8, 8)));
        source.source.size = INT32_MIN;
        EXPECT_EQ(decode_wbmp(source, roomy).result, 0);
        EXPECT_TRUE(host.allocations.empty());
    }
}

TEST_F(WbmpHeaders, other_source_kinds_are_refused) {
    for (const uint32_t kind : {2u, 3u, 4u, 5u, 0x101u, 0xFFFFFFFFu}) {
        host.reset();
        TestSource source(PELM_SOURCE_MEMORY, file_bytes(noise_wbmp(8, 8)));
        source.source.kind = kind;
        const WbmpDecode decode = decode_wbmp(source, roomy);
        EXPECT_EQ(decode.result, 0) << kind;
        EXPECT_TRUE(decode.is_untouched());
        EXPECT_EQ(decode.misbehaviour, "");
        EXPECT_TRUE(host.allocations.empty());
        EXPECT_TRUE(host.reads.empty());
    }
}

TEST_F(WbmpHeaders, null_requests_inputs_and_memory_give_0) {
    uint8_t output[16];
    EXPECT_EQ(ZOTARPELMI_DecodeWBMP(nullptr, output, 2, 2), 0);
    ImageDecodeInfo info{};
    EXPECT_EQ(ZOTARPELMI_DecodeWBMP(&info, output, 2, 2), 0);
    TestSource source(PELM_SOURCE_MEMORY, file_bytes(noise_wbmp(8, 8)));
    source.source.data = nullptr;
    EXPECT_EQ(decode_wbmp(source, roomy).result, 0);
    EXPECT_TRUE(host.allocations.empty());
}

TEST_F(WbmpHeaders, sides_of_several_bytes_are_read) {
    WbmpFile file = blank_wbmp(128, 3);
    ASSERT_EQ(file.width, (Bytes{0x81, 0x00}));
    expect_sides(file_bytes(file), 128, 3, {1, 0, 200, 40});
    expect_sides(file_bytes(blank_wbmp(3, 20000)), 3, 20000, {0, 0, 3, 20000});
    expect_sides(file_bytes(blank_wbmp(2097152, 1)), 40, 1, {1, 0x700, 40, 1});
}

TEST_F(WbmpHeaders, sides_may_have_zeros_in_front_up_to_four_bytes) {
    for (size_t wide = 1; wide <= 7; ++wide)
        for (size_t high = 1; high <= 7; ++high) {
            WbmpFile file = noise_wbmp(13, 5);
            file.width = multi_byte(13, wide);
            file.height = multi_byte(5, high);
            if (wide <= 4 && high <= 4)
                expect_sides(file_bytes(file), 13, 5);
            else
                expect_refused(file_bytes(file));
        }
}

TEST_F(WbmpHeaders, endless_integers_are_refused_without_reading_or_writing_beyond) {
    for (const size_t length : {5u, 6u, 7u, 8u, 9u, 16u, 18u, 19u, 20u, 1000u})
        for (const uint8_t byte : {uint8_t{0x80}, uint8_t{0xFF}}) {
            Bytes bytes(2 + length, byte);
            bytes[0] = bytes[1] = 0;
            expect_refused(bytes);
            Bytes height = {0, 0, 1};
            height.insert(height.end(), length, byte);
            expect_refused(height);
        }
}

TEST_F(WbmpHeaders, sides_from_2_to_the_27th_on_are_refused_before_rows_are_allocated) {
    for (const uint64_t side : {uint64_t{1} << 27, (uint64_t{1} << 27) + 1, (uint64_t{1} << 28) - 1})
        for (const uint64_t other : {0u, 1u, 9u})
            for (const bool wide : {false, true}) {
                WbmpFile file = noise_wbmp(9, 9);
                file.width = multi_byte(wide ? side : other);
                file.height = multi_byte(wide ? other : side);
                expect_refused(file_bytes(file));
                EXPECT_LE(host.allocations.size(), 1u);
            }
}

TEST_F(WbmpHeaders, sizes_that_lie_are_refused) {
    const int32_t sides[] = {1, 8, 9, 127, 128, 16383, 16384, 65535, 65536, 1 << 20, (1 << 27) - 1};
    for (const int32_t width : sides)
        for (const int32_t height : sides) {
            WbmpFile file;
            file.width = multi_byte(static_cast<uint32_t>(width));
            file.height = multi_byte(static_cast<uint32_t>(height));
            const int64_t needed = int64_t{(width + 7) / 8} * height;
            if (needed > 1 << 16) {
                file.rows = {Bytes(100)};
                expect_refused(file_bytes(file));
                continue;
            }
            file.rows = {Bytes(static_cast<size_t>(needed))};
            expect_sides(file_bytes(file), 3, 2, {7, 0x700, 3, 2});
            file.rows[0].pop_back();
            expect_refused(file_bytes(file));
        }
}

TEST_F(WbmpHeaders, products_that_wrap_to_a_small_number_are_refused) {
    // 2^32 bytes each, and a few more or less.
    for (const auto &[width, height] : {std::pair{1 << 24, 1 << 11},
                                        {1 << 19, 1 << 16},
                                        {1 << 11, 1 << 24},
                                        {(1 << 19) - 7, 1 << 16},
                                        {1 << 25, 1 << 11}}) {
        WbmpFile file;
        file.width = multi_byte(static_cast<uint32_t>(width));
        file.height = multi_byte(static_cast<uint32_t>(height));
        file.rows = {Bytes(64, 0xFF)};
        expect_refused(file_bytes(file));
    }
}

TEST_F(WbmpHeaders, files_cut_at_every_byte_are_refused_or_have_nothing_to_draw) {
    const Bytes whole = file_bytes(noise_wbmp(200, 7));
    const size_t header = 2 + 2 + 1;
    for (size_t size = 0; size < whole.size(); ++size) {
        const Bytes cut(whole.begin(), whole.begin() + static_cast<ptrdiff_t>(size));
        if (size == header - 1)
            expect_nothing_drawn(cut, {1, 0, 300, 300}); // no height
        else
            expect_refused(cut, {1, 0, 300, 300});
    }
    expect_sides(whole, 200, 7, {1, 0, 300, 300});
}

TEST_F(WbmpHeaders, integers_that_the_data_cuts_short_count_as_far_as_they_go) {
    expect_nothing_drawn({0, 0, 0x81, 0x81}); // 129 x nothing
    expect_nothing_drawn({0, 0, 0x80, 0x80});
    expect_nothing_drawn({0, 0, 0, 0x85}); // 0 x 5
    expect_refused({0, 0, 1, 0x85});       // 1 x 5 without rows
}

TEST_F(WbmpHeaders, bytes_behind_the_rows_do_not_matter) {
    WbmpFile file = noise_wbmp(11, 4);
    file.behind = Bytes(50, 0xFF);
    expect_sides(file_bytes(file), 11, 4);
}

TEST_F(WbmpHeaders, an_image_without_pixels_is_a_success) {
    for (const auto &[width, height] : {std::pair{0, 0}, {0, 5}, {5, 0}, {0, 5000}, {5000, 0}}) {
        WbmpFile file;
        file.width = multi_byte(static_cast<uint64_t>(width));
        file.height = multi_byte(static_cast<uint64_t>(height));
        for (const uint32_t format : {1u, 5u})
            expect_nothing_drawn(file_bytes(file), {format, 0, 40, 40});
        // Stretched it has a size, but nothing to show.
        for (const uint32_t kind : wbmp_kinds) {
            host.reset();
            TestSource source(kind, file_bytes(file));
            const WbmpDecode decode = decode_wbmp(source, {7, 0x700, 6, 5});
            EXPECT_EQ(decode.result, 1);
            EXPECT_EQ(decode.info.outputWidth, 6);
            EXPECT_EQ(decode.info.outputHeight, 5);
            EXPECT_EQ(decode.output, Bytes(6 * 5 * 4, background));
            EXPECT_EQ(decode.misbehaviour, "");
        }
    }
}

// Whatever a header holds, nothing is read or written outside, and nothing is left.
TEST_F(WbmpHeaders, of_noise_do_no_harm) {
    Noise noise(7);
    for (int i = 0; i < (quick() ? 5000 : 50000); ++i) {
        host.reset();
        Bytes bytes(noise.below(60));
        for (uint8_t &byte : bytes)
            byte = static_cast<uint8_t>(noise.below(3) == 0 ? noise.next() : noise.below(12));
        if (!bytes.empty()) bytes[0] = 0;
        const uint32_t formats[] = {0, 1, 7, 8, 5};
        const WbmpRequest request = {formats[noise.below(5)], noise.below(2) * 0x700,
                                     static_cast<int32_t>(noise.below(12)), static_cast<int32_t>(noise.below(12))};
        TestSource source(wbmp_kinds[i % 2], bytes);
        const WbmpDecode decode = decode_wbmp(source, request, noise.below(2) == 0 ? Edge::start : Edge::end);
        ASSERT_EQ(decode.misbehaviour, "") << "case " << i;
        ASSERT_TRUE(decode.result == 1 || decode.is_untouched()) << "case " << i;
    }
}

} // namespace
} // namespace pelm::test
