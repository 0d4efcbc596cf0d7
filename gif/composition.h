// The frame's row over the canvas, as far as a decode needs it.
#pragma once

#include "gif/state.h"

namespace pelm {

// As PELMI_MakeFrameLineBuffer, but for rows that the output does not show: of these only the frame's own columns, for
// the canvas. A frame of a few bytes may have 65535 rows.
void compose_to_be_shown(const GifDecoderState &state);

} // namespace pelm
