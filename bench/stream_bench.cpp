#include "bench/stream_bench.h"

#include "bench/contest.h"
#include "bench/large_works.h"
#include "bench/own_decoder.h"
#include "bench/png_pictures.h"
#include "bench/temporary_file.h"

namespace bench {
namespace {

void add(const std::string &name, Call call, Box box, const SharedWork &work) {
    const Request request = {call, rgba, box};
    const size_t size = bytes_of(rgba, box);
    const auto stored = std::make_shared<TemporaryFile>();
    add_contest(
        "stream/" + name, work,
        {{"pelm", [=](const Bytes &file) { return decode_stream(request, stored->path_with(file), output_of(size)); }},
         {"memory", [=](const Bytes &file) { return decode_memory(request, file, output_of(size)); }}});
}

} // namespace

void add_stream_benchmarks() {
    add("png photo", ZOTARPELMI_DecodePNG, large_box, png_photo_rgb());
    add("png screenshot", ZOTARPELMI_DecodePNG, hd_box, file_made_by([] {
            return png_picture(Motif::screenshot, {2, 8}, 1920, 1080);
        }));
    add("gif photo", ZOTARPELMI_DecodeGIF, hd_box, gif_photo_hd());
    add("gif screenshot", ZOTARPELMI_DecodeGIF, hd_box, gif_screenshot_hd());
    for (const int32_t bits_per_pixel : {8, 24})
        add("bmp " + std::to_string(bits_per_pixel) + " bits", ZOTARPELMI_DecodeBMP, large_box,
            bmp_of_depth(bits_per_pixel));
}

} // namespace bench
