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

bool Comparison::are_the_same(const Bytes &file, const Bytes &ours, const Bytes &expected, const char *whose) {
    if (ours == expected) return true;
    const auto at = std::mismatch(ours.begin(), ours.end(), expected.begin(), expected.end()).first - ours.begin();
    ADD_FAILURE() << "other pixels than " << whose << " from byte " << at << " of " << ours.size() << " on\nfile of "
                  << file.size() << " bytes: " << test::hex_of(file, 6000);
    return false;
}

bool Comparison::agree(const Bytes &file, const Bytes &ours, const Bytes &theirs, const std::string &explanation) {
    if (ours == theirs) {
        ++same;
        return true;
    }
    if (explanation.empty()) return are_the_same(file, ours, theirs, "the other reader's");
    ++explained_[explanation];
    return true;
}

bool Comparison::agree_with_model(const Bytes &file, const Bytes &ours, const Bytes &model) {
    ++by_model_;
    return are_the_same(file, ours, model, "the model's");
}

void Comparison::tell_all(const char *peer, uint64_t files, uint64_t of_all, uint64_t of_both) {
    const auto number = [](uint64_t count) { return static_cast<unsigned long long>(count); };
    uint64_t explained = 0;
    for (const auto &[explanation, count] : explained_)
        explained += count;
    std::printf(
        "    beside %s: %llu files, %llu read by both, %llu the same, %llu explained, %llu also as a model says\n",
        peer, number(files), number(same + explained), number(same), number(explained), number(by_model_));
    for (const auto &[explanation, count] : explained_)
        std::printf("    %llu explained beside %s: %s\n", number(count), peer, explanation.c_str());
    std::printf("    %llu read here only, %llu there only, %llu by neither\n", number(only_ours), number(only_theirs),
                number(neither));
    EXPECT_EQ(same + explained + only_ours + only_theirs + neither, files);
    EXPECT_GT(same, files / 10) << "hardly any file is read by both";
    tell("mutated files", files, of_all);
    tell("of these read by both", same + explained, of_both);
}

} // namespace pelm::sweeps
