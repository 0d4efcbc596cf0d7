// The rows of a call that writes into a buffer of its own, of just these rows; where they belong in the picture is up
// to us.
#pragma once

#include "tools/decode_job.h"

namespace pelm_tool {

// In pixels.
struct LinePlace {
    int32_t buffer_width; // of a row of the buffer
    int32_t column;       // where the image begins in it
    int32_t width;        // of the image
    int32_t left, top;    // of the image in the picture
};

// The box is as wide as the buffer, the image begins at its left and lies in the middle of the picture.
LinePlace centred_lines(const DecodeJob &job);

class LineBuffer {
public:
    LineBuffer(Picture &picture, const LinePlace &place, int32_t lines);

    // Calls `decode` with the buffer for the lines from `row` of the image on; what it says is returned. What it leaves
    // as it is keeps what the picture holds there.
    template <class Decode>
    int32_t fill(int64_t row, Decode decode) {
        load(row);
        const int32_t result = decode(lines_.data());
        store(row);
        return result;
    }

private:
    void load(int64_t row);
    void store(int64_t row);
    uint8_t *line(int32_t number);
    uint8_t *place_of(int64_t row); // nullptr: below the picture

    Picture &picture_;
    LinePlace place_;
    int32_t count_;
    size_t row_bytes_; // of the image
    std::vector<uint8_t> lines_;
};

} // namespace pelm_tool
