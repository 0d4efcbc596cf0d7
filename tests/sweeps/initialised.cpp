// Under MemorySanitizer (the `memory` preset): every input by every call in every format, in some of all settings, on
// host memory that nothing has filled. No byte that was never written may decide anything, or come out: not in the
// buffer, not in the request, not in the colour tables. A plain program, because GoogleTest and the C++ library are not
// instrumented.
#include <sanitizer/msan_interface.h>

#include <cstdio>
#include <cstdlib>

#include "tests/sweeps/decodes.h"
#include "tests/sweeps/extent.h"
#include "tests/sweeps/mutations.h"

namespace {

using namespace pelm;
using namespace pelm::sweeps;

constexpr uint8_t background = 0x5C;

bool is_initialised(const void *memory, size_t size) {
    return size == 0 || __msan_test_shadow(memory, size) < 0;
}

bool has_only_initialised_replies(const Outcome &outcome) {
    for (const Reply &reply : outcome.replies)
        if (!is_initialised(&reply, sizeof reply)) return false;
    return is_initialised(outcome.colour_tables.data(), outcome.colour_tables.size());
}

Outcome decoded(const Decode &decode, const Setting &setting, Bytes &buffer) {
    PelmTest_Faults()->filling = -1;
    Outcome outcome = run(decode, setting, buffer);
    PelmTest_Reset();
    return outcome;
}

// What blends reads the buffer.
bool may_blend(const Decode &decode, const Setting &setting) {
    return decode.input->format == fuzz::Format::png && setting.format <= PELM_FORMAT_RGB888;
}

// False when something came out that was never written, or what is written depends on the buffer.
bool holds(const Decode &decode, const Setting &setting) {
    const std::optional<size_t> size = output_size(decode, setting);
    PelmTest_Reset();
    if (!size) return true;
    Bytes filled(*size, background);
    const Outcome outcome = decoded(decode, setting, filled);
    if (!has_only_initialised_replies(outcome) || !is_initialised(filled.data(), filled.size())) return false;
    if (may_blend(decode, setting)) return true;

    Bytes others(*size, static_cast<uint8_t>(~background));
    decoded(decode, setting, others);
    Bytes empty(*size, background);
    __msan_allocated_memory(empty.data(), empty.size());
    if (!has_only_initialised_replies(decoded(decode, setting, empty))) return false;
    for (size_t i = 0; i < *size; ++i)
        if (filled[i] == others[i] && !is_initialised(&empty[i], 1)) return false;
    return true;
}

struct Count {
    uint32_t decodes = 0, failures = 0;
};

void sweep(const std::vector<Input> &inputs, uint32_t settings, Count &count) {
    for (const Decode &decode : decodes_of(inputs)) {
        for (uint32_t format = 0; format <= 12; ++format) {
            if (fuzz::bytes_per_output_pixel(decode.input->format, format) == 0) continue;
            for (uint32_t i = 0; i < settings; ++i) {
                const Setting setting = nth_setting(*decode.input, format, count.decodes++ * 7 % setting_count);
                if (holds(decode, setting)) continue;
                ++count.failures;
                std::printf("%s, %s: bytes that were never written\n", decode.name().c_str(), setting.name().c_str());
            }
        }
    }
}

// Each input, changed here and there. PNG files are refused for their checksums, most of them, and left out.
std::vector<Input> damaged(const std::vector<Input> &inputs, uint32_t seed) {
    Random random(seed);
    std::vector<Input> others;
    for (const Input &input : inputs)
        if (input.format != fuzz::Format::png)
            others.push_back(
                {input.name + "_damaged", input.format, input.width, input.height, mutated(random, input.bytes, 13)});
    return others;
}

} // namespace

int main() {
    const std::vector<Input> small = small_inputs();
    Count count;
    sweep(small, by_extent(1u, 6u, setting_count), count);
    sweep(cut_short(small), by_extent(1u, 3u, setting_count), count);
    for (uint32_t seed = 1; seed <= by_extent(1u, 20u, 400u); ++seed)
        sweep(damaged(small, seed), 1, count);
    sweep(sample_inputs(), 1, count);
    std::printf("%u decodes, %u with bytes that were never written\n", count.decodes, count.failures);
    return count.decodes > 0 && count.failures == 0 ? 0 : 1;
}
