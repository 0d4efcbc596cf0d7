#include "fuzz/mutators/mutate_input.h"
#include "fuzz/plan.h"
#include "fuzz/target.h"

size_t LLVMFuzzerCustomMutator(uint8_t *input, size_t size, size_t most, unsigned seed) {
    return pelm::fuzz::mutate_input_with_png(input, size, most, seed, pelm::fuzz::file_offset(size));
}
