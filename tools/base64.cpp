#include "tools/base64.h"

#include <string>

namespace pelm_tool {
namespace {

constexpr char digits[] = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";

void append_group(std::string &text, const unsigned char *group) {
    const unsigned bits = static_cast<unsigned>(group[0]) << 16 | static_cast<unsigned>(group[1]) << 8 | group[2];
    for (int shift = 18; shift >= 0; shift -= 6)
        text += digits[bits >> shift & 63];
}

} // namespace

void Base64::write(const void *bytes, size_t size) {
    const auto *const from = static_cast<const unsigned char *>(bytes);
    std::string text;
    text.reserve(size / 3 * 4 + 4);
    for (size_t i = 0; i < size; ++i) {
        group_[held_++] = from[i];
        if (held_ < sizeof group_) continue;
        append_group(text, group_);
        held_ = 0;
    }
    to_.write(text.data(), text.size());
}

void Base64::finish() {
    if (held_ == 0) return;
    for (size_t i = held_; i < sizeof group_; ++i)
        group_[i] = 0;
    std::string text;
    append_group(text, group_);
    text.replace(held_ + 1, std::string::npos, 3 - held_, '=');
    to_.write(text.data(), text.size());
    held_ = 0;
}

} // namespace pelm_tool
