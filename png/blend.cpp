#include "png/blend.h"

uint16_t APPLY_ALPHA_RGB_TO_SHORT(uint32_t red, uint32_t green, uint32_t blue, uint32_t alpha, uint32_t oldPixel) {
    const pelm::Rgb over = {static_cast<uint8_t>(red), static_cast<uint8_t>(green), static_cast<uint8_t>(blue)};
    return pelm::blend_rgb565(over, alpha, oldPixel & 0xFFFF);
}

uint8_t APPLY_ALPHA_BYTE_TO_BYTE(uint32_t source, uint32_t alpha, uint32_t destination) {
    return pelm::blend_byte(source, alpha, destination);
}
