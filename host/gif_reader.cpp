#include "host/gif_reader.h"

#include <algorithm>
#include <cstring>

namespace pelm::host {

bool GifReader::refill(int32_t need) {
    memmove(window_, window_ + at_, static_cast<size_t>(end_ - at_));
    end_ -= at_;
    at_ = 0;
    while (end_ < need) {
        const int32_t got = ZOTARPELM_Read_IO(&source_, window_ + end_, window_size - end_);
        if (got < 1) return false;
        end_ += std::min(got, window_size - end_);
    }
    return true;
}

} // namespace pelm::host
