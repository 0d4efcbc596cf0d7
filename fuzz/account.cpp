#include "fuzz/account.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>

#include "bmp/state.h"
#include "frame/bytes.h"
#include "tests/gif/support/gif_blocks.h"

namespace pelm::fuzz {
namespace {

using Blocks = std::vector<uint32_t>; // sizes, in the order of their allocation

constexpr uint64_t most_for_a_still_gif = 464u << 10;

constexpr size_t bmp_header_bytes = 54;
constexpr int32_t gif_screen_bytes = 10; // of the header: up to where the screen's sides are known
constexpr uint32_t png_read_buffer = 16384;

bool is_bmp_header_unsupported(const Plan &plan) {
    const uint8_t size = plan.file[14];
    return size != 12 && size != 40 && (size < 56 || size > 64);
}

bool begins_with_bm(const Plan &plan) {
    return plan.file.size() >= 2 && plan.file[0] == 'B' && plan.file[1] == 'M';
}

// Whether the read that was just served told more than it delivered.
bool overclaims() {
    const uint32_t from = PelmTest_Faults()->overclaimingReadsFrom;
    return from != 0 && PelmTest_Counters()->reads >= from;
}

// Those that are alive, the last `count`.
Blocks newest_blocks(uint64_t count) {
    Blocks blocks;
    const uint64_t alive = PelmTest_Counters()->liveBlocks;
    for (uint64_t i = alive - count; i < alive; ++i)
        blocks.push_back(PelmTest_LiveBlock(i, nullptr));
    return blocks;
}

// docs/formats.md, "Memory".
uint32_t bmp_palette_block(const Plan &plan) {
    const uint32_t offset = read_u32le(&plan.file[10]);
    const int32_t entries = offset <= bmp_header_bytes ? 13 : static_cast<int16_t>((offset - bmp_header_bytes) / 4);
    return std::max<uint32_t>(1024, 4 * static_cast<uint32_t>(std::max(entries, 0)));
}

// The record; and the palette, when it is what breaks off. Some refusals come before both.
bool are_refused_bmp_blocks(const Blocks &blocks, const Plan &plan, bool may_have_palette) {
    if (blocks.empty() || blocks == Blocks{sizeof(BmpState)}) return true;
    if (!may_have_palette || blocks.size() != 2) return false;
    // A read that told too much may have promised a header that is not there.
    const uint32_t palette = plan.file.size() >= bmp_header_bytes ? bmp_palette_block(plan) : blocks[1];
    return blocks == Blocks{sizeof(BmpState), palette};
}

} // namespace

void give_reason(const char *what) {
    fprintf(stderr, "Broken promise: %s\n", what);
    abort();
}

void check(const Call &call, bool holds, const char *what) {
    if (holds) return;
    fprintf(stderr, "Broken promise: %s %s\n", call.name, what);
    abort();
}

Account::Account(const Plan &plan, int32_t filling) : plan_(plan) {
    PelmTest_Reset();
    *PelmTest_Faults() = plan.faults;
    PelmTest_Faults()->filling = filling;
    PelmTest_SetObserver(observe, this);
}

Account::~Account() {
    PelmTest_SetObserver(nullptr, nullptr);
    PelmTest_Reset();
}

void Account::observe(void *account, const PelmTestCall *call) {
    if (call->served == 0) return;
    if (call->violation != nullptr) give_reason(call->violation);
    if (call->service == PELM_TEST_READ || call->service == PELM_TEST_ALLOCATION)
        static_cast<Account *>(account)->note(*call);
}

// Reading must end, whatever the file says: at most a few times all of it in one call.
void Account::note(const PelmTestCall &call) {
    const bool is_read = call.service == PELM_TEST_READ;
    const int32_t delivered = is_read ? call.result : call.block != nullptr ? 1 : 0;
    if (plan_.keeps_services) {
        const bool at_end = is_read && call.position >= static_cast<int64_t>(plan_.file.size());
        services_.push_back({calls_, is_read, static_cast<int32_t>(call.amount), delivered, at_end});
    }
    if (!is_read) {
        if (delivered == 0) (allocated_ == 0 ? has_no_first_ : has_no_second_) = true;
        allocated_ += static_cast<uint64_t>(delivered);
        bytes_allocated_ += delivered != 0 ? static_cast<uint64_t>(call.amount) : 0;
        return;
    }
    const uint64_t file = plan_.file.size();
    came_short_ = call.result < call.amount && !overclaims();
    knows_screen_ |= call.position == 0 && call.result >= gif_screen_bytes;
    // Once is enough: data without end would be read without end.
    if (overclaims()) PelmTest_Faults()->overclaimingReadsFrom = 0;
    bytes_read_ += call.result > 0 ? static_cast<uint64_t>(call.result) : 0;
    if (++reads_ > 2000 + 8 * file) give_reason("reads without end");
    if (bytes_read_ > (1u << 20) + 8 * file) give_reason("reads the file again and again");
}

void Account::begin_call(bool was_idle) {
    before_ = *PelmTest_Counters();
    was_idle_ = was_idle;
    allocated_ = bytes_allocated_ = reads_ = bytes_read_ = 0;
    has_no_first_ = has_no_second_ = came_short_ = knows_screen_ = false;
}

// A refusal that leaves what was allocated by then: a header of another size, or a read that came short.
bool Account::is_refused_bmp() const {
    if (PelmTest_Counters()->failedAllocations != before_.failedAllocations) return false;
    const bool is_known_kind = plan_.kind <= PELM_SOURCE_STREAM_ALT || plan_.kind == PELM_SOURCE_SEQUENTIAL;
    const bool has_header = is_known_kind && plan_.file.size() >= bmp_header_bytes && begins_with_bm(plan_);
    return came_short_ || (has_header && is_bmp_header_unsupported(plan_));
}

// All that a still decode has, so that nothing may have been freed. Only a row for a wider image, for which there was
// no memory, has taken the place of the screen's.
bool Account::is_broken_gif(const Ending &ending, uint64_t leaked, uint64_t freed) const {
    if (ending.result != PELM_RESULT_FAILED || !ending.told_the_size || ending.found_an_image) return leaked == 0;
    const bool has_no_row = PelmTest_Counters()->failedAllocations != before_.failedAllocations;
    const Blocks blocks = newest_blocks(leaked);
    if (blocks.empty()) return false;
    // Of a screen that no read has delivered the row alone tells.
    const uint32_t width = knows_screen_ ? read_u16le(&plan_.file[6]) : blocks.back() / 4;
    Blocks stated = test::gif_still_blocks(width);
    const uint64_t taken = stated.size();
    if (has_no_row) stated.erase(stated.end() - 2);
    return blocks == stated && allocated_ == taken && freed == (has_no_row ? 1 : 0);
}

// Record and palette are freed. Without a read that told too much the file says whether there is one.
uint64_t Account::blocks_but_palette(const Call &call, uint64_t held, uint64_t freed) const {
    if (held == 0) return 0;
    const bool is_sure = plan_.faults.overclaimingReadsFrom == 0 && plan_.file.size() >= bmp_header_bytes;
    const uint32_t bits = is_sure ? read_u16le(&plan_.file[plan_.file[14] == 12 ? 24 : 28]) : 0;
    const uint64_t stated = held > 1 && bits <= 8 ? 2 : 1;
    check(call, freed == stated || (!is_sure && freed == 1), "freed other than the record and its palette");
    return held - freed;
}

// Whether this is what a call leaves for good, as the header says.
bool Account::is_stated_leak(const Call &call, const Ending &ending, uint64_t leaked, uint64_t freed) const {
    const bool failed = ending.result == PELM_RESULT_FAILED;
    const uint64_t held = before_.liveBlocks - lost_;
    switch (call.leaks) {
    case Leaks::nothing: return leaked == 0;
    case Leaks::broken_gif: return is_broken_gif(ending, leaked, freed);
    case Leaks::read_buffer: {
        const bool has_no_record = allocated_ == 1 && has_no_second_;
        const bool leaks =
            allocated_ != 0 && (plan_.kind == PELM_SOURCE_STREAM ? has_no_record : plan_.kind != PELM_SOURCE_MEMORY);
        return newest_blocks(leaked) == (leaks ? Blocks{png_read_buffer} : Blocks{});
    }
    case Leaks::refused_bmp:
        if (!failed || !was_idle_ || !is_refused_bmp()) return leaked == 0;
        return leaked == allocated_ && are_refused_bmp_blocks(newest_blocks(leaked), plan_, came_short_ && reads_ == 2);
    case Leaks::unsigned_bmp:
        if (!failed || (bytes_read_ >= 2 && begins_with_bm(plan_))) return leaked == 0;
        return leaked == allocated_ && are_refused_bmp_blocks(newest_blocks(leaked), plan_, false);
    case Leaks::all: return leaked == held;
    case Leaks::all_but_palette: return leaked == blocks_but_palette(call, held, freed);
    }
    return false;
}

// What a call costs is bounded by what it reads, allocates and writes; compressed rows take two bytes each.
void Account::look_at_work(const Call &call, uint64_t pixels) const {
    const PelmTestCounters &now = *PelmTest_Counters();
    const uint64_t file = plan_.file.size();
    check(call, now.polls - before_.polls <= 2000 + 1100 * file, "polls without end");
    const uint64_t moved = now.bytesMoved - before_.bytesMoved;
    // Each row, which ends in a poll, may clear the sums of a whole reduced one: of boxes whose pixels cannot be
    // counted, too.
    const uint64_t held = before_.liveBytes + bytes_allocated_;
    const uint64_t most =
        (1u << 16) + 16 * (held + 4 * pixels + 4 * file) + (now.polls - before_.polls) * held + reads_ * 16384;
    check(call, moved <= most, "copies and fills without end");
}

void Account::end_call(const Call &call, const Ending &ending, uint64_t pixels) {
    const PelmTestCounters &now = *PelmTest_Counters();
    check(call, plan_.format != Format::png || now.stops == before_.stops || ending.result == PELM_RESULT_FAILED,
          "went on although it was told to stop");
    look_at_work(call, pixels);
    ++calls_;
    const bool is_by_itself =
        call.progress == Progress::apart || call.progress == Progress::whole || call.progress == Progress::needs_idle;
    const uint64_t owned = is_by_itself ? before_.liveBlocks : lost_;
    if (!is_by_itself && !ending.idle) return;
    check(call, now.liveBlocks >= owned, "freed what it had lost");
    const uint64_t leaked = now.liveBlocks - owned;
    check(call, is_stated_leak(call, ending, leaked, now.frees - before_.frees), "leaks other than the header states");
    lost_ += leaked;
}

void Account::end() {
    PelmTest_CheckBlocks();
    if (PelmTest_Violation() != nullptr) give_reason(PelmTest_Violation());
    const PelmTestCounters &now = *PelmTest_Counters();
    if (plan_.format != Format::bmp && now.liveBlocks != lost_) give_reason("a decode that was given up leaks");
    if (plan_.format == Format::gif && plan_.most_calls != 1 && now.peakBytes > most_for_a_still_gif)
        give_reason("a still GIF took more memory than the documents say");
}

} // namespace pelm::fuzz
