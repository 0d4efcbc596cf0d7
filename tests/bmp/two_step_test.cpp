// Decodes in two steps: what the first one tells and parks, and what the second one writes.
#include <climits>

#include "bmp/working.h"
#include "tests/bmp/expectations.h"
#include "tests/support/quick.h"
#include "tests/support/two_step.h"

namespace pelm::test {
namespace {

const BmpVariant &rgb24 = variant_named("twenty_four_bits");

class BmpTwoStep : public HostedTest {
protected:
    static ::testing::AssertionResult decodes_in_two_steps(BmpSubject &subject, const BmpRequest &request,
                                                           Edge edge = Edge::end) {
        const std::string report = subject.difference(two_steps(request), request, subject.expect(request), edge);
        return report.empty() ? ::testing::AssertionSuccess() : ::testing::AssertionFailure() << report;
    }
};

TEST_F(BmpTwoStep, the_first_step_tells_the_size_and_parks_the_header) {
    struct Case {
        int32_t width, height, divisor, output_width, output_height;
    };
    for (const Case &c : {Case{640, 480, 1, 640, 480}, Case{640, 480, 3, 213, 160}, Case{641, -480, 2, 320, -240},
                          Case{7, -5, 2, 3, -2}, Case{7, 5, 8, 0, 0}, Case{7, 5, -2, -3, -2}, Case{0, 0, 1, 0, 0},
                          Case{-9, 4, 2, -4, 2}, Case{INT_MAX, INT_MIN + 1, 1, INT_MAX, INT_MIN + 1},
                          Case{INT_MIN, 5, 2, INT_MIN / 2, 2}, Case{7, 5, INT_MIN, 0, 0}})
        for (const uint32_t kind : all_kinds) {
            host.reset();
            BmpFile file;
            file.width = c.width;
            file.height = c.height;
            const Bytes bytes = file_bytes(file);
            TestSource source(kind, bytes);
            source.source.hostPosition = 11; // whatever was done with it before
            const BmpRequest request{};
            ImageDecodeInfo info = marked_info(&source.source, request);
            ASSERT_EQ(ZOTARPELMI_PreInitBMP(&info, c.divisor), 1);
            EXPECT_EQ(info.imageWidth, c.width);
            EXPECT_EQ(info.imageHeight, std::abs(c.height));
            EXPECT_EQ(info.outputWidth, c.output_width);
            EXPECT_EQ(info.outputHeight, c.output_height);
            EXPECT_EQ(info.preInitMode, 2u);
            EXPECT_EQ(info.decodeStarted, 0u);
            const auto *const state = static_cast<const BmpState *>(info.decoderState);
            ASSERT_NE(state, nullptr);
            EXPECT_EQ(state->width, c.width);
            EXPECT_EQ(state->height, std::abs(c.height));
            EXPECT_EQ(state->topDown, c.height < 0 ? 1u : 0u);
            EXPECT_EQ(state->requestedWidth, c.output_height);
            EXPECT_EQ(Bytes(state->headerCopy, state->headerCopy + 54), bytes);
            EXPECT_EQ(host.seeks, (std::vector<SeekCall>{{0, 0}}));
            EXPECT_EQ(host.reads, (std::vector<ReadCall>{{0, 54, 54}})) << "memory is read by the host too";
            EXPECT_EQ(host.allocations, std::vector<uint32_t>{sizeof(BmpState)});
        }
}

TEST_F(BmpTwoStep, a_first_step_that_fails_leaves_the_request_as_it_was) {
    struct Case {
        const char *what;
        int32_t width, height, divisor;
        char second;
        size_t left;
    };
    for (const Case &c : {Case{"divisor of 0", 7, 5, 0, 'M', 0}, Case{"no BMP", 7, 5, 1, 'A', 1},
                          Case{"height without absolute value", 7, INT_MIN, 1, 'M', 0},
                          Case{"width that the divisor makes too large", INT_MIN, 5, -1, 'M', 0}})
        for (const uint32_t kind : all_kinds) {
            host.reset();
            BmpFile file;
            file.signature[1] = c.second;
            file.width = c.width;
            file.height = c.height;
            TestSource source(kind, file_bytes(file));
            ImageDecodeInfo info = marked_info(&source.source, {});
            info.decoderState = &info;
            EXPECT_EQ(ZOTARPELMI_PreInitBMP(&info, c.divisor), 0) << c.what;
            EXPECT_EQ(host.seeks.size(), 1u) << c.what << ": whatever is refused";
            EXPECT_EQ(info.decoderState, &info) << c.what;
            EXPECT_TRUE(marks_intact(info)) << c.what;
            EXPECT_EQ(host.live_blocks().size(), c.left) << c.what;
        }
}

TEST_F(BmpTwoStep, memory_without_data_is_not_asked_for_a_header) {
    TestSource source(PELM_SOURCE_MEMORY, file_bytes(noise_bmp(rgb24, 9, 7, false)));
    source.source.data = nullptr;
    ImageDecodeInfo info{};
    info.input = &source.source;
    EXPECT_EQ(ZOTARPELMI_PreInitBMP(&info, 1), 0);
    EXPECT_TRUE(host.allocations.empty());
    EXPECT_TRUE(host.reads.empty());
}

TEST_F(BmpTwoStep, header_bytes_that_do_not_arrive_are_zeros_whatever_the_host_leaves_there) {
    const Bytes whole = file_bytes(noise_bmp(rgb24, 0x0707, 0x0505, false));
    for (const uint32_t kind : all_kinds)
        for (size_t length = 0; length < 54; ++length) {
            host.reset();
            host.faults.read_filling = 0x5A;
            TestSource source(kind, Bytes(whole.begin(), whole.begin() + static_cast<ptrdiff_t>(length)));
            ImageDecodeInfo info{};
            info.input = &source.source;
            const int32_t result = ZOTARPELMI_PreInitBMP(&info, 1);
            ASSERT_EQ(result, length >= 2 ? 1 : 0);
            EXPECT_EQ(info.imageWidth, length >= 20 ? 0x0707 : length == 19 ? 0x07 : 0);
            EXPECT_EQ(info.imageHeight, length >= 24 ? 0x0505 : length == 23 ? 0x05 : 0);
            if (length < 2) continue;
            Bytes expected = whole;
            expected.resize(54);
            std::fill(expected.begin() + static_cast<ptrdiff_t>(length), expected.end(), uint8_t{0});
            const auto *const state = static_cast<const BmpState *>(info.decoderState);
            EXPECT_EQ(Bytes(state->headerCopy, state->headerCopy + 54), expected);
        }
}

TEST_F(BmpTwoStep, every_depth_is_decoded_as_in_one_call) {
    for (const BmpVariant &variant : bmp_variants)
        for (const bool top_down : {false, true})
            for (const uint32_t kind : all_kinds) {
                BmpSubject subject(noise_bmp(variant, 11, 13, top_down), kind, 100);
                for (int turns = 0; turns < 4; ++turns)
                    for (const uint32_t placement : {0u, 0x100u, 0x200u, 0x600u, 0x700u})
                        for (const uint32_t format : bmp_formats) {
                            ASSERT_TRUE(decodes_in_two_steps(
                                subject, request_for(11, 13, format, turns, placement, 2, 5), Edge::end));
                            ASSERT_TRUE(decodes_in_two_steps(
                                subject, request_for(11, 13, format, turns, placement, -4, -5), Edge::start));
                        }
            }
}

TEST_F(BmpTwoStep, sizes_1_to_17) {
    const int32_t most = quick() ? 5 : 17;
    for (const bool top_down : {false, true})
        for (int32_t width = 1; width <= most; ++width)
            for (int32_t height = 1; height <= most; ++height) {
                BmpSubject subject(noise_bmp(bmp_variants[width % 9], width, height, top_down));
                for (const int32_t divisor : {1, 2, 3}) {
                    const BmpRequest request{1, (width + height) % 4, 0, width / divisor, height / divisor};
                    ASSERT_TRUE(decodes_in_two_steps(subject, request));
                }
            }
}

TEST_F(BmpTwoStep, headers_of_any_size_are_taken_for_one_of_40_bytes) {
    for (const uint32_t size : {0u, 12u, 39u, 40u, 52u, 56u, 65u, 108u, 124u, 0xFFFFFFFFu}) {
        BmpFile file = noise_bmp(rgb24, 9, 7, true);
        file.header_size = size == 12 ? 0x0D : size; // the builder would write the fields of 12 bytes
        if (size > 40 && size < 200) file.gap = Bytes(size - 40, 0x33);
        for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM}) {
            BmpSubject subject(file, kind, 60);
            EXPECT_TRUE(decodes_in_two_steps(subject, {1, 0, 0, 9, 7})) << size;
        }
    }
}

TEST_F(BmpTwoStep, palettes_come_from_byte_54_behind_every_header) {
    // 68 further header bytes and 256 entries: the first 17 of 273 entries are the header's.
    BmpFile file = noise_bmp(variant_named("eight_bits"), 9, 7, false);
    file.header_size = 108;
    file.palette.insert(file.palette.begin(), 68, 0x44);
    for (const uint32_t kind : all_kinds) {
        BmpSubject subject(file, kind, 60);
        EXPECT_TRUE(decodes_in_two_steps(subject, {1, 0, 0, 9, 7}));
    }
}

TEST_F(BmpTwoStep, there_are_as_many_palette_entries_as_fit_before_the_pixels_and_no_default) {
    for (const auto &[offset, entries] : {std::pair{51u, 0},
                                          {52u, 0},
                                          {53u, 0},
                                          {54u, 0},
                                          {57u, 0},
                                          {58u, 1},
                                          {61u, 1},
                                          {62u, 2},
                                          {54u + 4 * 255, 255}})
        for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM}) {
            host.reset();
            BmpFile file;
            file.width = 256;
            file.bits = 8;
            file.palette = Bytes(1280, 0x77);
            file.pixel_data_offset = offset;
            TestSource source(kind, file_bytes(file), 256);
            const BmpRequest request{1, 0, 0, 256, 1};
            // Pixels from the offset on are headers, palette bytes or both.
            Bytes expected;
            const Bytes bytes = file_bytes(file);
            for (size_t x = 0; x < 256; ++x)
                expected.insert(expected.end(), 3, bytes[offset + x] < entries ? 0x77 : 0);
            const BmpDecode decode = decode_by(two_steps(request), source, request, 768);
            EXPECT_EQ(decode.result, 1) << offset;
            EXPECT_EQ(decode.output, expected) << offset;
            EXPECT_TRUE(decode.live_blocks.empty());
        }
}

TEST_F(BmpTwoStep, a_palette_that_does_not_arrive_is_black_whatever_the_host_leaves_there) {
    for (const uint32_t kind : stream_kinds) {
        host.reset();
        host.faults.read_filling = 0x5A;
        TestSource source(kind, file_bytes(noise_bmp(variant_named("eight_bits"), 9, 7, false)), 60);
        host.faults.failing_read = 2;
        const BmpRequest request{1, 0, 0, 9, 7};
        const BmpDecode decode = decode_by(two_steps(request), source, request, 189);
        EXPECT_EQ(decode.result, 1);
        EXPECT_EQ(decode.output, Bytes(189, 0));
        EXPECT_TRUE(decode.live_blocks.empty());
    }
}

TEST_F(BmpTwoStep, whole_rows_of_the_callers_staging_buffer_are_used_and_its_size_stays) {
    const BmpFile file = noise_bmp(rgb24, 11, 13, false); // 36 bytes a row
    for (const uint32_t kind : {PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT})
        for (const int32_t size : {36, 37, 71, 72, 100, 1000}) {
            host.reset();
            TestSource source(kind, file_bytes(file), size);
            const BmpRequest request{1, 0, 0, 11, 13};
            const BmpDecode decode = decode_by(two_steps(request), source, request, 429);
            EXPECT_EQ(decode.output, BmpSubject(file).expect(request).output);
            EXPECT_EQ(source.source.bufferSize, size);
            EXPECT_EQ(source.source.data, nullptr);
            EXPECT_TRUE(decode.live_blocks.empty());
            EXPECT_EQ(host.violations, std::vector<std::string>{});
            ASSERT_GE(host.reads.size(), 2u);
            for (size_t i = 1; i < host.reads.size(); ++i)
                EXPECT_EQ(host.reads[i].asked, size / 36 * 36);
        }
}

TEST_F(BmpTwoStep, the_second_step_moves_only_seekable_streams_and_only_to_the_rows) {
    for (const uint32_t kind : all_kinds) {
        host.reset();
        const BmpFile file = noise_bmp(variant_named("eight_bits"), 9, 7, false);
        TestSource source(kind, file_bytes(file), 60);
        const BmpRequest request{1, 0, 0, 9, 7};
        EXPECT_EQ(decode_by(two_steps(request), source, request, 189).result, 1);
        std::vector<SeekCall> expected{{0, 0}};
        if (kind == PELM_SOURCE_STREAM || kind == PELM_SOURCE_STREAM_ALT)
            expected.push_back({static_cast<int32_t>(file.rows_at()), 0});
        EXPECT_EQ(host.seeks, expected);
    }
}

TEST_F(BmpTwoStep, the_completed_record_holds_the_box_and_the_compression) {
    BmpFile file = noise_bmp(variant_named("eight_bits"), 9, 7, true);
    file.compression = 1;
    TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
    ImageDecodeInfo info{};
    info.input = &source.source;
    info.flags = PELM_ROTATE_90;
    ASSERT_EQ(ZOTARPELMI_PreInitBMP(&info, 2), 1);
    const void *const parked = info.decoderState;
    Bytes output(126);
    BmpState *const state = PELMI_BMP_InitializeSKIA(&info, 7, 9, output.data());
    ASSERT_EQ(state, parked);
    EXPECT_EQ(info.decoderState, parked);
    EXPECT_EQ(info.decodeStarted, 1u);
    EXPECT_EQ(info.outputWidth, 9);
    EXPECT_EQ(info.outputHeight, 7);
    EXPECT_EQ(state->requestedWidth, 7);
    EXPECT_EQ(state->requestedHeight, 9);
    EXPECT_EQ(state->compression, 1u);
    EXPECT_EQ(state->bitsPerPixel, 8);
    EXPECT_EQ(state->pixelDataOffset, file.rows_at());
    EXPECT_EQ(state->rotation, 90);
    EXPECT_EQ(state->topDown, 1u);
    EXPECT_EQ(state->rowsDone, 0);
    EXPECT_EQ(state->output.buffer.start, output.data());
    EXPECT_EQ(state->output.buffer.size, 126u);
    PELMI_BMP_DeleteDecInfo(state);
    EXPECT_TRUE(host.live_blocks().empty());
}

TEST_F(BmpTwoStep, other_depths_decode_nothing_and_succeed) {
    for (const uint16_t bits : {uint16_t{2}, uint16_t{3}, uint16_t{64}}) {
        BmpFile file = noise_bmp(rgb24, 9, 7, false);
        file.bits = bits;
        TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
        const BmpRequest request{1, 0, 0, 9, 7};
        const BmpDecode decode = decode_by(two_steps(request), source, request, 189);
        EXPECT_EQ(decode.result, bits == 64 ? 0 : 1) << "64 bits: the rows are not there";
        EXPECT_EQ(decode.output, Bytes(189, background));
        EXPECT_TRUE(decode.live_blocks.empty());
    }
}

TEST_F(BmpTwoStep, it_allocates_what_one_call_does_but_for_the_staging_buffer) {
    for (const BmpVariant &variant : bmp_variants)
        for (const uint32_t kind : all_kinds) {
            host.reset();
            TestSource source(kind, file_bytes(noise_bmp(variant, 11, 13, false)), 100);
            const BmpRequest request{1, 0, 0, 5, 5};
            const BmpDecode decode = decode_by(two_steps(request), source, request, 75);
            EXPECT_EQ(decode.result, 1);
            std::vector<uint32_t> expected{sizeof(BmpState)};
            if (kind == PELM_SOURCE_STREAM || kind == PELM_SOURCE_STREAM_ALT) expected.push_back(100); // the test's
            if (variant.bits <= 8) expected.push_back(1024);
            expected.push_back(static_cast<uint32_t>(decode.info.outputWidth) * 8);
            if (kind == PELM_SOURCE_SEQUENTIAL) expected.push_back(100);
            EXPECT_EQ(host.allocations, expected);
            EXPECT_TRUE(decode.live_blocks.empty());
        }
}

} // namespace
} // namespace pelm::test
