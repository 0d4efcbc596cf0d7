#include "samples/gif_writer.h"

#include <algorithm>
#include <cstdio>
#include <map>

namespace pelm_samples {
namespace {

using Bytes = std::vector<uint8_t>;

constexpr uint32_t table_size = 4096;

void append_16(Bytes &file, int value) {
    file.push_back(static_cast<uint8_t>(value));
    file.push_back(static_cast<uint8_t>(value >> 8));
}

// Least significant bits first.
class Bits {
public:
    void put(uint32_t code, uint32_t width) {
        held_ |= code << count_;
        for (count_ += width; count_ >= 8; count_ -= 8, held_ >>= 8)
            bytes_.push_back(static_cast<uint8_t>(held_));
    }
    Bytes finished() {
        if (count_ > 0) bytes_.push_back(static_cast<uint8_t>(held_));
        return std::move(bytes_);
    }

private:
    Bytes bytes_;
    uint32_t held_ = 0, count_ = 0;
};

// A code grows by a bit when the decoder, which is one entry behind, needs it.
class Lzw {
public:
    explicit Lzw(uint32_t code_size) : code_size_(code_size) { clear(); }
    Bytes compress(const Bytes &indices);

private:
    uint32_t clear_code() const { return 1u << code_size_; }
    void clear();
    void put(uint32_t code) { bits_.put(code, width_); }
    void add(uint32_t prefix, uint8_t index);

    uint32_t code_size_;
    uint32_t width_ = 0;
    uint32_t next_ = 0;
    std::map<uint32_t, uint32_t> entries_; // prefix << 8 | index -> code
    Bits bits_;
};

void Lzw::clear() {
    width_ = code_size_ + 1;
    next_ = clear_code() + 2;
    entries_.clear();
}

void Lzw::add(uint32_t prefix, uint8_t index) {
    if (next_ == table_size) {
        put(clear_code());
        clear();
        return;
    }
    if (next_ == 1u << width_) ++width_;
    entries_.emplace(prefix << 8 | index, next_++);
}

Bytes Lzw::compress(const Bytes &indices) {
    put(clear_code());
    uint32_t prefix = indices.front();
    for (size_t i = 1; i < indices.size(); ++i) {
        const auto longer = entries_.find(prefix << 8 | indices[i]);
        if (longer != entries_.end()) {
            prefix = longer->second;
            continue;
        }
        put(prefix);
        add(prefix, indices[i]);
        prefix = indices[i];
    }
    put(prefix);
    if (next_ == 1u << width_ && next_ < table_size) ++width_;
    put(clear_code() + 1);
    return bits_.finished();
}

void append_blocks(Bytes &file, const Bytes &data) {
    for (size_t at = 0; at < data.size(); at += 255) {
        const size_t size = std::min<size_t>(255, data.size() - at);
        file.push_back(static_cast<uint8_t>(size));
        file.insert(file.end(), data.begin() + static_cast<ptrdiff_t>(at),
                    data.begin() + static_cast<ptrdiff_t>(at + size));
    }
    file.push_back(0);
}

Bytes in_four_passes(const GifFrame &frame) {
    constexpr struct { int first, step; } passes[] = {{0, 8}, {4, 8}, {2, 4}, {1, 2}};
    Bytes indices;
    for (const auto &pass : passes) {
        for (int y = pass.first; y < frame.height; y += pass.step) {
            const auto row = frame.indices.begin() + ptrdiff_t{y} * frame.width;
            indices.insert(indices.end(), row, row + frame.width);
        }
    }
    return indices;
}

uint32_t bits_for(const std::vector<Colour> &palette) {
    uint32_t bits = 1;
    while (1u << bits < palette.size())
        ++bits;
    return bits;
}

void append_header(Bytes &file, const GifContents &contents) {
    const uint32_t bits = bits_for(contents.palette);
    file = {'G', 'I', 'F', '8', '9', 'a'};
    append_16(file, contents.width);
    append_16(file, contents.height);
    for (const uint32_t byte : {0x80 | 7u << 4 | (bits - 1), 0u, 0u})
        file.push_back(static_cast<uint8_t>(byte));
    for (size_t i = 0; i < size_t{1} << bits; ++i) {
        const Colour c = i < contents.palette.size() ? contents.palette[i] : Colour{0, 0, 0};
        for (const int channel : {c.r, c.g, c.b})
            file.push_back(static_cast<uint8_t>(channel));
    }
}

void append_loops(Bytes &file, int loops) {
    constexpr std::string_view application = "\x0BNETSCAPE2.0\x03\x01";
    file.insert(file.end(), {'!', 0xFF});
    file.insert(file.end(), application.begin(), application.end());
    append_16(file, loops);
    file.push_back(0);
}

void append_graphic_control(Bytes &file, const GifFrame &frame) {
    const int flags = static_cast<int>(frame.disposal) << 2 | (frame.transparent >= 0 ? 1 : 0);
    file.insert(file.end(), {'!', 0xF9, 4, static_cast<uint8_t>(flags)});
    append_16(file, frame.delay);
    file.insert(file.end(), {static_cast<uint8_t>(std::max(frame.transparent, 0)), 0});
}

void append_frame(Bytes &file, const GifFrame &frame, uint32_t bits) {
    append_graphic_control(file, frame);
    file.push_back(',');
    for (const int value : {frame.left, frame.top, frame.width, frame.height})
        append_16(file, value);
    file.push_back(frame.interlaced ? 0x40 : 0);
    const uint32_t code_size = std::max(bits, 2u);
    file.push_back(static_cast<uint8_t>(code_size));
    append_blocks(file, Lzw(code_size).compress(frame.interlaced ? in_four_passes(frame) : frame.indices));
}

} // namespace

bool write_gif(const std::string &path, const GifContents &contents) {
    Bytes file;
    append_header(file, contents);
    if (contents.loops >= 0) append_loops(file, contents.loops);
    for (const GifFrame &frame : contents.frames)
        append_frame(file, frame, bits_for(contents.palette));
    file.push_back(';');
    std::FILE *const stream = std::fopen(path.c_str(), "wb");
    if (stream == nullptr) return false;
    const bool written = std::fwrite(file.data(), 1, file.size(), stream) == file.size();
    return std::fclose(stream) == 0 && written;
}

} // namespace pelm_samples
