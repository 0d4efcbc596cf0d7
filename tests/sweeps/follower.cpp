#include "tests/sweeps/follower.h"

namespace pelm::sweeps {
namespace {

// More than any input needs. A PNG whose first block holds no row would be begun anew forever.
constexpr uint32_t most_calls = 2000;

} // namespace

Follower::Follower(const Decode &decode, const Setting &setting, PelmTestBytes &bytes, uint8_t *output)
    : decode_(decode), setting_(setting), output_(output),
      has_two_steps_(decode.call->progress == fuzz::Progress::parks) {
    PelmTest_OpenSource(&source, setting.kind, &bytes, setting.buffer_size);
    info.input = &source;
    info.outputFormat = setting.format;
    info.flags = setting.rotation | setting.placement | decode.flags;
}

const fuzz::Call &Follower::next_call() const {
    return calls > 0 && has_two_steps_ ? fuzz::resuming_call() : *decode_.call;
}

int32_t Follower::make() {
    const fuzz::Call &call = next_call();
    const int32_t rows = has_two_steps_ ? 1 : setting_.rows; // 1: the divisor of the first step
    if (call.progress == fuzz::Progress::resumes) bring_staging_buffer();
    const fuzz::Step step{0, setting_.width, setting_.height, rows, output_ == nullptr, false};
    result = call.make(&info, output_, step);
    ++calls;
    if (call.progress == fuzz::Progress::resumes) info.decoderState = nullptr; // freed, whatever came of it
    return result;
}

bool Follower::is_over() const {
    return calls > 0 && (info.decoderState == nullptr || result == PELM_RESULT_FAILED || calls == most_calls);
}

void Follower::give_up() {
    fuzz::give_up(decode_.input->format, info);
}

void Follower::free_colour_tables() {
    for (void **const table : {&info.globalColorTable, &info.localColorTable}) {
        if (*table != nullptr) ZOTARPELM_OsFree(*table);
        *table = nullptr;
    }
}

void Follower::bring_staging_buffer() {
    if (setting_.kind != PELM_SOURCE_STREAM && setting_.kind != PELM_SOURCE_STREAM_ALT) return;
    source.data = static_cast<uint8_t *>(ZOTARPELM_OsMalloc(static_cast<uint32_t>(source.bufferSize)));
}

} // namespace pelm::sweeps
