#include "bench/ratio_table.h"

#include <cstdarg>
#include <cstdio>
#include <set>

#include "bench/goals.h"

namespace bench {
namespace {

using Times = std::map<std::string, double>;

std::string text(const char *format, ...) {
    char buffer[100];
    va_list values;
    va_start(values, format);
    std::vsnprintf(buffer, sizeof buffer, format, values);
    va_end(values);
    return buffer;
}

std::string verdict_on(double ratio, double goal) {
    return ratio >= goal ? "reached" : text("missed by %.0f %%", 100 * (1 - ratio / goal));
}

bool ends_with(const std::string &name, const std::string &end) {
    return name.size() >= end.size() && name.compare(name.size() - end.size(), end.size(), end) == 0;
}

std::string without_format(const std::string &work) {
    return ends_with(work, "/rgba") ? work.substr(0, work.size() - 5) : work;
}

// How much faster than RGBA; empty where that was not measured.
std::string speed_of_565(const BestTimes &times, const std::string &work, double own_time) {
    if (!ends_with(work, "/rgba")) return "";
    const auto at = times.find(without_format(work) + "/rgb565");
    if (at == times.end() || at->second.count("pelm") == 0) return "";
    const double ratio = own_time / at->second.at("pelm");
    return text(ratio >= 1 ? "%.2f" : "%.2f, slower", ratio);
}

std::string others_than(const char *peer, const Times &times, double own_time) {
    std::string others;
    for (const auto &[who, time] : times)
        if (who != "pelm" && who != peer)
            others += text("%s%s %.2f", others.empty() ? "" : ", ", who.c_str(), time / own_time);
    return others;
}

void print_row(const std::string &work, double own_time, const std::string &ratio, const std::string &goal,
               const std::string &verdict, const std::string &of_565, const std::string &others) {
    std::printf("| %-30s | %8.3f | %-20s | %-4s | %-14s | %-12s | %s |\n", without_format(work).c_str(), own_time,
                ratio.c_str(), goal.c_str(), verdict.c_str(), of_565.c_str(), others.c_str());
}

void print_goal(const BestTimes &times, const Goal &goal) {
    const auto at = times.find(goal.work);
    if (at == times.end() || at->second.count("pelm") == 0 || at->second.count(goal.peer) == 0) return;
    const double own_time = at->second.at("pelm");
    const double ratio = at->second.at(goal.peer) / own_time;
    print_row(goal.work, own_time, text("%.2f x %s", ratio, goal.peer), text("%g", goal.ratio),
              verdict_on(ratio, goal.ratio), speed_of_565(times, goal.work, own_time),
              others_than(goal.peer, at->second, own_time));
}

} // namespace

void print_ratio_table(const BestTimes &times) {
    std::printf("\n| %-30s | %8s | %-20s | %-4s | %-14s | %-12s | %s |\n|---|---:|---|---|---|---|---|\n", "Work", "ms",
                "Speed", "Goal", "", "RGB565", "Also");
    std::set<std::string> with_goals;
    for (const Goal &goal : goals) {
        print_goal(times, goal);
        with_goals.insert(goal.work);
    }
    for (const auto &[work, of_work] : times) {
        const bool is_column =
            ends_with(work, "/rgb565") && times.count(work.substr(0, work.size() - 7) + "/rgba") != 0;
        if (with_goals.count(work) != 0 || is_column || of_work.count("pelm") == 0) continue;
        const double own_time = of_work.at("pelm");
        print_row(work, own_time, "", "", "", speed_of_565(times, work, own_time), others_than("", of_work, own_time));
    }
}

} // namespace bench
