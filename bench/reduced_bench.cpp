#include "bench/reduced_bench.h"

#include "bench/contest.h"
#include "bench/large_works.h"
#include "bench/own_decoder.h"
#include "bench/peers.h"

namespace bench {
namespace {

constexpr Box screen = {320, 240};

Contestant pelm(Call call, uint32_t flags = PELM_PLACE_FIT) {
    const Request request = {call, rgb565, screen, flags};
    return {"pelm",
            [=](const Bytes &file) { return decode_memory(request, file, output_of(bytes_of(rgb565, screen))); }};
}

Contestant by_rows(const char *who, bool (*reduce)(const Bytes &file, Box box, uint8_t *output)) {
    return {who, [=](const Bytes &file) { return reduce(file, screen, output_of(bytes_of(rgb565, screen))); }};
}

} // namespace

void add_reduced_benchmarks() {
    const Contestant libpng = by_rows("libpng rows", libpng_reduce);
    add_contest("reduced/png RGB", png_photo_rgb(), {pelm(ZOTARPELMI_DecodePNG), libpng});
    add_contest("reduced/png palette", png_photo_palette(), {pelm(ZOTARPELMI_DecodePNG), libpng});
    add_contest("reduced/png Adam7", png_photo_adam7(), {pelm(ZOTARPELMI_DecodePNG, PELM_INTERLACE_FRAME), libpng});
    add_contest("reduced/gif", gif_photo_hd(), {pelm(ZOTARPELMI_DecodeGIF), by_rows("giflib rows", giflib_reduce)});
    add_contest("reduced/bmp 24 bits", bmp_of_depth(24), {pelm(ZOTARPELMI_DecodeBMP), {"stb whole", stb_decode}});
}

} // namespace bench
