// Undoing a row's filter (PNG specification, chapter 9).
#pragma once

#include "png/state.h"

// In place. The filter type is the byte before `row`; `previousRow` is the reconstructed row above, or zeros.
// A filter type above 4 sets the first byte to 0 and leaves the rest.
PELM_EXPORT void __PELMI_PngReadFilterRow(const PngDecodeState *state, uint8_t *row, const uint8_t *previousRow,
                                          uint32_t rowLength);
