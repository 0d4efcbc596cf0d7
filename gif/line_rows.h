// Rows of line calls that nobody sees.
#pragma once

#include "gif/state.h"

namespace pelm {

// Whether the next output row begins at or behind the end of the buffer, so that nothing of it is written.
bool next_row_is_outside(const GifDecoderState &state);

// Counts the output rows that the current image row gives, as far as they are wanted, without writing them: a box may
// ask for billions of them where nothing can be written.
void pass_over_output_rows(GifDecoderState &state, int32_t wanted);

} // namespace pelm
