#include "tests/sweeps/peers/comparison.h"

#include <algorithm>

#include "tests/gif/support/gif_builder.h"
#include "tests/sweeps/tally.h"

namespace pelm::sweeps {

std::optional<Bytes> decoded(const fuzz::Call &call, fuzz::Format format, const Bytes &file, uint32_t output_format,
                             int32_t width, int32_t height) {
    const Input input{"mutated", format, width, height, file};
    const Setting setting{.format = output_format, .width = width, .height = height};
    const size_t pixel = fuzz::bytes_per_output_pixel(format, output_format);
    Bytes output(pixel * static_cast<size_t>(width) * static_cast<size_t>(height), untouched);
    const Outcome outcome = run({&input, &call}, setting, output);
    EXPECT_EQ(PelmTest_Violation(), nullptr) << test::hex_of(file, 4000);
    PelmTest_Reset();
    if (outcome.replies.back().result != PELM_RESULT_DONE) return {};
    return output;
}

bool Comparison::agree(const Bytes &file, const Bytes &ours, const Bytes &theirs, const std::string &explanation) {
    if (ours == theirs) {
        ++same;
        return true;
    }
    if (!explanation.empty()) {
        ++explained_[explanation];
        return true;
    }
    const auto at = std::mismatch(ours.begin(), ours.end(), theirs.begin(), theirs.end()).first - ours.begin();
    ADD_FAILURE() << "other pixels from byte " << at << " of " << ours.size() << " on\nfile of " << file.size()
                  << " bytes: " << test::hex_of(file, 6000);
    return false;
}

void Comparison::tell_all(const char *peer, uint64_t files, uint64_t of_all) {
    std::printf("    beside %s: %llu the same, %llu read here only, %llu there only, %llu by neither\n", peer,
                static_cast<unsigned long long>(same), static_cast<unsigned long long>(only_ours),
                static_cast<unsigned long long>(only_theirs), static_cast<unsigned long long>(neither));
    for (const auto &[explanation, count] : explained_)
        std::printf("    %llu other pixels: %s\n", static_cast<unsigned long long>(count), explanation.c_str());
    EXPECT_GT(same, files / 10) << "hardly any file is read by both";
    tell("mutated files", files, of_all);
}

} // namespace pelm::sweeps
