// The progress line on a terminal: appears when the work takes long, and is gone when it ends.
#pragma once

#include <chrono>
#include <cstddef>
#include <string>

namespace pelm_tool {

class Progress {
public:
    // Shows nothing unless `wanted` and standard error is a terminal. `inputs` is how many there are in all.
    Progress(bool wanted, size_t inputs);
    ~Progress();
    Progress(const Progress &) = delete;
    Progress &operator=(const Progress &) = delete;

    void start_input(size_t index, const std::string &name); // index counts from 0
    void at(double part_of_input) noexcept;                  // 0 to 1
    void clear() noexcept;                                   // before anything else is printed

private:
    using Clock = std::chrono::steady_clock;

    void draw(double part) noexcept;

    bool shown_at_all_;
    size_t inputs_;
    size_t index_ = 0;
    std::string name_;
    Clock::time_point next_draw_;
    bool visible_ = false;
};

} // namespace pelm_tool
