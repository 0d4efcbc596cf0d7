// Every input by every call in every format code, turned, placed and boxed in every way, from every kind of source,
// with nothing but inaccessible pages behind the output and the input, and again with them before both.
#include <algorithm>
#include <array>
#include <cstring>
#include <map>
#include <string_view>

#include <gtest/gtest.h>

#include "tests/support/guarded_buffer.h"
#include "tests/sweeps/at_fault.h"
#include "tests/sweeps/follower.h"
#include "tests/sweeps/placed_area.h"
#include "tests/sweeps/shards.h"

namespace pelm::sweeps {
namespace {

using test::Edge;

constexpr uint8_t background = 0x5C;
constexpr int64_t largest_output = 1 << 16; // pixels
constexpr std::array<uint32_t, 15> formats = {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 10, 11, 12, 13, 0xFFFFFFFF};
constexpr std::array<uint32_t, 4> rotations = {PELM_ROTATE_0, PELM_ROTATE_90, PELM_ROTATE_180, PELM_ROTATE_270};
constexpr std::array<uint32_t, 4> placements = {PELM_PLACE_FIT, PELM_PLACE_EXACT, PELM_PLACE_STRETCH, 0x200};
constexpr std::array<uint32_t, 4> kinds = {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT,
                                           PELM_SOURCE_SEQUENTIAL};
constexpr std::array<Edge, 2> edges = {Edge::end, Edge::start};

struct Box {
    int32_t width, height;
};

constexpr Box no_buffer = {-1, -1};

std::array<Box, 10> boxes_for(const Input &input) {
    const int32_t w = input.width, h = input.height;
    return {{{0, 0},
             {1, 1},
             {1, h},
             {w, 1},
             {w, h},
             {w / 2, h / 2},
             {w - 1, h - 1},
             {w + 1, h + 1},
             {3 * w, 3 * h},
             {h, w}}};
}

// The settings of one decode: number n of all of them, the kind of source counting fastest.
constexpr uint32_t settings_per_decode =
    kinds.size() * formats.size() * edges.size() * 10 * placements.size() * rotations.size();

struct Case {
    Setting setting;
    Edge edge;
};

Case nth_case(const Input &input, uint32_t n) {
    const auto digit = [&n](size_t base) {
        const uint32_t value = n % static_cast<uint32_t>(base);
        n /= static_cast<uint32_t>(base);
        return value;
    };
    Case one{{.width = 0, .height = 0}, Edge::end};
    one.setting.kind = kinds[digit(kinds.size())];
    one.setting.format = formats[digit(formats.size())];
    one.edge = edges[digit(edges.size())];
    const Box box = boxes_for(input)[digit(10)];
    one.setting.width = box.width;
    one.setting.height = box.height;
    one.setting.placement = placements[digit(placements.size())];
    one.setting.rotation = rotations[digit(rotations.size())];
    one.setting.buffer_size = input.width * 5;
    return one;
}

// One call's decodes. The areas and buffers are taken over from decode to decode.
class Sweep {
public:
    void add(const Decode &decode, const Case &one);
    std::string where() const; // the last one
    uint64_t decodes = 0;
    int failures = 0;
    std::map<const Exception *, uint64_t> needed; // exceptions, and how often something was written elsewhere

private:
    Box buffer_size(const Decode &decode, const Setting &setting);
    std::string finding(const Decode &decode, const Case &one);
    std::string writing(const Placing &placing, const uint8_t *output, size_t pixel);

    const Decode *decode_ = nullptr;
    Case case_{{.width = 0, .height = 0}, Edge::end};
    test::GuardedBuffer input_, output_;
    // Of the last exact buffer, whose size depends on these alone.
    const Decode *measured_ = nullptr;
    Setting measured_setting_{.width = 0, .height = 0};
    Box exact_{};
};

// In pixels.
Box Sweep::buffer_size(const Decode &decode, const Setting &setting) {
    const fuzz::Output output = decode.call->output;
    if (output == fuzz::Output::rows || output == fuzz::Output::own_rows) return {setting.width, setting.rows};
    if (setting.placement != PELM_PLACE_EXACT || !fuzz::knows_exact_buffers(decode.input->format))
        return {setting.width, setting.height};
    const bool is_known = measured_ == &decode && measured_setting_.width == setting.width &&
                          measured_setting_.height == setting.height && measured_setting_.rotation == setting.rotation;
    if (!is_known) {
        const std::vector<Reply> replies = run(decode, setting, {}).replies;
        const Reply &reply = replies[std::min<size_t>(replies.size() - 1, output == fuzz::Output::none ? 1 : 0)];
        exact_ = {reply.width, reply.height};
        const int64_t pixels = int64_t{reply.width} * reply.height;
        if (pixels > largest_output) exact_ = no_buffer; // of a header that is misread
        measured_ = &decode;
        measured_setting_ = setting;
    }
    return exact_;
}

bool is_background(const uint8_t *bytes, size_t count) {
    return count == 0 || (bytes[0] == background && memcmp(bytes, bytes + 1, count - 1) == 0);
}

// What was written where nothing must be, or "".
std::string Sweep::writing(const Placing &placing, const uint8_t *output, size_t pixel) {
    const Area area = placed_area(placing);
    const size_t row_bytes = static_cast<size_t>(placing.buffer_width) * pixel;
    const int32_t left = std::clamp(area.left, 0, placing.buffer_width);
    const int32_t right = std::clamp(area.left + area.width, left, placing.buffer_width);
    const Exception *exception = nullptr;
    for (int32_t y = 0; y < placing.buffer_height; ++y) {
        const uint8_t *const row = output + static_cast<size_t>(y) * row_bytes;
        const bool is_placed = y >= area.top && y < area.top + area.height;
        const size_t before = is_placed ? static_cast<size_t>(left) * pixel : row_bytes;
        const size_t from = is_placed ? static_cast<size_t>(right) * pixel : row_bytes;
        if (is_background(row, before) && is_background(row + from, row_bytes - from)) continue;
        if (exception == nullptr) {
            exception = exception_for(placing);
            if (exception == nullptr) return "wrote outside the placed area, in row " + std::to_string(y);
            ++needed[exception];
        }
        if (exception->allows == nullptr) return "";
        const auto is_allowed = [&](uint8_t byte) { return byte == background || exception->allows(area, y, byte); };
        if (!std::all_of(row, row + before, is_allowed) || !std::all_of(row + from, row + row_bytes, is_allowed))
            return "wrote outside the placed area other than stated, in row " + std::to_string(y);
    }
    return "";
}

std::string Sweep::finding(const Decode &decode, const Case &one) {
    const Setting &setting = one.setting;
    const Bytes &file = decode.input->bytes;
    const size_t pixel = fuzz::bytes_per_output_pixel(decode.input->format, setting.format);
    const Box buffer = buffer_size(decode, setting);
    const bool is_empty = buffer.width <= 0 || buffer.height <= 0;
    const size_t size = is_empty ? 0 : static_cast<size_t>(buffer.width) * static_cast<size_t>(buffer.height) * pixel;
    PelmTestBytes bytes{input_.take(file.size(), one.edge), static_cast<int32_t>(file.size()), 0};
    memcpy(bytes.bytes, file.data(), file.size());
    uint8_t *const room = output_.take(size, one.edge);
    uint8_t *const output = buffer.width < 0 || buffer.height < 0 ? nullptr : room;
    memset(room, background, size);

    Follower follower(decode, setting, bytes, output);
    while (!follower.is_over())
        follower.make();
    follower.give_up();
    follower.free_colour_tables();

    const bool may_join_chunks = decode.input->format == fuzz::Format::png && setting.kind == PELM_SOURCE_MEMORY;
    if (!output_.intact()) return "wrote outside the buffer";
    if (!input_.intact()) return "wrote outside the input";
    if (!may_join_chunks && memcmp(bytes.bytes, file.data(), file.size()) != 0) return "wrote to the input";
    if (PelmTest_Violation() != nullptr) return PelmTest_Violation();
    if (size == 0) return "";
    return writing(
        {&decode, &setting, follower.info.outputWidth, follower.info.outputHeight, buffer.width, buffer.height}, room,
        pixel);
}

std::string Sweep::where() const {
    if (decode_ == nullptr) return "no decode";
    return decode_->name() + ", " + case_.setting.name() +
           (case_.edge == Edge::end ? ", at the end" : ", at the start");
}

void Sweep::add(const Decode &decode, const Case &one) {
    decode_ = &decode;
    case_ = one;
    const std::string found = finding(decode, one);
    ++decodes;
    if (PelmTest_Counters()->liveBlocks != 0) PelmTest_Reset(); // refusals that leak
    if (found.empty()) return;
    ++failures;
    ADD_FAILURE() << where() << ": " << found;
}

// How many exceptions a call shows.
size_t exceptions_by(std::string_view call) {
    if (call == "DecodeBMPLine" || call == "DecodeWBMP" || call == "DecodeGIFLine") return 0;
    if (call == "DecodeGIF") return 3;
    return call.starts_with("DecodePNG") ? 4 : 2;
}

class GuardPages : public testing::TestWithParam<Shard> {
protected:
    GuardPages() { PelmTest_Reset(); }
    ~GuardPages() override { PelmTest_Reset(); }
};

// Wide and high ones; and data that end early, but for PNG, which refuses them unread.
std::vector<Input> all_inputs() {
    std::vector<Input> inputs = small_inputs();
    for (const std::vector<Input> &more : {small_inputs(17, 26), cut_short(small_inputs())})
        for (const Input &input : more)
            if (input.format != fuzz::Format::png || !input.name.ends_with("cut_short")) inputs.push_back(input);
    return inputs;
}

TEST_P(GuardPages, nothing_is_touched_but_the_input_and_the_placed_area) {
    const std::vector<Input> inputs = all_inputs();
    ASSERT_GE(inputs.size(), 40u);
    const uint32_t step = by_extent(2003u, 61u, 1u); // primes to every dimension
    Sweep sweep;
    const AtFault at_fault([&sweep] { return sweep.where(); });
    uint32_t first = 0;
    for (const Decode &decode : decodes_of(GetParam(), inputs)) {
        for (uint32_t n = first++ % step; n < settings_per_decode && sweep.failures < 10; n += step)
            sweep.add(decode, nth_case(*decode.input, n));
    }
    tell_count("guard pages", GetParam(), sweep.decodes, step);
    for (const auto &[exception, count] : sweep.needed)
        printf("  elsewhere in the buffer: %llu, %s\n", static_cast<unsigned long long>(count), exception->oddity);
    if (is_complete()) {
        EXPECT_EQ(sweep.needed.size(), exceptions_by(GetParam().call->name)) << "each is there for a reason";
    }
}

INSTANTIATE_TEST_SUITE_P(Sweep, GuardPages, testing::ValuesIn(shards(700000, 57600, 1800000, 460000)), name_of_shard);

} // namespace
} // namespace pelm::sweeps
