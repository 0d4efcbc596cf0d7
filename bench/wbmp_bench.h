// WBMP: 12 megapixels pixel for pixel, against memcpy of the output, and reduced.
#pragma once

namespace bench {

void add_wbmp_benchmarks();

} // namespace bench
