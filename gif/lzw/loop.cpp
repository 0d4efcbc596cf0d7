#include "gif/lzw/loop.h"

#include "frame/host.h"
#include "gif/lzw/fast_loop.h"
#include "gif/lzw/fast_strings.h"
#include "gif/lzw/table.h"
#include "gif/pixel_buffer.h"
#include "gif/working.h"

namespace pelm {
namespace {

bool end_image(Lzw &lzw, GifEnding ending) {
    lzw.ending = ending;
    return false;
}

// The string of a code that the table holds.
void put_known(Lzw &lzw, uint32_t code) {
    const uint32_t length = lzw.tables.length[code];
    lzw.first_pixel = put_string(lzw.tables, code, length, lzw.pixels + lzw.pixel_count);
    lzw.pixel_count += static_cast<int32_t>(length);
}

// The string before with its own first pixel behind it. Returns the code that it extends.
// Required: for any code that the table does not hold (docs/oddities.md, "Codes that are not in the table").
uint32_t put_unknown(Lzw &lzw) {
    uint32_t prefix = lzw.previous < lzw.next_code ? lzw.previous : 0;
    if (lzw.tables.length[prefix] > longest_string) prefix = 0;
    const uint8_t last = lzw.first_pixel;
    put_known(lzw, prefix);
    lzw.first_pixel = last;
    lzw.pixels[lzw.pixel_count++] = last;
    return prefix;
}

void grow_table(Lzw &lzw, uint32_t prefix) {
    if (lzw.next_code < gif_table_entries) add_string(lzw.tables, prefix, lzw.first_pixel, lzw.next_code++);
    if (lzw.next_code == 1u << lzw.code_size && lzw.code_size < widest_code) ++lzw.code_size;
}

bool fill_row_carefully(Lzw &lzw, int32_t width) {
    while (lzw.pixel_count < width) {
        uint32_t code = 0;
        if (!read_code(lzw.codes, lzw.code_size, code)) return end_image(lzw, lzw.codes.ending);
        if (code == lzw.end_code) return end_image(lzw, GIF_ENDED);
        if (code == lzw.clear_code) {
            lzw.code_size = lzw.min_code_size + 1;
            if (!read_first_code(lzw)) return false;
            lzw.next_code = lzw.clear_code + 2;
            continue;
        }
        if (code < lzw.next_code) {
            if (lzw.tables.length[code] > longest_string) code = 0;
            put_known(lzw, code);
            grow_table(lzw, lzw.previous);
        } else {
            grow_table(lzw, put_unknown(lzw));
        }
        lzw.previous = code;
    }
    return true;
}

// The rest of the image is decoded carefully.
void leave_fast_tables(Lzw &lzw) {
    to_careful_tables(*lzw.fast, lzw.clear_code, lzw.filled, lzw.tables);
    lzw.fast = nullptr;
}

// Only a still image that is narrower than the screen shows what lies behind the waiting pixels.
bool shows_pixels_behind(const GifDecoderState &state) {
    return state.animated == 0 && state.oneToOne != 0 && state.imageWidth < state.screenWidth;
}

} // namespace

void begin_strings(GifDecoderState &state) {
    state.usesFastStrings = state.fastStrings != nullptr && !shows_pixels_behind(state) ? 1 : 0;
    state.savedFilled = 0;
    if (state.usesFastStrings != 0)
        begin_fast_strings(*state.fastStrings, 1u << state.lzwMinCodeSize);
    else
        PELMI_InitializeTransTBL(state.lzwMinCodeSize, state.lzw);
}

Lzw restore(const GifDecoderState &state, InputSource *source) {
    Lzw lzw{};
    lzw.codes = open_codes(state, source);
    lzw.tables = *state.lzw;
    lzw.fast = state.usesFastStrings != 0 ? state.fastStrings : nullptr;
    lzw.filled = state.savedFilled;
    lzw.pixels = state.pixelBuffer;
    lzw.pixel_count = state.savedPixelCount;
    lzw.min_code_size = state.lzwMinCodeSize;
    lzw.clear_code = 1u << state.lzwMinCodeSize;
    lzw.end_code = lzw.clear_code + 1;
    lzw.code_size = state.savedCodeSize;
    lzw.next_code = state.savedNextCode;
    lzw.previous = state.savedPrevCode;
    lzw.first_pixel = static_cast<uint8_t>(state.savedFirstPixel);
    return lzw;
}

void save(Lzw &lzw, GifDecoderState &state) {
    close_codes(lzw.codes, state);
    state.usesFastStrings = lzw.fast != nullptr ? 1 : 0;
    state.savedFilled = lzw.filled;
    state.savedPixelCount = lzw.pixel_count;
    state.savedCodeSize = lzw.code_size;
    state.savedNextCode = lzw.next_code;
    state.savedPrevCode = lzw.previous;
    state.savedCode = lzw.previous;
    state.savedFirstPixel = lzw.first_pixel;
}

bool read_first_code(Lzw &lzw) {
    uint32_t code = lzw.clear_code;
    while (code == lzw.clear_code)
        if (!read_code(lzw.codes, lzw.code_size, code)) return end_image(lzw, lzw.codes.ending);
    if (code == lzw.end_code) return end_image(lzw, GIF_ENDED);
    lzw.first_pixel = static_cast<uint8_t>(code);
    lzw.pixels[lzw.pixel_count++] = lzw.first_pixel;
    lzw.previous = code;
    return true;
}

bool fill_row(Lzw &lzw, int32_t width) {
    if (lzw.fast != nullptr) {
        const FastFill filled = fill_row_fast(lzw, width);
        if (filled != FastFill::irregular) return filled == FastFill::full;
        leave_fast_tables(lzw);
    }
    return fill_row_carefully(lzw, width);
}

void drop_row(Lzw &lzw, int32_t width) {
    lzw.pixel_count -= width;
    if (lzw.pixel_count > 0 && width > 0)
        ZOTARPELM_OsMemcpy(lzw.pixels, lzw.pixels + width, static_cast<uint32_t>(lzw.pixel_count));
}

} // namespace pelm
