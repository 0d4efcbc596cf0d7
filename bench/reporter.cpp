#include "bench/reporter.h"

#include <algorithm>
#include <iterator>

namespace bench {
namespace {

using Run = benchmark::BenchmarkReporter::Run;

// Of repeated runs one line is enough: the median.
std::vector<Run> worth_a_line(const std::vector<Run> &runs) {
    std::vector<Run> chosen;
    std::copy_if(runs.begin(), runs.end(), std::back_inserter(chosen), [](const Run &run) {
        return run.error_occurred || run.repetitions <= 1 || run.aggregate_name == "median";
    });
    return chosen;
}

} // namespace

void Reporter::ReportRuns(const std::vector<Run> &runs) {
    for (const Run &run : runs) {
        has_failures_ = has_failures_ || run.error_occurred;
        if (run.run_type != Run::RT_Iteration || run.error_occurred) continue;
        const std::string &name = run.run_name.function_name;
        const size_t slash = name.rfind('/');
        const double time = run.GetAdjustedCPUTime();
        const auto [best, is_new] = best_[name.substr(0, slash)].emplace(name.substr(slash + 1), time);
        if (!is_new) best->second = std::min(best->second, time);
    }
    ConsoleReporter::ReportRuns(worth_a_line(runs));
}

} // namespace bench
