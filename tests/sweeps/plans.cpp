#include "tests/sweeps/plans.h"

#include <iterator>

namespace pelm::sweeps {
namespace {

constexpr uint32_t most_calls = 64;
constexpr uint32_t formats[] = {7, 0, 1, 5, 6, 8, 10, 11, 12, 3};

PelmTestFaults none() {
    PelmTestFaults faults{};
    faults.largestBlock = 1u << 20; // what damaged headers ask for beyond takes long and shows nothing new
    faults.mostLiveBytes = 8u << 20;
    faults.filling = 0xA5;
    faults.failingReadResult = -1;
    faults.mostPerRead = 1;
    return faults;
}

// Animations have calls of their own.
fuzz::Format format_of(const Decode &decode, uint8_t &number) {
    for (const fuzz::Format format : {decode.input->format, fuzz::Format::agif}) {
        const auto calls = fuzz::decoding_calls(format);
        for (number = 0; number < calls.size(); ++number)
            if (&calls[number] == decode.call) return format;
    }
    return decode.input->format;
}

} // namespace

fuzz::Plan plan_of(const Decode &decode, const Setting &setting) {
    fuzz::Plan plan{};
    uint8_t call = 0;
    plan.format = format_of(decode, call);
    plan.output_format = setting.format;
    plan.flags = setting.rotation | setting.placement | decode.flags;
    plan.kind = setting.kind;
    plan.buffer_size = setting.buffer_size;
    plan.faults = none();
    const bool is_parked = decode.call->progress == fuzz::Progress::parks;
    plan.steps = {{call, setting.width, setting.height, is_parked ? 1 : setting.rows, false, false}};
    plan.most_calls = most_calls;
    plan.file = decode.input->bytes;
    return plan;
}

std::vector<fuzz::Plan> plans_of(const Input &input, size_t count) {
    const std::vector<Input> inputs{input};
    const std::vector<Decode> decodes = decodes_of(inputs);
    std::vector<fuzz::Plan> plans;
    for (size_t n = 0; n < count; ++n) {
        const auto number = static_cast<uint32_t>(n * 7 % setting_count);
        const Setting setting = nth_setting(input, formats[n % std::size(formats)], number);
        plans.push_back(plan_of(decodes[n % decodes.size()], setting));
    }
    return plans;
}

} // namespace pelm::sweeps
