// Line calls: bands of rows, each in a buffer of its own.
#include <climits>

#include "bmp/working.h"
#include "tests/bmp/bands.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

const BmpVariant &rgb24 = variant_named("twenty_four_bits");

// One decode by lines, and the buffer of one band at a time, just as large as the band.
class Lines {
public:
    Lines(const BmpFile &file, uint32_t kind, const BmpRequest &request, int32_t buffer_size = 50)
        : request_(request), model_(file, file_bytes(file), kind), source_(kind, file_bytes(file), buffer_size),
          info_(marked_info(&source_.source, request)) {}

    int32_t decode(int32_t rows, size_t size, Edge edge = Edge::end) {
        uint8_t *const output = memory_.take(size, edge);
        std::fill_n(output, size, background);
        const int32_t result = ZOTARPELMI_DecodeBMPLine(&info_, output, request_.box_width, request_.box_height, rows);
        band_.assign(output, output + size);
        EXPECT_TRUE(memory_.intact()) << described(request_);
        EXPECT_TRUE(source_.unchanged());
        return result;
    }

    // A band of `rows` rows, of which the image has `count`; compared with the model.
    ::testing::AssertionResult decodes(int32_t rows, int32_t count, Edge edge) {
        const Bytes expected = model_.expect_line(request_, done_, count, background);
        const int32_t result = decode(rows, expected.size(), edge);
        done_ += count;
        const bool complete = done_ >= height();
        if (result == 1 && band_ == expected && complete == (info_.decoderState == nullptr) && marks_intact(info_))
            return ::testing::AssertionSuccess();
        const auto differing = std::mismatch(expected.begin(), expected.end(), band_.begin()).first;
        return ::testing::AssertionFailure()
               << described(request_) << ", kind " << source_.source.kind << ": a band of " << rows
               << " rows up to row " << done_ << " of " << height() << " gave " << result << ", decoderState "
               << (info_.decoderState == nullptr ? "NULL" : "set") << ", first differing byte "
               << differing - expected.begin() << " of " << expected.size();
    }

    int32_t height() const {
        BmpRequest plain = request_;
        plain.quarter_turns = 0;
        plain.placement = request_.stretches() ? 0x700 : 0;
        return static_cast<int32_t>(model_.expect(plain, background).size.height);
    }

    int32_t done() const { return done_; }
    ImageDecodeInfo &info() { return info_; }
    const Bytes &band() const { return band_; }

private:
    const BmpRequest request_;
    const BmpModel model_;
    TestSource source_;
    ImageDecodeInfo info_;
    GuardedBuffer memory_;
    Bytes band_;
    int32_t done_ = 0;
};

class BmpLine : public HostedTest {
protected:
    void expect_bands(const BmpFile &file, uint32_t kind, const BmpRequest &request, int32_t rows) {
        Lines lines(file, kind, request);
        const int32_t height = lines.height();
        do
            ASSERT_TRUE(lines.decodes(rows, std::min(rows, height - lines.done()),
                                      lines.done() % 2 == 0 ? Edge::end : Edge::start))
                << described(file, 0);
        while (lines.done() < height);
        ASSERT_TRUE(host.live_blocks().empty());
        ASSERT_TRUE(host.violations.empty());
    }
};

TEST_F(BmpLine, every_band_lies_in_the_first_rows_of_its_buffer_and_nowhere_else) {
    for (const BmpVariant &variant : bmp_variants)
        for (const bool top_down : {false, true})
            for (const uint32_t kind : seekable_kinds)
                for (const BmpRequest &request :
                     {BmpRequest{1, 0, 0, 9, 7}, BmpRequest{0, 0, 0, 14, 40}, BmpRequest{5, 0, 0, 5, 5},
                      BmpRequest{6, 0, 0, 6, 20}, BmpRequest{7, 0, 0x700, 4, 11}, BmpRequest{8, 0, 0x700, 13, 3}})
                    for (int32_t rows = 1; rows <= 12; rows += quick() ? 4 : 1)
                        expect_bands(noise_bmp(variant, 9, 7, top_down), kind, request, rows);
}

TEST_F(BmpLine, rotations_and_exact_buffers_are_not_known) {
    for (const bool top_down : {false, true})
        for (int turns = 0; turns < 4; ++turns)
            for (uint32_t placement = 0; placement < 0x800; placement += 0x100)
                for (const auto &[box_width, box_height] : {std::pair{15, 12}, {5, 12}, {15, 4}, {9, 7}})
                    for (const int32_t rows : {1, 3, 100})
                        expect_bands(noise_bmp(rgb24, 9, 7, top_down), PELM_SOURCE_MEMORY,
                                     {1, turns, placement, box_width, box_height}, rows);
}

TEST_F(BmpLine, small_pictures_of_every_size) {
    const int32_t most = quick() ? 4 : 7;
    for (int32_t width = 1; width <= most; ++width)
        for (int32_t height = 1; height <= most; ++height)
            for (int32_t box = 1; box <= most + 2; ++box)
                for (const uint32_t placement : {0u, 0x700u})
                    for (int32_t rows = 1; rows <= box; ++rows)
                        expect_bands(noise_bmp(rgb24, width, height, width % 2 == 0), PELM_SOURCE_MEMORY,
                                     {1, 0, placement, box, box}, rows);
}

TEST_F(BmpLine, bands_may_change_their_height) {
    Noise noise(3);
    for (int i = 0; i < 300; ++i) {
        const BmpVariant &variant = bmp_variants[noise.below(std::size(bmp_variants))];
        const BmpRequest request{bmp_formats[noise.below(6)], static_cast<int>(noise.below(4)), noise.below(8) << 8,
                                 static_cast<int32_t>(1 + noise.below(14)), static_cast<int32_t>(1 + noise.below(14))};
        Lines lines(noise_bmp(variant, 9, 11, noise.below(2) == 0), seekable_kinds[noise.below(3)], request);
        const int32_t height = lines.height();
        do {
            const int32_t rows = noise.below(9) == 0 ? INT_MAX : static_cast<int32_t>(noise.below(5)) - 1;
            ASSERT_TRUE(lines.decodes(rows, std::clamp(rows, 0, height - lines.done()), Edge::end));
        } while (lines.done() < height);
        ASSERT_TRUE(host.live_blocks().empty());
    }
}

TEST_F(BmpLine, a_picture_is_centred_between_left_and_right_only) {
    BmpFile file;
    file.height = 2;
    file.rows = {{1, 2, 3}, {4, 5, 6}};
    const uint8_t b = background;
    Lines lines(file, PELM_SOURCE_MEMORY, {1, 0, 0, 4, 9}); // a margin of 3: one pixel left, two right
    EXPECT_EQ(lines.decode(1, 12), 1);
    EXPECT_EQ(lines.band(), (Bytes{b, b, b, 6, 5, 4, b, b, b, b, b, b}));
    EXPECT_EQ(lines.decode(1, 12), 1);
    EXPECT_EQ(lines.band(), (Bytes{b, b, b, 3, 2, 1, b, b, b, b, b, b}));
    EXPECT_EQ(lines.info().decoderState, nullptr);
}

TEST_F(BmpLine, bands_together_are_what_one_call_gives) {
    for (const BmpVariant &variant : bmp_variants)
        for (const int32_t box : {5, 9}) {
            const BmpFile file = noise_bmp(variant, 9, 9, false);
            const BmpRequest request{7, 0, 0, box, box};
            Lines lines(file, PELM_SOURCE_STREAM, request);
            Bytes all;
            for (int32_t y = 0; y < box; y += 2) {
                EXPECT_EQ(lines.decode(2, static_cast<size_t>(std::min(2, box - y) * box * 4)), 1);
                all.insert(all.end(), lines.band().begin(), lines.band().end());
            }
            EXPECT_EQ(all, BmpSubject(file).expect(request).output) << variant.name;
        }
}

TEST_F(BmpLine, the_record_holds_the_count_of_rows_and_no_cursor) {
    Lines lines(noise_bmp(rgb24, 9, 7, false), PELM_SOURCE_MEMORY, {1, 3, 0x100, 14, 20});
    for (int32_t done = 2; done < 7; done += 2) {
        EXPECT_EQ(lines.decode(2, 84), 1);
        const auto *const state = static_cast<const BmpState *>(lines.info().decoderState);
        ASSERT_NE(state, nullptr);
        EXPECT_EQ(state->rowsDone, done);
        EXPECT_EQ(state->rotation, 0);
        EXPECT_EQ(state->output.buffer.size, 0u) << "a buffer of an earlier call";
    }
    EXPECT_EQ(lines.decode(2, 42), 1);
}

TEST_F(BmpLine, every_call_moves_the_source_to_its_start) {
    Lines lines(noise_bmp(rgb24, 9, 7, true), PELM_SOURCE_STREAM, {1, 0, 0, 9, 7});
    for (int i = 0; i < 2; ++i)
        EXPECT_EQ(lines.decode(3, 81), 1);
    EXPECT_EQ(host.seeks, (std::vector<SeekCall>{{0, 0}, {54, 0}, {0, 0}, {54 + 3 * 28, 0}}));
    PELMI_BMP_DeleteDecInfo(static_cast<BmpState *>(lines.info().decoderState));
}

TEST_F(BmpLine, a_failed_read_gives_5_and_counts_the_band) {
    for (const uint32_t kind : {PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT}) {
        host.reset();
        Lines lines(noise_bmp(rgb24, 9, 7, true), kind, {1, 0, 0, 9, 7}, 28);
        host.faults.failing_read = 4; // header, two rows, and the third
        EXPECT_EQ(lines.decode(4, 108), 5);
        ASSERT_NE(lines.info().decoderState, nullptr);
        EXPECT_EQ(static_cast<const BmpState *>(lines.info().decoderState)->rowsDone, 4);
        const Bytes whole = BmpSubject(noise_bmp(rgb24, 9, 7, true)).expect({1, 0, 0, 9, 7}).output;
        Bytes expected(108, background);
        std::copy_n(whole.begin(), 54, expected.begin());
        EXPECT_EQ(lines.band(), expected);
        EXPECT_EQ(lines.decode(4, 81), 1) << "the last rows are read again";
        EXPECT_EQ(lines.band(), Bytes(whole.begin() + 108, whole.end()));
        EXPECT_EQ(lines.info().decoderState, nullptr);
        EXPECT_TRUE(host.live_blocks().empty());
    }
}

TEST_F(BmpLine, a_failed_read_in_the_last_band_gives_5_and_ends_the_decode) {
    for (const uint32_t kind : stream_kinds) {
        host.reset();
        Lines lines(noise_bmp(rgb24, 9, 7, true), kind, {1, 0, 0, 9, 7}, 28);
        host.faults.failing_reads_from = 3;
        EXPECT_EQ(lines.decode(7, 189), 5);
        EXPECT_EQ(lines.info().decoderState, nullptr);
        EXPECT_TRUE(host.live_blocks().empty());
    }
}

TEST_F(BmpLine, data_that_simply_ends_gives_1) {
    const BmpFile file = noise_bmp(rgb24, 9, 7, true);
    Bytes bytes = file_bytes(file);
    bytes.resize(54 + 3 * 28);
    for (const uint32_t kind : all_kinds) {
        host.reset();
        TestSource source(kind, bytes, 28);
        ImageDecodeInfo info{};
        info.input = &source.source;
        info.outputFormat = 1;
        Bytes output(189, background);
        EXPECT_EQ(ZOTARPELMI_DecodeBMPLine(&info, output.data(), 9, 7, 7), 1) << kind;
        EXPECT_EQ(info.decoderState, nullptr);
        EXPECT_TRUE(host.live_blocks().empty());
    }
}

TEST_F(BmpLine, refusals_leave_what_the_other_calls_leave) {
    for (const uint32_t kind : all_kinds) {
        struct Case {
            const char *what;
            Bytes bytes;
            size_t left;
        };
        BmpFile unsupported = noise_bmp(rgb24, 9, 7, false);
        unsupported.header_size = 108;
        BmpFile codes = noise_bmp(variant_named("eight_bits"), 9, 7, false);
        codes.compression = 1;
        Bytes short_palette = file_bytes(noise_bmp(variant_named("eight_bits"), 9, 7, false));
        short_palette.resize(100);
        Bytes short_header = file_bytes(noise_bmp(rgb24, 9, 7, false));
        short_header.resize(53);
        const bool stream = kind != PELM_SOURCE_MEMORY;
        for (const Case &c : {Case{"header size", file_bytes(unsupported), 1}, Case{"codes", file_bytes(codes), 0},
                              Case{"short header", short_header, stream ? 1u : 0u}}) {
            host.reset();
            TestSource source(kind, c.bytes);
            ImageDecodeInfo info{};
            info.input = &source.source;
            Bytes output(126, background);
            EXPECT_EQ(ZOTARPELMI_DecodeBMPLine(&info, output.data(), 9, 7, 7), 0) << c.what;
            EXPECT_EQ(host.live_blocks().size(), c.left) << c.what << ", kind " << kind;
            EXPECT_EQ(info.decoderState, nullptr) << c.what;
            EXPECT_EQ(output, Bytes(126, background)) << c.what;
        }
        if (!stream) continue;
        host.reset();
        TestSource source(kind, short_palette);
        ImageDecodeInfo info{};
        info.input = &source.source;
        Bytes output(126, background);
        EXPECT_EQ(ZOTARPELMI_DecodeBMPLine(&info, output.data(), 9, 7, 7), 0);
        EXPECT_EQ(host.live_blocks().size(), 2u);
    }
}

TEST_F(BmpLine, without_memory_for_a_sequential_row_buffer_it_fails_and_frees_everything) {
    Lines lines(noise_bmp(rgb24, 9, 7, false), PELM_SOURCE_SEQUENTIAL, {1, 0, 0, 9, 7});
    host.faults.failing_allocation = 3; // record, sums, row buffer
    EXPECT_EQ(lines.decode(3, 81), 0);
    EXPECT_EQ(lines.info().decoderState, nullptr);
    EXPECT_EQ(lines.band(), Bytes(81, background));
    EXPECT_TRUE(host.live_blocks().empty());
}

TEST_F(BmpLine, a_sequential_source_is_decoded_whole_in_one_band) {
    for (const BmpVariant &variant : bmp_variants)
        for (const bool top_down : {false, true})
            for (const int32_t box : {9, 5}) {
                Lines lines(noise_bmp(variant, 9, 9, top_down), PELM_SOURCE_SEQUENTIAL, {1, 0, 0, box, box});
                // Only the first row of a top-down picture stays: the others go above it.
                EXPECT_TRUE(lines.decodes(box, box, Edge::start)) << variant.name;
                EXPECT_TRUE(host.live_blocks().empty());
            }
}

TEST_F(BmpLine, later_bands_of_a_sequential_source_read_from_its_start) {
    // 2 x 8 to 1 x 4, top-down: output row 2 averages file rows 4 and 5, taken from the file's bytes 0 to 5 and 8
    // to 13.
    const BmpFile file = noise_bmp(rgb24, 2, 8, true);
    const Bytes bytes = file_bytes(file);
    Lines lines(file, PELM_SOURCE_SEQUENTIAL, {8, 0, 0, 1, 4}, 16);
    EXPECT_EQ(lines.decode(2, 8), 1);
    EXPECT_EQ(lines.decode(2, 8), 1);
    Bytes expected(8, background);
    for (size_t channel = 0; channel < 3; ++channel)
        expected[channel] =
            static_cast<uint8_t>((bytes[channel] + bytes[3 + channel] + bytes[8 + channel] + bytes[11 + channel]) / 4);
    expected[3] = 255;
    EXPECT_EQ(lines.band(), expected) << "its second row goes above it";
    EXPECT_EQ(lines.info().decoderState, nullptr);
    EXPECT_TRUE(host.live_blocks().empty());
}

TEST_F(BmpLine, another_width_on_a_later_call_moves_the_margin_and_stays_within_its_rows) {
    const BmpFile file = noise_bmp(rgb24, 3, 6, false);
    const Bytes whole = BmpSubject(file).expect({1, 0, 0, 3, 6}).output;
    TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
    ImageDecodeInfo info{};
    info.input = &source.source;
    info.outputFormat = 1;
    GuardedBuffer memory;
    int32_t row = 0;
    for (const int32_t width : {3, 7, 4, 2, 1, 0}) { // below the image's width nothing is written
        const size_t size = static_cast<size_t>(width * 3);
        uint8_t *const output = memory.take(size, Edge::end);
        std::fill_n(output, size, background);
        EXPECT_EQ(ZOTARPELMI_DecodeBMPLine(&info, output, width, 6, 1), 1);
        EXPECT_TRUE(memory.intact());
        Bytes expected(size, background);
        if (width >= 3) std::copy_n(whole.begin() + row * 9, 9, expected.begin() + (width - 3) / 2 * 3);
        EXPECT_EQ(Bytes(output, output + size), expected) << "width " << width;
        ++row;
    }
    EXPECT_EQ(info.decoderState, nullptr);
}

TEST_F(BmpLine, a_band_whose_rows_are_too_long_to_step_over_is_passed_over) {
    for (const uint32_t format : {0u, 1u, 7u}) {
        host.reset();
        const BmpFile file = noise_bmp(rgb24, 3, 4, false);
        const Bytes whole = BmpSubject(file).expect({format, 0, 0, 3, 4}).output;
        TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
        ImageDecodeInfo info{};
        info.input = &source.source;
        info.outputFormat = format;
        uint8_t byte = background; // of a buffer that nothing may be written to
        EXPECT_EQ(ZOTARPELMI_DecodeBMPLine(&info, &byte, 1 << 30, 4, 2), 1);
        EXPECT_EQ(byte, background);
        Bytes output(whole.size() / 2, background);
        EXPECT_EQ(ZOTARPELMI_DecodeBMPLine(&info, output.data(), 3, 4, 2), 1);
        EXPECT_EQ(output, Bytes(whole.end() - static_cast<ptrdiff_t>(output.size()), whole.end()));
    }
}

TEST_F(BmpLine, a_null_output_passes_over_the_band) {
    const BmpFile file = noise_bmp(rgb24, 3, 4, false);
    TestSource source(PELM_SOURCE_STREAM, file_bytes(file));
    ImageDecodeInfo info{};
    info.input = &source.source;
    info.outputFormat = 1;
    Bytes output(18, background);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPLine(&info, nullptr, 3, 4, 2), 1);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPLine(&info, output.data(), 3, 4, 2), 1);
    const Bytes whole = BmpSubject(file).expect({1, 0, 0, 3, 4}).output;
    EXPECT_EQ(output, Bytes(whole.begin() + 18, whole.end()));
}

TEST_F(BmpLine, other_formats_and_depths_write_nothing) {
    BmpFile file = noise_bmp(rgb24, 9, 7, false);
    Lines other_format(file, PELM_SOURCE_MEMORY, {4, 0, 0, 9, 7});
    EXPECT_EQ(other_format.decode(7, 252), 1);
    EXPECT_EQ(other_format.band(), Bytes(252, background));
    file.bits = 2;
    Lines other_depth(file, PELM_SOURCE_MEMORY, {1, 0, 0, 9, 7});
    EXPECT_EQ(other_depth.decode(7, 189), 1);
    EXPECT_EQ(other_depth.band(), Bytes(189, background));
    EXPECT_TRUE(host.live_blocks().empty());
}

TEST_F(BmpLine, a_decode_begun_by_lines_writes_nothing_when_iterated_and_the_other_way_round_lines_work) {
    const BmpFile file = noise_bmp(rgb24, 3, 4, false);
    const Bytes whole = BmpSubject(file).expect({1, 0, 0, 3, 4}).output;
    TestSource source(PELM_SOURCE_MEMORY, file_bytes(file));
    ImageDecodeInfo info{};
    info.input = &source.source;
    info.outputFormat = 1;
    Bytes band(18, background);
    Bytes all(36, background);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPLine(&info, band.data(), 3, 4, 2), 1);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, all.data(), 3, 4, 2), 1);
    EXPECT_EQ(all, Bytes(36, background));
    EXPECT_EQ(info.decoderState, nullptr);

    EXPECT_EQ(ZOTARPELMI_DecodeBMPIterLine(&info, all.data(), 3, 4, 2), 1);
    EXPECT_EQ(ZOTARPELMI_DecodeBMPLine(&info, band.data(), 3, 4, 2), 1);
    EXPECT_EQ(Bytes(all.begin(), all.begin() + 18), Bytes(whole.begin(), whole.begin() + 18));
    EXPECT_EQ(band, Bytes(whole.begin() + 18, whole.end()));
    EXPECT_EQ(info.decoderState, nullptr);
}

TEST_F(BmpLine, the_box_is_no_buffer_and_may_be_of_any_height) {
    for (const auto &[width, height] : {std::pair{100, INT_MAX}, std::pair{30000, 200000}}) {
        const BmpRequest request{7, 0, 0, width, height};
        Lines lines(noise_bmp(rgb24, 10, 10, false), PELM_SOURCE_MEMORY, request);
        EXPECT_EQ(lines.decode(2, static_cast<size_t>(width) * 8), 1);
        const Bytes untouched(lines.band().size(), background);
        EXPECT_NE(lines.band(), untouched);
        EXPECT_NE(lines.info().decoderState, nullptr);
        EXPECT_EQ(lines.decode(8, static_cast<size_t>(width) * 32), 1);
        EXPECT_EQ(lines.info().decoderState, nullptr);
    }
}

} // namespace
} // namespace pelm::test
