// Sweeps that are cut into one test for each call, so that they run side by side and name what fails.
#pragma once

#include <ostream>

#include <gtest/gtest.h>

#include "tests/sweeps/decodes.h"
#include "tests/sweeps/extent.h"

namespace pelm::sweeps {

struct Shard {
    const fuzz::Call *call;
    uint64_t complete; // decodes, all of them
};

inline void PrintTo(const Shard &shard, std::ostream *stream) {
    *stream << shard.call->name;
}

// All calls that decode, with the number of decodes that a complete sweep makes at least by each call of a format.
inline std::vector<Shard> shards(uint64_t bmp, uint64_t wbmp, uint64_t png, uint64_t gif) {
    using fuzz::Format;
    std::vector<Shard> all;
    const std::pair<Format, uint64_t> formats[] = {
        {Format::bmp, bmp}, {Format::wbmp, wbmp}, {Format::png, png}, {Format::gif, gif}, {Format::agif, gif}};
    for (const auto &[format, complete] : formats)
        for (const fuzz::Call &call : fuzz::decoding_calls(format))
            all.push_back({&call, complete});
    return all;
}

inline std::string name_of_shard(const testing::TestParamInfo<Shard> &info) {
    return info.param.call->name;
}

// The decodes of all inputs by the shard's call. The inputs must outlive them.
inline std::vector<Decode> decodes_of(const Shard &shard, const std::vector<Input> &inputs) {
    std::vector<Decode> decodes = decodes_of(inputs);
    std::erase_if(decodes, [&shard](const Decode &decode) { return decode.call != shard.call; });
    return decodes;
}

// One in `step` of the complete amount was to be made.
inline void tell_count(const char *sweep, const Shard &shard, uint64_t decodes, uint64_t step) {
    tell_count((std::string(sweep) + ", " + shard.call->name).c_str(), decodes);
    EXPECT_GE(decodes, shard.complete / step);
}

} // namespace pelm::sweeps
