#include "tests/sweeps/decodes.h"

#include <algorithm>
#include <cstdio>
#include <string_view>

#include "tests/sweeps/follower.h"

namespace pelm::sweeps {
namespace {

using fuzz::Call;
using fuzz::Format;
using fuzz::Output;

constexpr uint64_t largest_output = 16u << 20;

bool is_by_lines(const Call &call) {
    return std::string_view(call.name).ends_with("Line");
}

// A decode, and what is kept of it.
class Run {
public:
    Run(const Decode &decode, const Setting &setting, std::span<uint8_t> output);
    Outcome to_its_end();

private:
    void make_call();
    void keep_output();
    void keep(const void *colour_table);

    const std::span<uint8_t> output_;
    Bytes file_; // a copy: PNG joins its chunks in memory sources
    PelmTestBytes bytes_;
    Follower follower_;
    Outcome outcome_;
};

Run::Run(const Decode &decode, const Setting &setting, std::span<uint8_t> output)
    : output_(output), file_(decode.input->bytes), bytes_{file_.data(), static_cast<int32_t>(file_.size()), 0},
      follower_(decode, setting, bytes_, output.data()) {}

Outcome Run::to_its_end() {
    while (!follower_.is_over())
        make_call();
    follower_.give_up();
    if (follower_.result == PELM_RESULT_MORE) keep_output();
    keep(follower_.info.globalColorTable);
    keep(follower_.info.localColorTable);
    follower_.free_colour_tables();
    return std::move(outcome_);
}

void Run::make_call() {
    const Call &call = follower_.next_call();
    const ImageDecodeInfo &info = follower_.info;
    const int32_t result = follower_.make();
    outcome_.replies.push_back(
        {result, info.outputWidth, info.outputHeight, info.hasTransparency, info.frameDelay, info.colorTableState});
    if (call.output != Output::none && (result != PELM_RESULT_MORE || is_by_lines(call))) keep_output();
}

void Run::keep_output() {
    outcome_.output.insert(outcome_.output.end(), output_.begin(), output_.end());
}

void Run::keep(const void *colour_table) {
    if (colour_table == nullptr) return;
    const auto *const bytes = static_cast<const uint8_t *>(colour_table);
    outcome_.colour_tables.insert(outcome_.colour_tables.end(), bytes, bytes + 1024);
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
