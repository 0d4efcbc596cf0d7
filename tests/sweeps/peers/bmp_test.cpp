// Mutated BMP files beside SDL: what both read shows the same pixels, but for what docs/oddities.md states.
#include "tests/support/run_length_codes.h"
#include "tests/support/sdl_reader.h"
#include "tests/sweeps/mutations.h"
#include "tests/sweeps/peers/comparison.h"
#include "tests/sweeps/tally.h"

namespace pelm::sweeps {
namespace {

using test::SdlPicture;

uint32_t little(const Bytes &bytes, size_t at, size_t count) {
    uint32_t value = 0;
    for (size_t i = count; i-- > 0;)
        value = value << 8 | (at + i < bytes.size() ? bytes[at + i] : uint8_t{0});
    return value;
}

// The fields that readers go by. Core headers are told apart before.
struct Header {
    explicit Header(const Bytes &file)
        : offset(little(file, 10, 4)), size(little(file, 14, 4)), width(static_cast<int32_t>(little(file, 18, 4))),
          height(static_cast<int32_t>(little(file, 22, 4))), bits(little(file, 28, 2)),
          compression(little(file, 30, 4)), colours(little(file, 46, 4)) {}
    uint32_t offset, size;
    int32_t width, height;
    uint32_t bits, compression, colours;
};

// Codes that every reader takes the same way: without moves, rows that end at their width at the latest, each with its
// end, and nothing behind the last.
bool are_ordinary(const Bytes &codes, const Header &header) {
    int32_t row = 0;
    uint32_t column = 0;
    const auto width = static_cast<uint32_t>(header.width);
    for (size_t at = 0; at + 2 <= codes.size();) {
        const uint32_t first = codes[at], second = codes[at + 1];
        at += 2;
        if (first == 0 && second == 2) return false;
        if (first == 0 && second < 2) {
            column = 0;
            if (++row == std::abs(header.height))
                return at + 2 > codes.size() || (codes[at] == 0 && codes[at + 1] == 1);
            if (second == 1) return false;
            continue;
        }
        column += first != 0 ? first : second;
        if (column > width) return false;
        if (first != 0) continue;
        at += header.bits == 8 ? second : (second + 1) / 2;
        at += at % 2;
    }
    return false;
}

// The entry of docs/oddities.md that lets this file look different here.
std::string explanation(const Bytes &file) {
    const Header header(file);
    if ((header.size & 0xFF) == 12) return "Core headers";
    if (header.size != 40 && header.size > 255) return "Header sizes";
    switch (header.bits) {
    case 1:
    case 4:
    case 8: {
        const uint32_t stated = header.colours != 0 ? header.colours : 1u << header.bits;
        const bool has_palette_at_54 = header.size == 40 && header.offset > 54;
        if (!has_palette_at_54 || (header.offset - 54) / 4 != stated || stated > 1u << header.bits) return "Palettes";
        break;
    }
    case 16:
    case 24:
    case 32: break;
    default: return "Unknown formats and depths succeed";
    }
    if (header.compression != 1 && header.compression != 2) return "";
    const size_t at = std::min<size_t>(header.offset, file.size());
    return are_ordinary({file.begin() + static_cast<ptrdiff_t>(at), file.end()}, header) ? "" : "Run-length codes";
}

// Required: the stored bits of 16 move to the top of each channel, and the rest is 0 (docs/formats.md, "Colours").
void as_this_library_widens(Bytes &rgb, const Header &header, const Bytes &file) {
    if (header.bits != 16) return;
    const uint32_t red_mask = header.compression == 3 ? little(file, 54, 4) : 0x7C00;
    const uint8_t kept = red_mask == 0x0F00 ? 0xF0 : 0xF8;
    for (size_t i = 0; i < rgb.size(); ++i)
        rgb[i] = static_cast<uint8_t>(rgb[i] & (i % 3 == 1 && red_mask == 0xF800 ? 0xFC : kept));
}

// Required: a row that is not there as a whole is not written (docs/oddities.md, "Truncated files succeed").
void leave_out_missing_rows(SdlPicture &picture, const Header &header, const Bytes &file) {
    if (header.compression == 1 || header.compression == 2) return;
    const auto stride = (static_cast<size_t>(header.width) * header.bits + 31) / 32 * 4;
    const auto height = static_cast<size_t>(picture.height), length = static_cast<size_t>(picture.width) * 3;
    for (size_t row = 0; row < height; ++row) {
        if (header.offset + stride * (row + 1) <= file.size()) continue;
        const size_t y = header.height < 0 ? row : height - 1 - row;
        std::fill_n(picture.rgb.begin() + static_cast<ptrdiff_t>(y * length), length, untouched);
    }
}

bool has_codes_of_its_depth(const Header &header) {
    return (header.compression == 1 && header.bits == 8) || (header.compression == 2 && header.bits == 4);
}

// What the codes show by the own reader of them; rows that they lack stay untouched. The palette lies where others look
// for it, too.
Bytes picture_of_codes(const Bytes &file, const Header &header) {
    const size_t at = std::min<size_t>(header.offset, file.size());
    const int32_t height = std::abs(header.height);
    const test::Picture rows = test::expanded_rows({file.begin() + static_cast<ptrdiff_t>(at), file.end()},
                                                   static_cast<int>(header.bits), header.width, height);
    const size_t length = static_cast<size_t>(header.width) * 3, entries = (header.offset - 54) / 4;
    Bytes rgb(length * static_cast<size_t>(height), untouched);
    for (size_t row = 0; row < rows.size(); ++row) {
        const size_t y = header.height < 0 ? row : static_cast<size_t>(height) - 1 - row;
        for (size_t x = 0; x < rows[row].size(); ++x)
            for (size_t channel = 0; channel < 3; ++channel) {
                const size_t index = rows[row][x];
                rgb[y * length + x * 3 + channel] =
                    index < entries ? static_cast<uint8_t>(little(file, 54 + 4 * index + 2 - channel, 1)) : uint8_t{0};
            }
    }
    return rgb;
}

bool has_few_pixels(const Header &header) {
    const int64_t pixels = int64_t{header.width} * header.height;
    return pixels < 1 << 22 && pixels > -(1 << 22);
}

// As SDL reads it but for what is documented.
std::optional<SdlPicture> read_by_the_peer(const Bytes &file) {
    const Header header(file);
    if (!has_few_pixels(header)) return {};
    std::optional<SdlPicture> picture = test::read_with_sdl(file);
    if (!picture) return {};
    as_this_library_widens(picture->rgb, header, file);
    leave_out_missing_rows(*picture, header, file);
    return picture;
}

// Those of the small inputs hold moves and codes behind their rows' width.
Input plain_run_lengths(int bits) {
    constexpr int32_t width = 29, height = 17;
    test::Noise noise(static_cast<uint32_t>(bits));
    test::Picture rows = test::noise_picture(width, height, static_cast<uint16_t>(bits), 5);
    for (auto &row : rows) // runs
        for (size_t x = 2; x < row.size(); ++x)
            if (noise.below(3) != 0) row[x] = row[x - (bits == 4 ? 2 : 1)];
    const Bytes codes = test::run_length_codes(rows, bits, noise, {});
    test::BmpFile file = test::run_length_bmp(bits, width, height, codes, test::noise_palette(1u << bits, 5));
    return {"plain_run_lengths", fuzz::Format::bmp, width, height, file_bytes(file)};
}

class BmpPeers : public Comparison {};

TEST_P(BmpPeers, show_the_same_pixels) {
    std::vector<Input> inputs = inputs_of(small_inputs(), fuzz::Format::bmp);
    for (const int bits : {4, 8})
        inputs.insert(inputs.end(), 2, plain_run_lengths(bits));
    const auto calls = fuzz::decoding_calls(fuzz::Format::bmp);
    const uint32_t all = by_extent(100u, 3000u, 60000u);
    for (uint32_t i = 0; i < all; ++i) {
        const Bytes &sound = inputs[random.below(static_cast<uint32_t>(inputs.size()))].bytes;
        const Bytes file = mutated(random, sound, random.one_in(2) ? 54 : 10);
        const Header header(file);
        const std::optional<SdlPicture> picture = read_by_the_peer(file);
        const int32_t width = picture ? picture->width : 64, height = picture ? picture->height : 64;
        // In two steps where one call does not know the codes.
        const bool has_codes = header.compression == 1 || header.compression == 2;
        const fuzz::Call &call = has_codes ? calls.back() : calls.front();
        const std::optional<Bytes> ours = decoded(call, fuzz::Format::bmp, file, PELM_FORMAT_RGB888, width, height);
        if (ours && picture) {
            const std::string reason = explanation(file);
            if (reason == "Run-length codes" && has_codes_of_its_depth(header) &&
                !agree_with_model(file, *ours, picture_of_codes(file, header)))
                return;
            if (!agree(file, *ours, picture->rgb, reason)) return;
            continue;
        }
        ++(ours ? only_ours : picture ? only_theirs : neither);
    }
    tell_all("SDL", all, 60000, 35000);
}

INSTANTIATE_TEST_SUITE_P(Shards, BmpPeers, testing::Range(0u, 2u));

} // namespace
} // namespace pelm::sweeps
