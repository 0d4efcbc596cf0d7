// Mutates an input whose file is a PNG: now and then what stands before the file, or the whole input blindly, mostly
// the file.
#pragma once

#include <cstddef>
#include <cstdint>

namespace pelm::fuzz {

// As LLVMFuzzerCustomMutator. The file begins at `file_at`.
size_t mutate_input_with_png(uint8_t *input, size_t size, size_t most, uint32_t seed, size_t file_at);

} // namespace pelm::fuzz
