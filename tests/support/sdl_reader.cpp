#include "tests/support/sdl_reader.h"

#include <SDL.h>

#include <memory>

namespace pelm::test {

std::optional<SdlPicture> read_with_sdl(const Bytes &file) {
    using Surface = std::unique_ptr<SDL_Surface, void (*)(SDL_Surface *)>;
    SDL_RWops *const stream = SDL_RWFromConstMem(file.data(), static_cast<int>(file.size()));
    const Surface stored(SDL_LoadBMP_RW(stream, 1), SDL_FreeSurface);
    if (!stored) return {};
    const Surface surface(SDL_ConvertSurfaceFormat(stored.get(), SDL_PIXELFORMAT_RGB24, 0), SDL_FreeSurface);
    if (!surface) return {};
    SdlPicture picture{surface->w, surface->h, {}};
    const auto *const rows = static_cast<const uint8_t *>(surface->pixels);
    for (int y = 0; y < surface->h; ++y)
        picture.rgb.insert(picture.rgb.end(), rows + y * surface->pitch, rows + y * surface->pitch + 3 * surface->w);
    return picture;
}

} // namespace pelm::test
