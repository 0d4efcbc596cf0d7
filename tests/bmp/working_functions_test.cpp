// The exported working functions called directly: pixel writers with every step and alignment, and row decoders on
// bands of rows.
#include <cstring>
#include <functional>

#include "bmp/working.h"
#include "tests/bmp/expectations.h"

namespace pelm::test {
namespace {

constexpr int32_t steps_in_pixels[] = {1, -1, 3, -3, 0};
constexpr uint32_t no_formats[] = {2, 3, 4, 9, 10, 11, 12, 0x100, 0xFFFFFFFF};

class BmpWriters : public HostedTest {
protected:
    // Calls `write(output, step, format)` for every format, step and alignment, and compares with `pixels` converted.
    // Places between the pixels must keep the background.
    using Write = std::function<void(void *output, int32_t step, uint32_t format)>;
    using Packed = std::function<std::array<uint8_t, 4>(size_t pixel, uint32_t format)>;

    static void expect_written(size_t count, const Write &write, const Packed &packed) {
        for (const uint32_t format : bmp_formats)
            for (const int32_t step : steps_in_pixels)
                for (size_t alignment = 0; alignment < 4; ++alignment)
                    expect_one(count, write, packed, format, step, alignment);
        for (const uint32_t format : no_formats) {
            Bytes memory(4 * count + 4, background);
            write(memory.data(), 4, format);
            EXPECT_EQ(memory, Bytes(memory.size(), background)) << "format " << format;
        }
    }

    static void expect_one(size_t count, const Write &write, const Packed &packed, uint32_t format, int32_t step,
                           size_t alignment) {
        const int32_t size = bytes_per_pixel(format);
        const ptrdiff_t distance = ptrdiff_t{step} * size; // in bytes
        const size_t span = (count > 0 ? count - 1 : 0) * static_cast<size_t>(std::abs(distance));
        const size_t first = 8 + alignment + (distance < 0 ? span : 0);
        Bytes expected(span + 32, background);
        for (size_t i = 0; i < count; ++i) {
            const auto pixel = packed(i, format);
            std::copy_n(pixel.begin(), size,
                        expected.begin() + static_cast<ptrdiff_t>(first) + static_cast<ptrdiff_t>(i) * distance);
        }
        Bytes memory(span + 32, background);
        write(memory.data() + first, format == 0 ? step : step * size, format);
        EXPECT_EQ(memory, expected) << "format " << format << ", " << count << " pixels, step of " << step
                                    << " pixel(s), " << alignment << " bytes off";
    }

    // A row whose last byte lies against an inaccessible page.
    const uint8_t *guarded(const Bytes &row) {
        uint8_t *const area = memory_.take(row.size(), Edge::end);
        std::copy(row.begin(), row.end(), area);
        return area;
    }

private:
    GuardedBuffer memory_;
};

Rgb palette_color(const Bytes &palette, uint32_t index) {
    return {palette[4 * index + 2], palette[4 * index + 1], palette[4 * index]};
}

TEST_F(BmpWriters, indexed_writers_look_colours_up) {
    for (const uint16_t bits : {uint16_t{1}, uint16_t{4}, uint16_t{8}}) {
        const Bytes palette = noise_palette(1u << bits, 9);
        for (int32_t count = 0; count <= 35; ++count) {
            const std::vector<uint32_t> pixels = noise_picture(count, 1, bits, 6)[0];
            const uint8_t *const row = guarded(pack_row(pixels, bits));
            const auto write = [&](void *output, int32_t step, uint32_t format) {
                if (bits == 1)
                    PELMI_BMP_Write1bitOutput(row, output, count, step, palette.data(), format);
                else if (bits == 4)
                    PELMI_BMP_Write4bitOutput(row, output, count, step, palette.data(), format);
                else
                    PELMI_BMP_Write8bitOutput(row, output, count, step, palette.data(), format);
            };
            expect_written(pixels.size(), write, [&](size_t i, uint32_t format) {
                return packed_pixel(palette_color(palette, pixels[i]), format);
            });
        }
    }
}

TEST_F(BmpWriters, the_one_bit_writer_returns_where_it_stopped) {
    const Bytes row(5, 0x35);
    const Bytes palette = noise_palette(2, 1);
    for (const int32_t count : {0, 1, 7, 8, 9, 10, 16, 33})
        for (const uint32_t format : bmp_formats)
            for (const int32_t pixels : {1, -2, 4}) {
                const int32_t size = bytes_per_pixel(format);
                Bytes memory(2 * 33 * 4 * 5);
                uint8_t *const output = memory.data() + 33 * 4 * 4;
                const BmpStop stop = PELMI_BMP_Write1bitOutput(
                    row.data(), output, count, format == 0 ? pixels : pixels * size, palette.data(), format);
                EXPECT_EQ(stop.source - row.data(), count / 8) << count << " pixels";
                EXPECT_EQ(stop.output - output, ptrdiff_t{count} * pixels * size)
                    << count << " pixels, format " << format;
            }
}

TEST_F(BmpWriters, the_24_and_32_bit_writers_reorder_bytes) {
    for (const uint16_t bits : {uint16_t{24}, uint16_t{32}})
        for (int32_t count = 0; count <= 19; ++count) {
            const std::vector<uint32_t> pixels = noise_picture(count, 1, bits, 8)[0];
            const uint8_t *const row = guarded(pack_row(pixels, bits));
            const auto write = [&](void *output, int32_t step, uint32_t format) {
                if (bits == 24)
                    PELMI_BMP_Write24bitOutput(row, output, count, step, format);
                else
                    PELMI_BMP_Write32bitOutput(row, output, count, step, format);
            };
            expect_written(pixels.size(), write, [&](size_t i, uint32_t format) {
                const Rgb color{static_cast<uint8_t>(pixels[i] >> 16), static_cast<uint8_t>(pixels[i] >> 8),
                                static_cast<uint8_t>(pixels[i])};
                return packed_pixel(color, format);
            });
        }
}

// The conversion of a 16-bit pixel, with masks and shifts of any value.
struct Fields {
    uint32_t masks[3];
    uint32_t shifts[3];
};

uint32_t field(uint32_t pixel, const Fields &fields, int i) {
    return fields.shifts[i] >= 32 ? 0 : (pixel & fields.masks[i]) << fields.shifts[i];
}

std::array<uint8_t, 4> packed_16(uint32_t pixel, const Fields &fields, uint32_t format) {
    const uint32_t r = field(pixel, fields, 0), g = field(pixel, fields, 1), b = field(pixel, fields, 2);
    const auto byte = [](uint32_t value) { return static_cast<uint8_t>(value); };
    const uint8_t red = byte(r >> 8), green = byte(g >> 3), blue = byte(b << 3);
    const uint32_t value = r | g | b;
    switch (format) {
    case 0: return {byte(value), byte(value >> 8)};
    case 1: return {red, green, blue};
    case 5: return {255, red, green, blue};
    case 6: return {byte(value), byte(value >> 8), 255};
    case 7: return {red, green, blue, 255};
    default: return {blue, green, red, 255};
    }
}

TEST_F(BmpWriters, the_16_bit_writer_takes_any_masks_and_shifts) {
    const Fields cases[] = {
        {{0xF800, 0x07E0, 0x001F}, {0, 0, 0}},           {{0x7C00, 0x03E0, 0x001F}, {1, 1, 0}},
        {{0x0F00, 0x00F0, 0x000F}, {4, 3, 1}},           {{0x001F, 0x07E0, 0xF800}, {11, 0, 0}},
        {{0xFFFF, 0xFFFF, 0xFFFF}, {0, 0, 0}},           {{0xFFFF, 0xFFFF, 0xFFFF}, {31, 30, 29}},
        {{0xFFFF, 0xFFFF, 0xFFFF}, {32, 33, 63}},        {{0xFFFF, 0x07E0, 0x001F}, {0xFFFFFFFF, 0x80000000, 64}},
        {{0xFFFFFFFF, 0xFFFF0000, 0x10000}, {0, 8, 16}}, {{0, 0, 0}, {0, 0, 0}},
        {{0xF800, 0x07E0, 0x001F}, {0, 32, 0}},
    };
    for (const Fields &fields : cases)
        for (const int32_t count : {0, 1, 2, 7, 18}) {
            const std::vector<uint32_t> pixels = noise_picture(count, 1, 16, 8)[0];
            const uint8_t *const row = guarded(pack_row(pixels, 16));
            const auto write = [&](void *output, int32_t step, uint32_t format) {
                PELMI_BMP_Write16bitOutput(row, output, count, step, fields.masks[0], fields.masks[1], fields.masks[2],
                                           fields.shifts[0], fields.shifts[1], fields.shifts[2], format);
            };
            expect_written(pixels.size(), write,
                           [&](size_t i, uint32_t format) { return packed_16(pixels[i], fields, format); });
        }
}

TEST_F(BmpWriters, the_16_bit_writer_converts_every_pixel_value) {
    for (const char *const name : {"sixteen_bits_565", "sixteen_bits_555", "sixteen_bits_444"}) {
        const std::string variant = name;
        const Fields fields = variant == "sixteen_bits_565"   ? Fields{{0xF800, 0x07E0, 0x001F}, {0, 0, 0}}
                              : variant == "sixteen_bits_555" ? Fields{{0x7C00, 0x03E0, 0x001F}, {1, 1, 0}}
                                                              : Fields{{0x0F00, 0x00F0, 0x000F}, {4, 3, 1}};
        std::vector<uint32_t> pixels;
        for (uint32_t pixel = 0; pixel < 0x10000; ++pixel)
            pixels.push_back(pixel);
        const Bytes row = pack_row(pixels, 16);
        for (const uint32_t format : bmp_formats) {
            const size_t size = static_cast<size_t>(bytes_per_pixel(format));
            Bytes output(pixels.size() * size);
            PELMI_BMP_Write16bitOutput(row.data(), output.data(), 0x10000, format == 0 ? 1 : static_cast<int32_t>(size),
                                       fields.masks[0], fields.masks[1], fields.masks[2], fields.shifts[0],
                                       fields.shifts[1], fields.shifts[2], format);
            for (const uint32_t pixel : pixels) {
                const auto expected = packed_16(pixel, fields, format);
                ASSERT_TRUE(std::equal(expected.begin(), expected.begin() + static_cast<ptrdiff_t>(size),
                                       output.begin() + static_cast<ptrdiff_t>(pixel * size)))
                    << name << ", pixel " << pixel << ", format " << format;
            }
        }
    }
}

TEST_F(BmpWriters, the_16_bit_writer_reads_rows_at_any_alignment) {
    const std::vector<uint32_t> pixels = noise_picture(9, 1, 16, 8)[0];
    const Bytes packed = pack_row(pixels, 16);
    Bytes memory(1);
    memory.insert(memory.end(), packed.begin(), packed.end());
    Bytes outputs[2] = {Bytes(27), Bytes(27)};
    PELMI_BMP_Write16bitOutput(packed.data(), outputs[0].data(), 9, 3, 0xF800, 0x07E0, 0x001F, 0, 0, 0, 1);
    PELMI_BMP_Write16bitOutput(memory.data() + 1, outputs[1].data(), 9, 3, 0xF800, 0x07E0, 0x001F, 0, 0, 0, 1);
    EXPECT_EQ(outputs[0], outputs[1]);
}

// A pixel from the sums of four samples a channel.
std::array<uint8_t, 4> packed_sums(uint32_t red_sum, uint32_t green_sum, uint32_t blue_sum, uint32_t format) {
    const Rgb mean{static_cast<uint8_t>(red_sum / 4), static_cast<uint8_t>(green_sum / 4),
                   static_cast<uint8_t>(blue_sum / 4)};
    return packed_pixel(mean, format, true);
}

TEST_F(BmpWriters, finished_accumulators_are_averaged) {
    std::vector<std::array<uint32_t, 3>> sums{{0, 0, 0},       {1020, 1020, 1020}, {1020, 0, 0}, {0, 1020, 0},
                                              {0, 0, 1020},    {3, 3, 3},          {4, 7, 8},    {1019, 1016, 1015},
                                              {512, 256, 128}, {31, 15, 33}};
    Noise noise(3);
    while (sums.size() < 40)
        sums.push_back({noise.below(1021), noise.below(1021), noise.below(1021)});
    std::vector<uint32_t> accumulators;
    for (const auto &[r, g, b] : sums)
        accumulators.push_back(r << 20 | g << 10 | b);
    for (const size_t count : {size_t{0}, size_t{1}, size_t{2}, sums.size()})
        expect_written(
            count,
            [&](void *output, int32_t step, uint32_t format) {
                PELMI_BMP_WriteResizedOutput(accumulators.data(), output, static_cast<int32_t>(count), step, format);
            },
            [&](size_t i, uint32_t format) { return packed_sums(sums[i][0], sums[i][1], sums[i][2], format); });
}

TEST_F(BmpWriters, every_sum_of_a_channel_is_averaged) {
    for (uint32_t sum = 0; sum <= 1020; ++sum)
        for (int channel = 0; channel < 3; ++channel) {
            const uint32_t word = sum << 10 * channel;
            for (const uint32_t format : bmp_formats) {
                std::array<uint8_t, 4> output{};
                PELMI_BMP_WriteResizedOutput(&word, output.data(), 1, 4, format);
                auto expected =
                    packed_sums(channel == 2 ? sum : 0, channel == 1 ? sum : 0, channel == 0 ? sum : 0, format);
                ASSERT_EQ(output, expected) << "sum " << sum << " of channel " << channel << ", format " << format;
            }
        }
}

TEST_F(BmpWriters, words_of_the_32_bit_scaler_are_written_as_they_are) {
    Noise noise(5);
    std::vector<uint32_t> words{0, 0xFFFFFFFF, 0xFFFCFCFC, 0x00FF0000, 0x0000FF00, 0x000000FF, 0xFF000000, 0x00070307};
    while (words.size() < 40)
        words.push_back(noise.next());
    for (const size_t count : {size_t{0}, size_t{1}, words.size()})
        expect_written(
            count,
            [&](void *output, int32_t step, uint32_t format) {
                PELMI_BMP_WriteResizedOutputWithAlpha(words.data(), output, static_cast<int32_t>(count), step, format);
            },
            [&](size_t i, uint32_t format) {
                return packed_pixel({static_cast<uint8_t>(words[i] >> 16), static_cast<uint8_t>(words[i] >> 8),
                                     static_cast<uint8_t>(words[i])},
                                    format);
            });
}

TEST_F(BmpWriters, a_count_below_0_writes_nothing) {
    const Bytes row(64), palette(1024);
    const uint32_t words[4] = {};
    for (const int32_t count : {-1, INT32_MIN}) {
        Bytes memory(64, background);
        uint8_t *const output = memory.data() + 32;
        for (const uint32_t format : bmp_formats) {
            PELMI_BMP_Write1bitOutput(row.data(), output, count, 4, palette.data(), format);
            PELMI_BMP_Write4bitOutput(row.data(), output, count, 4, palette.data(), format);
            PELMI_BMP_Write8bitOutput(row.data(), output, count, 4, palette.data(), format);
            PELMI_BMP_Write16bitOutput(row.data(), output, count, 4, 31, 31, 31, 0, 0, 0, format);
            PELMI_BMP_Write24bitOutput(row.data(), output, count, 4, format);
            PELMI_BMP_Write32bitOutput(row.data(), output, count, 4, format);
            PELMI_BMP_WriteResizedOutput(words, output, count, 4, format);
            PELMI_BMP_WriteResizedOutputWithAlpha(words, output, count, 4, format);
        }
        EXPECT_EQ(memory, Bytes(64, background));
    }
}

// ---- Row decoders on bands ----------------------------------------------------------------------------------------

class BmpBands : public HostedTest, public ::testing::WithParamInterface<BmpVariant> {
protected:
    static int32_t decode_rows(BmpState *state, intptr_t cursor, int32_t rows) {
        switch (state->bitsPerPixel) {
        case 1: return PELMI_BMP_Decode1bitBMP(state, cursor, rows);
        case 4: return PELMI_BMP_Decode4bitBMP(state, cursor, rows);
        case 8: return PELMI_BMP_Decode8bitBMP(state, cursor, rows);
        case 16: return PELMI_BMP_Decode16bitBMP(state, cursor, rows);
        case 24: return PELMI_BMP_Decode24bitBMP(state, cursor, rows);
        default: return PELMI_BMP_Decode32bitBMP(state, cursor, rows);
        }
    }

    // Decodes in bands of `band` output rows, each placed where it belongs.
    static Bytes decode_in_bands(const BmpFile &file, uint32_t kind, const BmpRequest &request, int32_t band,
                                 size_t size) {
        TestSource source(kind, file_bytes(file), 100);
        Bytes output(size, background);
        ImageDecodeInfo info = marked_info(&source.source, request);
        BmpState *const state = PELMI_BMP_Initialize(&info, request.box_width, request.box_height, output.data());
        if (state == nullptr) return {};
        const intptr_t row_step = state->topDown != 0 ? -state->rowStep : state->rowStep;
        while (state->rowsDone < state->scaledHeight) {
            const int32_t rows = std::min(band, state->scaledHeight - state->rowsDone);
            EXPECT_EQ(decode_rows(state, state->outputCursor + row_step * state->rowsDone, rows), 1);
            state->rowsDone += rows;
        }
        PELMI_BMP_DeleteDecInfo(state);
        return output;
    }
};

TEST_P(BmpBands, bands_of_any_height_make_up_the_whole_picture) {
    for (const bool top_down : {false, true})
        for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT}) {
            BmpSubject subject(noise_bmp(GetParam(), 11, 13, top_down), kind, 100);
            for (const auto &[box_width, box_height] : {std::pair{11, 13}, {14, 15}, {7, 5}, {5, 12}, {9, 31}, {30, 7}})
                for (const uint32_t placement : {0u, 0x100u, 0x700u})
                    for (int turns = 0; turns < 4; ++turns)
                        for (const int32_t band : {1, 2, 3, 5, 100}) {
                            const BmpRequest request{7, turns, placement, box_width, box_height};
                            const BmpExpectation expected = subject.expect(request);
                            if (placement == 0x100 && turns % 2 == 1)
                                continue; // overlapping pixels: the order of bands matters
                            EXPECT_EQ(decode_in_bands(subject.file(), kind, request, band, expected.output.size()),
                                      expected.output)
                                << described(subject.file(), file_bytes(subject.file()).size()) << "; "
                                << described(request) << "; kind " << kind << ", bands of " << band;
                        }
        }
}

TEST_P(BmpBands, no_rows_write_nothing) {
    for (const uint32_t kind : all_kinds)
        for (const int32_t side : {20, 5}) {
            TestSource source(kind, file_bytes(noise_bmp(GetParam(), 11, 13, false)), 100);
            Bytes output(1200, background);
            ImageDecodeInfo info = marked_info(&source.source, {1, 0, 0, side, side});
            BmpState *const state = PELMI_BMP_Initialize(&info, side, side, output.data());
            ASSERT_NE(state, nullptr);
            decode_rows(state, state->outputCursor, 0);
            EXPECT_EQ(output, Bytes(1200, background));
            PELMI_BMP_DeleteDecInfo(state);
        }
}

TEST_P(BmpBands, a_decoder_for_another_depth_does_nothing) {
    TestSource source(PELM_SOURCE_MEMORY, file_bytes(noise_bmp(GetParam(), 11, 13, false)));
    Bytes output(1200, background);
    ImageDecodeInfo info = marked_info(&source.source, {1, 0, 0, 20, 20});
    BmpState *const state = PELMI_BMP_Initialize(&info, 20, 20, output.data());
    ASSERT_NE(state, nullptr);
    using Decoder = int32_t(BmpState *, intptr_t, int32_t);
    const std::pair<uint32_t, Decoder *> decoders[] = {{1, PELMI_BMP_Decode1bitBMP},   {4, PELMI_BMP_Decode4bitBMP},
                                                       {8, PELMI_BMP_Decode8bitBMP},   {16, PELMI_BMP_Decode16bitBMP},
                                                       {24, PELMI_BMP_Decode24bitBMP}, {32, PELMI_BMP_Decode32bitBMP}};
    for (const auto &[depth, decoder] : decoders) {
        if (depth == state->bitsPerPixel) continue;
        EXPECT_EQ(decoder(state, state->outputCursor, 13), 1) << depth;
    }
    EXPECT_EQ(output, Bytes(1200, background));
    PELMI_BMP_DeleteDecInfo(state);
}

TEST_P(BmpBands, a_cursor_outside_the_buffer_writes_nothing) {
    for (const intptr_t cursor : {intptr_t{-5000}, intptr_t{5000}, intptr_t{1} << 29, -(intptr_t{1} << 29)})
        for (const int32_t side : {20, 5}) {
            TestSource source(PELM_SOURCE_MEMORY, file_bytes(noise_bmp(GetParam(), 11, 13, false)));
            GuardedBuffer memory;
            const size_t size = static_cast<size_t>(side * side * 3);
            uint8_t *const output = memory.take(size, Edge::end);
            memset(output, background, size);
            ImageDecodeInfo info = marked_info(&source.source, {1, 0, 0, side, side});
            BmpState *const state = PELMI_BMP_Initialize(&info, side, side, output);
            ASSERT_NE(state, nullptr);
            decode_rows(state, cursor, state->scaledHeight);
            EXPECT_EQ(Bytes(output, output + size), Bytes(size, background));
            EXPECT_TRUE(memory.intact());
            PELMI_BMP_DeleteDecInfo(state);
        }
}

TEST_P(BmpBands, a_cursor_between_pixels_drops_those_that_stick_out) {
    for (const uint32_t format : bmp_formats)
        for (const auto &[box_width, box_height] : {std::pair{11, 13}, {5, 4}})
            for (int turns = 0; turns < 4; turns += 2)
                for (const intptr_t shift : {-1, 1}) {
                    const BmpRequest request{format, turns, 0x700, box_width, box_height};
                    BmpSubject subject(noise_bmp(GetParam(), 11, 13, false));
                    const Bytes whole = subject.expect(request).output;
                    const ptrdiff_t pixel = bytes_per_pixel(format);
                    // Everything one byte further on, without the pixel that would be cut.
                    Bytes expected(whole.size(), background);
                    if (shift > 0)
                        std::copy(whole.begin(), whole.end() - pixel, expected.begin() + 1);
                    else
                        std::copy(whole.begin() + pixel, whole.end(), expected.begin() + pixel - 1);

                    TestSource source(PELM_SOURCE_MEMORY, file_bytes(subject.file()));
                    GuardedBuffer memory;
                    uint8_t *const output = memory.take(whole.size(), shift > 0 ? Edge::end : Edge::start);
                    memset(output, background, whole.size());
                    ImageDecodeInfo info = marked_info(&source.source, request);
                    BmpState *const state = PELMI_BMP_Initialize(&info, box_width, box_height, output);
                    ASSERT_NE(state, nullptr);
                    EXPECT_EQ(decode_rows(state, state->outputCursor + shift, state->scaledHeight), 1);
                    EXPECT_EQ(Bytes(output, output + whole.size()), expected)
                        << described(request) << ", cursor moved by " << shift;
                    EXPECT_TRUE(memory.intact());
                    PELMI_BMP_DeleteDecInfo(state);
                }
}

INSTANTIATE_TEST_SUITE_P(Variants, BmpBands, ::testing::ValuesIn(bmp_variants),
                         [](const auto &variant) { return std::string(variant.param.name); });

} // namespace
} // namespace pelm::test
