// WBMP, whole and reduced, against memcpy of the output.
#pragma once

namespace bench {

void add_wbmp_benchmarks();

} // namespace bench
