#include "tests/sweeps/streams/inflate_ways.h"

#include <algorithm>
#include <cstring>
#include <sstream>
#include <stdexcept>

#include "png/inflate/inflate.h"
#include "tests/support/kernels.h"

namespace pelm::sweeps {
namespace {

using test::Inflation;
using test::InflationEnd;

constexpr uint8_t stale = 0xA5; // what the window holds of earlier streams

// Rows that are none: bytes are compared as they come.
struct Comparer {
    const Bytes *expected;
    size_t done;
    uint32_t stop_after;
    bool differs;
};

Stop take_run(Comparer &rows, const uint8_t *bytes, uint32_t count, uint32_t &taken) {
    const size_t left = rows.expected->size() - rows.done;
    taken = count;
    if (rows.stop_after != 0)
        taken = std::min(count, rows.stop_after - static_cast<uint32_t>(rows.done % rows.stop_after));
    rows.differs = taken > left || std::memcmp(bytes, rows.expected->data() + rows.done, taken) != 0;
    if (rows.differs) return Stop::host_stopped;
    rows.done += taken;
    return rows.stop_after != 0 && rows.done % rows.stop_after == 0 ? Stop::rows_done : Stop::go_on;
}

// Each piece lies where the one before it lay, at the area's end.
struct PieceInput {
    const uint8_t *next, *end;
    uint8_t *area_end;
    const Bytes *stream;
    const Way *way;
    size_t taken, pieces; // so far
};

bool more(PieceInput &input) {
    const std::vector<uint32_t> &sizes = input.way->pieces;
    const size_t left = input.stream->size() - input.taken;
    if (left == 0) return false;
    const size_t size = std::min<size_t>(left, sizes[std::min(input.pieces++, sizes.size() - 1)]);
    input.end = input.area_end;
    input.next = input.end - size;
    std::memcpy(input.area_end - size, input.stream->data() + input.taken, size);
    input.taken += size;
    return true;
}

size_t bytes_taken(const MemoryInput &input, const Bytes &stream) {
    return stream.size() - static_cast<size_t>(input.end - input.next);
}

size_t bytes_taken(const PieceInput &input, const Bytes &) {
    return input.taken - static_cast<size_t>(input.end - input.next);
}

InflationEnd end_of(Stop stop) {
    switch (stop) {
    case Stop::finished: return InflationEnd::finished;
    case Stop::bad_code: return InflationEnd::bad_code;
    case Stop::input_ended: return InflationEnd::input_ended;
    case Stop::input_ended_stored: return InflationEnd::input_ended_stored;
    default: return InflationEnd::bad_stream;
    }
}

const char *name_of(InflationEnd end) {
    static constexpr const char *names[] = {"finished", "bad stream", "bad code", "input ended",
                                            "input ended in a stored block"};
    return names[static_cast<size_t>(end)];
}

std::string at_byte(size_t byte, const std::string &what) {
    return "behind byte " + std::to_string(byte) + " of the output: " + what;
}

// At the end of a block. Empty when it is where the model says.
std::string other_place(const Inflation &expected, size_t block, size_t bytes, size_t bits) {
    if (block >= expected.block_ends.size()) return at_byte(bytes, "a block ends that does not");
    const Inflation::Place &place = expected.block_ends[block];
    if (place.bytes == bytes && place.bits == bits) return "";
    return at_byte(bytes, "block " + std::to_string(block) + " ends at bit " + std::to_string(bits) +
                              " of the input, not behind byte " + std::to_string(place.bytes) + " at bit " +
                              std::to_string(place.bits));
}

template <class Input>
std::string follow(InflateState &state, HuffmanNodePool *&pool, Input &input, const Bytes &stream,
                   const Inflation &expected, const Way &way) {
    Comparer rows{&expected.bytes, 0, way.stop_after, false};
    size_t blocks = 0;
    Stop stop = Stop::rows_done;
    while (stop == Stop::rows_done || stop == Stop::block_ended) {
        stop = inflate(state, input, rows, pool, way.pause_at_blocks);
        if (rows.differs) return at_byte(rows.done, "other bytes, or too many");
        const size_t bits = 8 * bytes_taken(input, stream) - state.bits.count;
        if (stop == Stop::finished) blocks = expected.block_ends.size() - 1;
        if (stop != Stop::block_ended && stop != Stop::finished) continue;
        const std::string other = other_place(expected, blocks++, rows.done, bits);
        if (!other.empty()) return other;
    }
    if (end_of(stop) != expected.end)
        return at_byte(rows.done, std::string(name_of(end_of(stop))) + ", not " + name_of(expected.end));
    if (rows.done != expected.bytes.size() || state.window.total != static_cast<uint32_t>(expected.bytes.size()))
        return at_byte(rows.done, "ends too early, or counts wrongly");
    const bool paused_everywhere = blocks == expected.block_ends.size();
    return !way.pause_at_blocks || paused_everywhere ? "" : at_byte(rows.done, "a block end without a pause");
}

std::string in_hexadecimal(const Bytes &bytes) {
    static constexpr char digits[] = "0123456789abcdef";
    std::string text;
    for (size_t i = 0; i < std::min<size_t>(bytes.size(), 4000); ++i) {
        text += digits[bytes[i] >> 4];
        text += digits[bytes[i] & 15];
    }
    return text;
}

} // namespace

std::string Way::name() const {
    std::ostringstream text;
    text << (pieces.empty() ? "at once" : "in pieces of");
    for (size_t i = 0; i < std::min<size_t>(pieces.size(), 30); ++i)
        text << ' ' << pieces[i];
    if (stop_after != 0) text << ", stopping after every " << stop_after << " bytes";
    if (pause_at_blocks) text << ", pausing at blocks";
    return text.str();
}

InflateWays::InflateWays() {
    PelmTest_Reset();
    PelmTest_TakeArea(&area_, 4u << 20, PELM_TEST_AREA_AT_END);
    state_.window.bytes = static_cast<uint8_t *>(ZOTARPELM_OsMalloc(window_allocation));
    if (area_.bytes == nullptr || state_.window.bytes == nullptr) throw std::runtime_error("no memory");
}

InflateWays::~InflateWays() {
    ZOTARPELM_OsFree(state_.window.bytes);
    if (state_.dynamic != nullptr) ZOTARPELM_OsFree(state_.dynamic);
    PELMI_FreePNGHuffmanMemory(&pool_);
    PelmTest_ReleaseArea(&area_);
}

uint8_t *InflateWays::flush(std::span<const uint8_t> bytes) {
    if (bytes.size() > area_.size) PelmTest_TakeArea(&area_, 2 * bytes.size(), PELM_TEST_AREA_AT_END);
    uint8_t *const at = area_.bytes + area_.size - bytes.size();
    std::copy(bytes.begin(), bytes.end(), at);
    return at;
}

std::string InflateWays::difference(const Bytes &stream, const Inflation &expected, const Way &way) {
    // Now and then by the careful loop, which the fast one hands back to, alone.
    const test::WithKernels with(++decodes % 4 == 0 ? Kernels::careful : kernels());
    std::memset(state_.window.bytes, stale, window_allocation);
    restart(state_);
    std::string found;
    if (way.pieces.empty()) {
        const uint8_t *const at = flush(stream);
        MemoryInput input{at, at + stream.size()};
        found = follow(state_, pool_, input, stream, expected, way);
    } else {
        uint8_t *const end = area_.bytes + area_.size;
        PieceInput input{end, end, end, &stream, &way, 0, 0};
        found = follow(state_, pool_, input, stream, expected, way);
    }
    if (found.empty() && PelmTest_Violation() != nullptr) found = PelmTest_Violation();
    if (found.empty()) return found;
    return way.name() + ": " + found + "\nstream of " + std::to_string(stream.size()) + " bytes " +
           in_hexadecimal(stream);
}

std::string InflateWays::difference(const Bytes &stream, Random &random) {
    const Inflation &expected = model.inflate(stream);
    Way slow{.stop_after = random.between(1, 700), .pause_at_blocks = random.one_in(2)};
    Way pieces{.pause_at_blocks = random.one_in(2)};
    const uint32_t largest = random.one_in(3) ? 400 : 20;
    for (uint32_t i = 0; i < 8; ++i)
        pieces.pieces.push_back(random.between(1, largest));
    for (const Way &way : {Way{}, slow, pieces}) {
        std::string found = difference(stream, expected, way);
        if (!found.empty()) return found;
    }
    return "";
}

Bytes zlib_of(const Bytes &deflated) {
    Bytes stream = {0x78, 0x9C};
    stream.resize(2 + deflated.size());
    std::copy(deflated.begin(), deflated.end(), stream.begin() + 2);
    return stream;
}

} // namespace pelm::sweeps
