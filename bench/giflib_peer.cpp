#include "bench/giflib_peer.h"

#include <algorithm>
#include <cstring>

#include <gif_lib.h>

namespace bench {
namespace {

struct Unread {
    const uint8_t *next;
    size_t left;
};

int on_read(GifFileType *gif, GifByteType *to, int count) {
    Unread &unread = *static_cast<Unread *>(gif->UserData);
    const size_t got = std::min(static_cast<size_t>(count), unread.left);
    std::memcpy(to, unread.next, got);
    unread.next += got;
    unread.left -= got;
    return static_cast<int>(got);
}

uint32_t pack(const GifColorType &c, uint32_t) {
    return 0xFF000000u | uint32_t{c.Blue} << 16 | uint32_t{c.Green} << 8 | c.Red;
}

uint16_t pack(const GifColorType &c, uint16_t) {
    return static_cast<uint16_t>(c.Red >> 3 << 11 | c.Green >> 2 << 5 | c.Blue >> 3);
}

// What one frame is painted with.
template <class Pixel>
struct Brush {
    Pixel colours[256];
    int transparent;
    std::vector<uint8_t> line;
};

template <class Pixel>
bool prepare(Brush<Pixel> &brush, const GifFileType &gif) {
    const ColorMapObject *const map = gif.Image.ColorMap != nullptr ? gif.Image.ColorMap : gif.SColorMap;
    if (map == nullptr) return false;
    for (int i = 0; i < map->ColorCount; ++i)
        brush.colours[i] = pack(map->Colors[i], Pixel{});
    brush.line.resize(static_cast<size_t>(gif.Image.Width));
    return true;
}

template <class Pixel>
void paint_line(const Brush<Pixel> &brush, Pixel *to) {
    const size_t width = brush.line.size();
    if (brush.transparent == NO_TRANSPARENT_COLOR) {
        for (size_t x = 0; x < width; ++x)
            to[x] = brush.colours[brush.line[x]];
        return;
    }
    for (size_t x = 0; x < width; ++x)
        if (brush.line[x] != brush.transparent) to[x] = brush.colours[brush.line[x]];
}

// Frames that reach beyond the screen are refused: the pictures here have none.
template <class Pixel>
bool paint_frame(GifFileType &gif, int transparent, Pixel *screen) {
    if (DGifGetImageDesc(&gif) != GIF_OK) return false;
    const GifImageDesc &place = gif.Image;
    if (place.Left + place.Width > gif.SWidth || place.Top + place.Height > gif.SHeight) return false;
    static Brush<Pixel> brush;
    brush.transparent = transparent;
    if (!prepare(brush, gif)) return false;
    static constexpr struct { int first, step; } passes[] = {{0, 8}, {4, 8}, {2, 4}, {1, 2}, {0, 1}};
    const int pass = place.Interlace ? 0 : 4, end = place.Interlace ? 4 : 5;
    for (int i = pass; i < end; ++i) {
        for (int y = passes[i].first; y < place.Height; y += passes[i].step) {
            if (DGifGetLine(&gif, brush.line.data(), place.Width) != GIF_OK) return false;
            paint_line(brush, screen + ptrdiff_t{place.Top + y} * gif.SWidth + place.Left);
        }
    }
    return true;
}

bool read_extension(GifFileType &gif, int &transparent) {
    int code = 0;
    GifByteType *block = nullptr;
    if (DGifGetExtension(&gif, &code, &block) != GIF_OK) return false;
    GraphicsControlBlock control;
    if (code == GRAPHICS_EXT_FUNC_CODE && block != nullptr &&
        DGifExtensionToGCB(block[0], block + 1, &control) == GIF_OK)
        transparent = control.TransparentColor;
    while (block != nullptr)
        if (DGifGetExtensionNext(&gif, &block) != GIF_OK) return false;
    return true;
}

template <class Pixel>
bool run_first(GifFileType &gif, Pixel *output) {
    int ignored = NO_TRANSPARENT_COLOR;
    for (GifRecordType record = UNDEFINED_RECORD_TYPE; record != TERMINATE_RECORD_TYPE;) {
        if (DGifGetRecordType(&gif, &record) != GIF_OK) return false;
        if (record == EXTENSION_RECORD_TYPE && !read_extension(gif, ignored)) return false;
        if (record == IMAGE_DESC_RECORD_TYPE) return paint_frame(gif, NO_TRANSPARENT_COLOR, output);
    }
    return false;
}

template <class Pixel>
bool run_all(GifFileType &gif, Pixel *output) {
    std::vector<Pixel> screen(static_cast<size_t>(gif.SWidth) * static_cast<size_t>(gif.SHeight));
    int transparent = NO_TRANSPARENT_COLOR;
    for (GifRecordType record = UNDEFINED_RECORD_TYPE; record != TERMINATE_RECORD_TYPE;) {
        if (DGifGetRecordType(&gif, &record) != GIF_OK) return false;
        if (record == EXTENSION_RECORD_TYPE && !read_extension(gif, transparent)) return false;
        if (record != IMAGE_DESC_RECORD_TYPE) continue;
        if (!paint_frame(gif, transparent, screen.data())) return false;
        std::copy(screen.begin(), screen.end(), output);
    }
    return true;
}

template <class Pixel>
bool run(GifFileType &gif, bool all_frames, uint8_t *output) {
    auto *const pixels = reinterpret_cast<Pixel *>(output);
    return all_frames ? run_all(gif, pixels) : run_first(gif, pixels);
}

bool decode(const std::vector<uint8_t> &file, Target target, bool all_frames, uint8_t *output) {
    Unread unread{file.data(), file.size()};
    int error = 0;
    GifFileType *const gif = DGifOpen(&unread, on_read, &error);
    if (gif == nullptr) return false;
    const bool decoded =
        target == Target::rgba ? run<uint32_t>(*gif, all_frames, output) : run<uint16_t>(*gif, all_frames, output);
    DGifCloseFile(gif, &error);
    return decoded;
}

} // namespace

bool giflib_decode(const std::vector<uint8_t> &gif, Target target, uint8_t *output) {
    return decode(gif, target, false, output);
}

bool giflib_decode_frames(const std::vector<uint8_t> &gif, Target target, uint8_t *output) {
    return decode(gif, target, true, output);
}

} // namespace bench
