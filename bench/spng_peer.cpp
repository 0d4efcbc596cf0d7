#include "bench/png_peers.h"

#include <spng.h>

#include "bench/pack_565.h"

namespace bench {
namespace {

bool is_transparent(spng_ctx *context, const spng_ihdr &header) {
    spng_trns transparency;
    return (header.color_type & 4) != 0 || spng_get_trns(context, &transparency) == 0;
}

bool decode_rows(spng_ctx *context, const spng_ihdr &header, uint8_t *output) {
    const bool blends = is_transparent(context, header);
    const spng_format format = blends ? SPNG_FMT_RGBA8 : SPNG_FMT_RGB8;
    std::vector<uint8_t> row(size_t{header.width} * (blends ? 4 : 3));
    if (spng_decode_image(context, nullptr, 0, format, SPNG_DECODE_PROGRESSIVE | SPNG_DECODE_TRNS) != 0) return false;
    for (int result = 0; result == 0; output += size_t{header.width} * 2) {
        result = spng_decode_row(context, row.data(), row.size());
        if (result != 0 && result != SPNG_EOI) return false;
        blends ? blend_rgba_row(row.data(), header.width, output) : pack_rgb_row(row.data(), header.width, output);
        if (result == SPNG_EOI) break;
    }
    return true;
}

bool decode(spng_ctx *context, const std::vector<uint8_t> &file, Target target, uint8_t *output) {
    spng_ihdr header;
    if (spng_set_png_buffer(context, file.data(), file.size()) != 0) return false;
    if (spng_get_ihdr(context, &header) != 0) return false;
    if (target == Target::rgb565) return decode_rows(context, header, output);
    const size_t size = size_t{header.width} * header.height * 4;
    return spng_decode_image(context, output, size, SPNG_FMT_RGBA8, SPNG_DECODE_TRNS) == 0;
}

} // namespace

bool spng_decode(const std::vector<uint8_t> &file, Target target, uint8_t *output) {
    spng_ctx *const context = spng_ctx_new(0);
    if (context == nullptr) return false;
    const bool decoded = decode(context, file, target, output);
    spng_ctx_free(context);
    return decoded;
}

} // namespace bench
