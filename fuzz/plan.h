// What a fuzzing input says: how to call, on what host, and the file. The head is a record of single bytes, so that
// every input is a plan and a changed byte changes one thing.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "PelmHostTesting.h"

namespace pelm::fuzz {

enum class Format : uint8_t { bmp, wbmp, png, gif, agif };
constexpr uint8_t format_count = 5;

struct Head {
    uint8_t call;                // which of the format's ways to decode, modulo their number
    uint8_t format;              // output format: see plan.cpp
    uint8_t flags;               // bits 0-1 rotation, 2-4 placement and interlace frame: see plan.cpp
    uint8_t kind;                // of the source, modulo their number
    uint8_t width[2], height[2]; // of the box, low byte first: small as it stands, with a high byte from 0xC0 on absurd
    uint8_t rows;                // of line calls; the divisor of the graphics library's calls
    uint8_t most_calls;          // the decode is given up after so many; 0: at its end
    uint8_t buffer_size;         // of the source
    uint8_t options;             // Options below
    uint8_t size_lie;            // added to the source's size, signed
    uint8_t image_height;        // word 6 of the request
    uint8_t failing_allocation;  // bits 0-5 which one, bit 7: and all that follow
    uint8_t failing_read;        // bits 0-5 which one, bit 6 result 0 instead of -1, bit 7: and all that follow
    uint8_t short_read;          // bits 0-5 which one, bit 7: and all that follow
    uint8_t most_per_read;
    uint8_t stopping_poll; // which one
    uint8_t pausing_poll;  // which one; 255: every one
};

enum Options : uint8_t {
    null_output = 0x01,
    null_request = 0x02,
    other_filling = 0x04,    // decode again with host memory that holds something else: nothing may change
    own_colour_table = 0x08, // still GIF: the caller wants the tables
    alignment = 0x30,        // of the output
    stated_end = 0x40,       // a stream ends where its size says
    no_data = 0x80           // memory sources without memory
};

constexpr uint32_t no_source = 0xFFFFFFFF; // in place of a kind: the request has no source at all

struct Step {
    uint8_t call;
    int32_t width, height;
    int32_t rows;
    bool null_output, null_request;
};

struct Plan {
    Format format;
    uint32_t output_format;
    uint32_t flags;
    uint32_t kind;
    int32_t buffer_size;
    int32_t size_lie;
    int32_t image_height;
    bool other_filling, own_colour_table, stated_end, no_data;
    uint8_t alignment;
    PelmTestFaults faults;
    // Given steps, or one that is repeated until the decode ends, at most `most_calls` times.
    std::vector<Step> steps;
    uint32_t most_calls;
    std::vector<uint8_t> file;
    bool looks_at_pixels = false; // what the buffers hold is part of the outcome
    bool keeps_services = false;  // allocations and reads are told one by one
    bool again = false;           // then the same request is decoded once more, without faults (not in exact buffers)
};

// One way to decode, to its end.
Plan plan_for(Format format, const uint8_t *input, size_t size);

// Any sequence of the calls of one format: the head, a format, a number of steps, four bytes for each, and the file.
Plan plan_of_calls(const uint8_t *input, size_t size);
Format format_of_calls(const uint8_t *input, size_t size);

// Where the file begins in such inputs.
size_t file_offset(size_t size);
size_t file_offset_behind_calls(const uint8_t *input, size_t size);

} // namespace pelm::fuzz
