// Source layout x output format x direction: one row loop combines them.
//
// A `Load` is a source row: load(x) gives the pixel in column x, in any type that frame/pixel.h's questions have
// answers for. Where that is nothing but bytes of the row, `channels` says which, and `row` is where they are. Where it
// has a faster way than pixel by pixel, write_some<Store>(from, count, out) writes as many pixels as that serves, one
// behind the other, and returns how many. A store is one of frame/stores.h; `put_wide`, where there is one, also writes
// up to three bytes behind the pixel.
#pragma once

#include <algorithm>
#include <cstddef>

#include "frame/clip.h"
#include "frame/formats.h"
#include "frame/stores.h"

namespace pelm {

template <class Store, class Load>
inline void write_run(const Load &load, int32_t from, int32_t count, uint8_t *__restrict out) {
    for (ptrdiff_t i = 0; i < count; ++i)
        Store::put(out + i * Store::size, load(from + static_cast<int32_t>(i)));
}

// Required for ARM with NEON: where GCC vectorizes this loop it takes every pixel of four bytes for aligned, and uses a
// store (vstr) that traps where one is not.
#if defined(__arm__) && defined(__GNUC__) && !defined(__clang__)
#define PELM_ONE_BY_ONE [[gnu::noinline, gnu::optimize("no-tree-vectorize")]]
#else
#define PELM_ONE_BY_ONE
#endif

template <class Store, class Load>
PELM_ONE_BY_ONE inline void write_distant_run(const Load &load, int32_t from, int32_t count, uint8_t *__restrict out,
                                              ptrdiff_t step) {
    for (ptrdiff_t i = 0; i < count; ++i)
        Store::put(out + i * step, load(from + static_cast<int32_t>(i)));
}

#undef PELM_ONE_BY_ONE

template <class Store, class Load>
concept IsSwizzle = requires {
    Load::channels;
    Store::channels;
};

// Whole groups of pixels as bytes, the others one by one: those at the end, and groups that blend.
template <class Store, class Load>
void write_run_in_groups(const Load &load, int32_t from, int32_t count, uint8_t *out) {
    static constexpr Swizzle how = make_swizzle(Load::channels, Store::channels, Store::swizzle_to);
    while (count > 0) {
        const int32_t done = swizzle(how, load.row + ptrdiff_t{from} * how.source_size, count, out);
        const int32_t singly = std::min(count - done, done == 0 ? 32 : 4);
        write_run<Store>(load, from + done, singly, out + ptrdiff_t{done} * Store::size);
        from += done + singly;
        count -= done + singly;
        out += ptrdiff_t{done + singly} * Store::size;
    }
}

// All but the last pixels are followed by others, which are written later.
template <class Store, class Load>
inline void write_run_wide(const Load &load, int32_t from, int32_t count, uint8_t *__restrict out) {
    const int32_t wide = std::max(count - 3, 0);
    for (ptrdiff_t i = 0; i < wide; ++i)
        Store::put_wide(out + i * Store::size, load(from + static_cast<int32_t>(i)));
    write_run<Store>(load, from + wide, count - wide, out + ptrdiff_t{wide} * Store::size);
}

// Pixels one behind the other.
template <class Store, class Load>
inline void write_dense_run(const Load &load, int32_t from, int32_t count, uint8_t *out) {
    if constexpr (IsSwizzle<Store, Load>)
        if (can_swizzle()) return write_run_in_groups<Store>(load, from, count, out);
    if constexpr (requires { load.template write_some<Store>(from, count, out); }) {
        const int32_t done = load.template write_some<Store>(from, count, out);
        from += done;
        count -= done;
        out += ptrdiff_t{done} * Store::size;
    }
    if constexpr (requires { Store::put_wide; } && Store::size == 3)
        write_run_wide<Store>(load, from, count, out);
    else
        write_run<Store>(load, from, count, out);
}

// Columns from .. from + count - 1, the first one to `out`, `step` bytes apart.
template <class Store, class Load>
inline void write_run_as(const Load &load, int32_t from, int32_t count, uint8_t *out, ptrdiff_t step) {
    if (step == Store::size)
        write_dense_run<Store>(load, from, count, out);
    else
        write_distant_run<Store>(load, from, count, out, step);
}

// This switch is the list of formats that the full-colour decoders write; any other code writes nothing.
template <class Load>
void write_row_as(uint32_t format, const Load &load, int32_t from, int32_t count, uint8_t *out, ptrdiff_t step) {
    switch (format) {
    case PELM_FORMAT_RGB565: return write_run_as<StoreRgb565>(load, from, count, out, step);
    case PELM_FORMAT_RGB888: return write_run_as<StoreRgb888>(load, from, count, out, step);
    case PELM_FORMAT_ARGB8888: return write_run_as<StoreArgb8888>(load, from, count, out, step);
    case PELM_FORMAT_RGB565_A8: return write_run_as<StoreRgb565A8>(load, from, count, out, step);
    case PELM_FORMAT_RGBA8888: return write_run_as<StoreRgba8888>(load, from, count, out, step);
    case PELM_FORMAT_BGRA8888: return write_run_as<StoreBgra8888>(load, from, count, out, step);
    default: return;
    }
}

// A list of output formats: how wide their pixels are, 0 for a code that is not in it, and how a row is written.
struct FullColourFormats {
    static constexpr int32_t size(uint32_t format) { return bytes_per_pixel(format); }
    template <class Load>
    static void write_row(uint32_t format, const Load &load, int32_t from, int32_t count, uint8_t *out,
                          ptrdiff_t step) {
        write_row_as(format, load, from, count, out, step);
    }
};

// The list that a load is written by: its own, or that of full colour.
template <class Load>
struct FormatsOf {
    using List = FullColourFormats;
};

template <class Load>
requires requires {
    typename Load::Formats;
}
struct FormatsOf<Load> {
    using List = typename Load::Formats;
};

// The same for a row that starts at byte `position` of a buffer: pixels that do not lie wholly inside are dropped.
template <class Load>
void write_row_clipped(const OutputBuffer &buffer, int64_t position, int64_t step, uint32_t format, const Load &load,
                       int32_t from, int32_t count) {
    using Formats = typename FormatsOf<Load>::List;
    const int32_t size = Formats::size(format);
    if (size == 0) return;
    const Run inside = clip_run(position, step, count, size, buffer.size);
    if (inside.count == 0) return;
    uint8_t *const first = buffer.start + static_cast<ptrdiff_t>(position + inside.first * step);
    Formats::write_row(format, load, from + static_cast<int32_t>(inside.first), inside.count, first,
                       static_cast<ptrdiff_t>(step));
}

} // namespace pelm
