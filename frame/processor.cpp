#include "frame/processor.h"

#include <atomic>

#include "frame/lanes.h"

#if defined(__x86_64__) || defined(__i386__)
#include <cpuid.h>
#endif

namespace pelm {
namespace {

// The library's only variable: 0, or what was found. Whoever finds it 0 asks, and all find the same.
std::atomic<uint8_t> known_kernels;

Kernels find_kernels() {
#if defined(__x86_64__) || defined(__i386__)
    unsigned eax, ebx, ecx, edx;
    const bool has_answer = __get_cpuid(1, &eax, &ebx, &ecx, &edx) != 0;
    const bool has_shuffles = has_answer && (ecx & bit_SSSE3) != 0 && (edx & bit_SSE2) != 0;
    if (!has_shuffles) return lanes_are_fast ? Kernels::lanes : Kernels::plain;
    if ((ecx & bit_PCLMUL) == 0) return Kernels::shuffles;
    const bool has_bmi2 = __get_cpuid_count(7, 0, &eax, &ebx, &ecx, &edx) != 0 && (ebx & bit_BMI2) != 0;
    return has_bmi2 ? Kernels::bmi2 : Kernels::carryless;
#else
    return lanes_are_fast ? Kernels::shuffles : Kernels::plain;
#endif
}

} // namespace

Kernels kernels() {
    const uint8_t known = known_kernels.load(std::memory_order_relaxed);
    if (known != 0) return static_cast<Kernels>(known);
    const Kernels found = find_kernels();
    use_kernels(found);
    return found;
}

void use_kernels(Kernels wanted) {
    known_kernels.store(static_cast<uint8_t>(wanted), std::memory_order_relaxed);
}

} // namespace pelm
