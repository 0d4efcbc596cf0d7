// Which code does the work where there is more than one for it. All of it gives the same bytes.
#pragma once

#include <cstdint>

namespace pelm {

// Each includes those before it.
enum class Kernels : uint8_t {
    careful = 1, // no fast loops either: what all others are held against
    plain,
    lanes,     // frame/lanes.h, where lanes_are_fast
    shuffles,  // and bytes put into any order: frame/swizzle.cpp
    carryless, // and x86's carry-less multiplication
    bmi2,      // and x86's shifts by a number in any register
};

// What this processor is best served with. It is asked once: asking is slow in a virtual machine.
Kernels kernels();

// From now on and for all threads; `wanted` is no more than the processor has. For tests.
void use_kernels(Kernels wanted);

} // namespace pelm
