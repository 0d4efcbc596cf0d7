// The least that any decode of a picture must do: write it.
#pragma once

#include <cstring>
#include <memory>

#include "bench/contest.h"
#include "bench/output.h"

namespace bench {

inline Contestant copy_of_output(const Format &format, Box box, uint32_t frames = 1) {
    const size_t size = bytes_of(format, box);
    return {"memcpy", [=, pixels = std::make_shared<Bytes>()](const Bytes &) {
                pixels->resize(size, 1);
                for (uint32_t i = 0; i < frames; ++i)
                    std::memcpy(output_of(size), pixels->data(), size);
                return true;
            }};
}

} // namespace bench
