// From bytes to a plan. Values that matter are short lists to choose from; rare ones are at the end.
#include "fuzz/plan.h"

#include <algorithm>
#include <cstring>
#include <iterator>

namespace pelm::fuzz {
namespace {

constexpr uint32_t output_formats[] = {0, 1, 5, 6, 7, 8, 10, 11, 12, 2, 3, 4, 9, 13, 0xFFFFFFFF};
constexpr uint32_t placements[] = {0, 0x100, 0x700, 0x200, 0x1000, 0x1100, 0x1700, 0x3000};
constexpr uint32_t kinds[] = {1, 0, 4, 2, 1, 0, 3, no_source};
constexpr int32_t buffer_sizes[] = {4096, 1, 64, 333, 65536, 0, -1, 0x7FFFFFFF};
constexpr int32_t absurd_sides[] = {0,      -1,        0x7FFFFFFF, -0x7FFFFFFF - 1, 65535,     65536,
                                    0x8000, 0x1000000, 46341,      0x40000000,      0x3FFFFFFF};
constexpr int32_t rows_of_lines[] = {0, -1, 0x7FFFFFFF, -0x7FFFFFFF - 1, 300, 0x10000};
constexpr size_t step_bytes = 4;
constexpr size_t most_steps = 24;
constexpr uint32_t most_calls_of_a_decode = 100;

template <class Value, size_t count>
Value choose(const Value (&values)[count], size_t which) {
    return values[which % count];
}

int32_t side(const uint8_t (&bytes)[2]) {
    const int32_t low = bytes[0];
    const int32_t high = bytes[1];
    if (high >= 0xC0) return choose(absurd_sides, static_cast<size_t>(low));
    return high < 3 ? low + 256 * high : low & 0x3F;
}

int32_t rows_from(uint8_t byte) {
    return byte < 0xE0 ? byte : choose(rows_of_lines, byte - 0xE0u);
}

// A number that a fault strikes at, alone or from there on.
void set_fault(uint8_t byte, uint32_t &one, uint32_t &from) {
    ((byte & 0x80) != 0 ? from : one) = byte & 0x3F;
}

PelmTestFaults faults_from(const Head &head) {
    PelmTestFaults faults{};
    faults.largestBlock = 1u << 20; // what a small file makes of larger ones takes long and shows nothing new
    faults.mostLiveBytes = 8u << 20;
    faults.filling = 0xA5;
    set_fault(head.failing_allocation, faults.failingAllocation, faults.failingAllocationsFrom);
    set_fault(head.failing_read, faults.failingRead, faults.failingReadsFrom);
    faults.failingReadResult = (head.failing_read & 0x40) != 0 ? 0 : -1;
    set_fault(head.short_read, faults.shortRead, faults.shortReadsFrom);
    faults.mostPerRead = head.most_per_read;
    faults.stoppingPoll = head.stopping_poll;
    faults.stoppingStatus = -1;
    faults.pausingPoll = head.pausing_poll;
    faults.pausingPollsFrom = head.pausing_poll == 0xFF ? 1 : 0;
    faults.pausingStatus = 1 + head.pausing_poll;
    return faults;
}

Step step_from(const Head &head) {
    return {head.call,
            side(head.width),
            side(head.height),
            rows_from(head.rows),
            (head.options & Options::null_output) != 0,
            (head.options & Options::null_request) != 0};
}

// Missing bytes are zeros.
Head head_of(const uint8_t *input, size_t size) {
    Head head{};
    if (size > 0) memcpy(&head, input, std::min(size, sizeof head));
    return head;
}

Plan plan_from(const Head &head, Format format) {
    Plan plan{};
    plan.format = format;
    plan.output_format = choose(output_formats, head.format);
    plan.flags = (head.flags & 3u) << 2 | choose(placements, head.flags >> 2 & 7u);
    plan.kind = choose(kinds, head.kind);
    plan.buffer_size =
        head.buffer_size < 0xC0 ? int32_t{head.buffer_size} * 16 : choose(buffer_sizes, head.buffer_size);
    plan.size_lie = static_cast<int8_t>(head.size_lie);
    plan.image_height = head.image_height;
    plan.other_filling = plan.looks_at_pixels = (head.options & Options::other_filling) != 0;
    plan.own_colour_table = (head.options & Options::own_colour_table) != 0;
    plan.stated_end = (head.options & Options::stated_end) != 0;
    plan.no_data = (head.options & Options::no_data) != 0;
    plan.alignment = (head.options & Options::alignment) >> 4;
    plan.faults = faults_from(head);
    plan.most_calls = head.most_calls != 0 ? head.most_calls : most_calls_of_a_decode;
    return plan;
}

// A box that has to do with the first one, or not.
void change_box(Step &step, uint8_t how) {
    switch (how & 15) {
    case 0:
    case 1:
    case 2: break;
    case 3: std::swap(step.width, step.height); break;
    case 4: step.width = static_cast<int32_t>(static_cast<uint32_t>(step.width) + 1); break;
    case 5: step.height = static_cast<int32_t>(static_cast<uint32_t>(step.height) - 1); break;
    case 6: step.width /= 2; break;
    case 7: step.height /= 2; break;
    case 8: step.width = step.height = 1; break;
    case 9: step.width = 0; break;
    case 10: step.height = -1; break;
    case 11: step.width = 0x7FFFFFFF; break;
    default: step.width = step.height = 8 + (how >> 4) * 3; break;
    }
}

} // namespace

size_t file_offset(size_t size) {
    return std::min(size, sizeof(Head));
}

size_t file_offset_behind_calls(const uint8_t *input, size_t size) {
    constexpr size_t before = sizeof(Head) + 2;
    if (size < before) return size;
    const size_t steps = input[before - 1] % (most_steps + 1);
    return std::min(size, before + steps * step_bytes);
}

Plan plan_for(Format format, const uint8_t *input, size_t size) {
    const Head head = head_of(input, size);
    Plan plan = plan_from(head, format);
    plan.steps = {step_from(head)};
    plan.file.assign(input + file_offset(size), input + size);
    return plan;
}

Format format_of_calls(const uint8_t *input, size_t size) {
    return static_cast<Format>(size > sizeof(Head) ? input[sizeof(Head)] % format_count : 0);
}

Plan plan_of_calls(const uint8_t *input, size_t size) {
    const Head head = head_of(input, size);
    const size_t behind = file_offset_behind_calls(input, size);
    Plan plan = plan_from(head, format_of_calls(input, size));
    plan.most_calls = 1;
    for (size_t at = sizeof head + 2; at + step_bytes <= behind; at += step_bytes) {
        Step step = step_from(head);
        step.call = input[at];
        change_box(step, input[at + 1]);
        if (input[at + 2] != 0) step.rows = rows_from(input[at + 2]);
        step.null_output = (input[at + 3] & 0x07) == 1;
        step.null_request = (input[at + 3] & 0xF8) == 0xF8;
        plan.steps.push_back(step);
    }
    plan.file.assign(input + behind, input + size);
    return plan;
}

} // namespace pelm::fuzz
