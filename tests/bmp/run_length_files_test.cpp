// Run-length files of an own encoder, and of noise, from every source and in every direction; and their memory.
#include "bmp/working.h"
#include "tests/bmp/coded.h"
#include "tests/support/quick.h"

namespace pelm::test {
namespace {

class BmpRunLengthFiles : public HostedTest {};

// Indices that come in runs as well as singly.
Picture runny_picture(int32_t width, int32_t height, int bits, Noise &noise) {
    Picture picture(static_cast<size_t>(height));
    for (auto &row : picture)
        while (row.size() < static_cast<size_t>(width)) {
            const uint32_t indices[2] = {noise.below(1u << bits), noise.below(1u << bits)};
            const uint32_t length = 1 + noise.below(noise.below(3) == 0 ? 40 : 4);
            for (uint32_t i = 0; i < length && row.size() < static_cast<size_t>(width); ++i)
                row.push_back(noise.below(9) == 0 ? 0 : indices[i % static_cast<uint32_t>(bits == 4 ? 2 : 1)]);
        }
    return picture;
}

CodeHabits any_habits(Noise &noise) {
    const auto maybe = [&] { return noise.below(2) == 0; };
    return {maybe(), maybe(), maybe(), maybe(), maybe()};
}

TEST_F(BmpRunLengthFiles, the_encoder_writes_what_the_model_reads) {
    Noise noise(7);
    for (int i = 0; i < 500; ++i) {
        const int bits = i % 2 == 0 ? 8 : 4;
        const int32_t width = static_cast<int32_t>(1 + noise.below(40));
        const Picture rows = runny_picture(width, 5, bits, noise);
        const Bytes codes = run_length_codes(rows, bits, noise, any_habits(noise));
        ASSERT_EQ(expanded_rows(codes, bits, width, 5), rows) << ::testing::PrintToString(codes);
    }
}

TEST_F(BmpRunLengthFiles, pictures_of_every_small_size_from_every_source) {
    Noise noise(11);
    const int32_t most = quick() ? 9 : 33;
    for (const int bits : {4, 8})
        for (int32_t width = 1; width <= most; ++width)
            for (const bool top_down : {false, true})
                for (const uint32_t kind : all_kinds) {
                    const int32_t height = static_cast<int32_t>(1 + noise.below(20));
                    const Bytes codes =
                        run_length_codes(runny_picture(width, height, bits, noise), bits, noise, any_habits(noise));
                    Coded coded(bits, width, top_down ? -height : height, codes, kind,
                                static_cast<int32_t>(40 + noise.below(60)));
                    for (int turns = 0; turns < 4; ++turns)
                        for (const uint32_t format : bmp_formats) {
                            ASSERT_TRUE(coded.decodes(request_for(width, height, format, turns, 0, 2, 1)));
                            ASSERT_TRUE(coded.decodes(request_for(width, height, format, turns, 0x700, 3, -1)));
                            ASSERT_TRUE(
                                coded.decodes(request_for(width, height, format, turns, 0, -1, -2), Edge::start));
                        }
                }
}

TEST_F(BmpRunLengthFiles, codes_may_straddle_any_refill) {
    Noise noise(13);
    for (const int bits : {4, 8})
        for (int32_t width : {1, 3, 21, 300}) {
            const Bytes codes = run_length_codes(runny_picture(width, 6, bits, noise), bits, noise, any_habits(noise));
            const int32_t stride = (width * bits + 31) / 32 * 4;
            for (int32_t buffer = stride; buffer < stride + 40; buffer += stride)
                for (const uint32_t kind : stream_kinds) {
                    Coded coded(bits, width, 6, codes, kind, buffer);
                    ASSERT_TRUE(coded.decodes({1, 0, 0, width, 6}));
                    ASSERT_TRUE(coded.decodes({1, 0, 0, width, 4}));
                }
        }
}

TEST_F(BmpRunLengthFiles, reads_of_any_size_give_the_same_rows) {
    Noise noise(17);
    for (const int bits : {4, 8})
        for (const int32_t most : {1, 2, 3, 5, 7}) {
            const Bytes codes = run_length_codes(runny_picture(21, 6, bits, noise), bits, noise, any_habits(noise));
            Coded coded(bits, 21, 6, codes, PELM_SOURCE_SEQUENTIAL, 50);
            host.reset();
            host.faults.short_reads_from = 3; // header and palette come whole
            host.faults.most_per_read = most;
            const BmpRequest request{1, 0, 0, 21, 6};
            EXPECT_EQ(decode_by(two_steps(request), coded.source(), request, 378).output,
                      coded.model().expect(request, background).output)
                << most;
        }
}

TEST_F(BmpRunLengthFiles, codes_cut_anywhere_give_the_rows_that_are_ended) {
    Noise noise(19);
    for (const int bits : {4, 8}) {
        const Bytes codes = run_length_codes(runny_picture(17, 5, bits, noise), bits, noise, {});
        for (size_t length = 0; length <= codes.size(); ++length)
            for (const uint32_t kind : all_kinds)
                for (const bool top_down : {false, true}) {
                    const Bytes cut(codes.begin(), codes.begin() + static_cast<ptrdiff_t>(length));
                    Coded coded(bits, 17, top_down ? -5 : 5, cut, kind, 24);
                    ASSERT_TRUE(coded.decodes({1, 0, 0, 17, 5}));
                    ASSERT_TRUE(coded.decodes({1, 0, 0x700, 9, 7}));
                }
    }
}

TEST_F(BmpRunLengthFiles, codes_of_noise_are_read_as_the_rules_say) {
    Noise noise(23);
    const int runs = quick() ? 2000 : 20000;
    for (int i = 0; i < runs; ++i) {
        const int bits = i % 2 == 0 ? 8 : 4;
        Bytes codes(noise.below(400));
        for (uint8_t &byte : codes) // many escapes, and counts of every size
            byte = static_cast<uint8_t>(noise.below(3) == 0 ? 0 : noise.below(4) == 0 ? noise.next() : noise.below(5));
        const int32_t width = static_cast<int32_t>(1 + noise.below(noise.below(4) == 0 ? 300 : 12));
        const int32_t height = static_cast<int32_t>(1 + noise.below(20));
        Coded coded(bits, width, noise.below(2) == 0 ? -height : height, codes, all_kinds[noise.below(4)],
                    static_cast<int32_t>(300 + noise.below(60)));
        const BmpRequest request{bmp_formats[noise.below(6)], static_cast<int>(noise.below(4)),
                                 std::array{0u, 0x100u, 0x700u}[noise.below(3)],
                                 static_cast<int32_t>(1 + noise.below(40)), static_cast<int32_t>(1 + noise.below(40))};
        ASSERT_TRUE(coded.decodes(request, i % 3 == 0 ? Edge::start : Edge::end));
    }
}

TEST_F(BmpRunLengthFiles, the_row_decoders_find_the_rows_of_a_band_from_the_first_code_on) {
    Noise noise(29);
    for (const int bits : {4, 8})
        for (const bool top_down : {false, true})
            for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM})
                for (const int32_t box : {9, 6})
                    for (int32_t rows = 1; rows <= box + 1; ++rows) {
                        host.reset();
                        const Bytes codes = run_length_codes(runny_picture(9, 9, bits, noise), bits, noise, {});
                        Coded coded(bits, 9, top_down ? -9 : 9, codes, kind, 24);
                        InputSource &source = coded.source().source;
                        ImageDecodeInfo info{};
                        info.input = &source;
                        info.outputFormat = 1;
                        Bytes output(static_cast<size_t>(box * box * 3), background);
                        ASSERT_EQ(ZOTARPELMI_PreInitBMP(&info, 1), 1);
                        give_staging(source);
                        BmpState *const state = PELMI_BMP_InitializeSKIA(&info, box, box, output.data());
                        ASSERT_NE(state, nullptr);
                        const auto decode = bits == 8 ? PELMI_BMP_Decode8bitBMP : PELMI_BMP_Decode4bitBMP;
                        const int32_t step = top_down ? -state->rowStep : state->rowStep;
                        for (; state->rowsDone < box; state->rowsDone += rows)
                            EXPECT_EQ(decode(state, state->outputCursor + state->rowsDone * step, rows), 1);
                        PELMI_BMP_DeleteDecInfo(state);
                        EXPECT_EQ(output, coded.model().expect({1, 0, 0, box, box}, background).output)
                            << bits << " bits, bands of " << rows;
                        EXPECT_TRUE(host.live_blocks().empty());
                    }
}

TEST_F(BmpRunLengthFiles, the_row_decoder_tells_failed_reads_from_ended_data) {
    for (const uint32_t kind : stream_kinds)
        for (const bool fails : {false, true}) {
            host.reset();
            Coded coded(8, 4, 2, {4, 1, 0, 0, 4, 2}, kind, 4);
            InputSource &source = coded.source().source;
            ImageDecodeInfo info{};
            info.input = &source;
            Bytes output(16, background);
            ASSERT_EQ(ZOTARPELMI_PreInitBMP(&info, 1), 1);
            give_staging(source);
            BmpState *const state = PELMI_BMP_InitializeSKIA(&info, 4, 2, output.data());
            ASSERT_NE(state, nullptr);
            if (fails) host.faults.failing_reads_from = 4; // header, palette, and the first four codes
            EXPECT_EQ(PELMI_BMP_Decode8bitBMP(state, state->outputCursor, 2), fails ? 5 : 1);
            PELMI_BMP_DeleteDecInfo(state);
            EXPECT_TRUE(host.live_blocks().empty());
        }
}

TEST_F(BmpRunLengthFiles, a_row_of_indices_is_allocated_while_rows_are_decoded) {
    for (const int bits : {4, 8})
        for (const uint32_t kind : all_kinds) {
            host.reset();
            Coded coded(bits, 13, 2, {13, 1, 0, 0, 13, 2, 0, 0}, kind, 64);
            const BmpRequest request{1, 0, 0x700, 5, 5};
            const BmpDecode decode = decode_by(two_steps(request), coded.source(), request, 75);
            std::vector<uint32_t> expected{sizeof(BmpState)};
            if (kind == PELM_SOURCE_STREAM || kind == PELM_SOURCE_STREAM_ALT) expected.push_back(64); // the test's
            expected.insert(expected.end(), {1024, 5 * 8});
            if (kind == PELM_SOURCE_SEQUENTIAL) expected.push_back(64);
            expected.push_back(13);
            EXPECT_EQ(host.allocations, expected);
            EXPECT_TRUE(decode.live_blocks.empty());
        }
}

TEST_F(BmpRunLengthFiles, every_failing_allocation_releases_everything) {
    for (const int bits : {4, 8})
        for (const uint32_t kind : all_kinds)
            for (size_t failing = 0; failing < 4; ++failing) {
                host.reset();
                Coded coded(bits, 13, 2, {13, 1, 0, 0, 13, 2, 0, 0}, kind, 64);
                ImageDecodeInfo info{};
                info.input = &coded.source().source;
                info.outputFormat = 1;
                Bytes output(78, background);
                ASSERT_EQ(ZOTARPELMI_PreInitBMP(&info, 1), 1);
                give_staging(coded.source().source);
                std::vector<uint32_t> blocks = host.allocations; // so far; then those of the second step
                const size_t before = blocks.size();
                blocks.insert(blocks.end(), {1024, 13 * 8});
                if (kind == PELM_SOURCE_SEQUENTIAL) blocks.push_back(64);
                blocks.push_back(13);
                if (before + failing >= blocks.size()) continue;

                host.faults.failing_allocation = static_cast<int>(before + failing + 1);
                // What the row decoder allocates is not looked at.
                EXPECT_EQ(ZOTARPELMI_DecodeBMPSKIA(&info, output.data(), 13, 2), failing < 2 ? 0 : 1);
                blocks.resize(before + failing + 1);
                EXPECT_EQ(host.allocations, blocks) << "it goes on without";
                EXPECT_EQ(output, Bytes(78, background));
                EXPECT_TRUE(host.live_blocks().empty());
            }
}

} // namespace
} // namespace pelm::test
