// Mutated PNG files beside libpng: what both read shows the same pixels, but for what docs/oddities.md states.
#include "tests/png/support/libpng_reader.h"
#include "tests/png/support/png_builder.h"
#include "tests/sweeps/mutations.h"
#include "tests/sweeps/peers/any_png.h"
#include "tests/sweeps/peers/comparison.h"
#include "tests/sweeps/tally.h"

namespace pelm::sweeps {
namespace {

using test::LibpngPicture;

uint32_t big_u32(const Bytes &bytes, size_t at) {
    return static_cast<uint32_t>(bytes[at]) << 24 | static_cast<uint32_t>(bytes[at + 1]) << 16 |
           static_cast<uint32_t>(bytes[at + 2]) << 8 | bytes[at + 3];
}

struct FoundChunk {
    std::string type;
    size_t at; // its data
    size_t length;
};

std::vector<FoundChunk> chunks_in(const Bytes &file) {
    std::vector<FoundChunk> chunks;
    for (size_t at = 8; at + 8 <= file.size();) {
        const size_t length = big_u32(file, at);
        chunks.push_back({std::string(&file[at + 4], &file[at + 8]), at + 8, length});
        at += length + 12;
    }
    return chunks;
}

// So that both look at what was changed.
Bytes with_right_checksums(Bytes file) {
    for (const FoundChunk &chunk : chunks_in(file)) {
        const size_t end = chunk.at + chunk.length;
        if (end + 4 > file.size()) break;
        const auto begin = file.begin() + static_cast<ptrdiff_t>(chunk.at - 4);
        const uint32_t crc = test::crc32_of({begin, begin + static_cast<ptrdiff_t>(chunk.length + 4)});
        for (size_t i = 0; i < 4; ++i)
            file[end + i] = static_cast<uint8_t>(crc >> (24 - 8 * i));
    }
    return file;
}

// The entry of docs/oddities.md that lets this file look different here.
std::string explanation(const Bytes &file, const LibpngPicture &picture) {
    const std::vector<FoundChunk> chunks = chunks_in(file);
    size_t palettes = 0, keys = 0, palette_size = 0;
    bool has_image_data = false;
    for (size_t i = 0; i < chunks.size(); ++i) {
        const FoundChunk &chunk = chunks[i];
        const bool is_colour = chunk.type == "PLTE" || chunk.type == "tRNS";
        if (chunk.length == 0 && chunk.type != "IEND") return "Empty chunks";
        if (chunk.type == "IEND") break;
        if (is_colour && has_image_data) return "Palettes and headers that come twice";
        palettes += chunk.type == "PLTE" ? 1 : 0;
        keys += chunk.type == "tRNS" ? 1 : 0;
        if (palettes > 1 || keys > 1) return "Palettes and headers that come twice";
        if (chunk.type == "PLTE") palette_size = std::min(chunk.length / 3, size_t{1} << picture.depth);
        if (chunk.type == "tRNS" && picture.colour_type == 3 && chunk.length > palette_size)
            return "Alphas beyond the palette";
        if (chunk.type == "tRNS" && picture.colour_type == 2 && picture.depth == 8 &&
            (file[chunk.at] | file[chunk.at + 2] | file[chunk.at + 4]) != 0)
            return "Colour keys above 255";
        has_image_data = has_image_data || chunk.type == "IDAT";
    }
    return "";
}

class PngPeers : public Comparison {};

TEST_P(PngPeers, show_the_same_pixels) {
    const std::vector<Input> inputs = inputs_of(small_inputs(), fuzz::Format::png);
    const fuzz::Call &one_shot = fuzz::decoding_calls(fuzz::Format::png).front();
    const uint32_t all = by_extent(100u, 1000u, 30000u);
    for (uint32_t i = 0; i < all; ++i) {
        const Bytes &sound = inputs[random.below(static_cast<uint32_t>(inputs.size()))].bytes;
        const Bytes file = random.one_in(3) ? with_right_checksums(mutated(random, sound, 33)) : any_png_file(random);
        std::optional<LibpngPicture> picture = test::read_with_libpng(file);
        if (picture) as_this_library_widens(*picture);
        const auto width = picture ? static_cast<int32_t>(picture->width) : 64;
        const auto height = picture ? static_cast<int32_t>(picture->height) : 64;
        const std::optional<Bytes> ours =
            decoded(one_shot, fuzz::Format::png, file, PELM_FORMAT_RGBA8888, width, height);
        if (ours && picture) {
            if (!agree(file, *ours, picture->rgba, explanation(file, *picture))) return;
            continue;
        }
        ++(ours ? only_ours : picture ? only_theirs : neither);
    }
    tell_all("libpng", all, 30000, 14000);
}

INSTANTIATE_TEST_SUITE_P(Shards, PngPeers, testing::Range(0u, 3u));

} // namespace
} // namespace pelm::sweeps
