#include "gif/lzw/fast_loop.h"

#include <algorithm>
#include <cstring>

#include "frame/bytes.h"
#include "gif/lzw/fast_strings.h"

namespace pelm {
namespace {

inline void put_group(uint8_t *at, PixelGroup group) {
    static_assert(std::endian::native == std::endian::little, "the first pixel is the lowest byte");
    std::memcpy(at, &group, sizeof group);
}

// Writes a string, its last group first, and returns its first pixel.
inline uint8_t put_groups(const GifFastStrings &strings, FastEntry entry, uint8_t *out) {
    uint32_t at = last_pixel_of(entry.link) & ~(group_pixels - 1u);
    put_group(out + at, entry.group);
    while (at != 0) {
        entry = fast_entry(strings, groups_before(entry.link));
        at -= group_pixels;
        put_group(out + at, entry.group);
    }
    return static_cast<uint8_t>(entry.group);
}

// The loop's values, which the compiler can keep in registers: stores of pixels might change those in memory.
struct Loop {
    uint64_t bits;
    uint32_t count, size, next_code, previous;
    FastEntry entry; // of `previous`
    uint8_t first;   // pixel of its string
    uint8_t *out;
};

inline Loop take_up(const Lzw &lzw) {
    return {lzw.codes.bits,  lzw.codes.count,
            lzw.code_size,   lzw.next_code,
            lzw.previous,    fast_entry(*lzw.fast, lzw.previous),
            lzw.first_pixel, lzw.pixels + lzw.pixel_count};
}

inline void put_back(const Loop &loop, Lzw &lzw) {
    lzw.codes.bits = loop.bits;
    lzw.codes.count = loop.count;
    lzw.code_size = loop.size;
    lzw.next_code = loop.next_code;
    lzw.previous = loop.previous;
    lzw.first_pixel = loop.first;
    lzw.pixel_count = static_cast<int32_t>(loop.out - lzw.pixels);
    lzw.filled = std::max(lzw.filled, loop.next_code);
}

inline bool fetch_code(Loop &loop, CodeReader &codes) {
    codes.bits = loop.bits;
    codes.count = loop.count;
    const bool fetched = fetch_bits(codes, loop.size);
    loop.bits = codes.bits;
    loop.count = codes.count;
    return fetched;
}

inline void drop_code(Loop &loop) {
    loop.bits >>= loop.size;
    loop.count -= loop.size;
}

inline FastFill end_image(Lzw &lzw, GifEnding ending) {
    lzw.ending = ending;
    return FastFill::ended;
}

// The clear code, and what follows it.
inline FastFill clear_table(Loop &loop, Lzw &lzw) {
    loop.size = lzw.min_code_size + 1;
    put_back(loop, lzw);
    if (!read_first_code(lzw)) return FastFill::ended;
    lzw.next_code = lzw.clear_code + 2;
    if (lzw.previous >= lzw.next_code) return FastFill::irregular;
    loop = take_up(lzw);
    return FastFill::full;
}

} // namespace

FastFill fill_row_fast(Lzw &lzw, int32_t width) {
    if (lzw.previous >= lzw.next_code) return FastFill::irregular;
    Loop loop = take_up(lzw);
    GifFastStrings &strings = *lzw.fast;
    uint32_t *const prefixes = lzw.tables.prefix;
    const uint8_t *const row_end = lzw.pixels + width;
    while (loop.out < row_end) {
        if (loop.count < loop.size && !fetch_code(loop, lzw.codes)) {
            put_back(loop, lzw);
            return end_image(lzw, lzw.codes.ending);
        }
        const uint32_t code = static_cast<uint32_t>(loop.bits) & ((1u << loop.size) - 1);
        FastEntry entry;
        if (code < loop.next_code) {
            if (code - lzw.clear_code <= 1) {
                drop_code(loop);
                if (code == lzw.end_code) {
                    put_back(loop, lzw);
                    return end_image(lzw, GIF_ENDED);
                }
                const FastFill cleared = clear_table(loop, lzw);
                if (cleared != FastFill::full) return cleared;
                continue;
            }
            entry = fast_entry(strings, code);
        } else {
            if (code != loop.next_code) {
                put_back(loop, lzw);
                return FastFill::irregular;
            }
            entry = extended(loop.entry, loop.previous, loop.first);
        }
        drop_code(loop);
        loop.first = put_groups(strings, entry, loop.out);
        loop.out += last_pixel_of(entry.link) + 1;
        if (loop.next_code < gif_table_entries) {
            const FastEntry added = extended(loop.entry, loop.previous, loop.first);
            strings.group[loop.next_code] = added.group;
            strings.link[loop.next_code] = added.link;
            prefixes[loop.next_code] = loop.previous;
            ++loop.next_code;
            if (loop.next_code == 1u << loop.size && loop.size < widest_code) ++loop.size;
        }
        loop.previous = code;
        loop.entry = entry;
    }
    put_back(loop, lzw);
    return FastFill::full;
}

} // namespace pelm
