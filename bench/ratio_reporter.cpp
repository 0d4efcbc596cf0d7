#include "bench/ratio_reporter.h"

#include <algorithm>
#include <cstdio>

namespace bench {

void RatioReporter::ReportRuns(const std::vector<Run> &runs) {
    for (const Run &run : runs) {
        if (run.run_type != Run::RT_Iteration || run.error_occurred) continue;
        const std::string &name = run.run_name.function_name;
        const size_t slash = name.rfind('/');
        const double time = run.GetAdjustedCPUTime();
        const auto [best, is_new] = best_[name.substr(0, slash)].emplace(name.substr(slash + 1), time);
        if (!is_new) best->second = std::min(best->second, time);
    }
    ConsoleReporter::ReportRuns(runs);
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
