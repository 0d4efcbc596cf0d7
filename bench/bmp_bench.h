// BMP: 12 megapixels pixel for pixel, against memcpy of the output and stb_image, and reduced to a small box.
#pragma once

namespace bench {

void add_bmp_benchmarks();

} // namespace bench
