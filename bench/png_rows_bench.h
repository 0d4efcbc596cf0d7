// The inner loops of PNG by themselves: undoing the filters of a row, for each filter and pixel size, and checksums.
#pragma once

namespace bench {

void add_png_row_benchmarks();

} // namespace bench
