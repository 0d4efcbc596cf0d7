// Packed colours, R << 20 | G << 10 | B, and the output formats that GIF writes.
#pragma once

#include <bit>
#include <cstdint>
#include <cstring>

#include "frame/finished.h"
#include "gif/packed_lanes.h"
#include "gif/state.h"

namespace pelm {

struct PackedColour {
    uint32_t word;
};

constexpr uint32_t packed_colour(uint8_t r, uint8_t g, uint8_t b) {
    return static_cast<uint32_t>(r) << 20 | static_cast<uint32_t>(g) << 10 | b;
}

// A pixel that no frame has painted has all bits set, and so comes out white.
constexpr Rgb channels_of(PackedColour colour) {
    return {static_cast<uint8_t>(colour.word >> 20), static_cast<uint8_t>(colour.word >> 10),
            static_cast<uint8_t>(colour.word)};
}

constexpr uint16_t rgb565_of(PackedColour colour) {
    return rgb565_of(channels_of(colour));
}

constexpr Rgb swapped_channels_of(PackedColour colour) {
    const Rgb c = channels_of(colour);
    return {c.b, c.g, c.r};
}

struct StoreBgr565 {
    static constexpr int32_t size = 2;
    static void put(uint8_t *at, PackedColour colour) { put_rgb565(at, swapped_channels_of(colour)); }
};

struct StoreBgr888 {
    static constexpr int32_t size = 3;
    static void put(uint8_t *at, PackedColour colour) { put_rgb888(at, swapped_channels_of(colour)); }
};

// Required: this format alone shows what no frame has painted as transparent black (docs/oddities.md, "What no frame
// has painted").
struct StoreCanvasRgba8888 {
    static constexpr int32_t size = 4;
    static void put(uint8_t *at, PackedColour colour) {
        static_assert(std::endian::native == std::endian::little, "the first byte is the lowest");
        const uint32_t c = colour.word; // as one word, in shifts and masks that vectors have too
        const uint32_t opaque = (c >> 20 & 0xFF) | (c >> 2 & 0xFF00) | (c << 16 & 0xFF0000) | 0xFF000000;
        const uint32_t pixel = opaque & (c == gif_never_painted ? 0 : 0xFFFFFFFF);
        std::memcpy(at, &pixel, sizeof pixel);
    }
};

// The formats that GIF writes: see write_row_clipped.
struct GifFormats {
    static constexpr int32_t size(uint32_t format) {
        switch (format) {
        case PELM_FORMAT_RGB565_A8: return 0;
        case PELM_FORMAT_BGR565: return 2;
        case PELM_FORMAT_BGR888: return 3;
        case PELM_FORMAT_BGRX8888: return 4;
        default: return bytes_per_pixel(format);
        }
    }

    template <class Load>
    static void write_row(uint32_t format, const Load &load, int32_t from, int32_t count, uint8_t *out,
                          ptrdiff_t step) {
        switch (format) {
        case PELM_FORMAT_RGB565: return write_run_as<StoreRgb565>(load, from, count, out, step);
        case PELM_FORMAT_RGB888: return write_run_as<StoreRgb888>(load, from, count, out, step);
        case PELM_FORMAT_ARGB8888: return write_run_as<StoreArgb8888>(load, from, count, out, step);
        case PELM_FORMAT_RGBA8888: return write_run_as<StoreCanvasRgba8888>(load, from, count, out, step);
        case PELM_FORMAT_BGR565: return write_run_as<StoreBgr565>(load, from, count, out, step);
        case PELM_FORMAT_BGR888: return write_run_as<StoreBgr888>(load, from, count, out, step);
        case PELM_FORMAT_BGRA8888:
        case PELM_FORMAT_BGRX8888: return write_run_as<StoreBgra8888>(load, from, count, out, step);
        default: return;
        }
    }
};

// The steps of the 16-bit formats count pixels, those of all others bytes.
constexpr int32_t gif_step_unit(uint32_t format) {
    return GifFormats::size(format) == 2 ? 2 : 1;
}

// The rows that are written: the pixels, and the list of formats that takes them.

// Palette indices.
struct IndexedRow {
    using Pixel = FinishedPixel;
    using Formats = Finished<GifFormats>;
    const uint8_t *row;
    const uint32_t *finished;

    Pixel operator()(int32_t x) const { return {finished[row[x]]}; }

    template <class Store>
    requires(Store::size == 2 || Store::size == 4) int32_t write_some(int32_t from, int32_t count, uint8_t *out)
    const { return write_looked_up<8, Store::size>(finished, row + from, count, out); }
};

// Packed colours.
struct PackedRow {
    using Pixel = PackedColour;
    using Formats = GifFormats;
    const uint32_t *row;

    Pixel operator()(int32_t x) const { return {row[x]}; }

    template <class Store>
    requires std::is_same_v<Store, StoreRgb565> int32_t write_some(int32_t from, int32_t count, uint8_t *out)
    const { return write_rgb565_lanes(row + from, count, out); }
};

// The active table as finished pixels, 256 of them; made when the image's first row needs it.
const uint32_t *finished_colours(GifDecoderState &state);

} // namespace pelm
