// Prints, behind Google Benchmark's own table, how each of our runs compares with its peers: the best CPU time of all
// repetitions each. Names are "work/who"; ours is "work/pelm".
#pragma once

#include <benchmark/benchmark.h>

#include <map>
#include <string>

namespace bench {

class RatioReporter : public benchmark::ConsoleReporter {
public:
    void ReportRuns(const std::vector<Run> &runs) override;
    void Finalize() override;
    bool has_failures() const { return has_failures_; }

private:
    bool has_failures_ = false;
    std::map<std::string, std::map<std::string, double>> best_; // work, who -> CPU time of one iteration
};

} // namespace bench
