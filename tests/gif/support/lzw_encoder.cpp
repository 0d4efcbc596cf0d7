#include "tests/gif/support/lzw_encoder.h"

#include <array>

namespace pelm::test {

namespace {

constexpr uint32_t table_size = 4096;
constexpr int widest = 12;

// For each string: which one it becomes with one more pixel behind it; 0: none.
using Strings = std::vector<std::array<uint16_t, 256>>;

class Encoder {
public:
    Encoder(int min_code_size, const LzwOptions &options)
        : min_(min_code_size), options_(options), next_(first_free_code(min_code_size)) {}

    Codes encode(const Bytes &pixels) {
        if (options_.begins_with_clear) codes_.push_back(clear_code(min_));
        size_t at = 0;
        while (at < pixels.size())
            at = encode_string(pixels, at);
        if (options_.ends) codes_.push_back(end_code(min_));
        return codes_;
    }

private:
    size_t encode_string(const Bytes &pixels, size_t at) {
        clear_when_due();
        uint32_t string = pixels[at++];
        while (at < pixels.size()) {
            const uint32_t longer = string < strings_.size() ? strings_[string][pixels[at]] : 0;
            if (longer == 0) break;
            string = longer;
            ++at;
        }
        codes_.push_back(string);
        ++since_clear_;
        const bool grows = min_ >= 2 && !options_.literals_only;
        if (at < pixels.size() && grows && next_ < table_size) add(string, pixels[at]);
        return at;
    }

    void add(uint32_t string, uint8_t pixel) {
        if (string >= strings_.size()) strings_.resize(string + 1);
        strings_[string][pixel] = static_cast<uint16_t>(next_++);
    }

    void clear_when_due() {
        const bool asked = options_.clear_every > 0 && since_clear_ >= options_.clear_every;
        const bool full = options_.clears_full_table && next_ == table_size;
        if (!asked && !full) return;
        codes_.push_back(clear_code(min_));
        strings_.clear();
        next_ = first_free_code(min_);
        since_clear_ = 0;
    }

    int min_;
    LzwOptions options_;
    uint32_t next_;
    size_t since_clear_ = 0;
    Strings strings_;
    Codes codes_;
};

} // namespace

Codes lzw_codes(const Bytes &pixels, int min_code_size, const LzwOptions &options) {
    return Encoder(min_code_size, options).encode(pixels);
}

std::vector<int> code_widths(const Codes &codes, int min_code_size) {
    std::vector<int> widths;
    int width = min_code_size + 1;
    uint32_t next = first_free_code(min_code_size);
    bool first = true; // nothing to join it to
    for (const uint32_t code : codes) {
        widths.push_back(width);
        if (code == clear_code(min_code_size)) {
            width = min_code_size + 1;
            next = first_free_code(min_code_size);
            first = true;
            continue;
        }
        if (!first && next < table_size) ++next;
        if (!first && next == 1u << width && width < widest) ++width;
        first = false;
    }
    return widths;
}

Bytes packed_codes(const Codes &codes, int min_code_size) {
    const std::vector<int> widths = code_widths(codes, min_code_size);
    Bytes bytes;
    size_t bits = 0;
    for (size_t i = 0; i < codes.size(); ++i)
        for (int bit = 0; bit < widths[i]; ++bit, ++bits) {
            if (bits % 8 == 0) bytes.push_back(0);
            bytes.back() = static_cast<uint8_t>(bytes.back() | (codes[i] >> bit & 1u) << bits % 8);
        }
    return bytes;
}

Bytes lzw_data(const Bytes &pixels, int min_code_size, const LzwOptions &options) {
    return packed_codes(lzw_codes(pixels, min_code_size, options), min_code_size);
}

} // namespace pelm::test
