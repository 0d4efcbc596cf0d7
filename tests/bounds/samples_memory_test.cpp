// What decodes of the samples take from the host, block by block, against what docs/formats.md states.
#include <algorithm>
#include <numeric>

#include "bmp/state.h"
#include "frame/bytes.h"
#include "png/state.h"
#include "tests/bounds/samples.h"
#include "tests/bounds/ways.h"
#include "tests/bounds/work.h"
#include "tests/gif/support/gif_blocks.h"
#include "tests/png/support/memory.h"
#include "tests/png/support/png_builder.h"

namespace pelm::test {
namespace {

using SamplesMemory = BoundsTest;
using Blocks = std::vector<uint32_t>;

constexpr int32_t buffer_size = 4096; // that sources propose

Blocks bmp_blocks(const Bytes &file, uint32_t kind, Way way, uint32_t scaled_width, int32_t calls) {
    const uint32_t width = read_u32le(&file[18]), bits = read_u16le(&file[28]), offset = read_u32le(&file[10]);
    const uint32_t stride = (width * bits + 31) / 32 * 4;
    const uint32_t staging = std::max(buffer_size / stride * stride, stride);
    const bool seekable = kind == PELM_SOURCE_STREAM || kind == PELM_SOURCE_STREAM_ALT;
    Blocks blocks{sizeof(BmpState)};
    if (way == Way::bmp_two_steps && seekable) blocks.push_back(buffer_size); // the caller's
    if (bits <= 8) blocks.push_back(std::max(1024u, (offset - 54) / 4 * 4));
    if (way != Way::bmp_two_steps && seekable) blocks.push_back(staging);
    blocks.push_back(8 * scaled_width);
    if (kind == PELM_SOURCE_SEQUENTIAL)
        blocks.insert(blocks.end(), static_cast<size_t>(calls), std::max<uint32_t>(buffer_size, stride));
    return blocks;
}

Blocks wbmp_blocks(SampleSize size, uint32_t kind, uint32_t scaled_width) {
    Blocks blocks;
    if (kind == PELM_SOURCE_STREAM) blocks = {20, (size.width + 7) / 8};
    blocks.insert(blocks.end(), 2, 4 * scaled_width);
    return blocks;
}

Blocks png_blocks(const Bytes &file, SampleSize size, uint32_t kind, uint32_t scaled_width) {
    constexpr uint32_t channels[7] = {1, 0, 3, 1, 2, 0, 4};
    const uint32_t row = (size.width * file[24] * channels[file[25]] + 7) / 8 + 1;
    Blocks blocks{sizeof(PngDecodeState), sizeof(PngInputBuffer)};
    if (kind != PELM_SOURCE_MEMORY) blocks.push_back(16384);
    if (file[25] == 3) blocks.insert(blocks.end(), {768, 2 * read_u32be(&file[33])});
    blocks.insert(blocks.end(),
                  {2048 * sizeof(PngIdatEntry), 4 * size.width, 4 * scaled_width, 50008,
                   static_cast<uint32_t>(row_buffer_bytes(row, size.width)), window_bytes, sizeof(BlockCodes)});
    return blocks;
}

Blocks gif_blocks(SampleSize size, Way way) {
    Blocks blocks = way == Way::frames ? gif_request_tables : Blocks{};
    const bool animated = way == Way::frames || way == Way::frames_iterative;
    const Blocks state = animated ? gif_animated_blocks(size.width, size.height) : gif_still_blocks(size.width);
    blocks.insert(blocks.end(), state.begin(), state.end());
    return blocks;
}

std::vector<Way> ways_of(const Sample &sample) {
    if (sample.ends_with(".png")) return {std::begin(png_ways), std::end(png_ways)};
    if (sample.ends_with(".wbmp")) return {Way::wbmp};
    if (sample.ends_with(".bmp")) return {std::begin(bmp_ways), std::end(bmp_ways)};
    std::vector<Way> ways = {Way::gif, Way::gif_iterative, Way::frames, Way::frames_iterative};
    if (!sample.ends_with("interlaced.gif")) ways.push_back(Way::gif_lines);
    return ways;
}

std::vector<uint32_t> kinds_of(const Sample &sample) {
    if (sample.ends_with(".wbmp")) return {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM};
    return {std::begin(every_kind), std::end(every_kind)};
}

Blocks expected_blocks(const Sample &sample, const Asking &asking, Way way, const Decoded &decoded) {
    const SampleSize size = size_of(sample);
    const auto scaled_width = static_cast<uint32_t>(decoded.output_width);
    if (sample.ends_with(".png")) return png_blocks(sample.bytes, size, asking.kind, scaled_width);
    if (sample.ends_with(".gif")) return gif_blocks(size, way);
    if (sample.ends_with(".wbmp")) return wbmp_blocks(size, asking.kind, scaled_width);
    return bmp_blocks(sample.bytes, asking.kind, way, scaled_width, decoded.calls);
}

// All of it is alive at once, but for the buffer of sequential rows, which comes and goes with every call.
uint64_t peak_of(Blocks blocks, const Asking &asking, Way way, int32_t calls) {
    const bool is_bmp = std::find(std::begin(bmp_ways), std::end(bmp_ways), way) != std::end(bmp_ways);
    if (is_bmp && asking.kind == PELM_SOURCE_SEQUENTIAL) blocks.resize(blocks.size() - static_cast<size_t>(calls) + 1);
    return std::accumulate(blocks.begin(), blocks.end(), uint64_t{0});
}

TEST_F(SamplesMemory, every_decode_takes_what_is_stated_and_gives_it_back) {
    const std::vector<Sample> all = samples();
    ASSERT_GE(all.size(), 17u);
    for (const Sample &sample : all)
        for (const uint32_t kind : kinds_of(sample))
            for (const Way way : ways_of(sample)) {
                const SampleSize size = size_of(sample);
                const auto width = static_cast<int32_t>(size.width), height = static_cast<int32_t>(size.height);
                for (const Asking &asking :
                     {Asking{kind, 1, 0, width, height}, Asking{kind, 7, 0, width / 2, height / 2, 40},
                      Asking{kind, 0, 0x100, width / 3, height, 60}, Asking{kind, 8, 0x700, width / 2, height, 50}}) {
                    reset_work();
                    const Decoded decoded = decode(sample.bytes, way, asking);
                    const std::string what = sample.name + ", " + name_of(way) + ", kind " + std::to_string(kind) +
                                             ", box " + std::to_string(asking.width);
                    EXPECT_GE(decoded.result, 1) << what;
                    const Blocks expected = expected_blocks(sample, asking, way, decoded);
                    EXPECT_EQ(host.allocations, expected) << what;
                    EXPECT_EQ(work().peak_bytes, peak_of(expected, asking, way, decoded.calls)) << what;
                    EXPECT_TRUE(left_nothing()) << what;
                }
            }
}

TEST_F(SamplesMemory, a_refusal_that_leaks_grows_by_its_record_and_no_more) {
    BmpFile file = noise_bmp(variant_named("eight_bits"), 9, 9, false);
    file.header_size = 108;
    for (uint64_t count = 1; count <= 1000; ++count) {
        EXPECT_EQ(decode(file_bytes(file), Way::bmp, {PELM_SOURCE_MEMORY, 7, 0, 9, 9}).result, 0);
        ASSERT_EQ(host.live_bytes(), count * sizeof(BmpState));
    }
}

} // namespace
} // namespace pelm::test
