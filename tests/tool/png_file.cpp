#include "tests/tool/png_file.h"

#include <zlib.h>

#include "tests/support/bytes.h"

namespace pelm::test {

PngPart header_part(const PngHeader &header) {
    PngPart part = {"IHDR", {}};
    append_u32be(part.data, header.width);
    append_u32be(part.data, header.height);
    append(part.data, {header.depth, header.colour_type, header.compression, header.filter, header.interlace});
    return part;
}

PngPart data_part(const Bytes &rows) {
    return {"IDAT", zlib_bytes(rows)};
}

PngPart end_part() {
    return {"IEND", {}};
}

Bytes png_bytes(const std::vector<PngPart> &parts) {
    Bytes bytes = {0x89, 'P', 'N', 'G', 0x0D, 0x0A, 0x1A, 0x0A};
    for (const PngPart &part : parts) {
        append_u32be(bytes, static_cast<uint32_t>(part.data.size()));
        const size_t start = bytes.size();
        bytes.insert(bytes.end(), part.type.begin(), part.type.end());
        append(bytes, part.data);
        append_u32be(bytes,
                     static_cast<uint32_t>(crc32(0, bytes.data() + start, static_cast<uInt>(bytes.size() - start))));
    }
    return bytes;
}

size_t position_of(const std::vector<PngPart> &parts, size_t index) {
    return png_bytes({parts.begin(), parts.begin() + static_cast<ptrdiff_t>(index)}).size();
}

Bytes zlib_bytes(const Bytes &data) {
    uLongf size = compressBound(static_cast<uLong>(data.size()));
    Bytes bytes(size);
    compress(bytes.data(), &size, data.data(), static_cast<uLong>(data.size()));
    bytes.resize(size);
    return bytes;
}

Bytes stored_block(const Bytes &data) {
    const auto low = static_cast<uint8_t>(data.size() & 255), high = static_cast<uint8_t>(data.size() >> 8);
    Bytes bytes;
    bytes.reserve(data.size() + 5);
    append(bytes, {0, low, high, static_cast<uint8_t>(~low), static_cast<uint8_t>(~high)});
    append(bytes, data);
    return bytes;
}

Bytes noise_rows(size_t row_bytes, size_t rows) {
    Bytes bytes;
    uint32_t seed = 1;
    for (size_t i = 0; i < rows * (row_bytes + 1); ++i) {
        seed = seed * 1664525 + 1013904223;
        bytes.push_back(i % (row_bytes + 1) == 0 ? uint8_t{0} : static_cast<uint8_t>(seed >> 24));
    }
    return bytes;
}

} // namespace pelm::test
