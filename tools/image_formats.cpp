#include "tools/image_formats.h"

#include <algorithm>
#include <cstring>
#include <string>

#include "tools/bmp_description.h"
#include "tools/failure.h"

namespace pelm_tool {
namespace {

constexpr uint32_t bmp_formats = 1u << PELM_FORMAT_RGB565 | 1u << PELM_FORMAT_RGB888 | 1u << PELM_FORMAT_ARGB8888 |
                                 1u << PELM_FORMAT_RGB565_A8 | 1u << PELM_FORMAT_RGBA8888 | 1u << PELM_FORMAT_BGRA8888;

constexpr ImageFormat image_formats[] = {
    {"BMP", "BM", describe_bmp, ZOTARPELMI_DecodeBMP, bmp_formats},
    {"PNG", "\x89PNG\r\n\x1A\n", nullptr, nullptr, 0},
    {"GIF", "GIF8", nullptr, nullptr, 0},
};

bool begins_with(Bytes head, const char *magic) {
    const size_t length = std::strlen(magic);
    return head.size() >= length && std::memcmp(head.data(), magic, length) == 0;
}

} // namespace

const ImageFormat &recognise(Bytes head) {
    if (head.empty()) throw Failure("the file is empty");
    for (const ImageFormat &format : image_formats) {
        if (!begins_with(head, format.magic)) continue;
        if (format.describe == nullptr) throw Failure(std::string(format.name) + " images are not decoded yet");
        return format;
    }
    throw Failure("not a BMP file (it does not begin with \"BM\")");
}

bool writes(const ImageFormat &image, const PixelFormat &pixels) {
    return (image.written_formats >> pixels.code & 1) != 0;
}

} // namespace pelm_tool
