#include "png/adam7.h"

uint32_t getPassRowBytes(PngDecodeState *state, uint32_t imageWidth, uint32_t imageHeight, uint32_t *passNumber) {
    pelm::PassSize size = pelm::pass_size(imageWidth, imageHeight, *passNumber);
    while ((size.width == 0 || size.height == 0) && *passNumber <= pelm::pass_count)
        size = pelm::pass_size(imageWidth, imageHeight, ++*passNumber);
    state->imageWidth = size.width;
    state->imageHeight = size.height;
    state->interlaceMethod = static_cast<uint8_t>(*passNumber);
    return static_cast<uint32_t>((uint64_t{state->bitsPerPixel} * size.width + 7) / 8);
}
