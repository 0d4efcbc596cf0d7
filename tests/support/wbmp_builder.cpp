#include "tests/support/wbmp_builder.h"

namespace pelm::test {

Bytes multi_byte(uint64_t value, size_t length) {
    Bytes bytes;
    do {
        bytes.insert(bytes.begin(), static_cast<uint8_t>((bytes.empty() ? 0 : 0x80) | (value & 0x7F)));
        value >>= 7;
    } while (value != 0 || bytes.size() < length);
    return bytes;
}

Bytes file_bytes(const WbmpFile &file) {
    Bytes bytes = {file.type, file.fix_header};
    append(bytes, file.width);
    append(bytes, file.height);
    for (const Bytes &row : file.rows)
        append(bytes, row);
    append(bytes, file.behind);
    return bytes;
}

WbmpFile wbmp_of(const Picture &picture) {
    WbmpFile file;
    file.width = multi_byte(picture.empty() ? 0 : picture[0].size());
    file.height = multi_byte(picture.size());
    file.rows = pack_rows(picture, 1, true);
    return file;
}

WbmpFile noise_wbmp(int32_t width, int32_t height, uint32_t seed) {
    return wbmp_of(noise_picture(width, height, 1, seed));
}

WbmpFile blank_wbmp(int32_t width, int32_t height) {
    WbmpFile file;
    file.width = multi_byte(static_cast<uint32_t>(width));
    file.height = multi_byte(static_cast<uint32_t>(height));
    file.rows.assign(1, Bytes(static_cast<size_t>((width + 7) / 8) * static_cast<size_t>(height)));
    return file;
}

} // namespace pelm::test
