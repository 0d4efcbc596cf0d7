#include "tests/support/small_gif.h"

#include <algorithm>

#include "tests/support/bytes.h"

namespace pelm::test {
namespace {

void append_16(Bytes &bytes, uint32_t value) {
    append(bytes, {static_cast<uint8_t>(value), static_cast<uint8_t>(value >> 8)});
}

void append_colours(Bytes &bytes, const std::vector<uint32_t> &colours) {
    for (const uint32_t c : colours)
        append(bytes, {static_cast<uint8_t>(c >> 16), static_cast<uint8_t>(c >> 8), static_cast<uint8_t>(c)});
}

// The flag of a table and its size, as descriptors hold them.
uint8_t table_bits(const std::vector<uint32_t> &colours) {
    uint8_t bits = 0;
    while (2u << bits < colours.size())
        ++bits;
    return colours.empty() ? 0 : static_cast<uint8_t>(0x80 | bits);
}

// Least significant bits first.
class Codes {
public:
    void put(uint32_t code) {
        bits_ |= code << count_;
        for (count_ += width; count_ >= 8; count_ -= 8, bits_ >>= 8)
            bytes_.push_back(static_cast<uint8_t>(bits_));
    }
    Bytes finished() {
        if (count_ > 0) bytes_.push_back(static_cast<uint8_t>(bits_));
        return bytes_;
    }

    static constexpr uint32_t width = 9, clear = 256, end = 257;

private:
    Bytes bytes_;
    uint32_t bits_ = 0, count_ = 0;
};

// Every pixel a code of its own; the table is cleared before the codes would grow.
Bytes codes_of(const Bytes &indices) {
    Codes codes;
    for (size_t i = 0; i < indices.size(); ++i) {
        if (i % 200 == 0) codes.put(Codes::clear);
        codes.put(indices[i]);
    }
    codes.put(Codes::end);
    return codes.finished();
}

Bytes indices_of(const SmallFrame &frame) {
    Bytes indices = frame.indices;
    for (size_t i = indices.size(); i < size_t{frame.width} * frame.height && frame.indices.empty(); ++i)
        indices.push_back(static_cast<uint8_t>(i % 4));
    return indices;
}

Bytes in_stored_order(const SmallFrame &frame, const Bytes &indices) {
    if (!frame.interlaced) return indices;
    constexpr struct { uint32_t first, step; } passes[] = {{0, 8}, {4, 8}, {2, 4}, {1, 2}};
    Bytes stored;
    for (const auto &pass : passes) {
        for (uint32_t y = pass.first; y < frame.height; y += pass.step) {
            const auto row = indices.begin() + static_cast<ptrdiff_t>(size_t{y} * frame.width);
            stored.insert(stored.end(), row, row + static_cast<ptrdiff_t>(frame.width));
        }
    }
    return stored;
}

void append_blocks(Bytes &bytes, const Bytes &data) {
    for (size_t at = 0; at < data.size(); at += 255) {
        const size_t size = std::min<size_t>(255, data.size() - at);
        bytes.push_back(static_cast<uint8_t>(size));
        const auto from = data.begin() + static_cast<ptrdiff_t>(at);
        bytes.insert(bytes.end(), from, from + static_cast<ptrdiff_t>(size));
    }
    bytes.push_back(0);
}

} // namespace

Bytes gif_header(const SmallGif &gif) {
    Bytes bytes = {'G', 'I', 'F', '8', '9', 'a'};
    append_16(bytes, gif.width);
    append_16(bytes, gif.height);
    append(bytes, {table_bits(gif.colours), 0, 0});
    append_colours(bytes, gif.colours);
    return bytes;
}

Bytes gif_loop_block(const std::string &application, int loops) {
    Bytes bytes = {'!', 0xFF, static_cast<uint8_t>(application.size())};
    append(bytes, {application.begin(), application.end()});
    append(bytes, {3, 1});
    append_16(bytes, static_cast<uint32_t>(loops));
    bytes.push_back(0);
    return bytes;
}

Bytes gif_image(const SmallFrame &frame) {
    Bytes bytes = {','};
    for (const uint32_t value : {frame.left, frame.top, frame.width, frame.height})
        append_16(bytes, value);
    bytes.push_back(static_cast<uint8_t>(table_bits(frame.colours) | (frame.interlaced ? 0x40 : 0)));
    append_colours(bytes, frame.colours);
    bytes.push_back(8);
    append_blocks(bytes, codes_of(in_stored_order(frame, indices_of(frame))));
    return bytes;
}

Bytes gif_frame(const SmallFrame &frame) {
    Bytes bytes;
    if (frame.delay >= 0) {
        const bool is_clear = frame.transparent >= 0;
        append(bytes, {'!', 0xF9, 4, static_cast<uint8_t>(frame.disposal << 2 | (is_clear ? 1 : 0))});
        append_16(bytes, static_cast<uint32_t>(frame.delay));
        append(bytes, {static_cast<uint8_t>(is_clear ? frame.transparent : 0), 0});
    }
    append(bytes, gif_image(frame));
    return bytes;
}

Bytes gif_bytes(const SmallGif &gif) {
    Bytes bytes = gif_header(gif);
    if (gif.loops >= 0) append(bytes, gif_loop_block("NETSCAPE2.0", gif.loops));
    for (const SmallFrame &frame : gif.frames)
        append(bytes, gif_frame(frame));
    if (gif.has_trailer) bytes.push_back(';');
    return bytes;
}

} // namespace pelm::test
