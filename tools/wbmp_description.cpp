#include "tools/wbmp_description.h"

#include <algorithm>
#include <optional>

namespace pelm_tool {
namespace {

struct WbmpHeader {
    int64_t width, height; // 1 to 2^27 - 1, as the decoder takes them
    int64_t length;        // bytes
};

// Moves `at` behind the integer. Nothing for 0, for more than four bytes, and for what the decoder's 32 bits cannot
// hold.
std::optional<int64_t> read_side(Bytes head, size_t &at) {
    int64_t side = 0;
    for (int count = 0; count < 4 && at < head.size(); ++count) {
        const uint8_t byte = head[at++];
        side = side << 7 | (byte & 0x7F);
        if (byte >= 0x80) continue;
        const bool is_possible = side > 0 && side < int64_t{1} << 27;
        return is_possible ? std::optional(side) : std::nullopt;
    }
    return std::nullopt;
}

std::optional<WbmpHeader> parse_wbmp(Bytes head) {
    if (head.size() < 4 || head[0] != 0 || head[1] != 0) return std::nullopt;
    size_t at = 2;
    const std::optional<int64_t> width = read_side(head, at);
    const std::optional<int64_t> height = width ? read_side(head, at) : std::nullopt;
    if (!height) return std::nullopt;
    return WbmpHeader{*width, *height, static_cast<int64_t>(at)};
}

// The decoder takes no part of an image.
std::string why_refused(const WbmpHeader &header, const FileFacts &file) {
    const int64_t rows = std::max<int64_t>(0, file.size - header.length) / ((header.width + 7) / 8);
    if (rows >= header.height) return {};
    return "the file ends after " + std::to_string(rows) + " of " + std::to_string(header.height) +
           " rows, and only whole WBMPs are decoded";
}

} // namespace

bool begins_like_wbmp(Bytes head) {
    return parse_wbmp(head).has_value();
}

ImageDescription describe_wbmp(Bytes head, const FileFacts &file) {
    const WbmpHeader header = parse_wbmp(head).value();
    ImageDescription description;
    description.words =
        std::to_string(header.width) + "x" + std::to_string(header.height) + ", 1 bit per pixel, WBMP of type 0";
    description.refusal = why_refused(header, file);
    if (!description.refusal.empty()) return description;
    description.width = static_cast<int32_t>(header.width);
    description.height = static_cast<int32_t>(header.height);
    return description;
}

} // namespace pelm_tool
