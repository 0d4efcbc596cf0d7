#include "tests/tool/gif_oracle.h"

#include <gif_lib.h>

namespace pelm::test {
namespace {

constexpr int no_index = -1;

uint32_t colour_of(const GifFileType &gif, const SavedImage &frame, uint8_t index) {
    const ColorMapObject *const map = frame.ImageDesc.ColorMap != nullptr ? frame.ImageDesc.ColorMap : gif.SColorMap;
    const GifColorType &c = map->Colors[index];
    return uint32_t{c.Red} << 24 | uint32_t{c.Green} << 16 | uint32_t{c.Blue} << 8 | 255;
}

// Paints the frame, the indices but `transparent`; giflib has put interlaced rows in order.
void paint(Image &screen, const GifFileType &gif, const SavedImage &frame, int transparent) {
    const GifImageDesc &place = frame.ImageDesc;
    for (int y = 0; y < place.Height && place.Top + y < gif.SHeight; ++y) {
        for (int x = 0; x < place.Width && place.Left + x < gif.SWidth; ++x) {
            const uint8_t index = frame.RasterBits[y * place.Width + x];
            const size_t at = static_cast<size_t>(place.Top + y) * screen.width + static_cast<size_t>(place.Left + x);
            if (index != transparent) screen.pixels[at] = colour_of(gif, frame, index);
        }
    }
}

Image empty_screen(const GifFileType &gif) {
    const auto width = static_cast<size_t>(gif.SWidth), height = static_cast<size_t>(gif.SHeight);
    return {width, height, std::vector<uint32_t>(width * height), true};
}

void compose(OracleGif &result, GifFileType &gif) {
    Image screen = empty_screen(gif);
    for (int i = 0; i < gif.ImageCount; ++i) {
        GraphicsControlBlock control = {DISPOSAL_UNSPECIFIED, false, 0, no_index};
        DGifSavedExtensionToGCB(&gif, i, &control);
        const Image before = screen;
        paint(screen, gif, gif.SavedImages[i], control.TransparentColor);
        result.frames.push_back(screen);
        if (control.DisposalMode == DISPOSE_PREVIOUS) screen = before;
    }
}

} // namespace

OracleGif read_gif(const std::filesystem::path &path) {
    int error = 0;
    GifFileType *const gif = DGifOpenFileName(path.c_str(), &error);
    OracleGif result;
    if (gif != nullptr && DGifSlurp(gif) == GIF_OK && gif->ImageCount > 0) {
        result.first = empty_screen(*gif);
        paint(result.first, *gif, gif->SavedImages[0], no_index);
        compose(result, *gif);
    }
    DGifCloseFile(gif, &error);
    return result;
}

} // namespace pelm::test
