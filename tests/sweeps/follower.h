// Makes the calls of a decode one after the other, on memory of the caller.
#pragma once

#include "tests/sweeps/decodes.h"

namespace pelm::sweeps {

class Follower {
public:
    // PNG changes the bytes where it joins chunks. The source's size, the request's words and the faults may be changed
    // before the first call. `output` NULL: none.
    Follower(const Decode &decode, const Setting &setting, PelmTestBytes &bytes, uint8_t *output);
    Follower(const Follower &) = delete;
    Follower &operator=(const Follower &) = delete;

    // The next call, and what it gave.
    int32_t make();
    const fuzz::Call &next_call() const;
    // Complete, failed, or going on for ever.
    bool is_over() const;
    // Frees what is in progress, as far as a caller can. Of a decode in two steps nothing is in progress any more.
    void give_up();
    // Those of animations, which are the caller's.
    void free_colour_tables();

    InputSource source{};
    ImageDecodeInfo info{};
    int32_t result = -1;
    uint32_t calls = 0;

private:
    void bring_staging_buffer();

    const Decode &decode_;
    const Setting &setting_;
    uint8_t *const output_;
    const bool has_two_steps_;
};

} // namespace pelm::sweeps
