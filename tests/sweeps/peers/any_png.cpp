#include "tests/sweeps/peers/any_png.h"

#include <algorithm>

#include "tests/png/support/png_builder.h"

namespace pelm::sweeps {
namespace {

using test::Bytes;
using test::Chunk;
using Chunks = std::vector<Chunk>;

uint32_t size_of(const Bytes &bytes) {
    return static_cast<uint32_t>(bytes.size());
}

// Palettes and alphas may be longer than they should, and keys larger.
void add_colours(Random &random, test::Png &png) {
    if (png.colour_type == 3 || random.one_in(8))
        png.plte = random.noise(size_t{3} * random.between(1, 1u << std::min<uint32_t>(png.depth, 8)));
    if (png.colour_type > 3 || random.one_in(2)) return;
    if (png.colour_type == 3) {
        png.trns = random.noise(random.between(1, size_of(*png.plte) / 3 + (random.one_in(9) ? 5 : 0)));
        return;
    }
    png.trns = random.noise(png.colour_type == 0 ? 2 : 6);
    if (png.depth == 16 || random.one_in(4)) return;
    for (size_t i = 0; i < png.trns->size(); ++i) {
        uint8_t &byte = (*png.trns)[i];
        byte = i % 2 == 0 ? uint8_t{0} : static_cast<uint8_t>(byte & ((1u << png.depth) - 1));
    }
}

test::Png any_png(Random &random) {
    static constexpr uint8_t types[][2] = {{0, 1}, {0, 2}, {0, 4}, {0, 8}, {0, 16}, {2, 8}, {2, 16}, {3, 1},
                                           {3, 2}, {3, 4}, {3, 8}, {4, 8}, {4, 16}, {6, 8}, {6, 16}};
    const auto &[colour_type, depth] = types[random.below(std::size(types))];
    test::Png png{.width = random.between(1, 40),
                  .height = random.between(1, 30),
                  .colour_type = colour_type,
                  .depth = depth,
                  .interlace = random.one_in(3) ? uint8_t{1} : uint8_t{0}};
    png.rows = random.one_in(3) ? smooth_rows(png) : noise_rows(png, random.next());
    const uint32_t filters = random.one_in(40) ? 6 : 5;
    png.filters.clear();
    for (uint32_t i = 0; i < 9; ++i)
        png.filters.push_back(static_cast<uint8_t>(random.below(filters)));
    add_colours(random, png);
    png.level = static_cast<int>(random.below(10));
    if (random.one_in(2)) png.idat_size = random.between(1, 600);
    return png;
}

Chunks::iterator any_of(Random &random, Chunks &chunks) {
    return chunks.begin() + static_cast<ptrdiff_t>(random.below(static_cast<uint32_t>(chunks.size())));
}

void change(Random &random, Chunks &chunks) {
    static constexpr const char *others[] = {"tEXt", "gAMA", "bKGD", "sBIT", "pHYs", "tIME", "hIST", "abCd"};
    const auto place = any_of(random, chunks);
    const Chunk again = *any_of(random, chunks);
    const char *const other = others[random.below(std::size(others))];
    switch (random.below(6)) {
    case 0: chunks.insert(place, {other, random.noise(random.between(1, 30))}); return;
    case 1: chunks.insert(place, again); return;
    case 2: chunks.erase(place); return;
    case 3: std::iter_swap(place, any_of(random, chunks)); return;
    default:
        if (place->type != "IHDR" && !place->data.empty())
            place->data[random.below(size_of(place->data))] = random.byte();
    }
}

} // namespace

Bytes any_png_file(Random &random) {
    Chunks chunks = chunks_of(any_png(random));
    for (uint32_t changes = random.below(3); changes > 0 && !chunks.empty(); --changes)
        change(random, chunks);
    return file_of(chunks);
}

} // namespace pelm::sweeps
