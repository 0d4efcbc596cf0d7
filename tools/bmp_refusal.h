// Why the decoder refuses a BMP. The library itself says no more than "failed".
#pragma once

#include <string>

#include "tools/bmp_header.h"

namespace pelm_tool {

// The first reason in the order in which the decoder looks; empty: none.
std::string why_bmp_is_refused(const BmpHeader &header, const FileFacts &file);

// Whether it is of the kinds that only the calls in two steps know: longer headers and run-length codes.
bool may_fit_two_steps(const BmpHeader &header);

std::string bmp_depth_words(const BmpHeader &header);
std::string bmp_mask_words(const BmpHeader &header);
std::string bmp_compression_words(const BmpHeader &header);

} // namespace pelm_tool
