// One call beside another reader, over many files.
#pragma once

#include <map>
#include <optional>
#include <string>

#include <gtest/gtest.h>

#include "tests/sweeps/decodes.h"
#include "tests/sweeps/random.h"

namespace pelm::sweeps {

inline constexpr uint8_t untouched = 0x5C; // what the buffer holds before

// The image at its own size, by the call, from memory; nothing when it is refused.
std::optional<Bytes> decoded(const fuzz::Call &call, fuzz::Format format, const Bytes &file, uint32_t output_format,
                             int32_t width, int32_t height);

// Files and what came of them. Differences are counted by the entry of the documents that explains them.
class Comparison : public testing::TestWithParam<uint32_t> {
protected:
    Comparison() { PelmTest_Reset(); }
    ~Comparison() override { PelmTest_Reset(); }

    // Counts a file that both read. False when its pixels are others, and `explanation` is "".
    bool agree(const Bytes &file, const Bytes &ours, const Bytes &theirs, const std::string &explanation);
    // Besides that: of a file that readers may take in different ways a model says what this library must show.
    bool agree_with_model(const Bytes &file, const Bytes &ours, const Bytes &model);
    // The complete form is meant to come to so many files, and so many that both read.
    void tell_all(const char *peer, uint64_t files, uint64_t of_all, uint64_t of_both);

    Random random{GetParam() + 1300};
    uint64_t only_ours = 0, only_theirs = 0, neither = 0, same = 0;

private:
    bool are_the_same(const Bytes &file, const Bytes &ours, const Bytes &expected, const char *whose);

    uint64_t by_model_ = 0;
    std::map<std::string, uint64_t> explained_;
};

} // namespace pelm::sweeps
