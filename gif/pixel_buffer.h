// The buffer in which the LZW decoder puts strings together: decoded pixels that wait for their row to be complete.
#pragma once

#include "gif/state.h"

namespace pelm {

// Strings of more pixels than the table has entries come only from damaged data. The decoder does not follow them.
constexpr int32_t longest_string = gif_table_entries;

// How many pixels behind a string its last group may overwrite.
constexpr int32_t written_behind = 8;

// Makes room for rows of that width, and a string behind an incomplete one. What the buffer held is lost when it has to
// grow. False without memory.
bool reserve_pixel_row(GifDecoderState &state, int32_t width);

} // namespace pelm
