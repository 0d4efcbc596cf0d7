#include "bench/ratio_reporter.h"

#include <algorithm>
#include <cstdio>
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

void RatioReporter::ReportRuns(const std::vector<Run> &runs) {
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

void RatioReporter::Finalize() {
    std::printf("\n%-40s %12s   speed against\n", "best of all repetitions", "pelm");
    for (const auto &[work, times] : best_) {
        const auto own = times.find("pelm");
        if (own == times.end()) continue;
        std::printf("%-40s %10.3f ms", work.c_str(), own->second);
        for (const auto &[who, time] : times)
            if (who != "pelm") std::printf("   %s %.2fx", who.c_str(), time / own->second);
        std::printf("\n");
    }
    ConsoleReporter::Finalize();
}

} // namespace bench
