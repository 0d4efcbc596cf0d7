#include "tests/sweeps/peers/gif_walk.h"

#include <algorithm>

namespace pelm::sweeps {
namespace {

constexpr uint32_t table_entries = 4096;
constexpr uint32_t widest = 12;

size_t table_size(uint8_t packed) {
    return (packed & 0x80) != 0 ? size_t{6} << (packed & 7) : 0;
}

uint32_t word(const Bytes &file, size_t at) {
    return file[at] | static_cast<uint32_t>(file[at + 1]) << 8;
}

// Leaves `at` behind the terminator. With the blocks' data, if wanted.
void walk_sub_blocks(const Bytes &file, size_t &at, Bytes *data) {
    while (at < file.size() && file[at] != 0) {
        const size_t end = std::min(at + 1 + file[at], file.size());
        if (data != nullptr)
            data->insert(data->end(), file.begin() + static_cast<ptrdiff_t>(at + 1),
                         file.begin() + static_cast<ptrdiff_t>(end));
        at = end;
    }
    ++at;
}

struct CodeReader {
    const Bytes &data;
    size_t position = 0; // bits

    bool take(uint32_t width, uint32_t &code) {
        if (position + width > 8 * data.size()) return false;
        code = 0;
        for (uint32_t i = 0; i < width; ++i, ++position)
            code |= (data[position / 8] >> position % 8 & 1u) << i;
        return true;
    }
};

// By the lengths of the strings alone.
bool has_unknown_code(const Bytes &data, uint32_t min_code_size, size_t pixels) {
    CodeReader reader{data};
    const uint32_t clear = 1u << min_code_size;
    std::vector<size_t> lengths(table_entries, 1);
    uint32_t width = min_code_size + 1, next = clear + 2, code = 0;
    size_t previous = 0; // length of the string before; 0: none
    for (size_t done = 0; done < pixels && reader.take(width, code);) {
        if (code == clear) {
            width = min_code_size + 1;
            next = clear + 2;
            previous = 0;
            continue;
        }
        if (code == clear + 1) return false;
        if (code > next || (previous == 0 && code > clear) || (code == next && next == table_entries)) return true;
        if (previous != 0 && next < table_entries) {
            lengths[next++] = previous + 1;
            if (next == 1u << width && width < widest) ++width;
        }
        previous = lengths[code];
        done += previous;
    }
    return false;
}

} // namespace

GifWalk walk_to_the_first_image(const Bytes &file) {
    GifWalk walk;
    size_t at = 13 + table_size(file[10]);
    while (file[at] == 0x21) {
        const uint8_t label = file[at + 1];
        const bool is_known = label == 0x01 || label == 0xF9 || label == 0xFE || label == 0xFF;
        walk.has_unknown_extension = walk.has_unknown_extension || !is_known;
        at += 2;
        walk_sub_blocks(file, at, nullptr);
    }
    const size_t pixels = size_t{word(file, at + 5)} * word(file, at + 7);
    at += 10 + table_size(file[at + 9]);
    walk.min_code_size = file[at++];
    Bytes data;
    walk_sub_blocks(file, at, &data);
    walk.has_unknown_code = has_unknown_code(data, walk.min_code_size, pixels);
    return walk;
}

} // namespace pelm::sweeps
