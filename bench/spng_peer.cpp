#include "bench/peers.h"

#include <spng.h>

namespace bench {
namespace {

bool decode(spng_ctx *context, const std::vector<uint8_t> &file, uint8_t *output) {
    spng_ihdr header;
    if (spng_set_png_buffer(context, file.data(), file.size()) != 0) return false;
    if (spng_get_ihdr(context, &header) != 0) return false;
    const size_t size = size_t{header.width} * header.height * 4;
    return spng_decode_image(context, output, size, SPNG_FMT_RGBA8, SPNG_DECODE_TRNS) == 0;
}

} // namespace

bool spng_decode(const std::vector<uint8_t> &file, uint8_t *output) {
    spng_ctx *const context = spng_ctx_new(0);
    if (context == nullptr) return false;
    const bool decoded = decode(context, file, output);
    spng_ctx_free(context);
    return decoded;
}

} // namespace bench
