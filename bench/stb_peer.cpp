#include "bench/peers.h"

#if defined(__GNUC__)
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wunused-function"
#pragma GCC diagnostic ignored "-Wconversion"
#pragma GCC diagnostic ignored "-Wshadow"
#endif
#if defined(__GNUC__) && !defined(__clang__)
#pragma GCC diagnostic ignored "-Wmaybe-uninitialized"
#endif
#define STB_IMAGE_STATIC
#define STB_IMAGE_IMPLEMENTATION
#include <stb/stb_image.h>
#if defined(__GNUC__)
#pragma GCC diagnostic pop
#endif

namespace bench {

bool stb_decode(const std::vector<uint8_t> &file) {
    int width = 0;
    int height = 0;
    int channels = 0;
    stbi_uc *const pixels =
        stbi_load_from_memory(file.data(), static_cast<int>(file.size()), &width, &height, &channels, 4);
    stbi_image_free(pixels);
    return pixels != nullptr;
}

bool stb_decode_frames(const std::vector<uint8_t> &gif) {
    int width = 0;
    int height = 0;
    int frames = 0;
    int channels = 0;
    int *delays = nullptr;
    stbi_uc *const pixels = stbi_load_gif_from_memory(gif.data(), static_cast<int>(gif.size()), &delays, &width,
                                                      &height, &frames, &channels, 4);
    stbi_image_free(pixels);
    stbi_image_free(delays);
    return pixels != nullptr;
}

} // namespace bench
