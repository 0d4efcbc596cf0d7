// Google Benchmark's own lines, fewer of them, and the best CPU time of all repetitions of each benchmark.
#pragma once

#include <benchmark/benchmark.h>

#include "bench/ratio_table.h"

namespace bench {

class Reporter : public benchmark::ConsoleReporter {
public:
    void ReportRuns(const std::vector<Run> &runs) override;
    bool has_failures() const { return has_failures_; }
    const BestTimes &best() const { return best_; }

private:
    bool has_failures_ = false;
    BestTimes best_;
};

} // namespace bench
