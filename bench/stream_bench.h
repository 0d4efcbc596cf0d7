// Files read in pieces of 16 KB, against the same decodes from memory.
#pragma once

namespace bench {

void add_stream_benchmarks();

} // namespace bench
