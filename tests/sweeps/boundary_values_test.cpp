// Every field of every header at its boundary values, alone in every box, format code and rotation and in pairs: no
// decode asks for more memory than is stated, or for more work than its file and its box are worth.
#include <time.h>

#include <algorithm>
#include <array>
#include <cstring>

#include <gtest/gtest.h>

#include "tests/support/guarded_buffer.h"
#include "tests/sweeps/at_fault.h"
#include "tests/sweeps/follower.h"
#include "tests/sweeps/header_fields.h"
#include "tests/sweeps/memory_limit.h"
#include "tests/sweeps/shards.h"

namespace pelm::sweeps {
namespace {

constexpr uint32_t small_host = 1 << 20, large_host = 64 << 20; // their largest blocks
constexpr int64_t largest_output = 1 << 16;                     // pixels; in larger boxes nothing is written
constexpr uint32_t most_calls = 60;                             // an image of 2^31 rows may take any number

struct Box {
    int32_t width, height;
};

constexpr std::array<Box, 11> boxes = {{{23, 19},
                                        {11, 10},
                                        {0, 0},
                                        {-1, 7},
                                        {1, 1},
                                        {40, 9},
                                        {3, 200},
                                        {65535, 65535},
                                        {46341, 46341},
                                        {INT32_MAX, 3},
                                        {INT32_MAX, INT32_MAX}}};
constexpr std::array<uint32_t, 10> formats = {0, 1, 5, 6, 7, 8, 10, 11, 12, 13};
constexpr std::array<uint32_t, 4> placements = {PELM_PLACE_FIT, PELM_PLACE_STRETCH, PELM_PLACE_EXACT, 0x200};
constexpr std::array<uint32_t, 4> kinds = {PELM_SOURCE_MEMORY, PELM_SOURCE_STREAM, PELM_SOURCE_STREAM_ALT,
                                           PELM_SOURCE_SEQUENTIAL};

// Boxes, codes and rotations are combined, the others go round beside them.
constexpr uint32_t box_count = boxes.size(), format_count = formats.size();
constexpr uint32_t settings_alone = box_count * format_count * 4;

Setting nth_setting(uint32_t n) {
    const uint32_t box = n % box_count, format = n / box_count % format_count;
    Setting setting{.width = boxes[box].width, .height = boxes[box].height};
    setting.format = formats[format];
    setting.rotation = n / (box_count * format_count) % 4 * PELM_ROTATE_90;
    setting.placement = placements[(n + n / 7 + n / settings_alone) % 4];
    setting.kind = kinds[(n / 4 + n / 3) % 4];
    setting.rows = n % 5 == 0 ? 19 : 6;
    setting.buffer_size = 100;
    return setting;
}

// Watches what a decode asks its host for.
struct Wishes {
    uint64_t most = 0; // alive at once, had everything been granted

    static void observe(void *user, const PelmTestCall *call) {
        if (call->service != PELM_TEST_ALLOCATION || call->served != 0) return;
        auto &wishes = *static_cast<Wishes *>(user);
        const uint64_t alive = PelmTest_Counters()->liveBytes + static_cast<uint64_t>(call->amount);
        wishes.most = std::max(wishes.most, alive);
    }
};

// Of this thread alone, whatever else the machine does.
double cpu_milliseconds() {
    timespec now{};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) * 1e3 + static_cast<double>(now.tv_nsec) / 1e6;
}

struct Change {
    const Field *field;
    uint32_t value;
};

class Sweep {
public:
    // One decode of the file with these changes.
    void add(const Decode &decode, const Setting &setting, const std::vector<Change> &changes);
    std::string where() const; // the last one
    uint64_t decodes = 0;
    int failures = 0;
    double longest = 0; // CPU time of a decode's calls, in ms; measured in the complete form only
    std::string longest_where;

private:
    void follow_in_time(Follower &follower);
    // Blocks of 64 MB take long to clear.
    uint32_t largest_block() const { return decodes % 499 == 0 ? large_host : small_host; }
    std::string finding(const Decode &decode, const Setting &setting);
    uint8_t *take_output(const Decode &decode, const Setting &setting);
    std::string looked_at(const Follower &follower, const Decode &decode, const Setting &setting) const;

    const Decode *decode_ = nullptr;
    Setting setting_{.width = 0, .height = 0};
    std::vector<Change> changes_;
    Bytes file_; // as it is changed
    Wishes wishes_;
    test::GuardedBuffer input_, output_;
};

void look_on(Wishes &wishes, uint32_t largest_block) {
    PelmTest_Reset();
    PelmTest_Faults()->filling = -1;
    PelmTest_Faults()->largestBlock = largest_block;
    wishes = {};
    PelmTest_SetObserver(Wishes::observe, &wishes);
}

void follow(Follower &follower) {
    while (!follower.is_over() && follower.calls < most_calls)
        follower.make();
}

// A maximum to be told, not to be asserted.
void Sweep::follow_in_time(Follower &follower) {
    if (!is_complete()) return follow(follower);
    const double start = cpu_milliseconds();
    follow(follower);
    const double taken = cpu_milliseconds() - start;
    if (taken <= longest) return;
    longest = taken;
    longest_where = where();
}

// Room for what the calls may write; NULL where that would be much. The size of an exact buffer is found out before.
uint8_t *Sweep::take_output(const Decode &decode, const Setting &setting) {
    const fuzz::Output output = decode.call->output;
    int64_t width = setting.width, height = setting.height;
    if (output == fuzz::Output::rows || output == fuzz::Output::own_rows) {
        height = setting.rows;
    } else if (setting.placement == PELM_PLACE_EXACT && fuzz::knows_exact_buffers(decode.input->format)) {
        Bytes copy = file_;
        PelmTestBytes bytes{copy.data(), static_cast<int32_t>(copy.size()), 0};
        look_on(wishes_, largest_block());
        Follower measuring(decode, setting, bytes, nullptr);
        measuring.make();
        if (output == fuzz::Output::none && !measuring.is_over()) measuring.make();
        width = measuring.info.outputWidth;
        height = measuring.info.outputHeight;
        PelmTest_Reset();
    }
    width = std::max<int64_t>(width, 0);
    height = std::max<int64_t>(height, 0);
    if (width > largest_output || height > largest_output || width * height > largest_output) return nullptr;
    const size_t pixel = fuzz::bytes_per_output_pixel(decode.input->format, setting.format);
    return output_.take(static_cast<size_t>(width * height) * pixel, test::Edge::end);
}

std::string Sweep::looked_at(const Follower &follower, const Decode &decode, const Setting &setting) const {
    const PelmTestCounters &work = *PelmTest_Counters();
    const auto size = static_cast<uint64_t>(file_.size());
    const uint64_t calls = follower.calls;
    const uint64_t chunks = decode.input->format == fuzz::Format::png ? size / 12 : 0;
    const uint64_t limit = memory_limit(decode, setting, file_, follower.info);
    if (wishes_.most > limit)
        return "asks for " + std::to_string(wishes_.most) + " bytes, " + std::to_string(limit) + " are stated";
    if (work.reads > 32 + 4 * calls + size) return "reads without end";
    if (work.bytesRead > size * (4 + calls + chunks)) return "reads the file again and again";
    if (work.seeks > 8 + 2 * calls + chunks * 3 + size) return "moves its source without end";
    if (work.polls > calls * 8192) return "asks the host without end";
    // Blocks are cleared when they are new; PNG's sums with every row, as often as the host is asked.
    const uint64_t sums = 4 * std::min<uint64_t>(static_cast<uint32_t>(follower.info.outputWidth), largest_block());
    const uint64_t cleared =
        (1 + calls) * std::min<uint64_t>(limit, uint64_t{4} * largest_block()) + (2 + work.polls) * sums;
    if (work.bytesMoved > cleared + 64 * size + 65536) return "moves " + std::to_string(work.bytesMoved) + " bytes";
    if (PelmTest_Violation() != nullptr) return PelmTest_Violation();
    const int32_t result = follower.result;
    const bool may_leak = decode.call->leaks != fuzz::Leaks::nothing && result == PELM_RESULT_FAILED;
    if (work.liveBlocks > (may_leak ? 11u : 0u) && follower.calls < most_calls) return "leaks";
    return output_.intact() && input_.intact() ? "" : "wrote outside the buffer";
}

std::string Sweep::finding(const Decode &decode, const Setting &setting) {
    uint8_t *const output = take_output(decode, setting);
    PelmTestBytes bytes{input_.take(file_.size(), test::Edge::end), static_cast<int32_t>(file_.size()), 0};
    std::copy(file_.begin(), file_.end(), bytes.bytes);
    look_on(wishes_, largest_block());
    Follower follower(decode, setting, bytes, output);
    follow_in_time(follower);
    follower.give_up();
    follower.free_colour_tables();
    return looked_at(follower, decode, setting);
}

std::string Sweep::where() const {
    if (decode_ == nullptr) return "no decode";
    std::string text = decode_->name() + ", " + setting_.name();
    for (const Change &change : changes_)
        text += ", " + change.field->name + " " + std::to_string(change.value);
    return text;
}

void Sweep::add(const Decode &decode, const Setting &setting, const std::vector<Change> &changes) {
    decode_ = &decode;
    setting_ = setting;
    changes_ = changes;
    file_ = decode.input->bytes;
    for (const Change &change : changes)
        set_field(file_, *change.field, change.value);
    const std::string found = finding(decode, setting);
    PelmTest_SetObserver(nullptr, nullptr);
    ++decodes;
    if (found.empty()) return;
    ++failures;
    ADD_FAILURE() << where() << ": " << found;
}

std::vector<Change> changes_of(const Subject &subject) {
    std::vector<Change> changes;
    for (const Field &field : subject.fields)
        for (const uint32_t value : values_for(field))
            changes.push_back({&field, value});
    return changes;
}

class BoundaryValues : public testing::TestWithParam<Shard> {
protected:
    BoundaryValues() { PelmTest_Reset(); }
    ~BoundaryValues() override {
        PelmTest_SetObserver(nullptr, nullptr);
        PelmTest_Reset();
    }
};

// Calls check(decode, changes, whether alone) for every combination of changes.
template <class Check>
void for_all_changes(const Subject &subject, const Shard &shard, Check check) {
    const std::vector<Change> changes = changes_of(subject);
    const std::vector<Input> inputs = {subject.input};
    for (const Decode &decode : decodes_of(shard, inputs)) {
        for (auto one = changes.begin(); one != changes.end(); ++one) {
            check(decode, std::vector<Change>{*one}, true);
            for (auto other = one; other != changes.end(); ++other)
                if (other->field != one->field) check(decode, std::vector<Change>{*one, *other}, false);
        }
    }
}

TEST_P(BoundaryValues, no_header_costs_more_than_is_stated) {
    const uint32_t step = by_extent(1009u, 31u, 1u); // primes to what is combined
    Sweep sweep;
    const AtFault at_fault([&sweep] { return sweep.where(); });
    uint64_t number = 0;
    uint32_t round = 0;
    for (const Subject &subject : subjects())
        for_all_changes(subject, GetParam(), [&](const Decode &decode, const std::vector<Change> &changes, bool alone) {
            const uint32_t settings = alone ? settings_alone : 6;
            for (uint32_t i = 0; i < settings; ++i) {
                const uint32_t setting = alone ? i : ++round;
                if (number++ % step == 0 && sweep.failures < 10) sweep.add(decode, nth_setting(setting), changes);
            }
        });
    tell_count("boundary values", GetParam(), sweep.decodes, step);
    if (is_complete())
        printf("boundary values, %s: at most %.1f ms of CPU time, for %s\n", GetParam().call->name, sweep.longest,
               sweep.longest_where.c_str());
}

INSTANTIATE_TEST_SUITE_P(Sweep, BoundaryValues, testing::ValuesIn(shards(870000, 17000, 800000, 300000)),
                         name_of_shard);

} // namespace
} // namespace pelm::sweeps
