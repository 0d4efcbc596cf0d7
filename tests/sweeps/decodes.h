// Every way to decode every input, and one function that follows a way to its end: what sweeps over all formats and
// calls are made of.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "fuzz/calls.h"
#include "tests/sweeps/inputs.h"

namespace pelm::sweeps {

// An input and a way to decode it.
struct Decode {
    const Input *input;
    const fuzz::Call *call; // that begins, and goes on where no other one must
    uint32_t flags = 0;     // those that make it another way: PELM_INTERLACE_FRAME

    std::string name() const;
};

// All of them: every input by every call of its format. The inputs must outlive them.
std::vector<Decode> decodes_of(const std::vector<Input> &inputs);

struct Setting {
    uint32_t format = PELM_FORMAT_RGBA8888;
    uint32_t rotation = PELM_ROTATE_0;
    uint32_t placement = PELM_PLACE_FIT;
    int32_t width, height; // of the box
    uint32_t kind = PELM_SOURCE_MEMORY;
    int32_t rows = 7; // per line call
    int32_t buffer_size = 512;

    std::string name() const;
};

// Number n of all combinations of rotations, placements, boxes and kinds of source for an image of this size, n below
// `setting_count`. Neighbours differ in all of them.
inline constexpr uint32_t setting_count = 4 * 4 * 5 * 4;
Setting nth_setting(const Input &input, uint32_t output_format, uint32_t n);

// Bytes that the output of each call must have room for; 0 for formats that are not written. The size of an exact
// buffer is found out by a decode without a buffer; none where a header that is misread makes it more than 16 MB.
std::optional<size_t> output_size(const Decode &decode, const Setting &setting);

// What a call left in the request.
struct Reply {
    int32_t result;
    int32_t width, height; // scaled
    uint32_t has_transparency, frame_delay, colour_table_state;
    bool operator==(const Reply &) const = default;
};

struct Outcome {
    std::vector<Reply> replies;
    Bytes output; // all of the buffer after the last call; where bands or frames take turns in it, after each of them
    Bytes colour_tables; // of animations, at the end
    bool operator==(const Outcome &) const = default;

    std::vector<int32_t> results() const;
};

// Decodes until the picture or the animation is complete, or a call fails, into a buffer of `output_size` bytes; a span
// of nothing decodes without. Faults are the caller's, and so is PelmTest_Reset: some ways leak as the header states.
Outcome run(const Decode &decode, const Setting &setting, std::span<uint8_t> output);

} // namespace pelm::sweeps
