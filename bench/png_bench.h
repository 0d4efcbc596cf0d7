// PNG from memory to RGBA and RGB565, against libpng, libspng and stb_image: pictures made at start, the photos and
// icons of the folder of test images where it is there.
#pragma once

namespace bench {

void add_png_benchmarks();

} // namespace bench
