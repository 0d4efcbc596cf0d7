#include "fuzz/session.h"

#include <algorithm>
#include <cstring>
#include <memory>
#include <optional>

#include "fuzz/exact_bytes.h"

namespace pelm::fuzz {
namespace {

constexpr uint8_t background = 0x5C;
constexpr uint32_t untouched = 0x5E5E5E5E;
constexpr uint64_t largest_output = 1u << 20;

uint64_t hash(uint64_t so_far, const uint8_t *bytes, size_t count) {
    for (size_t i = 0; i < count; ++i)
        so_far = (so_far ^ bytes[i]) * 0x100000001B3u;
    return so_far;
}

size_t stated_size(const Plan &plan) {
    const auto size = static_cast<int64_t>(plan.file.size()) + plan.size_lie;
    return static_cast<size_t>(std::max<int64_t>(size, 0));
}

// Memory has the bytes that its size says, and no lie makes it more; a stream has its own.
size_t held_bytes(const Plan &plan) {
    return plan.kind == PELM_SOURCE_MEMORY ? std::min(plan.file.size(), stated_size(plan)) : plan.file.size();
}

bool is_staged(uint32_t kind) {
    return kind == PELM_SOURCE_STREAM || kind == PELM_SOURCE_STREAM_ALT;
}

bool has_exact_buffers(const Plan &plan) {
    return knows_exact_buffers(plan.format) && (plan.flags & PELM_PLACE_MASK) == PELM_PLACE_EXACT;
}

// On 32 bits large images turned sideways in an exact buffer may begin too far outside it (docs/formats.md, "Box");
// without a buffer that is nothing.
bool may_begin_too_far(const Plan &plan, const Outcome &measured) {
    const bool sideways = (plan.flags & PELM_ROTATE_90) != 0; // 270 has that bit, too
    return sizeof(void *) == 4 && sideways &&
           std::any_of(measured.scaled.begin(), measured.scaled.end(),
                       [](Sides scaled) { return std::max(scaled.width, scaled.height) > 20000; });
}

uint64_t pixels_of(Sides sides) {
    if (sides.width <= 0 || sides.height <= 0) return 0;
    return static_cast<uint64_t>(sides.width) * static_cast<uint64_t>(sides.height);
}

class Session {
public:
    // `measured`: an earlier session's outcome with the sizes of exact buffers. Without buffers it measures them.
    Session(const Plan &plan, int32_t filling, bool has_buffers, const Outcome *measured);
    Outcome run();
    // The same request once more, without faults, into new buffers.
    Outcome run_again();
    const std::vector<Service> &services() const { return account_.services(); }

private:
    void make(const Call &call, const Step &step);
    void carry_out_step(const Step &step);
    uint8_t *output_for(const Call &call, const Step &step);
    uint8_t *buffer(std::unique_ptr<ExactBytes> &holder, int64_t width, int64_t height, bool anew);
    uint8_t *box_buffer(std::unique_ptr<ExactBytes> &holder, const Step &step, bool anew);
    void look_at(const Call &call, const Step &step, int32_t result);
    void look_at_buffers();
    void bring_staging_buffer();
    void end_two_steps(const Call &call, const Step &step, int32_t result);
    void free_colour_tables();
    void end();

    const Plan &plan_;
    const bool has_buffers_;
    const Outcome *const measured_;
    Outcome outcome_;
    Account account_;
    RequestModel model_;
    // What the scaled size is before a call; no constant, or a fuzzer makes an image of that size.
    const int32_t unwritten_;
    Sides scaled_{};
    ExactBytes file_;
    PelmTestBytes bytes_;
    InputSource source_{};
    ImageDecodeInfo info_{};
    std::optional<ExactBytes> own_table_;

    std::unique_ptr<ExactBytes> box_, kept_, rows_;
    std::vector<std::unique_ptr<ExactBytes>> outlived_; // a decode might still write there, wrongly
    Sides begun_{};                                     // box of the decode's first call
};

Session::Session(const Plan &plan, int32_t filling, bool has_buffers, const Outcome *measured)
    : plan_(plan), has_buffers_(has_buffers), measured_(measured), account_(plan, filling), model_(plan),
      unwritten_(static_cast<int32_t>(hash(untouched, plan.file.data(), plan.file.size()) >> 32)),
      file_(held_bytes(plan)), bytes_{file_.bytes(), static_cast<int32_t>(file_.size()), plan.stated_end ? 1 : 0} {
    if (file_.size() > 0) memcpy(file_.bytes(), plan.file.data(), file_.size());
    PelmTest_OpenSource(&source_, plan.kind, &bytes_, plan.buffer_size);
    source_.size = static_cast<int32_t>(plan.kind == PELM_SOURCE_MEMORY ? file_.size() : stated_size(plan));
    if (plan.no_data) source_.data = nullptr;
    info_.input = plan.kind == no_source ? nullptr : &source_;
    info_.outputFormat = plan.output_format;
    info_.flags = plan.flags;
    info_.imageHeight = plan.image_height;
    info_.reserved3 = info_.reserved4 = info_.reserved11 = info_.reserved12 = info_.reserved13 = info_.reserved16 =
        untouched;
    if (plan.own_colour_table && plan.format == Format::gif) {
        own_table_.emplace(768u);
        info_.globalColorTable = own_table_->bytes();
    }
}

Outcome Session::run() {
    if (plan_.most_calls == 1) {
        for (const Step &step : plan_.steps)
            carry_out_step(step);
    } else {
        const auto ways = decoding_calls(plan_.format);
        const Call &begins = ways[plan_.steps[0].call % ways.size()];
        const Call &goes_on = begins.progress == Progress::parks ? resuming_call() : begins;
        make(begins, plan_.steps[0]);
        for (uint32_t calls = 1; info_.decoderState != nullptr && calls < plan_.most_calls; ++calls)
            make(goes_on, plan_.steps[0]);
    }
    end();
    return outcome_;
}

void Session::carry_out_step(const Step &step) {
    const auto calls = calls_of(plan_.format);
    const Call &call = calls[step.call % calls.size()];
    if (model_.is_legal(call)) make(call, step);
}

void Session::make(const Call &call, const Step &step) {
    if (model_.is_idle()) begun_ = {step.width, step.height};
    uint8_t *const output = output_for(call, step);
    info_.hasTransparency = untouched;
    info_.outputWidth = info_.outputHeight = unwritten_;
    if (model_.state() == State::bmp_parked && call.progress == Progress::resumes && !step.null_request)
        bring_staging_buffer();
    account_.begin_call(model_.is_idle());
    const int32_t result = call.make(step.null_request ? nullptr : &info_, output, step);
    outcome_.results.push_back(result);
    end_two_steps(call, step, result);
    look_at(call, step, result);
}

void Session::bring_staging_buffer() {
    if (!is_staged(source_.kind) || source_.bufferSize <= 0) return;
    source_.data = static_cast<uint8_t *>(ZOTARPELM_OsMalloc(static_cast<uint32_t>(source_.bufferSize)));
}

// The record is gone after the second step whatever its result, and the staging buffer with it.
void Session::end_two_steps(const Call &call, const Step &step, int32_t result) {
    if (step.null_request) return;
    if (call.progress == Progress::resumes && model_.state() == State::bmp_parked) {
        check(call, result == PELM_RESULT_FAILED || info_.decoderState == nullptr, "kept its state");
        check(call, !is_staged(source_.kind) || source_.data == nullptr, "left the staging buffer in the source");
        info_.decoderState = nullptr;
    }
    // What is given up leaves its staging buffer behind, which must not be taken for the next one's.
    if ((call.leaks == Leaks::all || call.leaks == Leaks::all_but_palette) && is_staged(source_.kind))
        source_.data = nullptr;
}

uint8_t *Session::buffer(std::unique_ptr<ExactBytes> &holder, int64_t width, int64_t height, bool anew) {
    const size_t pixel = bytes_per_output_pixel(plan_.format, plan_.output_format);
    const bool is_empty = width <= 0 || height <= 0 || pixel == 0;
    const uint64_t side = largest_output + 1;
    const uint64_t pixels =
        is_empty ? 0 : std::min(static_cast<uint64_t>(width), side) * std::min(static_cast<uint64_t>(height), side);
    if (pixels * pixel > largest_output) return nullptr;
    const auto size = static_cast<size_t>(pixels * pixel);
    if (holder != nullptr && holder->size() == size && !anew) return holder->bytes();
    if (holder != nullptr) outlived_.push_back(std::move(holder));
    holder = std::make_unique<ExactBytes>(size, plan_.alignment);
    memset(holder->bytes(), background, size);
    return holder->bytes();
}

uint8_t *Session::box_buffer(std::unique_ptr<ExactBytes> &holder, const Step &step, bool anew) {
    if (!has_exact_buffers(plan_)) return buffer(holder, step.width, step.height, anew);
    const Sides scaled = measured_->scaled.at(outcome_.scaled.size());
    return buffer(holder, scaled.width, scaled.height, anew);
}

uint8_t *Session::output_for(const Call &call, const Step &step) {
    if (!has_buffers_ || step.null_output || step.null_request) return nullptr;
    const bool idle = info_.decoderState == nullptr;
    switch (call.output) {
    case Output::none: return nullptr;
    // The rows of a box that is too large for a buffer would all be made, to be written outside a smaller one.
    case Output::box: return !idle && pixels_of(begun_) > largest_output ? nullptr : box_buffer(box_, step, false);
    case Output::kept: return idle ? box_buffer(kept_, step, true) : nullptr;
    case Output::rows: return buffer(rows_, begun_.width, step.rows, false);
    case Output::own_rows: return buffer(rows_, step.width, step.rows, false);
    }
    return nullptr;
}

void Session::look_at(const Call &call, const Step &step, int32_t result) {
    const bool idle = info_.decoderState == nullptr;
    const Sides words{info_.outputWidth, info_.outputHeight};
    const bool told_the_size = words != Sides{unwritten_, unwritten_};
    if (told_the_size) scaled_ = words;
    outcome_.scaled.push_back(scaled_);
    const Left left{result, !idle, told_the_size ? std::optional(words) : std::nullopt};
    if (const char *const wrong = model_.follow(call, step, left)) check(call, false, wrong);
    check(call,
          info_.reserved3 == untouched && info_.reserved4 == untouched && info_.reserved11 == untouched &&
              info_.reserved12 == untouched && info_.reserved13 == untouched && info_.reserved16 == untouched,
          "changed a reserved word");
    if (plan_.format == Format::wbmp && plan_.kind == PELM_SOURCE_STREAM)
        check(call, source_.data == nullptr, "left its row buffer in the source");
    if (idle) free_colour_tables();
    const Ending ending{result, idle, info_.hasTransparency != untouched, told_the_size};
    account_.end_call(call, ending, pixels_of(scaled_));
    look_at_buffers();
}

void Session::look_at_buffers() {
    const ExactBytes *const buffers[] = {box_.get(), kept_.get(), rows_.get()};
    uint64_t hashed = outcome_.pixels.empty() ? 0 : outcome_.pixels.back();
    for (const ExactBytes *const each : buffers) {
        if (each == nullptr) continue;
        if (!each->is_intact_before()) give_reason("a byte before the output was written");
        if (!plan_.looks_at_pixels) continue;
        hashed = hash(hashed, each->bytes(), each->size());
        outcome_.wrote_anything |=
            std::any_of(each->bytes(), each->bytes() + each->size(), [](uint8_t byte) { return byte != background; });
    }
    if (plan_.looks_at_pixels) outcome_.pixels.push_back(hashed);
}

// Animations leave the two tables to the caller.
void Session::free_colour_tables() {
    uint8_t *const own = own_table_ ? own_table_->bytes() : nullptr;
    if (info_.globalColorTable != own && info_.globalColorTable != nullptr) ZOTARPELM_OsFree(info_.globalColorTable);
    if (info_.localColorTable != nullptr) ZOTARPELM_OsFree(info_.localColorTable);
    info_.globalColorTable = own;
    info_.localColorTable = nullptr;
}

void Session::end() {
    give_up(plan_.format, info_);
    model_.forget();
    free_colour_tables();
    account_.end();
}

Outcome Session::run_again() {
    const int32_t filling = PelmTest_Faults()->filling;
    *PelmTest_Faults() = PelmTestFaults{};
    PelmTest_Faults()->filling = filling;
    for (std::unique_ptr<ExactBytes> *const buffer : {&box_, &kept_, &rows_})
        if (*buffer != nullptr) outlived_.push_back(std::move(*buffer));
    outcome_ = {};
    scaled_ = {};
    return run();
}

} // namespace

Report carry_out(const Plan &plan) {
    const bool exact = has_exact_buffers(plan);
    const int32_t filling = plan.faults.filling;
    Report report;
    Outcome measured;
    if (exact) measured = Session(plan, filling, false, nullptr).run();
    Session session(plan, filling, true, &measured);
    report.outcome = session.run();
    report.calls = measured.results.size() + report.outcome.results.size();
    if (exact && report.outcome.results != measured.results && !may_begin_too_far(plan, measured))
        give_reason("other results without a buffer");
    if (plan.again) {
        report.again = session.run_again();
        report.calls += report.again.results.size();
    }
    report.services = session.services();
    if (!plan.other_filling) return report;
    if (report.outcome != Session(plan, filling ^ 0xFF, true, &measured).run())
        give_reason("what the host's memory held has been seen in the output");
    return report;
}

} // namespace pelm::fuzz
