// GIF, stills and animations, against giflib and stb_image.
#pragma once

namespace bench {

void add_gif_benchmarks();

} // namespace bench
