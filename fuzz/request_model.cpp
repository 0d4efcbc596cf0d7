#include "fuzz/request_model.h"

#include <algorithm>

namespace pelm::fuzz {
namespace {

constexpr char wrong_state[] = "kept or lost its state";
constexpr int32_t largest_exact_side = 65535; // beyond, PNG and WBMP may be a pixel larger than their box

} // namespace

bool RequestModel::is_legal(const Call &call) const {
    switch (call.progress) {
    case Progress::needs_idle:
    case Progress::parks: return is_idle();
    case Progress::resumes: return is_idle() || state_ == State::bmp_parked;
    case Progress::gives_up_any: return true;
    default: return state_ != State::bmp_parked;
    }
}

// Of calls that have a request.
bool RequestModel::begins(const Call &call) const {
    switch (call.progress) {
    case Progress::whole:
    case Progress::needs_idle: return true;
    case Progress::steps:
    case Progress::parks: return is_idle();
    case Progress::resumes: return !is_idle();
    default: return false;
    }
}

bool RequestModel::fits_box(const Call &call, const Step &step, Sides scaled) const {
    if (step.width <= 0 || step.height <= 0) return true;
    if (std::max(step.width, step.height) > largest_exact_side) return true;
    const bool is_wbmp = plan_.format == Format::wbmp;
    const bool is_turned = (plan_.flags & PELM_ROTATE_90) != 0 && !is_wbmp && call.output != Output::own_rows;
    const Sides box = is_turned ? Sides{step.height, step.width} : Sides{step.width, step.height};
    const uint32_t mode = is_wbmp ? plan_.flags : plan_.flags & PELM_PLACE_MASK;
    if (mode == PELM_PLACE_STRETCH) return scaled == box;
    return scaled.width >= 0 && scaled.width <= box.width && scaled.height >= 0 && scaled.height <= box.height;
}

// Of a GIF or a PNG the size is told before the decode can fail; of a BMP only by the line call, which needs memory for
// its rows afterwards. A WBMP of which nothing is left does not tell it.
const char *RequestModel::look_at_size(const Call &call, const Step &step, const Left &left) const {
    if (!begins(call)) return left.scaled ? "wrote the scaled size without having begun" : nullptr;
    if (!left.scaled) {
        const bool may_lack = left.result == PELM_RESULT_FAILED || plan_.format == Format::wbmp;
        return may_lack ? nullptr : "did not tell the scaled size";
    }
    const bool tells_late =
        plan_.format == Format::wbmp || (plan_.format == Format::bmp && call.output != Output::own_rows);
    if (left.result == PELM_RESULT_FAILED && tells_late) return "told a scaled size and failed";
    const bool is_proposal = call.progress == Progress::parks;
    return is_proposal || fits_box(call, step, *left.scaled) ? nullptr : "scaled beyond its box";
}

// One that a call has begun, or goes on with.
const char *RequestModel::follow_steps(const Call &call, const Step &step, const Left &left) {
    const bool was_idle = is_idle();
    if (!was_idle && state_ != call.state)
        return left.result == PELM_RESULT_FAILED && left.has_state ? nullptr : "went on with another call's decode";
    if (was_idle && left.result == PELM_RESULT_FAILED) return left.has_state ? wrong_state : nullptr;
    if (!(left.has_state ? call.may_keep(left.result) : call.may_end(left.result))) return wrong_state;
    if (call.state == State::bmp_bands && left.result != PELM_RESULT_FAILED) {
        if (was_idle) {
            rows_done_ = 0;
            rows_ = left.scaled ? std::max(left.scaled->height, 0) : 0;
        }
        rows_done_ += std::clamp<int64_t>(call.rows != 0 ? call.rows : step.rows, 0, rows_ - rows_done_);
        if (left.has_state != (rows_done_ < rows_)) return "counted its rows wrongly";
    }
    state_ = left.has_state ? call.state : State::none;
    return nullptr;
}

const char *RequestModel::follow_state(const Call &call, const Step &step, const Left &left) {
    switch (call.progress) {
    case Progress::apart:
    case Progress::whole:
    case Progress::needs_idle: return left.has_state == !is_idle() ? nullptr : wrong_state;
    case Progress::steps: return follow_steps(call, step, left);
    case Progress::parks: state_ = left.result == PELM_RESULT_DONE ? State::bmp_parked : State::none; break;
    case Progress::resumes:
        if (is_idle() && left.result != PELM_RESULT_FAILED) return "decoded what was not parked";
        state_ = State::none;
        break;
    case Progress::gives_up:
    case Progress::gives_up_any:
        if (left.result != PELM_RESULT_DONE) return "did not give up";
        state_ = State::none;
        break;
    }
    return left.has_state == !is_idle() ? nullptr : wrong_state;
}

const char *RequestModel::follow(const Call &call, const Step &step, const Left &left) {
    if (!call.may_answer(left.result)) return "gave a result that it has not";
    if (step.null_request) {
        if (left.result != PELM_RESULT_FAILED) return "did something without a request";
        return left.has_state == !is_idle() && !left.scaled ? nullptr : "touched a request that it was not given";
    }
    const char *const wrong_size = look_at_size(call, step, left);
    return wrong_size != nullptr ? wrong_size : follow_state(call, step, left);
}

} // namespace pelm::fuzz
