// Deflate streams in PNG files, in chunks of every size, with too many and too few rows: by every call and from every
// kind of source the rows that the model says.
#include <gtest/gtest.h>

#include "tests/png/support/png_builder.h"
#include "tests/sweeps/decodes.h"
#include "tests/sweeps/streams/inflate_ways.h"
#include "tests/sweeps/streams/mixed_streams.h"
#include "tests/sweeps/tally.h"

namespace pelm::sweeps {
namespace {

using test::Inflation;
using test::InflationEnd;

constexpr uint8_t background = 0x5C;

uint8_t paeth(int left, int above, int corner) {
    const int guess = left + above - corner;
    const int l = std::abs(guess - left), a = std::abs(guess - above), c = std::abs(guess - corner);
    return static_cast<uint8_t>(l <= a && l <= c ? left : a <= c ? above : corner);
}

// Required: unknown filters leave a row as it is, with its first byte 0 (docs/oddities.md, "Unknown filters").
Bytes unfiltered(const uint8_t *filtered, size_t size, size_t distance, const Bytes &before) {
    const uint8_t filter = filtered[0];
    Bytes row(filtered + 1, filtered + 1 + size);
    if (filter > 4) row[0] = 0;
    for (size_t i = 0; i < size && filter <= 4; ++i) {
        const uint8_t left = i < distance ? uint8_t{0} : row[i - distance];
        const uint8_t corner = i < distance ? uint8_t{0} : before[i - distance];
        const int predictions[] = {0, left, before[i], (left + before[i]) / 2, paeth(left, before[i], corner)};
        row[i] = static_cast<uint8_t>(row[i] + predictions[filter]);
    }
    return row;
}

// An image of three bytes per pixel, written in RGB888 at its own size: the bytes of its rows.
Bytes picture(const Inflation &inflation, uint32_t width, uint32_t height) {
    const size_t size = size_t{3} * width;
    Bytes output(size * height, background);
    Bytes before(size);
    for (uint32_t y = 0; y < height && (y + 1) * (size + 1) <= inflation.bytes.size(); ++y) {
        before = unfiltered(&inflation.bytes[y * (size + 1)], size, 3, before);
        std::copy(before.begin(), before.end(), output.begin() + static_cast<ptrdiff_t>(y * size));
    }
    return output;
}

struct Case {
    Bytes stream;
    uint32_t width, height;
    size_t chunks;
    Input input;
};

Case any_case(Random &random) {
    Case made;
    made.stream = short_mixed_stream(random, 1200);
    const bool is_damaged = random.one_in(2);
    if (is_damaged) made.stream = damaged(random, made.stream);
    if (random.one_in(5)) made.stream.resize(random.between(1, static_cast<uint32_t>(made.stream.size())));
    made.width = random.between(1, 20);
    made.height = random.between(1, 40);
    test::Png png{.width = made.width, .height = made.height, .colour_type = 2, .depth = 8};
    if (random.one_in(2)) png.idat_size = random.one_in(2) ? random.between(1, 4) : random.between(1, 300);
    made.chunks = png.idat_size == 0 ? 1 : (made.stream.size() + png.idat_size - 1) / png.idat_size;
    png.stream = made.stream;
    const auto width = static_cast<int32_t>(made.width), height = static_cast<int32_t>(made.height);
    made.input = {"png", fuzz::Format::png, width, height, build(png)};
    return made;
}

// A pause before the first row begins the stream anew (docs/oddities.md, "Iterative PNG decodes that start over").
bool pauses_too_early(const Case &made, const Inflation &inflation) {
    const bool is_last = inflation.end == InflationEnd::finished && inflation.block_ends.size() == 1;
    return !inflation.block_ends.empty() && !is_last && inflation.block_ends[0].bytes <= size_t{3} * made.width;
}

// Where data ends, memory and streams of one chunk go on with what follows it in the file.
bool ends_within_the_stream(const Inflation &inflation) {
    return inflation.end != InflationEnd::input_ended && inflation.end != InflationEnd::input_ended_stored;
}

class PngFiles : public testing::TestWithParam<uint32_t> {
protected:
    bool holds(const Case &made) {
        const Inflation inflation = model.inflate(made.stream);
        const bool succeeds = inflation.end == InflationEnd::finished || inflation.end == InflationEnd::bad_code;
        const Bytes expected = picture(inflation, made.width, made.height);
        for (const fuzz::Call &call : fuzz::decoding_calls(fuzz::Format::png)) {
            if (call.name == std::string("DecodePNGIter") && pauses_too_early(made, inflation)) continue;
            for (const uint32_t kind : {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_SEQUENTIAL}) {
                const bool is_known =
                    ends_within_the_stream(inflation) || (kind != PELM_SOURCE_MEMORY && made.chunks > 1);
                const Setting setting{.format = PELM_FORMAT_RGB888,
                                      .width = made.input.width,
                                      .height = made.input.height,
                                      .kind = kind,
                                      .rows = static_cast<int32_t>(random.between(1, made.height))};
                Bytes output(expected.size(), background);
                const Decode decode{&made.input, &call};
                const Outcome outcome = run(decode, setting, output);
                const bool is_clean = PelmTest_Violation() == nullptr && PelmTest_Counters()->liveBlocks == 0;
                PelmTest_Reset();
                ++decodes;
                EXPECT_TRUE(is_clean) << decode.name() << ", " << setting.name();
                if (!is_known) continue;
                EXPECT_EQ(outcome.results().back(), succeeds ? PELM_RESULT_DONE : PELM_RESULT_FAILED)
                    << decode.name() << ", " << setting.name();
                EXPECT_TRUE(output == expected) << decode.name() << ", " << setting.name();
                if (HasFailure()) return false;
            }
        }
        return true;
    }

    Random random{GetParam() + 700};
    test::InflateModel model;
    uint64_t decodes = 0;
};

TEST_P(PngFiles, are_decoded_as_the_model_inflates_them) {
    PelmTest_Reset();
    const uint32_t all = by_extent(30u, 300u, 3000u);
    for (uint32_t i = 0; i < all; ++i)
        if (!holds(any_case(random))) return;
    tell("decodes of PNG files of any streams", decodes, 3000 * 6);
}

INSTANTIATE_TEST_SUITE_P(Shards, PngFiles, testing::Range(0u, 4u));

} // namespace
} // namespace pelm::sweeps
