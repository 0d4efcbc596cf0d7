// One kind of work and all who do it, as benchmarks with the names "work/who".
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "bench/work.h"

namespace bench {

using Decode = std::function<bool(const Bytes &file)>;

struct Contestant {
    const char *who;
    Decode decode;
};

// We are the contestant "pelm". `is_right` judges each file once, before we are timed; empty: nothing is judged.
void add_contest(const std::string &work_name, const SharedWork &work, const std::vector<Contestant> &contestants,
                 const Decode &is_right = {});

} // namespace bench
