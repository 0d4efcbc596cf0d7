#include "tools/blank_picture.h"

#include <algorithm>

#include "tools/failure.h"

namespace pelm_tool {
namespace {

constexpr uint64_t largest_output = uint64_t{1} << 31; // bytes

bool is_quarter_turn(const Options &options) {
    return options.rotation == PELM_ROTATE_90 || options.rotation == PELM_ROTATE_270;
}

} // namespace

Box divided(const ImageDescription &image, int32_t divisor) {
    return {std::max(image.width / divisor, 1), std::max(image.height / divisor, 1)};
}

Box box_for(const Options &options, const ImageDescription &image) {
    if (options.box) return *options.box;
    const Box size = divided(image, options.mode.divisor);
    return is_quarter_turn(options) ? Box{size.height, size.width} : size;
}

std::string size_words(int64_t width, int64_t height) {
    return std::to_string(width) + "x" + std::to_string(height);
}

void refuse_huge(const Box &box, const PixelFormat &format) {
    const uint64_t bytes =
        static_cast<uint64_t>(box.width) * static_cast<uint64_t>(box.height) * static_cast<uint64_t>(format.bytes);
    if (static_cast<uint64_t>(box.width) * static_cast<uint64_t>(box.height) > largest_output ||
        bytes > largest_output) {
        throw Failure("an output of " + size_words(box.width, box.height) + " pixels is larger than 2 GiB");
    }
}

Picture blank_picture(const Options &options, int32_t width, int32_t height) {
    Picture picture{options.format, static_cast<size_t>(width), static_cast<size_t>(height), {}};
    try {
        picture.bytes.resize(picture.width * picture.height * options.format->bytes);
    } catch (const std::exception &) { // bad_alloc, or length_error where addresses have 32 bits
        throw Failure("not enough memory for an output of " + size_words(width, height) + " pixels");
    }
    if (options.background) {
        const uint32_t rgb = *options.background;
        fill(picture, {static_cast<uint8_t>(rgb >> 16), static_cast<uint8_t>(rgb >> 8 & 0xFF),
                       static_cast<uint8_t>(rgb & 0xFF), 255});
    }
    return picture;
}

} // namespace pelm_tool
