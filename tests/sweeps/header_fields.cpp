#include "tests/sweeps/header_fields.h"

#include <algorithm>
#include <stdexcept>

#include "tests/png/support/png_builder.h"
#include "tests/support/wbmp_builder.h"
#include "tests/sweeps/cut_files.h"

namespace pelm::sweeps {
namespace {

using fuzz::Format;

// 46341 squared and 65536 times 65537 are beyond 2^31 and 2^32; the others are so with 8, 16, 24 or 32 bits or bytes.
constexpr uint32_t of_32_bits[] = {0,          1,          0xFFFFFFFF, 0x8000,     0xFFFF,     0x10000,
                                   0x10001,    0x7FFFFFFF, 0x80000000, 0x80000001, 0xFFFF8000, 46341,
                                   0x0AAAAAAB, 0x20000000, 0x10000000, 0x08000001, 0x40000000};
constexpr uint32_t of_16_bits[] = {0, 1, 0x7FFF, 0x8000, 0xFFFF, 0x4000, 4097};
constexpr uint32_t of_8_bits[] = {0, 1, 127, 128, 255, 12, 13};
constexpr uint32_t of_28_bits[] = {0, 1, 0x7FFF, 0x8000, 0xFFFF, 0x10001, 46341, 0x7FFFFFF, 0x8000000, 0xFFFFFFF};

std::vector<Field> bmp_fields(bool has_core_header, bool has_masks) {
    constexpr Encoding le = Encoding::little_endian;
    std::vector<Field> fields = {{"file size", 2, 4, le}, {"offset", 10, 4, le}, {"header size", 14, 4, le}};
    const std::vector<Field> core = {
        {"width", 18, 2, le}, {"height", 20, 2, le}, {"planes", 22, 2, le}, {"bits", 24, 2, le}};
    const std::vector<Field> info = {{"width", 18, 4, le},        {"height", 22, 4, le},      {"planes", 26, 2, le},
                                     {"bits", 28, 2, le},         {"compression", 30, 4, le}, {"image size", 34, 4, le},
                                     {"colours used", 46, 4, le}, {"important", 50, 4, le}};
    const std::vector<Field> &more = has_core_header ? core : info;
    fields.insert(fields.end(), more.begin(), more.end());
    if (has_masks)
        for (const size_t at : {54u, 58u, 62u})
            fields.push_back({"mask", at, 4, le});
    return fields;
}

std::vector<Field> png_fields(const Bytes &file) {
    constexpr Encoding be = Encoding::big_endian;
    std::vector<Field> fields = {{"width", 16, 4, be, 8, 13},       {"height", 20, 4, be, 8, 13},
                                 {"depth", 24, 1, be, 8, 13},       {"colours", 25, 1, be, 8, 13},
                                 {"compression", 26, 1, be, 8, 13}, {"filter", 27, 1, be, 8, 13},
                                 {"interlace", 28, 1, be, 8, 13}};
    size_t at = 8;
    for (const uint32_t length : png_chunks(file)) {
        fields.push_back({"length of the chunk at " + std::to_string(at), at, 4, be});
        if (length > 0 && at > 8)
            fields.push_back({"data of the chunk at " + std::to_string(at), at + 8, 1, be, at, length});
        at += size_t{12} + length;
        if (fields.size() > 16) break; // of many small chunks
    }
    return fields;
}

size_t table_bytes(uint8_t packed) {
    return static_cast<size_t>(gif_table_bytes(packed));
}

// The screen's, and those of the first blocks.
std::vector<Field> gif_fields(const Bytes &file) {
    constexpr Encoding le = Encoding::little_endian;
    std::vector<Field> fields = {{"screen width", 6, 2, le},
                                 {"screen height", 8, 2, le},
                                 {"screen's table", 10, 1, le},
                                 {"background", 11, 1, le},
                                 {"aspect", 12, 1, le}};
    const std::vector<Field> of_descriptor = {
        {"left", 1, 2, le}, {"top", 3, 2, le}, {"width", 5, 2, le}, {"height", 7, 2, le}, {"image's table", 9, 1, le}};
    size_t at = 13 + table_bytes(file[10]);
    for (size_t block = 0; block < 4 && at < file.size() && file[at] != 0x3B; ++block) {
        if (file[at] == 0x2C) {
            for (const Field &field : of_descriptor)
                fields.push_back({field.name, at + field.at, field.size, le});
            at += 10 + table_bytes(file[at + 9]);
            fields.push_back({"code size", at, 1, le});
            fields.push_back({"sub-block", at + 1, 1, le});
            ++at;
        } else {
            for (const size_t offset : {1u, 2u, 3u, 6u, 7u})
                fields.push_back({"byte " + std::to_string(offset) + " of an extension", at + offset, 1, le});
            at += 2;
        }
        while (file[at] != 0)
            at += file[at] + size_t{1};
        ++at;
    }
    return fields;
}

Subject wide_wbmp() {
    test::WbmpFile file = test::noise_wbmp(23, 19);
    file.width = test::multi_byte(23, 4);
    file.height = test::multi_byte(19, 4);
    constexpr Encoding groups = Encoding::groups_of_7_bits;
    return {{"wbmp", Format::wbmp, 23, 19, file_bytes(file)},
            {{"type", 0, 1, Encoding::big_endian},
             {"fix header", 1, 1, Encoding::big_endian},
             {"width", 2, 4, groups},
             {"height", 6, 4, groups}}};
}

std::vector<Field> fields_of(const Input &input) {
    switch (input.format) {
    case Format::bmp: return bmp_fields(input.name == "bmp_core_header", input.bytes[30] == 3);
    case Format::png: return png_fields(input.bytes);
    default: return gif_fields(input.bytes);
    }
}

} // namespace

std::vector<Subject> subjects() {
    std::vector<Subject> all = {wide_wbmp()};
    for (const Input &input : small_inputs())
        for (const char *const name :
             {"bmp_twenty_four_bits", "bmp_eight_bits", "bmp_one_bit", "bmp_sixteen_bits_565", "bmp_run_lengths_8",
              "bmp_core_header", "png_type_0_depth_8", "png_type_3_depth_4", "png_type_6_depth_8_interlaced",
              "png_transparent_colour_2", "gif_interlaced", "gif_frames"})
            if (input.name == name) all.push_back({input, fields_of(input)});
    if (all.size() != 13) throw std::logic_error("an input has another name");
    return all;
}

std::span<const uint32_t> values_for(const Field &field) {
    if (field.encoding == Encoding::groups_of_7_bits) return of_28_bits;
    if (field.size == 4) return of_32_bits;
    return field.size == 2 ? std::span<const uint32_t>(of_16_bits) : of_8_bits;
}

void set_field(Bytes &file, const Field &field, uint32_t value) {
    const uint32_t width = field.encoding == Encoding::groups_of_7_bits ? 7 : 8;
    for (size_t i = 0; i < field.size; ++i) {
        const size_t place = field.encoding == Encoding::little_endian ? i : field.size - 1 - i;
        uint8_t &byte = file[field.at + place];
        const uint32_t bits = value >> (width * i) & ((1u << width) - 1);
        const bool goes_on = width == 7 && i > 0;
        byte = static_cast<uint8_t>(bits | (goes_on ? 0x80u : 0u));
    }
    if (field.chunk == 0) return;
    const auto covered = file.begin() + static_cast<ptrdiff_t>(field.chunk + 4);
    const size_t covered_size = 4 + field.chunk_length;
    const uint32_t crc = test::crc32_of(Bytes(covered, covered + static_cast<ptrdiff_t>(covered_size)));
    for (size_t i = 0; i < 4; ++i)
        file[field.chunk + 4 + covered_size + i] = static_cast<uint8_t>(crc >> (24 - 8 * i));
}

} // namespace pelm::sweeps
