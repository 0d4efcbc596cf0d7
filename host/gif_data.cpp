// LZW with lengths for strings: where the codes end depends on nothing else.
#include "host/gif_data.h"

#include <cstring>

namespace pelm::host {
namespace {

constexpr uint32_t largest_code_size = 11; // above it the decoder gives up before the first pixel
constexpr uint32_t table_size = 4096;
constexpr uint32_t widest_code = 12; // bits
constexpr uint32_t longest_string = table_size;

class Codes {
public:
    Codes(GifReader &reader, uint32_t min_code_size) : reader_(reader), min_code_size_(min_code_size) { reset_width(); }

    uint32_t clear_code() const { return 1u << min_code_size_; }
    uint32_t end_code() const { return clear_code() + 1; }
    void reset_width() { width_ = min_code_size_ + 1; }
    void widen_at(uint32_t next_code) {
        if (next_code == 1u << width_ && width_ < widest_code) ++width_;
    }

    bool read(uint32_t &code); // false: the data ends
    bool read_behind_clears(uint32_t &code);

private:
    bool begin_block();

    GifReader &reader_;
    uint32_t min_code_size_;
    uint32_t width_; // bits
    uint32_t bits_ = 0;
    uint32_t bit_count_ = 0;
    int32_t block_left_ = 0; // bytes, all of them held by the reader
};

// A block is used only when a byte follows it. An empty one does not end the data.
bool Codes::begin_block() {
    if (!reader_.hold(1)) return false;
    const int32_t size = reader_.take();
    if (!reader_.hold(size + 1)) return false;
    block_left_ = size;
    return true;
}

bool Codes::read(uint32_t &code) {
    while (bit_count_ < width_) {
        if (block_left_ == 0) {
            if (!begin_block()) return false;
            continue;
        }
        bits_ |= static_cast<uint32_t>(reader_.take()) << bit_count_;
        bit_count_ += 8;
        --block_left_;
    }
    code = bits_ & ((1u << width_) - 1);
    bits_ >>= width_;
    bit_count_ -= width_;
    return true;
}

bool Codes::read_behind_clears(uint32_t &code) {
    do {
        if (!read(code)) return false;
    } while (code == clear_code());
    return true;
}

// The table of strings, of which only the lengths are kept.
class Strings {
public:
    explicit Strings(uint32_t roots) : roots_(roots), next_(roots) {
        memset(lengths_, 0, sizeof lengths_);
        for (uint32_t code = 0; code < roots; ++code)
            lengths_[code] = 1;
    }

    // The first code of the data or behind a clear code. Old entries stay until they are overwritten.
    void start_at(uint32_t code) {
        next_ = roots_;
        previous_ = code;
    }
    uint32_t pixels_of(uint32_t code); // and adds the entry that it defines
    uint32_t next() const { return next_; }

private:
    uint32_t roots_;
    uint32_t next_; // entry to be added; the table stays as it is once it is full
    uint32_t previous_ = 0;
    uint32_t lengths_[table_size]; // an entry that extends itself is longer each time
};

// As the decoder does it (docs/oddities.md, "Codes that are not in the table").
uint32_t Strings::pixels_of(uint32_t code) {
    uint32_t prefix = previous_;
    uint32_t pixels = 0;
    if (code < next_) {
        if (lengths_[code] > longest_string) code = 0;
        pixels = lengths_[code];
    } else {
        if (prefix >= next_) prefix = 0; // a known one behind another code is not too long
        pixels = lengths_[prefix] + 1;
    }
    if (next_ < table_size) {
        lengths_[next_] = lengths_[prefix] + 1;
        ++next_;
    }
    previous_ = code;
    return pixels;
}

} // namespace

uint64_t follow_gif_data(GifReader &reader, uint32_t min_code_size, uint64_t wanted) {
    if (min_code_size > largest_code_size) return 0;
    Codes codes(reader, min_code_size);
    Strings strings(codes.end_code() + 1);
    uint64_t pixels = 0;
    uint32_t code = codes.clear_code(); // the data begins as it goes on behind a clear code
    do {
        if (code == codes.clear_code()) {
            codes.reset_width();
            if (!codes.read_behind_clears(code) || code == codes.end_code()) break;
            strings.start_at(code);
            pixels += 1;
        } else {
            pixels += strings.pixels_of(code);
            codes.widen_at(strings.next());
        }
    } while (pixels < wanted && codes.read(code) && code != codes.end_code());
    return pixels;
}

} // namespace pelm::host
