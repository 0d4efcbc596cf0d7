#include "fuzz/mutators/mutate_input.h"

#include <algorithm>

#include "fuzz/mutators/png_mutator.h"
#include "fuzz/target.h"

namespace pelm::fuzz {
namespace {

// The file keeps its place: what stands before it is changed byte by byte.
size_t mutate_plan(uint8_t *input, size_t size, size_t file_at, uint32_t seed) {
    if (file_at == 0) return LLVMFuzzerMutate(input, size, size);
    const size_t changes = 1 + seed / 64 % 3;
    for (size_t i = 0; i < changes; ++i) {
        seed = seed * 1664525u + 1013904223u;
        input[(seed >> 16) % file_at] = static_cast<uint8_t>(seed >> 8);
    }
    return size;
}

} // namespace

size_t mutate_input_with_png(uint8_t *input, size_t size, size_t most, uint32_t seed, size_t file_at) {
    if (file_at >= most) return LLVMFuzzerMutate(input, size, most);
    switch (seed % 16) {
    case 0: return LLVMFuzzerMutate(input, size, most);
    case 1:
    case 2:
    case 3: return mutate_plan(input, size, file_at, seed);
    default: break;
    }
    const Bytes file = mutate_png(Bytes(input + file_at, input + size), most - file_at, seed / 16);
    std::copy(file.begin(), file.end(), input + file_at);
    return file_at + file.size();
}

} // namespace pelm::fuzz
