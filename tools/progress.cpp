#include "tools/progress.h"

#include <algorithm>
#include <cstdio>

#include <unistd.h>

namespace pelm_tool {
namespace {

constexpr auto patience = std::chrono::milliseconds(500);
constexpr auto redraw_interval = std::chrono::milliseconds(100);
constexpr int bar_width = 24;
constexpr int name_width = 36; // the whole line stays below 80 columns

} // namespace

Progress::Progress(bool wanted, size_t inputs)
    : shown_at_all_(wanted && isatty(STDERR_FILENO) == 1), inputs_(inputs), next_draw_(Clock::now() + patience) {}

Progress::~Progress() {
    clear();
}

void Progress::start_input(size_t index, const std::string &name) {
    index_ = index;
    name_ = name.size() <= name_width ? name : "..." + name.substr(name.size() - (name_width - 3));
    at(0);
}

void Progress::at(double part_of_input) noexcept {
    if (!shown_at_all_ || Clock::now() < next_draw_) return;
    next_draw_ = Clock::now() + redraw_interval;
    draw((static_cast<double>(index_) + std::clamp(part_of_input, 0.0, 1.0)) / static_cast<double>(inputs_));
}

void Progress::draw(double part) noexcept {
    const int filled = static_cast<int>(part * bar_width);
    std::fprintf(stderr, "\r\033[K[%.*s%*s] %3d%%  %s", filled, "########################", bar_width - filled, "",
                 static_cast<int>(part * 100), name_.c_str());
    std::fflush(stderr);
    visible_ = true;
}

void Progress::clear() noexcept {
    if (!visible_) return;
    std::fputs("\r\033[K", stderr);
    std::fflush(stderr);
    visible_ = false;
}

} // namespace pelm_tool
