// What the public BMP calls have in common: their start, the choice of the row decoder, and bands of rows.
#pragma once

#include "bmp/state.h"

namespace pelm {

// Moves the source to its start. False when there is none, or one in memory that holds no header.
bool begin_call(const ImageDecodeInfo *info);

// Decodes output rows with the row decoder of the record's depth, and gives its result. Other depths have no rows.
int32_t decode_by_depth(BmpState &state, intptr_t cursor, int32_t rows);

// How many rows a call decodes that is asked for `rows`: never more than remain, never below 0.
int32_t rows_of_band(const BmpState &state, int32_t rows);

// Counts the rows as done, whether or not the data had them. After the last one the decode ends.
void finish_band(ImageDecodeInfo &info, BmpState &state, int32_t rows);

} // namespace pelm
