// Any calls of a format on one request, in any order: other boxes, other buffers, none, no request, aborts, and on
// after a failure, on hosts that fail now and then. What each call leaves is compared with the model of a request
// (fuzz/request_model.h), what it takes from its host with its account (fuzz/account.h); either ends the program.
#include <cstring>
#include <random>

#include <gtest/gtest.h>

#include "fuzz/session.h"
#include "tests/sweeps/at_fault.h"
#include "tests/sweeps/extent.h"
#include "tests/sweeps/inputs.h"

namespace pelm::sweeps {
namespace {

using fuzz::Format;
using fuzz::Head;

class Dice {
public:
    explicit Dice(uint32_t seed) : numbers_(seed) {}
    uint32_t below(uint32_t limit) { return static_cast<uint32_t>(numbers_() % limit); }
    uint8_t byte() { return static_cast<uint8_t>(numbers_()); }
    bool one_in(uint32_t times) { return below(times) == 0; }
    uint8_t seldom(uint32_t times) { return one_in(times) ? byte() : uint8_t{0}; }

private:
    std::mt19937 numbers_;
};

// A box that has to do with the image, or not.
void set_side(Dice &dice, uint8_t (&side)[2], int32_t of_image) {
    const auto size = static_cast<uint8_t>(of_image);
    const uint8_t sides[] = {size, static_cast<uint8_t>(size / 2), static_cast<uint8_t>(size + 9), dice.byte()};
    side[0] = sides[dice.below(4)];
    side[1] = dice.one_in(24) ? dice.byte() : uint8_t{0};
}

Head any_head(Dice &dice, const Input &input) {
    Head head{};
    head.format = dice.byte();
    head.flags = dice.byte();
    head.kind = dice.one_in(12) ? dice.byte() : static_cast<uint8_t>(dice.below(6)); // the first ones are sound
    set_side(dice, head.width, input.width);
    set_side(dice, head.height, input.height);
    head.rows = dice.one_in(4) ? dice.byte() : static_cast<uint8_t>(dice.below(12));
    head.buffer_size = dice.byte();
    for (int bit = 0; bit < 8; ++bit)
        head.options = static_cast<uint8_t>(head.options | (dice.one_in(12) ? 1 << bit : 0));
    head.size_lie = dice.seldom(12);
    head.image_height = dice.seldom(4);
    head.failing_allocation = dice.seldom(6);
    head.failing_read = dice.seldom(6);
    head.short_read = dice.seldom(10);
    head.most_per_read = dice.byte();
    head.stopping_poll = dice.seldom(8);
    head.pausing_poll = dice.seldom(8);
    return head;
}

// Every other step goes on with what the step before did.
Bytes any_steps(Dice &dice, uint32_t count) {
    Bytes steps;
    uint8_t call = 0;
    for (uint32_t i = 0; i < count; ++i) {
        if (dice.one_in(2)) call = dice.byte();
        const uint8_t box = dice.one_in(2) ? dice.byte() : uint8_t{0};
        const auto rows = static_cast<uint8_t>(dice.one_in(8) ? dice.byte() : dice.below(9));
        steps.insert(steps.end(), {call, box, rows, dice.byte()});
    }
    return steps;
}

// As inputs of the fuzzing target `callseq` say it.
Bytes any_sequence(Dice &dice, Format format, const Input &input) {
    const Head head = any_head(dice, input);
    Bytes bytes(sizeof head);
    memcpy(bytes.data(), &head, sizeof head);
    const uint32_t steps = 6 + dice.below(19);
    bytes.push_back(static_cast<uint8_t>(format));
    bytes.push_back(static_cast<uint8_t>(steps));
    const Bytes step_bytes = any_steps(dice, steps);
    bytes.insert(bytes.end(), step_bytes.begin(), step_bytes.end());
    const size_t file = bytes.size();
    bytes.insert(bytes.end(), input.bytes.begin(), input.bytes.end());
    for (uint32_t damages = dice.one_in(4) ? 1 + dice.below(3) : 0; damages > 0; --damages)
        bytes[file + dice.below(static_cast<uint32_t>(input.bytes.size()))] = dice.byte();
    return bytes;
}

// Those that come in many pieces come often: they leave decodes in progress.
bool is_in_pieces(const Input &input) {
    return input.name == "png_many_blocks" || input.name.starts_with("gif_frames");
}

std::vector<Input> inputs_of(Format format) {
    const Format of_file = format == Format::agif ? Format::gif : format;
    const std::vector<Input> sound = small_inputs();
    std::vector<Input> inputs;
    for (const std::vector<Input> &all : {sound, sound, cut_short(sound)})
        for (const Input &input : all)
            if (input.format == of_file) inputs.insert(inputs.end(), is_in_pieces(input) ? 8 : 1, input);
    return inputs;
}

// So that the parts take about as long as each other.
struct Part {
    const char *name;
    Format format;
    uint32_t seed;
    uint64_t calls; // at least, in the long form
};

class RandomCalls : public testing::TestWithParam<Part> {};

TEST_P(RandomCalls, leave_what_the_model_of_a_request_says) {
    const Part &part = GetParam();
    const std::vector<Input> inputs = inputs_of(part.format);
    const uint64_t wanted = by_extent(part.calls / 100, part.calls / 8, part.calls);
    uint64_t calls = 0;
    uint32_t seed = part.seed;
    const AtFault at_fault([&seed, &part] { return std::string(part.name) + ", seed " + std::to_string(seed); });
    for (; calls < wanted; ++seed) {
        Dice dice(seed);
        const Input &input = inputs[dice.below(static_cast<uint32_t>(inputs.size()))];
        const Bytes sequence = any_sequence(dice, part.format, input);
        calls += fuzz::carry_out(fuzz::plan_of_calls(sequence.data(), sequence.size())).calls;
    }
    RecordProperty("calls", static_cast<int>(calls));
    printf("%s: %llu calls in %u sequences\n", part.name, static_cast<unsigned long long>(calls), seed - part.seed);
    EXPECT_GE(calls, wanted);
}

INSTANTIATE_TEST_SUITE_P(
    Of, RandomCalls,
    testing::Values(Part{"bmp_1", Format::bmp, 1, 800000}, Part{"bmp_2", Format::bmp, 1000001, 800000},
                    Part{"wbmp", Format::wbmp, 2000001, 800000}, Part{"png_1", Format::png, 3000001, 800000},
                    Part{"png_2", Format::png, 4000001, 800000}, Part{"gif_1", Format::gif, 5000001, 800000},
                    Part{"gif_2", Format::gif, 6000001, 800000}, Part{"agif", Format::agif, 7000001, 800000}),
    [](const auto &part) { return std::string(part.param.name); });

} // namespace
} // namespace pelm::sweeps
