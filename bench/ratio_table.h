// The table of docs/performance.md: each kind of work against its goals.
#pragma once

#include <map>
#include <string>

namespace bench {

// Milliseconds of one iteration, by work and by who did it; "pelm" is us.
using BestTimes = std::map<std::string, std::map<std::string, double>>;

// As Markdown, to the standard output.
void print_ratio_table(const BestTimes &times);

} // namespace bench
