#include "tests/sweeps/decodes.h"

#include <algorithm>
#include <cstdio>
#include <string_view>

namespace pelm::sweeps {
namespace {

using fuzz::Call;
using fuzz::Format;
using fuzz::Output;
using fuzz::Progress;

// More than any input needs. A PNG whose first block holds no row would be begun anew forever.
constexpr size_t most_calls = 2000;

constexpr uint64_t largest_output = 16u << 20;

bool is_by_lines(const Call &call) {
    return std::string_view(call.name).ends_with("Line");
}

class Run {
public:
    Run(const Decode &decode, const Setting &setting, std::span<uint8_t> output);
    Outcome to_its_end();

private:
    int32_t make(const Call &call);
    void bring_staging_buffer();
    void keep_output();
    void keep_and_free(void *&table);

    const Decode &decode_;
    const Setting &setting_;
    const std::span<uint8_t> output_;
    const bool has_two_steps_;
    Bytes file_; // a copy: PNG joins its chunks in memory sources
    PelmTestBytes bytes_;
    InputSource source_{};
    ImageDecodeInfo info_{};
    Outcome outcome_;
};

Run::Run(const Decode &decode, const Setting &setting, std::span<uint8_t> output)
    : decode_(decode), setting_(setting), output_(output), has_two_steps_(decode.call->progress == Progress::parks),
      file_(decode.input->bytes), bytes_{file_.data(), static_cast<int32_t>(file_.size()), 0} {
    PelmTest_OpenSource(&source_, setting.kind, &bytes_, setting.buffer_size);
    info_.input = &source_;
    info_.outputFormat = setting.format;
    info_.flags = setting.rotation | setting.placement | decode.flags;
}

Outcome Run::to_its_end() {
    const Call &next = has_two_steps_ ? fuzz::resuming_call() : *decode_.call;
    int32_t result = make(*decode_.call);
    while (info_.decoderState != nullptr && result != PELM_RESULT_FAILED && outcome_.replies.size() < most_calls)
        result = make(next);
    if (has_two_steps_) info_.decoderState = nullptr; // freed, whatever came of it
    fuzz::give_up(decode_.input->format, info_);
    if (result == PELM_RESULT_MORE) keep_output();
    keep_and_free(info_.globalColorTable);
    keep_and_free(info_.localColorTable);
    return std::move(outcome_);
}

int32_t Run::make(const Call &call) {
    const int32_t rows = has_two_steps_ ? 1 : setting_.rows; // 1: the divisor of the first step
    if (call.progress == Progress::resumes) bring_staging_buffer();
    const fuzz::Step step{0, setting_.width, setting_.height, rows, output_.data() == nullptr, false};
    const int32_t result = call.make(&info_, output_.data(), step);
    outcome_.replies.push_back({result, info_.outputWidth, info_.outputHeight, info_.hasTransparency, info_.frameDelay,
                                info_.colorTableState});
    if (call.output != Output::none && (result != PELM_RESULT_MORE || is_by_lines(call))) keep_output();
    return result;
}

void Run::bring_staging_buffer() {
    if (setting_.kind != PELM_SOURCE_STREAM && setting_.kind != PELM_SOURCE_STREAM_ALT) return;
    source_.data = static_cast<uint8_t *>(ZOTARPELM_OsMalloc(static_cast<uint32_t>(source_.bufferSize)));
}

void Run::keep_output() {
    outcome_.output.insert(outcome_.output.end(), output_.begin(), output_.end());
}

void Run::keep_and_free(void *&table) {
    if (table == nullptr) return;
    const auto *const bytes = static_cast<const uint8_t *>(table);
    outcome_.colour_tables.insert(outcome_.colour_tables.end(), bytes, bytes + 1024);
    ZOTARPELM_OsFree(table);
    table = nullptr;
}

bool is_interlaced_png(const Input &input) {
    return input.format == Format::png && input.bytes.size() > 28 && input.bytes[28] == 1;
}

} // namespace

std::string Decode::name() const {
    return input->name + " by " + call->name + (flags != 0 ? " through a frame" : "");
}

std::vector<Decode> decodes_of(const std::vector<Input> &inputs) {
    std::vector<Decode> decodes;
    const auto add_all = [&decodes](const Input &input, Format calls, uint32_t flags) {
        for (const Call &call : fuzz::decoding_calls(calls))
            decodes.push_back({&input, &call, flags});
    };
    for (const Input &input : inputs) {
        add_all(input, input.format, 0);
        if (input.format == Format::gif) add_all(input, Format::agif, 0);
        if (is_interlaced_png(input)) add_all(input, Format::png, PELM_INTERLACE_FRAME);
    }
    return decodes;
}

std::string Setting::name() const {
    char text[160];
    snprintf(text, sizeof text, "format %u, box %dx%d, rotation %u, placement 0x%x, source of kind %u",
             static_cast<unsigned>(format), static_cast<int>(width), static_cast<int>(height),
             static_cast<unsigned>(rotation * 90 / PELM_ROTATE_90), static_cast<unsigned>(placement),
             static_cast<unsigned>(kind));
    return text;
}

Setting nth_setting(const Input &input, uint32_t output_format, uint32_t n) {
    static constexpr uint32_t placements[] = {PELM_PLACE_FIT, PELM_PLACE_EXACT, PELM_PLACE_STRETCH, 0x200};
    static constexpr uint32_t kinds[] = {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT,
                                         PELM_SOURCE_SEQUENTIAL};
    const int32_t w = input.width;
    const int32_t h = input.height;
    const int32_t boxes[][2] = {{w, h}, {w / 2, h / 2 + 1}, {w + 5, h + 2}, {h, w}, {w * 2, h / 3}};
    // Each a digit of n: 5 and 4 have no common factor, and the higher digits shift the lower ones.
    const uint32_t digits = n % 4, higher = n / 4 % 4, highest = n / 16 % 4;
    Setting setting{.width = boxes[n % 5][0], .height = boxes[n % 5][1]};
    setting.format = output_format;
    setting.rotation = digits * PELM_ROTATE_90;
    setting.placement = placements[(digits + higher) % 4];
    setting.kind = kinds[(digits + highest) % 4];
    setting.rows = h / 3 + 1;
    setting.buffer_size = 4 * w + static_cast<int32_t>(n % 3) * 1000;
    return setting;
}

std::optional<size_t> output_size(const Decode &decode, const Setting &setting) {
    int32_t width = setting.width;
    int32_t height = setting.height;
    const Output output = decode.call->output;
    if (output == Output::rows || output == Output::own_rows) {
        height = setting.rows;
    } else if (setting.placement == PELM_PLACE_EXACT && fuzz::knows_exact_buffers(decode.input->format)) {
        const std::vector<Reply> replies = run(decode, setting, {}).replies;
        const Reply &reply = replies[std::min<size_t>(replies.size() - 1, output == Output::none ? 1 : 0)];
        width = reply.width;
        height = reply.height;
    }
    const size_t pixel = fuzz::bytes_per_output_pixel(decode.input->format, setting.format);
    if (width <= 0 || height <= 0) return 0;
    const uint64_t pixels = static_cast<uint64_t>(width) * static_cast<uint64_t>(height);
    if (pixels > largest_output / 4) return {};
    return static_cast<size_t>(pixels) * pixel;
}

std::vector<int32_t> Outcome::results() const {
    std::vector<int32_t> results;
    for (const Reply &reply : replies)
        results.push_back(reply.result);
    return results;
}

Outcome run(const Decode &decode, const Setting &setting, std::span<uint8_t> output) {
    return Run(decode, setting, output).to_its_end();
}

} // namespace pelm::sweeps
