// The decoding loop (GIF89a, appendix F): from codes to rows of palette indices.
#pragma once

#include "gif/lzw/code_reader.h"

namespace pelm {

constexpr uint32_t widest_code = 12;

struct Lzw {
    CodeReader codes;
    GifLzwTables tables;
    GifFastStrings *fast; // NULL: the careful loop decodes this image
    uint8_t *pixels;      // decoded ones that wait for their row to be complete
    int32_t pixel_count;
    uint32_t min_code_size, clear_code, end_code;
    uint32_t code_size;
    uint32_t next_code;  // index of the next string; gif_table_entries: the table is full until it is cleared
    uint32_t previous;   // may be a code that is not in the table
    uint32_t filled;     // fast tables: index behind the highest one used in this image
    uint8_t first_pixel; // of the string before
    GifEnding ending;    // GIF_GOES_ON until the image ends
};

// Settles whether the image is decoded with the fast tables, and begins them.
void begin_strings(GifDecoderState &state);

// Between the calls of a driver the decoder's values lie in the state.
Lzw restore(const GifDecoderState &state, InputSource *source);
void save(Lzw &lzw, GifDecoderState &state);

// The code behind one or more clear codes: taken as a root, whatever it is. False when the image ends.
bool read_first_code(Lzw &lzw);

// Decodes until `width` pixels wait. False when the image ends before.
bool fill_row(Lzw &lzw, int32_t width);

// The waiting pixels behind the first row move to the start. What lies behind them stays: a screen wider than the image
// shows it.
void drop_row(Lzw &lzw, int32_t width);

} // namespace pelm
