// Refusals in two steps: what is freed, what the source and the request hold afterwards, and who owns the staging
// buffer.
#include <climits>

#include "bmp/working.h"
#include "tests/bmp/expectations.h"
#include "tests/support/quick.h"
#include "tests/support/two_step.h"

namespace pelm::test {
namespace {

const BmpVariant &rgb24 = variant_named("twenty_four_bits");

bool is_seekable_stream(uint32_t kind) {
    return kind == PELM_SOURCE_STREAM || kind == PELM_SOURCE_STREAM_ALT;
}

class BmpTwoStepRefusals : public HostedTest {
protected:
    // The second step must refuse, free everything and leave `decoderState` as it was.
    void expect_refused(TestSource &source, const BmpRequest &request, const std::string &what) {
        Bytes output(1000, background);
        ImageDecodeInfo info = marked_info(&source.source, request);
        ASSERT_EQ(ZOTARPELMI_PreInitBMP(&info, 1), 1) << what;
        const void *const parked = info.decoderState;
        if (source.source.data == nullptr) give_staging(source.source);
        const uint8_t *const data = source.source.data;
        EXPECT_EQ(ZOTARPELMI_DecodeBMPSKIA(&info, output.data(), request.box_width, request.box_height), 0) << what;
        EXPECT_EQ(info.decoderState, parked) << what;
        EXPECT_EQ(source.source.data, is_seekable_stream(source.source.kind) ? nullptr : data) << what;
        EXPECT_EQ(output, Bytes(1000, background)) << what;
        EXPECT_TRUE(host.live_blocks().empty()) << what << ": " << host.live_blocks().size() << " left";
    }
};

BmpFile with_compression(const char *variant, uint32_t compression) {
    BmpFile file = noise_bmp(variant_named(variant), 9, 7, false);
    file.compression = compression;
    file.gap = Bytes(100);
    return file;
}

TEST_F(BmpTwoStepRefusals, what_is_refused) {
    struct Case {
        const char *what;
        BmpFile file;
    };
    std::vector<Case> cases;
    for (const uint32_t compression : {4u, 5u})
        for (const char *variant : {"one_bit", "eight_bits", "sixteen_bits_plain", "twenty_four_bits"})
            cases.push_back({"embedded files", with_compression(variant, compression)});
    for (const char *variant : {"one_bit", "eight_bits", "twenty_four_bits", "thirty_two_bits"})
        cases.push_back({"bit fields at other depths than 16", with_compression(variant, 3)});
    for (const uint32_t compression : {1u, 2u, 6u, 99u})
        cases.push_back({"16 bits without masks", with_compression("sixteen_bits_plain", compression)});
    for (const int32_t width : {0, -1, -9, INT_MIN}) {
        cases.push_back({"width", noise_bmp(rgb24, 9, 7, false)});
        cases.back().file.width = width;
    }
    cases.push_back({"no bits", noise_bmp(rgb24, 9, 7, false)});
    cases.back().file.bits = 0;
    cases.push_back({"rows beyond 31 bits", noise_bmp(rgb24, 9, 7, false)});
    cases.back().file.height = INT_MAX;
    cases.push_back({"swapped masks", with_compression("sixteen_bits_565", 3)});
    cases.back().file.masks = {0x001F, 0x07E0, 0xF800};
    for (const uint32_t offset : {0u, 1u, 49u, 50u, 131126u, 262197u, 0x80000000u, 0xFFFFFFF0u}) {
        cases.push_back({"negative palette size", with_compression("eight_bits", 6)});
        cases.back().file.pixel_data_offset = offset;
    }
    cases.push_back({"no rows, and the box too small", noise_bmp(rgb24, 9, 1, false)});
    cases.back().file.height = 0;

    for (const Case &c : cases)
        for (const uint32_t kind : all_kinds) {
            host.reset();
            TestSource source(kind, file_bytes(c.file), 100);
            expect_refused(source, {1, 0, 0, 8, 8}, std::string(c.what) + ": " + described(c.file, 0));
        }
}

TEST_F(BmpTwoStepRefusals, rows_that_are_not_all_there_unless_they_are_bit_fields) {
    for (const BmpVariant &variant : bmp_variants)
        for (const bool top_down : {false, true})
            for (const uint32_t kind : all_kinds) {
                const BmpFile file = noise_bmp(variant, 9, 7, top_down);
                Bytes bytes = file_bytes(file);
                host.reset();
                TestSource whole(kind, bytes, 100);
                const BmpRequest request{1, 0, 0, 9, 7};
                EXPECT_EQ(decode_by(two_steps(request), whole, request, 189).result, 1);
                bytes.pop_back(); // a byte of padding, but for 32 bits
                BmpSubject cut(file, bytes.size(), kind, 100);
                EXPECT_TRUE(decodes_as_computed(cut, request)) << "one call decodes what is there";
                if (variant.compression == 0) {
                    host.reset();
                    TestSource source(kind, bytes, 100);
                    expect_refused(source, request, variant.name);
                } else {
                    EXPECT_EQ(cut.difference(two_steps(request), request, cut.expect(request)), "");
                }
            }
}

TEST_F(BmpTwoStepRefusals, short_rows_are_no_reason_with_an_unknown_compression) {
    for (const uint32_t compression : {6u, 7u, 0xFFFFFFFFu}) {
        BmpFile file = noise_bmp(rgb24, 9, 7, true);
        file.compression = compression;
        BmpSubject subject(file, 54 + 3 * 28, PELM_SOURCE_MEMORY, 0);
        const BmpRequest request{1, 0, 0, 9, 7};
        EXPECT_EQ(subject.difference(two_steps(request), request, subject.expect(request)), "");
        EXPECT_EQ(subject.expect(request).pixels_landed, 27u);
    }
}

TEST_F(BmpTwoStepRefusals, masks_that_do_not_arrive_are_zeros_and_refused) {
    const BmpFile file = noise_bmp(variant_named("sixteen_bits_565"), 9, 7, false);
    for (const uint32_t kind : stream_kinds)
        for (const int read : {2, 3, 4}) {
            host.reset();
            TestSource source(kind, file_bytes(file), 100);
            host.faults.failing_read = read;
            expect_refused(source, {1, 0, 0, 9, 7}, "read " + std::to_string(read));
        }
    for (size_t length = 54; length < 63; ++length) {
        host.reset();
        Bytes bytes = file_bytes(file);
        bytes.resize(length);
        TestSource source(PELM_SOURCE_MEMORY, bytes);
        expect_refused(source, {1, 0, 0, 9, 7}, std::to_string(length) + " bytes");
    }
}

TEST_F(BmpTwoStepRefusals, staging_buffers_below_a_row) {
    for (const uint32_t kind : {PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT})
        for (const int32_t size : {1, 4, 27}) {
            host.reset();
            TestSource source(kind, file_bytes(noise_bmp(rgb24, 9, 7, false)), size);
            expect_refused(source, {1, 0, 0, 9, 7}, std::to_string(size) + " bytes");
        }
}

TEST_F(BmpTwoStepRefusals, staging_buffers_of_negative_size) {
    for (const int32_t size : {0, -1, INT_MIN}) {
        host.reset();
        TestSource source(PELM_SOURCE_STREAM, file_bytes(noise_bmp(rgb24, 9, 7, false)), size);
        source.source.data = static_cast<uint8_t *>(host.allocate(100));
        expect_refused(source, {1, 0, 0, 9, 7}, std::to_string(size) + " bytes");
    }
}

TEST_F(BmpTwoStepRefusals, sources_without_data) {
    for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT}) {
        host.reset();
        TestSource source(kind, file_bytes(noise_bmp(variant_named("eight_bits"), 9, 7, false)));
        ImageDecodeInfo info{};
        info.input = &source.source;
        Bytes output(126, background);
        ASSERT_EQ(ZOTARPELMI_PreInitBMP(&info, 1), 1);
        source.source.data = nullptr;
        EXPECT_EQ(ZOTARPELMI_DecodeBMPSKIA(&info, output.data(), 9, 7), 0);
        EXPECT_TRUE(host.live_blocks().empty());
        EXPECT_EQ(source.source.data, nullptr);
    }
}

TEST_F(BmpTwoStepRefusals, unknown_kinds) {
    for (const uint32_t kind : {3u, 5u, 0xFFFFFFFFu}) {
        host.reset();
        TestSource source(kind, file_bytes(noise_bmp(rgb24, 9, 7, false)));
        expect_refused(source, {1, 0, 0, 9, 7}, "kind " + std::to_string(kind));
    }
}

TEST_F(BmpTwoStepRefusals, a_request_that_has_lost_its_input) {
    TestSource source(PELM_SOURCE_STREAM, file_bytes(noise_bmp(rgb24, 9, 7, false)), 100);
    ImageDecodeInfo info{};
    info.input = &source.source;
    ASSERT_EQ(ZOTARPELMI_PreInitBMP(&info, 1), 1);
    give_staging(source.source);
    info.input = nullptr;
    EXPECT_EQ(ZOTARPELMI_DecodeBMPSKIA(&info, nullptr, 9, 7), 0);
    EXPECT_EQ(host.live_blocks(), std::vector<uint32_t>{100}) << "the staging buffer of a source that it cannot see";
}

TEST_F(BmpTwoStepRefusals, without_a_parked_record_nothing_is_touched) {
    for (const uint32_t kind : all_kinds) {
        host.reset();
        TestSource source(kind, file_bytes(noise_bmp(rgb24, 9, 7, false)), 100);
        ImageDecodeInfo info = marked_info(&source.source, {});
        give_staging(source.source);
        const uint8_t *const data = source.source.data;
        const size_t blocks = host.live_blocks().size();
        Bytes output(189, background);
        EXPECT_EQ(ZOTARPELMI_DecodeBMPSKIA(&info, output.data(), 9, 7), 0);
        EXPECT_EQ(PELMI_BMP_InitializeSKIA(&info, 9, 7, output.data()), nullptr);
        EXPECT_TRUE(marks_intact(info));
        EXPECT_EQ(source.source.data, data);
        EXPECT_EQ(host.live_blocks().size(), blocks);
    }
}

TEST_F(BmpTwoStepRefusals, a_completed_record_is_none_that_is_parked) {
    for (const char *name : {"eight_bits", "twenty_four_bits"})
        for (const uint32_t kind : all_kinds) {
            host.reset();
            TestSource source(kind, file_bytes(noise_bmp(variant_named(name), 9, 7, false)), 100);
            ImageDecodeInfo info{};
            info.input = &source.source;
            Bytes output(126);
            ASSERT_EQ(ZOTARPELMI_PreInitBMP(&info, 1), 1);
            give_staging(source.source);
            ASSERT_NE(PELMI_BMP_InitializeSKIA(&info, 9, 7, output.data()), nullptr);
            EXPECT_EQ(PELMI_BMP_InitializeSKIA(&info, 9, 7, output.data()), nullptr);
            EXPECT_TRUE(host.live_blocks().empty());
        }
}

TEST_F(BmpTwoStepRefusals, a_parked_record_that_is_not_wanted_is_destroyed_without_the_staging_buffer) {
    for (const uint32_t kind : all_kinds) {
        host.reset();
        TestSource source(kind, file_bytes(noise_bmp(variant_named("eight_bits"), 9, 7, false)), 100);
        ImageDecodeInfo info{};
        info.input = &source.source;
        ASSERT_EQ(ZOTARPELMI_PreInitBMP(&info, 4), 1);
        give_staging(source.source);
        EXPECT_EQ(PELMI_BMP_DestroyBMP(&info), 1);
        EXPECT_EQ(info.decoderState, nullptr);
        EXPECT_EQ(host.live_bytes(), is_seekable_stream(kind) ? 100u : 0u) << "it is still the caller's";
    }
}

TEST_F(BmpTwoStepRefusals, bands_of_a_parked_record_end_at_once_and_free_it) {
    for (const auto call : {ZOTARPELMI_DecodeBMPIterLine, ZOTARPELMI_DecodeBMPLine}) {
        host.reset();
        TestSource source(PELM_SOURCE_MEMORY, file_bytes(noise_bmp(rgb24, 9, 7, true)));
        ImageDecodeInfo info{};
        info.input = &source.source;
        Bytes output(126, background);
        ASSERT_EQ(ZOTARPELMI_PreInitBMP(&info, 1), 1);
        EXPECT_EQ(call(&info, output.data(), 9, 7, 3), 1);
        EXPECT_EQ(info.decoderState, nullptr);
        EXPECT_EQ(output, Bytes(126, background));
        EXPECT_TRUE(host.live_blocks().empty());
    }
}

TEST_F(BmpTwoStepRefusals, every_failing_allocation_releases_everything) {
    for (const BmpVariant &variant : bmp_variants)
        for (const uint32_t kind : all_kinds)
            for (int failing = 1; failing <= 5; ++failing) {
                host.reset();
                TestSource source(kind, file_bytes(noise_bmp(variant, 9, 7, false)), 100);
                ImageDecodeInfo info{};
                info.input = &source.source;
                info.outputFormat = 1;
                Bytes output(75, background);
                host.faults.failing_allocation = failing;
                const int32_t first = ZOTARPELMI_PreInitBMP(&info, 1);
                EXPECT_EQ(first, failing == 1 ? 0 : 1);
                if (first == 0) {
                    EXPECT_EQ(info.decoderState, nullptr);
                    EXPECT_TRUE(host.live_blocks().empty());
                    continue;
                }
                give_staging(source.source);
                const int32_t second = ZOTARPELMI_DecodeBMPSKIA(&info, output.data(), 5, 5);
                const bool reached = host.allocations.size() >= static_cast<size_t>(failing);
                // A sequential source's row buffer is not looked at, as in one call.
                const bool row_buffer = kind == PELM_SOURCE_SEQUENTIAL && host.allocations.back() == 100;
                EXPECT_EQ(second, reached && !row_buffer ? 0 : 1);
                if (reached) {
                    EXPECT_EQ(output, Bytes(75, background));
                }
                EXPECT_TRUE(host.live_blocks().empty()) << variant.name << ", allocation " << failing;
            }
}

// Whatever a parked header holds, nothing is written outside, and everything is freed.
TEST_F(BmpTwoStepRefusals, headers_of_noise_do_no_harm) {
    Noise noise(98);
    const int runs = quick() ? 4000 : 40000;
    for (int i = 0; i < runs; ++i) {
        host.reset();
        BmpFile file = noise_header(noise);
        file.compression = noise.below(8);
        host.faults.largest_block = 1 << 20;
        const BmpRequest request{noise.below(10), static_cast<int>(noise.below(4)), noise.below(8) << 8,
                                 static_cast<int32_t>(noise.below(40)), static_cast<int32_t>(noise.below(40))};
        TestSource source(all_kinds[noise.below(4)], file_bytes(file), static_cast<int32_t>(noise.below(4000)));
        const size_t size =
            static_cast<size_t>(request.box_width * request.box_height * buffer_bytes_per_pixel(request.format));
        const BmpDecode decode =
            decode_by(two_steps(request), source, request, size, i % 2 == 0 ? Edge::end : Edge::start);
        ASSERT_EQ(decode.misbehaviour, "") << described(file, 0) << "; " << described(request);
        ASSERT_EQ(decode.live_blocks.size(), 0u) << described(file, 0) << "; " << described(request);
    }
}

} // namespace
} // namespace pelm::test
