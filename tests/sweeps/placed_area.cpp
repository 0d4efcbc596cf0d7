#include "tests/sweeps/placed_area.h"

#include <algorithm>
#include <optional>
#include <string_view>

#include "frame/bytes.h"

namespace pelm::sweeps {
namespace {

using fuzz::Format;

bool is_turned(const Placing &placing) {
    return placing.setting->rotation != PELM_ROTATE_0;
}

bool is_sideways(const Placing &placing) {
    return placing.setting->rotation == PELM_ROTATE_90 || placing.setting->rotation == PELM_ROTATE_270;
}

bool is_call(const Placing &placing, std::string_view name) {
    return name == placing.decode->call->name;
}

// GIF alone also writes what is stretched to its own size like this.
bool is_one_to_one(const Placing &placing) {
    const Input &input = *placing.decode->input;
    return (placing.setting->placement != PELM_PLACE_STRETCH || input.format == Format::gif) &&
           placing.scaled_width == input.width && placing.scaled_height == input.height;
}

bool is_byte(const Input &input, size_t at, uint8_t value) {
    return at < input.bytes.size() && input.bytes[at] == value;
}

bool is_grey_of_8_bits(const Placing &placing) {
    const Input &png = *placing.decode->input;
    return is_byte(png, 24, 8) && is_byte(png, 25, 0) && is_byte(png, 28, 0); // not interlaced
}

bool is_square(const Placing &placing) {
    return placing.scaled_width == placing.scaled_height;
}

bool is_exact_and_turned(const Placing &placing) {
    return placing.setting->placement == PELM_PLACE_EXACT && is_sideways(placing) && !is_square(placing);
}

struct GifImage {
    int32_t top, width, height;
    bool is_cut; // its data ends with the file
};

size_t gif_table_bytes(uint8_t packed) {
    return (packed & 0x80) != 0 ? size_t{3} << ((packed & 7) + 1) : 0;
}

// Behind the sub-blocks that begin at `at`; nothing when the file ends first.
std::optional<size_t> behind_sub_blocks(const Bytes &file, size_t at) {
    while (at < file.size() && file[at] != 0)
        at += file[at] + size_t{1};
    return at < file.size() ? std::optional(at + 1) : std::nullopt;
}

// The first one, of files whose blocks are sound up to there.
std::optional<GifImage> first_image_of(const Input &gif) {
    constexpr size_t header_bytes = 13, descriptor_bytes = 10;
    const Bytes &file = gif.bytes;
    std::optional<size_t> at = header_bytes + gif_table_bytes(file[10]);
    while (at && *at < file.size() && file[*at] == 0x21)
        at = behind_sub_blocks(file, *at + 2);
    if (!at || file.size() < *at + descriptor_bytes || file[*at] != 0x2C) return {};
    const uint8_t *const descriptor = &file[*at];
    const size_t data = *at + descriptor_bytes + gif_table_bytes(descriptor[9]) + 1;
    return GifImage{read_u16le(descriptor + 3), read_u16le(descriptor + 5), read_u16le(descriptor + 7),
                    !behind_sub_blocks(file, data)};
}

// Where the rows below it are cleared.
bool lacks_rows(const Placing &placing) {
    const Input &gif = *placing.decode->input;
    const std::optional<GifImage> image = first_image_of(gif);
    return image && (image->is_cut || gif.name == "gif_damaged") && image->top + image->height <= gif.height;
}

constexpr Exception bmp_exceptions[] = {
    {"Exact placement of turned images",
     [](const Placing &placing) { return is_exact_and_turned(placing) && !is_call(placing, "DecodeBMPLine"); }},
    {"Top-down files on sequential sources",
     [](const Placing &placing) {
         const bool is_top_down = is_byte(*placing.decode->input, 25, 0xFF);
         return is_top_down && placing.setting->kind == PELM_SOURCE_SEQUENTIAL && !is_call(placing, "DecodeBMPLine");
     }},
};

constexpr Exception png_exceptions[] = {
    {"Exact placement of turned images", is_exact_and_turned},
    {"Rotation pixel for pixel",
     [](const Placing &placing) { return is_one_to_one(placing) && is_sideways(placing) && !is_square(placing); }},
    {"RGB565 turned by 270 degrees",
     [](const Placing &placing) {
         return placing.setting->format == PELM_FORMAT_RGB565 && placing.setting->rotation == PELM_ROTATE_270 &&
                !is_one_to_one(placing) && !is_square(placing);
     }},
    {"Reduced grey images of 8 bits",
     [](const Placing &placing) {
         return is_grey_of_8_bits(placing) && is_sideways(placing) && !is_one_to_one(placing) && !is_square(placing);
     }},
};

constexpr Exception gif_exceptions[] = {
    {"Exact placement of turned images",
     [](const Placing &placing) { return is_exact_and_turned(placing) && !is_call(placing, "DecodeGIFLine"); }},
    {"Turned images in 32-bit formats",
     [](const Placing &placing) {
         const uint32_t format = placing.setting->format;
         return is_one_to_one(placing) && is_turned(placing) && !is_call(placing, "DecodeGIFLine") &&
                (format == PELM_FORMAT_ARGB8888 || format == PELM_FORMAT_RGBA8888 || format == PELM_FORMAT_BGRA8888);
     }},
    {"Missing rows of a GIF",
     [](const Placing &placing) { return is_call(placing, "DecodeGIF") && !is_turned(placing) && lacks_rows(placing); },
     [](const Area &placed, int32_t row, uint8_t byte) { return byte == 0 && row >= placed.top; }},
};

} // namespace

Area placed_area(const Placing &placing) {
    const int32_t width = placing.scaled_width, height = placing.scaled_height;
    const int32_t free_width = placing.buffer_width - width;
    if (is_call(placing, "DecodeBMPLine")) return {free_width >> 1, 0, width, height};
    if (is_call(placing, "DecodeGIFLine")) {
        // The image's own columns: it may be wider than its screen, or narrower.
        const std::optional<GifImage> image = first_image_of(*placing.decode->input);
        return {0, 0, image && is_one_to_one(placing) ? image->width : width, height};
    }
    if (placing.decode->input->format == Format::wbmp)
        return {(free_width + 1) >> 1, (placing.buffer_height - height + 1) >> 1, width, height};
    const int32_t across = is_sideways(placing) ? height : width, down = is_sideways(placing) ? width : height;
    return {(placing.buffer_width - across) >> 1, (placing.buffer_height - down) >> 1, across, down};
}

std::span<const Exception> exceptions_of(Format format) {
    switch (format) {
    case Format::bmp: return bmp_exceptions;
    case Format::png: return png_exceptions;
    case Format::wbmp: return {};
    default: return gif_exceptions;
    }
}

const Exception *exception_for(const Placing &placing) {
    const auto exceptions = exceptions_of(placing.decode->input->format);
    const auto found = std::find_if(exceptions.begin(), exceptions.end(),
                                    [&placing](const Exception &exception) { return exception.holds(placing); });
    return found == exceptions.end() ? nullptr : &*found;
}

} // namespace pelm::sweeps
