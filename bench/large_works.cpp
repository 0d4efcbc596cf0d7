#include "bench/large_works.h"

#include <map>

#include "bench/bmp_pictures.h"
#include "bench/gif_pictures.h"
#include "bench/png_pictures.h"

namespace bench {
namespace {

SharedWork large_photo(PngLayout layout) {
    return file_made_by([=] {
        return png_picture(Motif::photo, layout, static_cast<uint32_t>(large_box.width),
                           static_cast<uint32_t>(large_box.height));
    });
}

SharedWork gif_hd(Motif motif, Colours colours) {
    return file_made_by([=] {
        return gif_picture(motif, colours, static_cast<uint32_t>(hd_box.width), static_cast<uint32_t>(hd_box.height));
    });
}

} // namespace

SharedWork png_photo_rgb() {
    static const SharedWork work = large_photo({2, 8});
    return work;
}

SharedWork png_photo_palette() {
    static const SharedWork work = large_photo({3, 8});
    return work;
}

SharedWork png_photo_adam7() {
    static const SharedWork work = large_photo({2, 8, true});
    return work;
}

SharedWork bmp_of_depth(int32_t bits_per_pixel) {
    static std::map<int32_t, SharedWork> works;
    SharedWork &work = works[bits_per_pixel];
    if (!work) work = file_made_by([=] { return photo_bmp(large_box.width, large_box.height, bits_per_pixel); });
    return work;
}

SharedWork gif_photo_hd() {
    static const SharedWork work = gif_hd(Motif::photo, Colours::dithered);
    return work;
}

SharedWork gif_screenshot_hd() {
    static const SharedWork work = gif_hd(Motif::screenshot, Colours::nearest);
    return work;
}

} // namespace bench
