#include "fuzz/mutators/mutate_input.h"
#include "fuzz/plan.h"
#include "fuzz/target.h"

using namespace pelm::fuzz;

size_t LLVMFuzzerCustomMutator(uint8_t *input, size_t size, size_t most, unsigned seed) {
    if (format_of_calls(input, size) != Format::png) return LLVMFuzzerMutate(input, size, most);
    return mutate_input_with_png(input, size, most, seed, file_offset_behind_calls(input, size));
}
