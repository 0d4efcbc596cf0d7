// BMP of every depth, against memcpy of the output and stb_image.
#pragma once

namespace bench {

void add_bmp_benchmarks();

} // namespace bench
