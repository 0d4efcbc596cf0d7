// What a decode asks of its host: which blocks in which order, which seeks and reads; and what becomes of it when the
// host fails anywhere.
#include <numeric>

#include "tests/wbmp/decoding.h"

namespace pelm::test {
namespace {

using WbmpHost = HostedTest;
using Sizes = std::vector<uint32_t>;

const WbmpRequest own_size = {1, 0, 20, 20};
const WbmpRequest reduced = {1, 0, 5, 5};

// Of a 19 x 13 image.
Sizes blocks_of(uint32_t kind, uint32_t scaled_width) {
    Sizes sizes = {4 * scaled_width, 4 * scaled_width};
    if (kind == PELM_SOURCE_STREAM) sizes.insert(sizes.begin(), {20, 3});
    return sizes;
}

Bytes image() {
    return file_bytes(noise_wbmp(19, 13));
}

TEST_F(WbmpHost, a_decode_allocates_exactly_the_expected_blocks) {
    for (const uint32_t kind : wbmp_kinds)
        for (const auto &[request, scaled_width] :
             {std::pair{own_size, 19u}, {reduced, 5u}, {WbmpRequest{7, 0x700, 100, 2}, 100u}}) {
            host.reset();
            TestSource source(kind, image());
            EXPECT_EQ(decode_wbmp(source, request).result, 1);
            const Sizes expected = blocks_of(kind, scaled_width);
            EXPECT_EQ(host.allocations, expected) << "kind " << kind;
            EXPECT_EQ(host.peak_bytes, std::accumulate(expected.begin(), expected.end(), uint64_t{0}));
        }
}

TEST_F(WbmpHost, every_failing_allocation_fails_the_decode_and_releases_everything) {
    for (const uint32_t kind : wbmp_kinds)
        for (const WbmpRequest &request : {own_size, reduced}) {
            const size_t blocks = blocks_of(kind, 1).size();
            for (size_t failing = 1; failing <= blocks; ++failing) {
                host.reset();
                host.faults.failing_allocation = static_cast<int>(failing);
                TestSource source(kind, image());
                const WbmpDecode decode = decode_wbmp(source, request);
                EXPECT_EQ(decode.result, 0) << "allocation " << failing;
                EXPECT_TRUE(decode.is_untouched());
                EXPECT_EQ(decode.misbehaviour, "");
                EXPECT_EQ(host.allocations.size(), failing) << "it goes on without";
                EXPECT_TRUE(decodes_as_modelled(noise_picture(19, 13, 1, 1), kind, request)) << "the next one";
            }
        }
}

TEST_F(WbmpHost, a_refusal_allocates_no_more_than_it_came_to) {
    struct Case {
        const char *what;
        Bytes bytes;
        WbmpRequest request;
        Sizes of_stream, of_memory;
    };
    WbmpFile typed = noise_wbmp(19, 13);
    typed.type = 1;
    WbmpFile extended = noise_wbmp(19, 13);
    extended.fix_header = 0x80;
    WbmpFile lying = noise_wbmp(19, 13);
    lying.height = multi_byte(14);
    const Case cases[] = {
        {"short", Bytes(3), own_size, {}, {}},
        {"type", file_bytes(typed), own_size, {20}, {}},
        {"extension", file_bytes(extended), own_size, {20}, {}},
        {"rows that are not there", file_bytes(lying), own_size, {20, 3}, {}},
        {"format", image(), {5, 0, 20, 20}, {20, 3, 76, 76}, {76, 76}},
    };
    for (const Case &one : cases)
        for (const uint32_t kind : wbmp_kinds) {
            EXPECT_TRUE(is_refused(one.bytes, kind, one.request)) << one.what;
            EXPECT_EQ(host.allocations, kind == PELM_SOURCE_STREAM ? one.of_stream : one.of_memory) << one.what;
        }
}

TEST_F(WbmpHost, a_box_that_leaves_nothing_allocates_no_sums) {
    for (const WbmpRequest &request : {WbmpRequest{1, 0, 0, 20}, WbmpRequest{1, 0x700, 20, -1}}) {
        host.reset();
        TestSource source(PELM_SOURCE_STREAM, image());
        const WbmpDecode decode = decode_wbmp(source, request);
        EXPECT_EQ(decode.result, 1);
        EXPECT_TRUE(decode.is_untouched());
        EXPECT_EQ(decode.misbehaviour, "");
        EXPECT_EQ(host.allocations, (Sizes{20, 3}));
    }
}

TEST_F(WbmpHost, a_row_buffer_of_no_bytes_may_be_null) {
    WbmpFile file;
    file.width = {0};
    file.height = {5};
    TestSource source(PELM_SOURCE_STREAM, file_bytes(file));
    host.faults.failing_allocation = 2;
    const WbmpDecode decode = decode_wbmp(source, own_size);
    EXPECT_EQ(decode.result, 1);
    EXPECT_EQ(decode.misbehaviour, "");
    EXPECT_EQ(host.allocations, (Sizes{20, 0}));
}

TEST_F(WbmpHost, what_a_block_held_before_does_not_matter) {
    for (const uint8_t filling : {uint8_t{0x00}, uint8_t{0xA5}, uint8_t{0xFF}})
        for (const WbmpRequest &request : {own_size, reduced}) {
            host.reset();
            host.faults.block_filling = filling;
            TestSource source(PELM_SOURCE_STREAM, image());
            EXPECT_EQ(decode_wbmp(source, request).output,
                      expect_wbmp(noise_picture(19, 13, 1, 1), request, background).output);
        }
}

TEST_F(WbmpHost, a_stream_is_read_row_by_row_behind_the_header) {
    TestSource source(PELM_SOURCE_STREAM, image());
    ASSERT_EQ(decode_wbmp(source, own_size).result, 1);
    EXPECT_EQ(host.seeks, (std::vector<SeekCall>{{0, 0}, {4, 0}}));
    std::vector<ReadCall> reads = {{0, 20, 20}};
    for (int32_t y = 0; y < 13; ++y)
        reads.push_back({4 + 3 * y, 3, 3});
    EXPECT_EQ(host.reads, reads);
}

TEST_F(WbmpHost, rows_without_samples_are_not_read) {
    // 64 rows into 2: samples in rows 8, 24, 40 and 56, one byte each behind a header of 4.
    TestSource source(PELM_SOURCE_STREAM, file_bytes(noise_wbmp(8, 64)));
    ASSERT_EQ(decode_wbmp(source, {1, 0x700, 3, 2}).result, 1);
    EXPECT_EQ(host.reads, (std::vector<ReadCall>{{0, 20, 20}, {12, 1, 1}, {28, 1, 1}, {44, 1, 1}, {60, 1, 1}}));
    EXPECT_EQ(host.seeks, (std::vector<SeekCall>{{0, 0}, {4, 0}, {12, 0}, {28, 0}, {44, 0}, {60, 0}}));
}

TEST_F(WbmpHost, rows_with_many_samples_are_read_once) {
    TestSource source(PELM_SOURCE_STREAM, file_bytes(noise_wbmp(8, 3)));
    ASSERT_EQ(decode_wbmp(source, {1, 0x700, 3, 40}).result, 1);
    EXPECT_EQ(host.reads, (std::vector<ReadCall>{{0, 20, 7}, {4, 1, 1}, {5, 1, 1}, {6, 1, 1}}));
    EXPECT_EQ(host.seeks.size(), 2u);
}

TEST_F(WbmpHost, memory_is_not_read_through_the_host) {
    TestSource source(PELM_SOURCE_MEMORY, image());
    ASSERT_EQ(decode_wbmp(source, own_size).result, 1);
    EXPECT_TRUE(host.reads.empty());
    EXPECT_EQ(host.seeks, (std::vector<SeekCall>{{0, 0}}));
}

TEST_F(WbmpHost, the_header_ends_where_its_read_ends) {
    // 4 bytes of header: type, fix-header field, width, height.
    for (int32_t delivered = 1; delivered <= 20; ++delivered) {
        host.reset();
        host.faults.short_reads_from = 1;
        host.faults.most_per_read = delivered;
        TestSource source(PELM_SOURCE_STREAM, image());
        const WbmpDecode decode = decode_wbmp(source, own_size);
        EXPECT_EQ(decode.misbehaviour, "");
        EXPECT_EQ(decode.result, delivered == 1 ? 0 : 1) << delivered;
        EXPECT_EQ(decode.is_untouched(), delivered < 4) << delivered;
    }
}

TEST_F(WbmpHost, rows_may_come_in_pieces) {
    for (const int32_t piece : {1, 2, 3}) {
        host.reset();
        host.faults.short_reads_from = 2;
        host.faults.most_per_read = piece;
        TestSource source(PELM_SOURCE_STREAM, image());
        EXPECT_EQ(decode_wbmp(source, own_size).output,
                  expect_wbmp(noise_picture(19, 13, 1, 1), own_size, background).output);
    }
}

TEST_F(WbmpHost, a_read_that_fails_fails_the_decode_with_the_rows_before_it_written) {
    for (const int32_t answer : {-1, 0, INT32_MIN})
        for (int failing = 1; failing <= 14; ++failing) {
            host.reset();
            host.faults.failing_reads_from = failing;
            host.faults.failing_read_result = answer;
            TestSource source(PELM_SOURCE_STREAM, image());
            const WbmpDecode decode = decode_wbmp(source, {1, 0, 19, 13});
            EXPECT_EQ(decode.result, 0) << "read " << failing;
            EXPECT_EQ(decode.info.outputWidth, untouched);
            EXPECT_EQ(decode.misbehaviour, "");
            Bytes expected = expect_wbmp(noise_picture(19, 13, 1, 1), {1, 0, 19, 13}, background).output;
            const auto rows = static_cast<ptrdiff_t>(std::max(failing - 2, 0));
            std::fill(expected.begin() + rows * 19 * 3, expected.end(), background);
            EXPECT_EQ(decode.output, expected) << "read " << failing;
        }
}

TEST_F(WbmpHost, a_read_that_fails_fails_a_reduced_decode) {
    for (int failing = 1; failing <= 11; ++failing) {
        host.reset();
        host.faults.failing_read = failing;
        TestSource source(PELM_SOURCE_STREAM, image());
        const WbmpDecode decode = decode_wbmp(source, {1, 0x700, 5, 5});
        EXPECT_EQ(decode.result, failing <= static_cast<int>(host.reads.size()) ? 0 : 1) << "read " << failing;
        EXPECT_EQ(decode.misbehaviour, "");
    }
}

TEST_F(WbmpHost, answers_beyond_what_was_asked_do_no_harm) {
    for (const int from : {1, 2, 5}) {
        host.reset();
        host.faults.overclaiming_reads_from = from;
        TestSource source(PELM_SOURCE_STREAM, image());
        const WbmpDecode decode = decode_wbmp(source, own_size);
        EXPECT_EQ(decode.result, 1);
        EXPECT_EQ(decode.misbehaviour, "");
        EXPECT_EQ(decode.output, expect_wbmp(noise_picture(19, 13, 1, 1), own_size, background).output);
    }
}

TEST_F(WbmpHost, a_pointer_that_stands_in_a_streams_data_word_is_neither_used_nor_freed) {
    uint8_t foreign = 9;
    for (const size_t size : {size_t{2}, image().size()}) {
        host.reset();
        Bytes bytes = image();
        bytes.resize(size);
        TestSource source(PELM_SOURCE_STREAM, bytes);
        source.source.data = &foreign;
        const WbmpDecode decode = decode_wbmp(source, own_size);
        EXPECT_EQ(decode.result, size == 2 ? 0 : 1);
        EXPECT_EQ(decode.misbehaviour, "");
        EXPECT_EQ(foreign, 9);
    }
}

TEST_F(WbmpHost, a_null_output_is_decoded_and_not_written) {
    for (const uint32_t kind : wbmp_kinds)
        for (const auto &[request, width, height] :
             {std::tuple{own_size, 19, 13}, {reduced, 5, 3}, {WbmpRequest{0, 0x700, 30, 40}, 30, 40}}) {
            host.reset();
            TestSource source(kind, image());
            const WbmpDecode decode = decode_wbmp_to_null(source, request);
            EXPECT_EQ(decode.result, 1);
            EXPECT_EQ(decode.info.outputWidth, width);
            EXPECT_EQ(decode.info.outputHeight, height);
            EXPECT_EQ(decode.misbehaviour, "");
        }
    TestSource source(PELM_SOURCE_MEMORY, image());
    EXPECT_EQ(decode_wbmp_to_null(source, {5, 0, 20, 20}).result, 0) << "a format that is not written";
}

} // namespace
} // namespace pelm::test
