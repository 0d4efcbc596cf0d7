// Capital letters, digits and a few signs, 5 x 7 dots each, for captions in pictures.
#pragma once

#include <string_view>

namespace pelm_tool {

inline constexpr int glyph_width = 5;
inline constexpr int glyph_height = 7;
inline constexpr int glyph_step = 6; // from one glyph to the next

// Whether the dot at (x, y) of `text`, set in one line, is on. Small letters look like capitals; unknown signs are
// blank.
bool dot_of_text(std::string_view text, int x, int y);

constexpr int text_width(std::string_view text) {
    return text.empty() ? 0 : static_cast<int>(text.size()) * glyph_step - (glyph_step - glyph_width);
}

} // namespace pelm_tool
