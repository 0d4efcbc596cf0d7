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

// Returns how many decodes were compared.
size_t compare(const std::vector<Input> &inputs, uint32_t step) {
    size_t compared = 0;
    uint32_t number = 0;
    for (const Decode &decode : decodes_of(inputs)) {
        for (uint32_t format = number % step; format <= 12; format += step) {
            const Setting setting = nth_setting(*decode.input, format, number++ * 7 % setting_count);
            const size_t size = output_size(decode, setting).value_or(0);
            PelmTest_Reset();
            const Outcome expected = outcome_with(Kernels::careful, decode, setting, size);
            for (const Kernels kind : test::all_kernels())
                EXPECT_EQ(outcome_with(kind, decode, setting, size), expected)
                    << decode.name() << ", " << setting.name() << ", kernels " << static_cast<int>(kind);
            ++compared;
        }
    }
    return compared;
}

TEST(SweepsKernels, every_kind_of_code_decodes_to_the_same_bytes) {
    const std::vector<Input> small = small_inputs();
    EXPECT_GT(compare(small, by_extent(5u, 1u, 1u)), 100u);
    EXPECT_GT(compare(cut_short(small), by_extent(5u, 1u, 1u)), 100u);
    EXPECT_GT(compare(sample_inputs(), by_extent(13u, 2u, 1u)), 0u);
}

} // namespace
} // namespace pelm::sweeps
