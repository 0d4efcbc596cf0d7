// pelm-instructions: decodes one picture of each kind under callgrind, which then writes for each how many instructions
// that took, named by the picture. scripts/count-instructions reads them.
#include <valgrind/callgrind.h>

#include <cstdio>
#include <string>

#include "bench/bmp_pictures.h"
#include "bench/gif_pictures.h"
#include "bench/own_decoder.h"
#include "bench/png_pictures.h"
#include "bench/wbmp_pictures.h"
#include "frame/processor.h"

namespace bench {
namespace {

constexpr Box size = {400, 300};
constexpr Box small = {80, 60};
constexpr uint32_t width = 400, height = 300;

bool has_failed = false;

// The second decode counts: the first one finds things out that are then known, for whoever comes first.
template <class Decode>
void count(const std::string &name, const Bytes &file, Decode decode) {
    CALLGRIND_START_INSTRUMENTATION;
    bool decoded = decode(file);
    CALLGRIND_ZERO_STATS;
    CALLGRIND_TOGGLE_COLLECT;
    decoded = decode(file) && decoded;
    CALLGRIND_TOGGLE_COLLECT;
    CALLGRIND_DUMP_STATS_AT(name.c_str());
    CALLGRIND_STOP_INSTRUMENTATION;
    if (!decoded) std::fprintf(stderr, "%s: decode failed\n", name.c_str());
    has_failed = has_failed || !decoded;
}

void count_still(const std::string &name, const Bytes &file, const Request &request) {
    count(name, file, [&](const Bytes &bytes) {
        return decode_memory(request, bytes, output_of(bytes_of(request.format, request.box)));
    });
}

// In the ways that go different paths.
void count_ways(const std::string &name, const Bytes &file, Call call) {
    count_still(name, file, {call, rgba, size});
    count_still(name + ", RGB565", file, {call, rgb565, size});
    count_still(name + ", reduced", file, {call, rgb565, small});
}

Bytes png(Motif motif, PngLayout layout) {
    return png_picture(motif, layout, width, height);
}

void count_png() {
    constexpr Call call = ZOTARPELMI_DecodePNG;
    count_ways("PNG photo RGB", png(Motif::photo, {2, 8}), call);
    count_ways("PNG photo RGBA", png(Motif::photo, {6, 8}), call);
    count_ways("PNG photo palette", png(Motif::photo, {3, 8}), call);
    count_still("PNG photo grey", png(Motif::photo, {0, 8}), {call, rgba, size});
    count_still("PNG photo RGB16", png(Motif::photo, {2, 16}), {call, rgba, size});
    const Bytes interlaced = png(Motif::photo, {2, 8, true});
    count_still("PNG photo Adam7", interlaced, {call, rgba, size});
    count_still("PNG photo Adam7, reduced", interlaced, {call, rgb565, small, PELM_INTERLACE_FRAME});
    count_still("PNG photo RGB, small blocks", png(Motif::photo, {2, 8, false, true}), {call, rgba, size});
    count_still("PNG illustration RGB", png(Motif::illustration, {2, 8}), {call, rgba, size});
    count_still("PNG screenshot RGBA", png(Motif::screenshot, {6, 8}), {call, rgba, size});
    count_still("PNG text grey", png(Motif::text, {0, 8}), {call, rgba, size});
    count_still("PNG text grey1", png(Motif::text, {0, 1}), {call, rgba, size});
    const std::vector<Bytes> icons = png_icons();
    count("PNG icons", {}, [&](const Bytes &) {
        for (const Bytes &icon : icons)
            if (!decode_memory({call, rgba, {32, 32}}, icon, output_of(bytes_of(rgba, {32, 32})))) return false;
        return true;
    });
}

void count_gif() {
    count_ways("GIF photo", gif_picture(Motif::photo, Colours::dithered, width, height), ZOTARPELMI_DecodeGIF);
    count_still("GIF screenshot", gif_picture(Motif::screenshot, Colours::nearest, width, height),
                {ZOTARPELMI_DecodeGIF, rgba, size});
    count_still("GIF text", gif_picture(Motif::text, Colours::two, width, height), {ZOTARPELMI_DecodeGIF, rgba, size});
    const auto play_as = [](Format format) {
        return [=](const Bytes &bytes) {
            return play_memory({ZOTARPELMI_DecodeAGIF, format, size}, bytes, output_of(bytes_of(format, size)));
        };
    };
    const Bytes changes = gif_of_small_changes(Motif::screenshot, width, height, 6);
    count("GIF animation, full frames", gif_of_full_frames(Motif::photo, width, height, 3), play_as(rgba));
    count("GIF animation, small changes", changes, play_as(rgba));
    count("GIF animation, small changes, RGB565", changes, play_as(rgb565));
}

void count_bmp() {
    constexpr Call call = ZOTARPELMI_DecodeBMP;
    for (const int32_t bits_per_pixel : {1, 4, 8, 16, 24, 32})
        count_ways("BMP " + std::to_string(bits_per_pixel) + " bits",
                   photo_bmp(size.width, size.height, bits_per_pixel), call);
    count_still("BMP 24 bits, turned", photo_bmp(size.width, size.height, 24),
                {call, rgba, {size.height, size.width}, PELM_ROTATE_90});
}

} // namespace
} // namespace bench

int main() {
    std::printf("kernels %d\n", static_cast<int>(pelm::kernels()));
    bench::count_png();
    bench::count_gif();
    bench::count_bmp();
    bench::count_ways("WBMP", bench::wbmp_page(bench::width, bench::height), ZOTARPELMI_DecodeWBMP);
    return bench::has_failed ? 1 : 0;
}
