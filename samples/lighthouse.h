// The sample animation: the same evening, half as large, while the lighthouse's beam turns and the boat sails on.
#pragma once

#include "samples/gif_writer.h"

namespace pelm_samples {

GifContents draw_lighthouse(); // 160 x 120, eight frames

} // namespace pelm_samples
