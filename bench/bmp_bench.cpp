#include "bench/bmp_bench.h"

#include "bench/contest.h"
#include "bench/copy_peer.h"
#include "bench/large_works.h"
#include "bench/own_decoder.h"
#include "bench/peers.h"

namespace bench {
namespace {

Contestant pelm_into(Format format, Box box, uint32_t flags) {
    const Request request = {ZOTARPELMI_DecodeBMP, format, box, flags};
    return {"pelm", [=](const Bytes &bmp) { return decode_memory(request, bmp, output_of(bytes_of(format, box))); }};
}

void add_depth(int32_t bits_per_pixel) {
    const SharedWork work = bmp_of_depth(bits_per_pixel);
    const std::string name = "bmp/" + std::to_string(bits_per_pixel) + " bits";
    for (const Format &format : {rgba, rgb565}) {
        std::vector<Contestant> contestants = {pelm_into(format, large_box, PELM_PLACE_FIT),
                                               copy_of_output(format, large_box)};
        if (format.code == rgba.code) contestants.push_back({"stb", stb_decode});
        add_contest(name + "/" + format.name, work, contestants);
    }
    add_contest(name + " turned/rgba", work, {pelm_into(rgba, {large_box.height, large_box.width}, PELM_ROTATE_90)});
}

} // namespace

void add_bmp_benchmarks() {
    for (const int32_t bits_per_pixel : {1, 4, 8, 16, 24, 32})
        add_depth(bits_per_pixel);
}

} // namespace bench
