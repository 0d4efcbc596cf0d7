#include <gtest/gtest.h>

#include "tests/png/inner/parse.h"

namespace pelm::test {

namespace {

using Keys = std::vector<uint16_t>;

Png png_with_trns(uint8_t colour_type, uint8_t depth, const Bytes &trns) {
    Png png = small_png(colour_type, depth);
    png.trns = trns;
    return png;
}

Keys keys_of(const PngDecodeState &state) {
    return {state.transparentKeyRed, state.transparentKeyGreen, state.transparentKeyBlue};
}

// The chunk's data alone, read by its own function.
struct Direct {
    Direct(const Bytes &trns, uint8_t colour_type, uint8_t depth, uint32_t seen)
        : source(PELM_SOURCE_MEMORY, trns), length(static_cast<uint32_t>(trns.size())) {
        input.source = &source.source;
        input.data = source.source.data;
        input.sourceSize = input.bytesLeft = length;
        record.colourType = colour_type;
        record.bitDepth = depth;
        record.chunkSeenFlags = seen;
    }
    uint32_t read() { return __PELMI_PngParseTRNSbKGd(&record, &input, length, 0x74524E53, &target); }

    TestSource source;
    uint32_t length;
    PngInputBuffer input{};
    PngDecodeState record{}, target{};
};

} // namespace

TEST(Transparency, the_key_of_grey_is_the_low_byte_of_its_sample) {
    struct Case {
        uint8_t depth;
        Bytes trns;
        uint16_t key;
    };
    for (const Case &one : {Case{1, {0, 0}, 0},
                            {1, {0, 1}, 255},
                            {1, {1, 0}, 0},
                            {1, {0, 2}, 255},
                            {2, {0, 3}, 192},
                            {2, {0, 1}, 64},
                            {2, {9, 0}, 0},
                            {4, {0, 15}, 240},
                            {4, {0, 1}, 16},
                            {8, {0, 200}, 200},
                            {8, {3, 200}, 200},
                            {16, {1, 2}, 2},
                            {16, {0xFF, 0}, 0},
                            {16, {0, 0xFF}, 255}})
        for (const uint32_t kind : source_kinds) {
            Parse parse(build(png_with_trns(0, one.depth, one.trns)), kind);
            EXPECT_EQ(parse.run(), PNG_DONE);
            EXPECT_EQ(keys_of(parse.state), (Keys{one.key, one.key, one.key}))
                << "depth " << int{one.depth} << " tRNS " << testing::PrintToString(one.trns);
            EXPECT_EQ(parse.state.ancillaryFlags, uint32_t{PNG_HAS_TRNS});
        }
}

TEST(Transparency, the_key_of_rgb_is_the_whole_value_at_8_bits_and_the_high_byte_at_16) {
    const Bytes trns = {1, 2, 3, 4, 5, 6};
    for (const uint32_t kind : source_kinds) {
        Parse wide(build(png_with_trns(2, 16, trns)), kind);
        EXPECT_EQ(wide.run(), PNG_DONE);
        EXPECT_EQ(keys_of(wide.state), (Keys{1, 3, 5}));
    }
    Parse narrow(build(png_with_trns(2, 8, trns)), PELM_SOURCE_MEMORY);
    EXPECT_EQ(narrow.run(), PNG_DONE);
    EXPECT_EQ(keys_of(narrow.state), (Keys{0x0102, 0x0304, 0x0506}));
}

TEST(Transparency, samples_are_kept_at_full_width_as_well) {
    struct Case {
        uint8_t colour_type;
        Bytes trns;
        Keys samples;
    };
    for (const Case &one :
         {Case{0, {1, 2}, {0x0102, 0x0102, 0x0102}}, {2, {1, 2, 3, 4, 5, 6}, {0x0102, 0x0304, 0x0506}}}) {
        Parse parse(build(png_with_trns(one.colour_type, 16, one.trns)), PELM_SOURCE_MEMORY);
        EXPECT_EQ(parse.run(), PNG_DONE);
        EXPECT_EQ(Keys(parse.state.transparentSamples, parse.state.transparentSamples + 3), one.samples);
    }
}

TEST(Transparency, a_key_of_another_length_is_refused) {
    for (size_t length = 0; length <= 8; ++length) {
        Png grey = png_with_trns(0, 8, Bytes(length)), rgb = png_with_trns(2, 8, Bytes(length));
        for (Png *const png : {&grey, &rgb}) { // behind the image data, where an empty chunk would be no error
            png->after_idat = {{"tRNS", *png->trns}};
            png->trns.reset();
        }
        for (const uint32_t kind : source_kinds) {
            EXPECT_EQ(parsed(build(grey), kind), length == 2 ? PNG_DONE : PNG_FORMAT_ERROR) << length;
            EXPECT_EQ(parsed(build(rgb), kind), length == 6 ? PNG_DONE : PNG_FORMAT_ERROR) << length;
        }
        EXPECT_EQ(Direct(Bytes(length), 0, 8, 1).read(), length == 2 ? PNG_DONE : PNG_BAD_DATA);
        EXPECT_EQ(Direct(Bytes(length), 2, 8, 1).read(), length == 6 ? PNG_DONE : PNG_BAD_DATA);
    }
}

TEST(Transparency, next_to_an_alpha_channel_is_refused) {
    for (const uint8_t colour_type : Bytes{4, 6})
        for (const uint8_t depth : Bytes{8, 16})
            for (const size_t length : {0u, 2u, 6u}) {
                EXPECT_EQ(Direct(Bytes(length), colour_type, depth, 3).read(), PNG_BAD_DATA);
                for (const uint32_t kind : source_kinds)
                    EXPECT_EQ(parsed(build(png_with_trns(colour_type, depth, Bytes(length))), kind), PNG_FORMAT_ERROR);
            }
}

TEST(Transparency, before_the_header_is_refused) {
    for (const uint8_t colour_type : Bytes{0, 2, 3, 4, 6})
        EXPECT_EQ(Direct({0, 1}, colour_type, 8, 0).read(), PNG_TRNS_BEFORE_IHDR);
    EXPECT_EQ(Direct({0, 1}, 3, 8, PNG_SEEN_PLTE).read(), PNG_TRNS_BEFORE_IHDR);
    std::vector<Chunk> chunks = chunks_of(png_with_trns(0, 8, {0, 1}));
    std::swap(chunks[0], chunks[1]);
    for (const uint32_t kind : source_kinds)
        EXPECT_EQ(parsed(file_of(chunks), kind), PNG_FORMAT_ERROR);
}

TEST(Transparency, of_a_palette_before_the_palette_is_refused) {
    EXPECT_EQ(Direct({1}, 3, 8, PNG_SEEN_IHDR).read(), PNG_BAD_DATA);
    EXPECT_EQ(Direct({}, 3, 8, PNG_SEEN_IHDR).read(), PNG_BAD_DATA);
    std::vector<Chunk> chunks = chunks_of(png_with_trns(3, 8, {1}));
    std::swap(chunks[1], chunks[2]);
    for (const uint32_t kind : source_kinds)
        EXPECT_EQ(parsed(file_of(chunks), kind), PNG_FORMAT_ERROR);
}

TEST(Transparency, of_a_palette_fills_its_first_entries) {
    for (size_t count = 1; count <= 4; ++count) {
        Png png = png_with_trns(3, 8, {0, 1, 128, 255});
        png.trns->resize(count);
        png.plte = Bytes(12, 1);
        for (const uint32_t kind : source_kinds) {
            Parse parse(build(png), kind);
            EXPECT_EQ(parse.run(), PNG_DONE);
            EXPECT_EQ(parse.state.ancillaryFlags, uint32_t{PNG_HAS_TRNS});
            for (size_t i = 0; i < 4; ++i)
                EXPECT_EQ(parse.state.paletteAlpha[i], i < count ? (*png.trns)[i] : 0xFFFF) << "entry " << i;
        }
    }
}

TEST(Transparency, of_a_palette_that_is_too_long_stays_within_its_block) {
    for (const size_t entries : {1u, 2u, 10u, 85u, 86u, 256u})
        for (const size_t length : {entries, entries + 1, 3 * entries, 3 * entries + 1, size_t{256}, size_t{1000}}) {
            Png png = png_with_trns(3, 8, Bytes(length));
            for (size_t i = 0; i < length; ++i)
                (*png.trns)[i] = static_cast<uint8_t>(i + 3);
            png.plte = Bytes(3 * entries, 1);
            for (const uint32_t kind : source_kinds) {
                Parse parse(build(png), kind);
                EXPECT_EQ(parse.run(), PNG_DONE) << length << " alphas of " << entries << " entries";
                for (size_t i = 0; i < std::min(entries, length); ++i)
                    ASSERT_EQ(parse.state.paletteAlpha[i], static_cast<uint8_t>(i + 3));
            } // the host finds what was written outside
        }
}

TEST(Transparency, an_empty_one_of_a_palette_is_accepted_and_ends_the_file) {
    EXPECT_EQ(Direct({}, 3, 8, PNG_SEEN_IHDR | PNG_SEEN_PLTE).read(), PNG_DONE);
    Png png = small_png(3, 8);
    png.has_iend = false;
    png.after_idat = {{"tRNS", {}}};
    for (const uint32_t kind : source_kinds) {
        Parse parse(build(png), kind);
        EXPECT_EQ(parse.run(), PNG_DONE);
        EXPECT_EQ(parse.state.ancillaryFlags, uint32_t{PNG_HAS_TRNS});
    }
}

TEST(Transparency, behind_the_image_data_and_repeated_the_last_one_wins) {
    Png png = png_with_trns(0, 8, {0, 1});
    png.after_idat = {{"tRNS", {0, 77}}};
    for (const uint32_t kind : source_kinds) {
        Parse parse(build(png), kind);
        EXPECT_EQ(parse.run(), PNG_DONE);
        EXPECT_EQ(parse.state.transparentKeyGreen, 77u);
    }
    Png palette = png_with_trns(3, 8, {9, 9});
    palette.after_idat = {{"tRNS", {5}}};
    Parse parse(build(palette), PELM_SOURCE_MEMORY);
    EXPECT_EQ(parse.run(), PNG_DONE);
    EXPECT_EQ(parse.state.paletteAlpha[0], 5u);
    EXPECT_EQ(parse.state.paletteAlpha[1], 9u);
}

TEST(Transparency, the_key_goes_to_the_target_and_only_the_data_is_read) {
    Direct grey({0, 42}, 0, 8, PNG_SEEN_IHDR);
    EXPECT_EQ(grey.read(), PNG_DONE);
    EXPECT_EQ(keys_of(grey.target), (Keys{42, 42, 42}));
    EXPECT_EQ(keys_of(grey.record), (Keys{0, 0, 0}));
    EXPECT_EQ(grey.input.bytesLeft, 0u);
    EXPECT_EQ(grey.target.ancillaryFlags, 0u); // which is the parser's to set

    Direct rgb({0, 1, 0, 2, 0, 3}, 2, 8, PNG_SEEN_IHDR);
    EXPECT_EQ(rgb.read(), PNG_DONE);
    EXPECT_EQ(keys_of(rgb.target), (Keys{1, 2, 3}));
}

TEST(Transparency, without_it_there_is_no_flag) {
    for (const uint8_t colour_type : Bytes{0, 2, 3, 4, 6}) {
        Parse parse(build(small_png(colour_type, 8)), PELM_SOURCE_MEMORY);
        EXPECT_EQ(parse.run(), PNG_DONE);
        EXPECT_EQ(parse.state.ancillaryFlags, 0u);
    }
}

} // namespace pelm::test
