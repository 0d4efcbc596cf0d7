// Animations to decode, and their frames through either kind of call.
#pragma once

#include "tests/gif/support/gif_check.h"

namespace pelm::test {

inline constexpr GifCall frame_calls[] = {GifCall::frame, GifCall::frame_iterative};

struct Frame {
    ImagePlace place;
    GraphicControl control;
    ColourTable local = {};
    bool has_control = true;
    Bytes pixels = {}; // empty: noise
};

struct Animation {
    uint16_t width = 10, height = 8;
    int bits = 3;
    uint8_t background = 1;
    std::vector<Frame> frames;
    bool has_trailer = true;
    uint32_t seed = 1;

    ColourTable table() const { return distinct_table(size_t{1} << bits, seed); }
    Bytes pixels_of(size_t frame) const;
    Bytes file() const;
};

// The whole output behind every frame that is delivered, and the result that came with it. Fails the test when the
// library and the model differ anywhere on the way.
struct DeliveredFrame {
    int32_t result;
    Bytes output;
    GifWords words;
};
std::vector<DeliveredFrame> frames_of(const Bytes &file, const GifRequest &request, GifCall which = GifCall::frame,
                                      const GifSetting &setting = {});

} // namespace pelm::test
