// What libFuzzer, or the plain main, calls.
#pragma once

#include <cstddef>
#include <cstdint>

extern "C" {

int LLVMFuzzerTestOneInput(const uint8_t *input, size_t size);
size_t LLVMFuzzerCustomMutator(uint8_t *input, size_t size, size_t most, unsigned seed);
size_t LLVMFuzzerMutate(uint8_t *bytes, size_t size, size_t most); // libFuzzer's own

} // extern "C"
