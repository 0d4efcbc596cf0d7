// The two services by which a host stops and slows down a decode, scripted. The test programs are linked so that calls
// of them arrive here.
#pragma once

#include <cstdint>
#include <functional>
#include <vector>

namespace pelm::test {

struct Polling {
    // Statuses of the first polls; 0 from then on.
    std::vector<int32_t> statuses;
    // Called at every poll with its number, from 1.
    std::function<void(int)> at_poll;

    int polls = 0;
    // Polls so far and the value, for every sleep.
    struct Sleep {
        int after_poll;
        int32_t value;
        bool operator==(const Sleep &) const = default;
    };
    std::vector<Sleep> sleeps;

    static Polling &get();
    void reset() { *this = Polling{}; }
};

} // namespace pelm::test
