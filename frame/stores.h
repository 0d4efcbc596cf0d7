// How one pixel of each output format lies in memory. A store whose pixels are whole channels also names their bytes,
// for rows that are made of such pixels (frame/swizzle.h).
#pragma once

#include "frame/bytes.h"
#include "frame/pixel.h"
#include "frame/swizzle.h"

namespace pelm {

// The formats without alpha ask the pixel how it goes over what is there: these are for pixels that hide it.
template <class Pixel>
inline void put_rgb565(uint8_t *at, Pixel pixel) {
    store_u16(at, rgb565_of(pixel));
}

template <class Pixel>
inline void put_rgb888(uint8_t *at, Pixel pixel) {
    const Rgb c = channels_of(pixel);
    at[0] = c.r;
    at[1] = c.g;
    at[2] = c.b;
}

struct StoreRgb565 {
    static constexpr int32_t size = 2;
    static constexpr ChannelBytes channels = {4, 0, 1, 2, ChannelBytes::none};
    static constexpr SwizzleTo swizzle_to = SwizzleTo::rgb565;
    template <class Pixel>
    static void put(uint8_t *at, Pixel pixel) {
        put_rgb565(at, pixel);
    }
};

struct StoreRgb888 {
    static constexpr int32_t size = 3;
    static constexpr ChannelBytes channels = {3, 0, 1, 2, ChannelBytes::none};
    static constexpr SwizzleTo swizzle_to = SwizzleTo::triples;
    template <class Pixel>
    static void put(uint8_t *at, Pixel pixel) {
        put_rgb888(at, pixel);
    }
};

struct StoreArgb8888 {
    static constexpr int32_t size = 4;
    static constexpr ChannelBytes channels = {4, 1, 2, 3, 0};
    static constexpr SwizzleTo swizzle_to = SwizzleTo::words;
    template <class Pixel>
    static void put(uint8_t *at, Pixel pixel) {
        const Rgb c = channels_of(pixel);
        store_4(at, alpha_of(pixel), c.r, c.g, c.b);
    }
};

struct StoreRgb565A8 {
    static constexpr int32_t size = 3;
    template <class Pixel>
    static void put(uint8_t *at, Pixel pixel) {
        const uint16_t value = rgb565_with_alpha_of(pixel);
        at[0] = static_cast<uint8_t>(value);
        at[1] = static_cast<uint8_t>(value >> 8);
        at[2] = alpha_of(pixel);
    }
};

struct StoreRgba8888 {
    static constexpr int32_t size = 4;
    static constexpr ChannelBytes channels = {4, 0, 1, 2, 3};
    static constexpr SwizzleTo swizzle_to = SwizzleTo::words;
    template <class Pixel>
    static void put(uint8_t *at, Pixel pixel) {
        const Rgb c = channels_of(pixel);
        store_4(at, c.r, c.g, c.b, alpha_of(pixel));
    }
};

struct StoreBgra8888 {
    static constexpr int32_t size = 4;
    static constexpr ChannelBytes channels = {4, 2, 1, 0, 3};
    static constexpr SwizzleTo swizzle_to = SwizzleTo::words;
    template <class Pixel>
    static void put(uint8_t *at, Pixel pixel) {
        const Rgb c = channels_of(pixel);
        store_4(at, c.b, c.g, c.r, alpha_of(pixel));
    }
};

} // namespace pelm
