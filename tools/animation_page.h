// An animation as one HTML file that needs nothing else: frames, delays, how often to play it, and a small player.
#pragma once

#include <cstdint>
#include <string>

#include "tools/output.h"
#include "tools/pixels.h"

namespace pelm_tool {

class AnimationPage {
public:
    AnimationPage(Output &output, const std::string &title) : output_(output), title_(title) {}

    void add(const Picture &picture, uint32_t delay); // milliseconds
    void finish(uint32_t plays);                      // 0: for ever

private:
    void begin(const Picture &picture);
    void write(const std::string &text) { output_.write(text.data(), text.size()); }

    Output &output_;
    std::string title_;
    bool has_begun_ = false;
};

} // namespace pelm_tool
