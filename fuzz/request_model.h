// What a caller may know of a request after each call: which decode is in progress, which calls may follow, and
// whether the words of the scaled size were written. Shared by fuzzing and by the sweeps.
#pragma once

#include <cstdint>
#include <optional>

#include "fuzz/calls.h"

namespace pelm::fuzz {

struct Sides {
    int32_t width, height;
    bool operator==(const Sides &) const = default;
};

// What a call left.
struct Left {
    int32_t result;
    bool has_state;              // `decoderState` is not NULL
    std::optional<Sides> scaled; // when the call wrote it
};

class RequestModel {
public:
    explicit RequestModel(const Plan &plan) : plan_(plan) {}

    State state() const { return state_; }
    bool is_idle() const { return state_ == State::none; }

    // Only what the header allows: a decode must not be forgotten, and one that is parked is for two calls only.
    bool is_legal(const Call &call) const;

    // What was in progress has been given up.
    void forget() { state_ = State::none; }

    // What is wrong with what the call left, or NULL.
    const char *follow(const Call &call, const Step &step, const Left &left);

private:
    const char *follow_state(const Call &call, const Step &step, const Left &left);
    const char *follow_steps(const Call &call, const Step &step, const Left &left);
    bool begins(const Call &call) const;
    const char *look_at_size(const Call &call, const Step &step, const Left &left) const;
    bool fits_box(const Call &call, const Step &step, Sides scaled) const;

    const Plan &plan_;
    State state_ = State::none;
    int64_t rows_ = 0, rows_done_ = 0; // of a BMP in bands, scaled
};

} // namespace pelm::fuzz
