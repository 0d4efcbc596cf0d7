// Whole decodes by careful code and by each other kind: the same output and results.
#include <gtest/gtest.h>

#include "tests/support/kernels.h"
#include "tests/sweeps/decodes.h"
#include "tests/sweeps/extent.h"

namespace pelm::sweeps {
namespace {

Outcome outcome_with(Kernels kind, const Decode &decode, const Setting &setting, size_t size) {
    const test::WithKernels with(kind);
    Bytes buffer(size, 0x5C);
    Outcome outcome = run(decode, setting, buffer);
    EXPECT_EQ(PelmTest_Violation(), nullptr) << decode.name();
    PelmTest_Reset();
    return outcome;
}

void compare(const Decode &decode, const Setting &setting) {
    const size_t size = output_size(decode, setting).value_or(0);
    PelmTest_Reset();
    const Outcome expected = outcome_with(Kernels::careful, decode, setting, size);
    for (const Kernels kind : test::all_kernels())
        EXPECT_EQ(outcome_with(kind, decode, setting, size), expected)
            << decode.name() << ", " << setting.name() << ", kernels " << static_cast<int>(kind);
}

// Returns how many decodes were compared.
size_t compare(const std::vector<Input> &inputs, uint32_t step) {
    size_t compared = 0;
    uint32_t number = 0;
    for (const Decode &decode : decodes_of(inputs))
        for (uint32_t format = number % step; format <= 12; format += step, ++compared)
            compare(decode, nth_setting(*decode.input, format, number++ * 7 % setting_count));
    return compared;
}

TEST(SweepsKernels, every_kind_of_code_decodes_to_the_same_bytes) {
    const std::vector<Input> small = small_inputs();
    EXPECT_GT(compare(small, by_extent(5u, 1u, 1u)), 100u);
    EXPECT_GT(compare(cut_short(small), by_extent(5u, 1u, 1u)), 100u);
    EXPECT_GT(compare(sample_inputs(), by_extent(13u, 2u, 1u)), 0u);
}

// Some code is for long rows, and for pixels that lie one behind the other.
TEST(SweepsKernels, every_kind_of_code_decodes_long_rows_to_the_same_bytes) {
    const std::vector<Input> wide = small_inputs(1200, 15);
    for (const Decode &decode : decodes_of(wide))
        for (const uint32_t format : {PELM_FORMAT_RGB565, PELM_FORMAT_RGB888, PELM_FORMAT_BGRA8888})
            compare(decode, {.format = format, .width = decode.input->width, .height = decode.input->height});
}

} // namespace
} // namespace pelm::sweeps
