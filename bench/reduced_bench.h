// Large pictures reduced to a small screen, against other decoders that reduce row by row, or decode the whole.
#pragma once

namespace bench {

void add_reduced_benchmarks();

} // namespace bench
