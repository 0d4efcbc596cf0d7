// Pixels of BMP files as SDL reads them.
#pragma once

#include <optional>

#include "tests/support/bmp_builder.h"

namespace pelm::test {

struct SdlPicture {
    int32_t width, height;
    Bytes rgb; // from the top left
};

// Nothing for what SDL does not read, and SDL_GetError() tells why.
std::optional<SdlPicture> read_with_sdl(const Bytes &file);

} // namespace pelm::test
