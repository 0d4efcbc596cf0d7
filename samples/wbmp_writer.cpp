#include "samples/wbmp_writer.h"

#include <cstddef>
#include <cstdio>

namespace pelm_samples {
namespace {

using Bytes = std::vector<uint8_t>;

// Seven bits a byte, all but the last one marked.
void put_side(Bytes &bytes, int side) {
    if (side >= 128) bytes.push_back(static_cast<uint8_t>(0x80 | side >> 7));
    bytes.push_back(static_cast<uint8_t>(side & 0x7F));
}

// Eight pixels a byte, the first one in its highest bit.
void put_row(Bytes &bytes, const uint32_t *values, int width) {
    for (int x = 0; x < width; x += 8) {
        uint32_t byte = 0;
        for (int i = 0; i < 8; ++i)
            byte = byte << 1 | (x + i < width ? values[x + i] : 0);
        bytes.push_back(static_cast<uint8_t>(byte));
    }
}

} // namespace

bool write_wbmp(const std::string &path, int width, int height, const std::vector<uint32_t> &values) {
    Bytes bytes = {0, 0};
    put_side(bytes, width);
    put_side(bytes, height);
    for (int y = 0; y < height; ++y)
        put_row(bytes, values.data() + static_cast<ptrdiff_t>(y) * width, width);

    std::FILE *const file = std::fopen(path.c_str(), "wb");
    if (file == nullptr) return false;
    const bool written = std::fwrite(bytes.data(), 1, bytes.size(), file) == bytes.size();
    return std::fclose(file) == 0 && written;
}

} // namespace pelm_samples
