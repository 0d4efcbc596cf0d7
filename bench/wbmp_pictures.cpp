#include "bench/wbmp_pictures.h"

namespace bench {
namespace {

// Below 16384, in two bytes.
void append_number(std::vector<uint8_t> &file, uint32_t value) {
    file.push_back(static_cast<uint8_t>(0x80 | value >> 7));
    file.push_back(static_cast<uint8_t>(value & 0x7F));
}

} // namespace

std::vector<uint8_t> wbmp_page(uint32_t width, uint32_t height) {
    std::vector<uint8_t> file = {0, 0};
    append_number(file, width);
    append_number(file, height);
    uint32_t noise = 1;
    for (uint32_t i = 0; i < (width + 7) / 8 * height; ++i) {
        noise = noise * 1664525 + 1013904223;
        const uint32_t patch = i / 23 % 4;
        file.push_back(patch == 0 ? static_cast<uint8_t>(noise >> 24) : patch == 1 ? uint8_t{0} : uint8_t{0xFF});
    }
    return file;
}

} // namespace bench
