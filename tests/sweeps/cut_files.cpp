#include "tests/sweeps/cut_files.h"

#include <algorithm>
#include <cstdlib>
#include <string_view>

#include "frame/bytes.h"
#include "tests/gif/support/gif_blocks.h"
#include "tests/png/support/png_builder.h"
#include "tests/support/run_length_codes.h"

namespace pelm::sweeps {
namespace {

using fuzz::Format;

constexpr int32_t bmp_header_bytes = 54;

const Bytes &file_of(const Cut &cut) {
    return cut.decode->input->bytes;
}

bool is_call(const Cut &cut, std::string_view name) {
    return name == cut.decode->call->name;
}

bool is_memory(const Cut &cut) {
    return cut.kind == PELM_SOURCE_MEMORY;
}

struct BmpFields {
    int64_t width, height, bits, compression, offset, stride;
};

// Bytes that are not there are zeros.
BmpFields fields_of(const Cut &cut, bool knows_core_headers) {
    Bytes head(file_of(cut).begin(), file_of(cut).begin() + std::min(cut.held, bmp_header_bytes));
    head.resize(bmp_header_bytes);
    const uint8_t *const bytes = head.data();
    BmpFields fields{};
    fields.offset = read_u32le(bytes + 10);
    if (knows_core_headers && bytes[14] == 12) {
        fields.width = read_u16le(bytes + 18);
        fields.height = read_u16le(bytes + 20);
        fields.bits = read_u16le(bytes + 24);
        fields.compression = read_u16le(bytes + 26);
    } else {
        fields.width = static_cast<int32_t>(read_u32le(bytes + 18));
        fields.height = std::abs(int64_t{static_cast<int32_t>(read_u32le(bytes + 22))});
        fields.bits = read_u16le(bytes + 28);
        fields.compression = read_u32le(bytes + 30);
    }
    fields.stride = (fields.width * fields.bits + 31) / 32 * 4;
    return fields;
}

int64_t palette_bytes(const BmpFields &fields) {
    return fields.bits <= 8 ? (fields.offset - bmp_header_bytes) / 4 * 4 : 0;
}

// Where the rows of a sequential source begin.
int64_t header_end(const BmpFields &fields) {
    return bmp_header_bytes + palette_bytes(fields) + (fields.compression == 3 ? 12 : 0);
}

Stated bmp_rows(const Cut &cut, const BmpFields &fields) {
    Stated stated{PELM_RESULT_DONE};
    stated.count =
        static_cast<int32_t>(std::clamp<int64_t>((cut.held - fields.offset) / fields.stride, 0, fields.height));
    if (cut.held < fields.offset) stated.count = 0;
    if (is_call(cut, "DecodeBMPLine") && !is_memory(cut) && cut.stated != cut.held && stated.count < fields.height) {
        if (cut.is_reduced)
            stated.result.reset(); // the last rows may hold no sample
        else
            stated.result = PELM_RESULT_DATA_ENDED;
    }
    const bool is_in_bands = is_call(cut, "DecodeBMPIter") || is_call(cut, "DecodeBMPIterLine");
    const bool is_straight_on = !is_in_bands && is_bottom_up(*cut.decode->input) && header_end(fields) == fields.offset;
    if (cut.is_reduced || (cut.kind == PELM_SOURCE_SEQUENTIAL && !is_straight_on)) stated.rows = Rows::not_stated;
    return stated;
}

Stated bmp_in_one_step(const Cut &cut) {
    if (cut.held < bmp_header_bytes) return {PELM_RESULT_FAILED, is_memory(cut) ? 0u : 1u};
    const BmpFields fields = fields_of(cut, true);
    if (fields.compression != 0 && (fields.compression != 3 || fields.bits != 16)) return {PELM_RESULT_FAILED};
    if (!is_memory(cut) && cut.held < bmp_header_bytes + palette_bytes(fields)) return {PELM_RESULT_FAILED, 2};
    if (fields.compression == 3 && cut.held < header_end(fields)) return {PELM_RESULT_FAILED, is_memory(cut) ? 0u : 1u};
    return bmp_rows(cut, fields);
}

// Rows of codes count when they were ended before the codes ran out.
int32_t rows_of_codes(const Cut &cut, const BmpFields &fields) {
    const Bytes &file = file_of(cut);
    const int64_t from = std::min<int64_t>(fields.offset, cut.held);
    const Bytes codes(file.begin() + static_cast<ptrdiff_t>(from), file.begin() + cut.held);
    return static_cast<int32_t>(test::expanded_rows(codes, static_cast<int>(fields.bits),
                                                    static_cast<int32_t>(fields.width),
                                                    static_cast<int32_t>(fields.height))
                                    .size());
}

// Bytes that are not there are zeros, as the last ones of a mask are anyway.
bool masks_are_there(const Cut &cut) {
    const Bytes &file = file_of(cut);
    return std::all_of(file.begin() + std::clamp(cut.held, bmp_header_bytes, bmp_header_bytes + 12),
                       file.begin() + bmp_header_bytes + 12, [](uint8_t byte) { return byte == 0; });
}

Stated bmp_in_two_steps(const Cut &cut) {
    if (cut.held < 2) return {PELM_RESULT_FAILED, 1};
    const BmpFields fields = fields_of(cut, false);
    if (fields.stride == 0) return {PELM_RESULT_FAILED};
    if (fields.compression == 0 && cut.stated < fields.offset + fields.height * fields.stride)
        return {PELM_RESULT_FAILED};
    if (fields.compression == 3 && !masks_are_there(cut)) return {PELM_RESULT_FAILED};
    Stated stated = bmp_rows(cut, fields);
    if (fields.compression == 1 || fields.compression == 2) stated.count = rows_of_codes(cut, fields);
    return stated;
}

// A multi-byte integer as far as it goes.
int64_t read_side(const Bytes &file, int64_t &at, int64_t end) {
    int64_t value = 0;
    while (at < end) {
        const uint8_t byte = file[static_cast<size_t>(at++)];
        value = value << 7 | (byte & 127);
        if ((byte & 128) == 0) break;
    }
    return value;
}

Stated wbmp(const Cut &cut) {
    if ((!is_memory(cut) && cut.kind != PELM_SOURCE_STREAM) || cut.stated < 4) return {PELM_RESULT_FAILED};
    const int64_t end = is_memory(cut) ? cut.stated : std::min(cut.held, 20);
    if (end < 2) return {PELM_RESULT_FAILED};
    int64_t at = 2;
    const int64_t width = read_side(file_of(cut), at, end), height = read_side(file_of(cut), at, end);
    const int64_t row = (width + 7) / 8;
    if (at + row * height > cut.stated) return {PELM_RESULT_FAILED};
    if (width == 0 || height == 0) return {PELM_RESULT_DONE};
    const int64_t there = std::min((std::max<int64_t>(cut.held, at) - at) / row, height);
    Stated stated{there == height ? PELM_RESULT_DONE : PELM_RESULT_FAILED};
    stated.count = static_cast<int32_t>(there);
    if (cut.is_reduced) {
        stated.rows = Rows::not_stated;
        if (there < height) stated.result.reset(); // the last rows may hold no sample
    }
    return stated;
}

int64_t longest_chunk(const Bytes &png) {
    const std::vector<uint32_t> lengths = png_chunks(png);
    return *std::max_element(lengths.begin(), lengths.end());
}

struct GifImage {
    std::vector<int64_t> sizes; // places of the sub-blocks' size bytes, the terminator's last
};

struct GifShape {
    int64_t blocks_at; // behind the screen and its table
    std::vector<GifImage> images;
};

// Of a sound file.
GifShape shape_of(const Bytes &file) {
    const auto byte = [&file](int64_t at) { return file[static_cast<size_t>(at)]; };
    const auto end = static_cast<int64_t>(file.size());
    int64_t at = 13 + gif_table_bytes(file[10]);
    GifShape shape{at, {}};
    while (at < end && byte(at) != 0x3B) {
        const bool is_image = byte(at) == 0x2C;
        at += is_image ? 11 + gif_table_bytes(byte(at + 9)) : 2;
        GifImage image;
        for (bool ends = false; !ends && at < end; at += byte(at) + 1) {
            ends = byte(at) == 0;
            image.sizes.push_back(at);
        }
        if (is_image) shape.images.push_back(image);
    }
    return shape;
}

const GifShape &shape_of(const Cut &cut) {
    static const Bytes *file = nullptr;
    static GifShape shape;
    if (file != &file_of(cut)) shape = shape_of(file_of(cut));
    file = &file_of(cut);
    return shape;
}

Stated gif_still(const Cut &cut) {
    const GifShape &shape = shape_of(cut);
    const bool leaks = !is_call(cut, "DecodeGIFLine");
    if (cut.held < shape.blocks_at) return {PELM_RESULT_FAILED};
    if (shape.images.empty() || cut.held < shape.images[0].sizes[0])
        return {PELM_RESULT_FAILED, leaks ? test::gif_still_blocks(1).size() : 0};
    const GifImage &image = shape.images[0];
    Stated stated{PELM_RESULT_FAILED};
    const std::string &name = cut.decode->input->name;
    const bool is_interlaced = name.find("interlaced") != std::string::npos;
    if (is_interlaced && !leaks) return stated;
    const bool ends_with_size = std::find(image.sizes.begin(), image.sizes.end(), cut.held - 1) != image.sizes.end();
    const bool ends_as_stated = cut.held == cut.stated && cut.held != image.sizes[0] && !ends_with_size;
    // By lines the rows that are there are a success, and the call for those that are not fails.
    if (ends_as_stated && leaks) stated.result = PELM_RESULT_DONE;
    stated.result_if_complete = PELM_RESULT_DONE;
    const bool is_narrow = name.find("narrow") != std::string::npos || name.find("cover") != std::string::npos;
    stated.rows = is_interlaced ? Rows::some : Rows::leading;
    if (cut.is_reduced || is_narrow) {
        stated.rows = Rows::not_stated;
        stated.result.reset();
    }
    return stated;
}

bool is_animation(const Cut &cut) {
    return is_call(cut, "DecodeAGIF") || is_call(cut, "DecodeAGIFIter");
}

// The rest of a sub-block that was dropped is stepped over as stray bytes, one of which may look like a trailer.
Stated gif_animation(const Cut &cut) {
    const std::vector<GifImage> &images = shape_of(cut).images;
    const bool is_cut_in_image = std::any_of(images.begin(), images.end(), [&cut](const GifImage &image) {
        return image.sizes[0] < cut.held && cut.held <= image.sizes.back();
    });
    Stated stated{PELM_RESULT_FAILED, 0, Rows::not_stated};
    if (is_cut_in_image) stated.result.reset();
    return stated;
}

} // namespace

Stated stated_for(const Cut &cut) {
    switch (cut.decode->input->format) {
    case Format::bmp: return is_call(cut, "PreInitBMP") ? bmp_in_two_steps(cut) : bmp_in_one_step(cut);
    case Format::wbmp: return wbmp(cut);
    case Format::png: return {PELM_RESULT_FAILED};
    default: break;
    }
    return is_animation(cut) ? gif_animation(cut) : gif_still(cut);
}

bool is_whole_to(const Cut &cut) {
    const auto whole = static_cast<int32_t>(file_of(cut).size());
    if (cut.held < whole) {
        if (cut.decode->input->format != Format::gif || is_animation(cut) || shape_of(cut).images.empty()) return false;
        return cut.held > shape_of(cut).images[0].sizes.back(); // a still needs its image
    }
    switch (cut.decode->input->format) {
    case Format::png: return longest_chunk(file_of(cut)) <= cut.stated;
    case Format::gif: return true;
    default: return false; // by the same statements as cut files
    }
}

size_t whole_frames(const Cut &cut) {
    const std::vector<GifImage> &images = shape_of(cut).images;
    return static_cast<size_t>(std::count_if(images.begin(), images.end(),
                                             [&cut](const GifImage &image) { return image.sizes.back() < cut.held; }));
}

int64_t gif_table_bytes(uint8_t packed) {
    return (packed & 0x80) != 0 ? int64_t{3} << ((packed & 7) + 1) : 0;
}

std::vector<uint32_t> png_chunks(const Bytes &file) {
    std::vector<uint32_t> lengths;
    for (size_t at = 8; at + 12 <= file.size(); at += size_t{12} + lengths.back())
        lengths.push_back(test::read_u32be(&file[at]));
    return lengths;
}

bool is_bottom_up(const Input &input) {
    return input.format == Format::bmp && (input.bytes[14] == 12 || input.bytes[25] < 0x80);
}

} // namespace pelm::sweeps
