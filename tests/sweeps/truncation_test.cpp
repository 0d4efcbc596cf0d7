// Every beginning of every file, by every call, from memory and streams, with the true size and with one that is not:
// nothing is read that is not there, every decode ends, and what it gives and writes is what is stated.
#include <algorithm>
#include <cstring>

#include <gtest/gtest.h>

#include "tests/support/guarded_buffer.h"
#include "tests/sweeps/at_fault.h"
#include "tests/sweeps/cut_files.h"
#include "tests/sweeps/follower.h"
#include "tests/sweeps/shards.h"

namespace pelm::sweeps {
namespace {

constexpr uint8_t background = 0x5C;
constexpr int32_t longest_beginning = 16384;

// What one decode left.
struct Ended {
    int32_t result = -1;
    uint64_t blocks = 0;
    Bytes output;              // after the last call
    std::vector<Bytes> frames; // of animations, each when it was complete
};

bool is_animated(const Decode &decode) {
    return std::string(decode.call->name).find("AGIF") != std::string::npos;
}

bool is_by_rows(const Decode &decode) {
    return decode.call->output == fuzz::Output::own_rows || decode.call->output == fuzz::Output::rows;
}

Setting setting_for(const Decode &decode, bool is_reduced) {
    const Input &input = *decode.input;
    Setting setting{.width = input.width, .height = input.height};
    setting.rows = input.height / 3 + 1;
    if (is_by_rows(decode)) setting.rows = input.height;
    const bool is_large = input.width > 100;
    if (is_large && input.format == fuzz::Format::png) { // refused as a whole: a small output shows that too
        setting.width = input.width / 10;
        setting.height = input.height / 10;
    } else if (is_reduced) {
        setting.width = input.width / 2;
        setting.height = input.height / 2 + 1;
        setting.rows = 7;
    }
    setting.format = is_large && input.format != fuzz::Format::gif ? PELM_FORMAT_RGB565 : PELM_FORMAT_RGBA8888;
    setting.buffer_size = input.width * 5;
    return setting;
}

// Pixel for pixel, or reduced.
struct Form {
    Setting setting;
    size_t pixel, size; // bytes, of a pixel and of the output
    Ended whole[5];     // what the whole file gives, by the kind of source
};

Form form_for(const Decode &decode, bool is_reduced) {
    const Setting setting = setting_for(decode, is_reduced);
    const int32_t rows = is_by_rows(decode) ? setting.rows : setting.height;
    const size_t pixel = fuzz::bytes_per_output_pixel(decode.input->format, setting.format);
    return {setting, pixel, static_cast<size_t>(setting.width) * static_cast<size_t>(rows) * pixel, {}};
}

// One way to decode one input, whole and cut.
class Way {
public:
    explicit Way(const Decode &decode);
    // What is wrong with a cut file's decode, or "". `is_alone`: memory ends where the cut is.
    std::string finding(const Cut &cut, bool is_alone);

private:
    void follow(const Cut &cut, bool is_alone, bool keeps_output);
    void look_at_frame(const Cut &cut, bool keeps_output);
    std::string looked_at_work(const Cut &cut) const;
    std::string looked_at_rows(const Cut &cut, const Stated &stated);
    const Setting &setting(const Cut &cut) const { return form(cut).setting; }
    const Form &form(const Cut &cut) const { return forms_[cut.is_reduced ? 1 : 0]; }
    const Ended &whole(const Cut &cut) const { return form(cut).whole[cut.kind]; }

    const Decode &decode_;
    Form forms_[2];
    const uint64_t chunks_; // of a PNG
    test::GuardedBuffer input_, output_;

    // Of the decode in progress.
    uint8_t *room_ = nullptr;
    Ended ended_;
    size_t frames_ = 0;
    uint32_t calls_ = 0;
    std::string frame_finding_;
    bool is_complete_ = false; // all rows are those of the whole file
};

Way::Way(const Decode &decode)
    : decode_(decode), forms_{form_for(decode, false), form_for(decode, true)},
      chunks_(decode.input->format == fuzz::Format::png ? png_chunks(decode.input->bytes).size() : 0) {
    const auto size = static_cast<int32_t>(decode.input->bytes.size());
    for (const bool is_reduced : {false, true}) {
        for (const uint32_t kind : {0u, 1u, 2u, 4u}) {
            follow({&decode, kind, size, size, is_reduced}, true, true);
            forms_[is_reduced ? 1 : 0].whole[kind] = std::move(ended_);
        }
    }
}

void Way::look_at_frame(const Cut &cut, bool keeps_output) {
    if (ended_.result == PELM_RESULT_MORE) return;
    const size_t size = form(cut).size;
    if (keeps_output) {
        ended_.frames.emplace_back(room_, room_ + size);
    } else if (frames_ < whole(cut).frames.size() && frames_ < whole_frames(cut) &&
               memcmp(room_, whole(cut).frames[frames_].data(), size) != 0) {
        frame_finding_ = "frame " + std::to_string(frames_) + " is there as a whole and another one comes out";
    }
    ++frames_;
}

void Way::follow(const Cut &cut, bool is_alone, bool keeps_output) {
    PelmTest_Reset();
    PelmTest_Faults()->filling = -1; // their contents are the business of another sweep
    const Bytes &file = decode_.input->bytes;
    // Neither streams nor cut files are joined in place.
    PelmTestBytes bytes{const_cast<uint8_t *>(file.data()), cut.held, 0};
    if (is_alone && cut.kind == PELM_SOURCE_MEMORY) {
        bytes.bytes = input_.take(static_cast<size_t>(cut.held), test::Edge::end);
        std::copy_n(file.begin(), cut.held, bytes.bytes);
    }
    const size_t size = form(cut).size;
    room_ = output_.take(size, test::Edge::end);
    memset(room_, background, size);
    Setting own = setting(cut);
    own.kind = cut.kind;
    Follower follower(decode_, own, bytes, room_);
    follower.source.size = cut.stated;
    ended_ = {};
    frames_ = 0;
    frame_finding_.clear();
    while (!follower.is_over()) {
        ended_.result = follower.make();
        if (is_animated(decode_)) look_at_frame(cut, keeps_output);
    }
    calls_ = follower.calls;
    follower.give_up();
    follower.free_colour_tables();
    ended_.blocks = PelmTest_Counters()->liveBlocks;
    if (keeps_output) ended_.output.assign(room_, room_ + size);
}

// Each call may begin anew, and PNG reads a buffer again behind each checksum; nothing more often than that.
std::string Way::looked_at_work(const Cut &cut) const {
    const PelmTestCounters &work = *PelmTest_Counters();
    const auto held = static_cast<uint64_t>(cut.held);
    const auto rows = static_cast<uint64_t>(decode_.input->height);
    if (calls_ > 8 + 2 * rows) return "does not end";
    if (work.reads > 16 + 4 * uint64_t{calls_} + held) return "reads without end";
    if (work.bytesRead > held * (2 + calls_ + chunks_)) return "reads the file again and again";
    if (work.polls > 2 * rows * calls_ + 16) return "asks the host more often than there are rows";
    if (PelmTest_Violation() != nullptr) return PelmTest_Violation();
    return output_.intact() && input_.intact() ? "" : "wrote outside the buffer";
}

bool holds_only(const uint8_t *bytes, size_t count, uint8_t byte) {
    return bytes[0] == byte && memcmp(bytes, bytes + 1, count - 1) == 0;
}

std::string Way::looked_at_rows(const Cut &cut, const Stated &stated) {
    const size_t row = static_cast<size_t>(setting(cut).width) * form(cut).pixel;
    const Bytes &sound = whole(cut).output;
    const bool may_be_cleared = std::string(decode_.call->name) == "DecodeGIF";
    const bool is_bottom_up_file = is_bottom_up(*decode_.input);
    const int32_t height = setting(cut).height;
    bool is_behind = false;
    is_complete_ = true;
    for (int32_t y = 0; y < height; ++y) {
        const size_t at = static_cast<size_t>(y) * row;
        const bool is_there = memcmp(room_ + at, &sound[at], row) == 0;
        const bool is_empty =
            holds_only(room_ + at, row, background) || (may_be_cleared && holds_only(room_ + at, row, 0));
        const int32_t in_file = is_bottom_up_file ? height - 1 - y : y;
        is_complete_ &= is_there;
        const bool is_right = stated.rows == Rows::counted   ? (in_file < stated.count ? is_there : is_empty)
                              : stated.rows == Rows::leading ? is_empty || (is_there && !is_behind)
                                                             : is_empty || is_there;
        is_behind |= !is_there;
        if (!is_right) return "row " + std::to_string(y) + " is neither what it should be nor as it was";
    }
    return "";
}

std::string Way::finding(const Cut &cut, bool is_alone) {
    follow(cut, is_alone, false);
    const std::string work = looked_at_work(cut);
    if (!work.empty()) return work;
    if (decode_.input->name == "gif_damaged") return "";
    if (!frame_finding_.empty()) return frame_finding_;
    const size_t size = form(cut).size;
    Stated stated;
    if (is_whole_to(cut)) {
        stated = {whole(cut).result, whole(cut).blocks, Rows::not_stated};
        if (memcmp(room_, whole(cut).output.data(), size) != 0) return "another picture than from the whole file";
    } else {
        stated = stated_for(cut);
    }
    is_complete_ = false;
    if (stated.rows != Rows::not_stated && !cut.is_reduced) {
        const std::string rows = looked_at_rows(cut, stated);
        if (!rows.empty()) return rows;
    }
    if (is_complete_ && stated.result_if_complete) stated.result = stated.result_if_complete;
    if (stated.result && ended_.result != *stated.result)
        return "gives " + std::to_string(ended_.result) + " instead of " + std::to_string(*stated.result);
    if (ended_.blocks != stated.blocks)
        return "leaves " + std::to_string(ended_.blocks) + " blocks instead of " + std::to_string(stated.blocks);
    return "";
}

class Truncation : public testing::TestWithParam<Shard> {
protected:
    Truncation() { PelmTest_Reset(); }
    ~Truncation() override { PelmTest_Reset(); }

    void sweep(const std::vector<Input> &inputs, int32_t step);
    void cut_at(Way &way, const Decode &decode, int32_t length);
    void look_at(Way &way, const Cut &cut, bool is_alone);

    std::string where() const; // the last one

    uint64_t decodes_ = 0;
    int failures_ = 0;
    Cut cut_{};
    bool is_alone_ = true;
    const AtFault at_fault_{[this] { return where(); }};
};

std::string Truncation::where() const {
    if (cut_.decode == nullptr) return "no decode";
    return cut_.decode->name() + (cut_.is_reduced ? ", reduced" : "") + ", source of kind " +
           std::to_string(cut_.kind) + ", " + std::to_string(cut_.held) + " bytes and a size of " +
           std::to_string(cut_.stated) + (is_alone_ ? "" : ", more behind");
}

void Truncation::look_at(Way &way, const Cut &cut, bool is_alone) {
    cut_ = cut;
    is_alone_ = is_alone;
    const std::string found = way.finding(cut, is_alone);
    ++decodes_;
    if (found.empty()) return;
    ++failures_;
    ADD_FAILURE() << where() << ": " << found;
}

// Both kinds of memory; of the kinds of streams one, with its true size and with another.
void Truncation::cut_at(Way &way, const Decode &decode, int32_t length) {
    static constexpr uint32_t kinds[] = {PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT, PELM_SOURCE_SEQUENTIAL};
    const auto whole = static_cast<int32_t>(decode.input->bytes.size());
    const uint32_t kind = kinds[length % 3];
    const bool is_reduced = length / 6 % 4 == 3;
    look_at(way, {&decode, PELM_SOURCE_MEMORY, length, length, is_reduced}, true);
    look_at(way, {&decode, PELM_SOURCE_MEMORY, length, length, is_reduced}, length == whole);
    look_at(way, {&decode, kind, length, length, is_reduced}, true);
    if (length % 2 == 0)
        look_at(way, {&decode, kind, length, whole + (length == whole ? 1 : 0), is_reduced}, true);
    else
        look_at(way, {&decode, kind, whole, length, is_reduced}, true);
}

void Truncation::sweep(const std::vector<Input> &inputs, int32_t step) {
    int32_t first = 0;
    for (const Decode &decode : decodes_of(GetParam(), inputs)) {
        Way way(decode);
        const auto size = static_cast<int32_t>(decode.input->bytes.size());
        const int32_t end = std::min(size, longest_beginning);
        for (int32_t length = first++ % step; length <= end && failures_ < 10; length += step)
            cut_at(way, decode, length);
        if (end < size) cut_at(way, decode, size);
    }
}

TEST_P(Truncation, every_beginning_of_every_file_gives_what_is_stated) {
    const int32_t step = by_extent(1009, 73, 1); // primes to what the lengths decide
    sweep(small_inputs(), step);
    sweep(sample_inputs(), step);
    tell_count("truncation", GetParam(), decodes_, static_cast<uint64_t>(step));
}

INSTANTIATE_TEST_SUITE_P(Sweep, Truncation, testing::ValuesIn(shards(617000, 38000, 480000, 220000)), name_of_shard);

} // namespace
} // namespace pelm::sweeps
