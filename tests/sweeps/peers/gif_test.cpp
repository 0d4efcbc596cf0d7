// Mutated GIF files beside giflib: what both read shows the same pixels, but for what docs/oddities.md states.
#include "tests/gif/support/giflib_reader.h"
#include "tests/sweeps/mutations.h"
#include "tests/sweeps/peers/comparison.h"
#include "tests/sweeps/peers/gif_walk.h"
#include "tests/sweeps/tally.h"

namespace pelm::sweeps {
namespace {

using test::GiflibFile;

// The entry of docs/oddities.md that lets this file look different here.
std::string explanation(const GifWalk &seen) {
    if (seen.has_unknown_extension) return "Unknown extensions";
    if (seen.has_unknown_code) return "Codes that are not in the table";
    if (seen.min_code_size == 1) return "Two colours never grow";
    return "";
}

// Required: a still image begins at the screen's left edge (docs/oddities.md, "Still images fill the screen"). What
// lies beside it is not compared.
void put_picture(const GiflibFile &read, Bytes &expected, const Bytes &ours) {
    expected = ours;
    const test::GiflibImage &image = read.images[0];
    for (uint32_t y = 0; y < image.place.height; ++y) {
        for (uint32_t x = 0; x < std::min(image.place.width, read.width); ++x) {
            const size_t row = y + image.place.top;
            if (row >= read.height) continue;
            const uint8_t index = image.indices[size_t{y} * image.place.width + x];
            const auto colour = test::table_colour(image.local.empty() ? read.global : image.local, index);
            std::copy(colour.begin(), colour.end(),
                      expected.begin() + static_cast<ptrdiff_t>(3 * (row * read.width + x)));
        }
    }
}

// A sound file of any size, with strings of any length, of which the codes are changed too.
Bytes rebuilt(Random &random) {
    const int bits = static_cast<int>(random.between(1, 8));
    const int size = std::max(bits, 2);
    const auto width = static_cast<uint16_t>(random.between(1, 60)),
               height = static_cast<uint16_t>(random.between(1, 40));
    test::GifFile file;
    file.screen(width, height, test::distinct_table(size_t{1} << bits, random.next()));
    if (random.one_in(4)) file.extension(random.one_in(2) ? 0xFE : 0x44, {{1, 2, 3}});
    if (random.one_in(4)) file.control({.transparent = 1});
    test::Noise noise(random.next());
    const Bytes pixels = test::pixel_runs(size_t{width} * height, 1u << bits, random.between(1, 60), noise);
    test::Codes codes = test::lzw_codes(pixels, size, {.clear_every = random.one_in(2) ? random.between(3, 900) : 0});
    const uint32_t changes = random.below(3);
    for (uint32_t i = 0; i < changes; ++i) {
        const size_t at = random.below(static_cast<uint32_t>(codes.size()));
        codes[at] = random.below(1u << test::code_widths(codes, size)[at]);
    }
    file.descriptor({0, 0, width, height, random.one_in(3)},
                    random.one_in(3) ? test::distinct_table(size_t{1} << bits, random.next()) : test::ColourTable{});
    return file.data(size, test::packed_codes(codes, size), static_cast<uint8_t>(random.between(1, 255)))
        .trailer()
        .bytes;
}

class GifPeers : public Comparison {};

TEST_P(GifPeers, show_the_same_pixels) {
    const std::vector<Input> inputs = inputs_of(small_inputs(), fuzz::Format::gif);
    const fuzz::Call &one_shot = fuzz::decoding_calls(fuzz::Format::gif).front();
    const uint32_t all = by_extent(100u, 1500u, 15000u);
    for (uint32_t i = 0; i < all; ++i) {
        const Bytes &sound = inputs[random.below(static_cast<uint32_t>(inputs.size()))].bytes;
        const Bytes file =
            random.one_in(2) ? mutated(random, random.one_in(2) ? sound : rebuilt(random), 13) : rebuilt(random);
        const std::optional<GiflibFile> read = test::first_image_with_giflib(file);
        const bool is_small = read && uint32_t{read->width} * read->height < 1u << 22;
        const int32_t width = is_small ? read->width : 64, height = is_small ? read->height : 64;
        const std::optional<Bytes> ours = decoded(one_shot, fuzz::Format::gif, file, PELM_FORMAT_RGB888, width, height);
        if (ours && is_small) {
            Bytes theirs;
            put_picture(*read, theirs, *ours);
            if (!agree(file, *ours, theirs, explanation(walk_to_the_first_image(file)))) return;
            continue;
        }
        ++(ours ? only_ours : read ? only_theirs : neither);
    }
    tell_all("giflib", all, 15000, 6000);
}

INSTANTIATE_TEST_SUITE_P(Shards, GifPeers, testing::Range(0u, 2u));

} // namespace
} // namespace pelm::sweeps
