#include "bench/contest.h"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <optional>

namespace bench {
namespace {

// Made once for all repetitions.
struct Judgement {
    Decode is_right;
    std::optional<bool> all_right;

    bool holds(const std::vector<Bytes> &files) {
        if (!is_right) return true;
        if (!all_right) all_right = std::all_of(files.begin(), files.end(), is_right);
        return *all_right;
    }
};

void run(benchmark::State &state, const SharedWork &work, const Decode &decode,
         const std::shared_ptr<Judgement> &judgement) {
    const std::vector<Bytes> &files = work->files();
    if (files.empty()) state.SkipWithError("there is nothing to decode");
    if (judgement && !judgement->holds(files)) state.SkipWithError("the picture is wrong");
    for (auto _ : state) {
        for (const Bytes &file : files)
            if (!decode(file)) state.SkipWithError("decode failed");
        benchmark::ClobberMemory();
    }
}

} // namespace

void add_contest(const std::string &work_name, const SharedWork &work, const std::vector<Contestant> &contestants,
                 const Decode &is_right) {
    for (const auto &[who, decode] : contestants) {
        const bool is_own = std::string(who) == "pelm";
        const auto judgement = is_own ? std::make_shared<Judgement>(Judgement{is_right, {}}) : nullptr;
        benchmark::RegisterBenchmark((work_name + "/" + who).c_str(), run, work, decode, judgement)
            ->Unit(benchmark::kMillisecond);
    }
}

} // namespace bench
