#include "bench/png_bench.h"

#include "bench/contest.h"
#include "bench/copy_peer.h"
#include "bench/large_works.h"
#include "bench/own_decoder.h"
#include "bench/peers.h"
#include "bench/png_pictures.h"

namespace bench {
namespace {

uint32_t word_at(const Bytes &file, size_t at) {
    return uint32_t{file[at]} << 24 | uint32_t{file[at + 1]} << 16 | uint32_t{file[at + 2]} << 8 | file[at + 3];
}

Box size_of(const Bytes &png) {
    return {static_cast<int32_t>(word_at(png, 16)), static_cast<int32_t>(word_at(png, 20))};
}

Contestant pelm_into(Format format) {
    return {"pelm", [=](const Bytes &png) {
                const Box box = size_of(png);
                return decode_memory({ZOTARPELMI_DecodePNG, format, box}, png, output_of(bytes_of(format, box)));
            }};
}

Contestant whole(const char *who, bool (*decode)(const Bytes &png, uint8_t *output)) {
    return {who, [=](const Bytes &png) { return decode(png, output_of(bytes_of(rgba, size_of(png)))); }};
}

// Narrow grey is widened differently on purpose.
bool has_same_colours_elsewhere(const Bytes &png) {
    const uint8_t depth = png[24];
    return depth != 2 && depth != 4;
}

bool equals_libpng(const Bytes &png) {
    if (!has_same_colours_elsewhere(png)) return true;
    const Box box = size_of(png);
    Bytes expected(bytes_of(rgba, box), 1), got(bytes_of(rgba, box), 2);
    return libpng_decode(png, expected.data()) && decode_memory({ZOTARPELMI_DecodePNG, rgba, box}, png, got.data()) &&
           expected == got;
}

void add(const std::string &name, const SharedWork &work, const std::vector<Contestant> &others = {}) {
    std::vector<Contestant> contestants = {
        pelm_into(rgba), whole("libpng", libpng_decode), whole("libspng", spng_decode), {"stb", stb_decode}};
    contestants.insert(contestants.end(), others.begin(), others.end());
    add_contest("png/" + name + "/rgba", work, contestants, equals_libpng);
    add_contest("png/" + name + "/rgb565", work, {pelm_into(rgb565)});
}

void add_picture(const std::string &name, Motif motif, PngLayout layout, int32_t width, int32_t height) {
    const auto picture = [=] {
        return png_picture(motif, layout, static_cast<uint32_t>(width), static_cast<uint32_t>(height));
    };
    add(name, file_made_by(picture), {copy_of_output(rgba, {width, height})});
}

} // namespace

void add_png_benchmarks() {
    add("photo RGB", png_photo_rgb());
    add_picture("photo RGBA", Motif::photo, {6, 8}, 3264, 2448);
    add_picture("photo grey", Motif::photo, {0, 8}, 3264, 2448);
    add("photo palette", png_photo_palette());
    add_picture("photo RGB16", Motif::photo, {2, 16}, 2304, 1728);
    add("photo Adam7", png_photo_adam7());
    add_picture("illustration RGB", Motif::illustration, {2, 8}, 2800, 2100);
    add_picture("screenshot RGB", Motif::screenshot, {2, 8}, 2560, 1600);
    add_picture("screenshot RGBA", Motif::screenshot, {6, 8}, 2560, 1600);
    add_picture("screenshot palette", Motif::screenshot, {3, 8}, 2560, 1600);
    add_picture("text grey", Motif::text, {0, 8}, 2400, 3400);
    add_picture("text grey1", Motif::text, {0, 1}, 2400, 3400);
    add("icons", std::make_shared<Work>(png_icons)); // what counts is how a decode begins and ends
}

} // namespace bench
