// The decompressor's core with rows that are no rows: bytes are collected, and the caller says when to stop.
#pragma once

#include <gtest/gtest.h>

#include <ostream>

#include "png/inflate/inflate.h"
#include "tests/png/inner/noise.h"
#include "tests/support/guarded_buffer.h"
#include "tests/support/kernels.h"
#include "tests/support/test_host.h"

namespace pelm {

inline std::ostream &operator<<(std::ostream &out, Stop stop) {
    constexpr const char *names[] = {"go_on",           "finished", "block_ended", "rows_done",          "host_stopped",
                                     "bad_stream",      "bad_code", "input_ended", "input_ended_stored", "no_memory",
                                     "no_lookup_memory"};
    return out << names[static_cast<size_t>(stop)];
}

} // namespace pelm

namespace pelm::test {

// Asks to stop after every `stop_after` bytes; 0: never.
struct Collector {
    Bytes bytes;
    uint32_t stop_after = 0;
    uint32_t largest_run = 0;
};

inline Stop take_run(Collector &rows, const uint8_t *bytes, uint32_t count, uint32_t &taken) {
    rows.largest_run = std::max(rows.largest_run, count);
    taken = count;
    if (rows.stop_after != 0) {
        const auto done = static_cast<uint32_t>(rows.bytes.size() % rows.stop_after);
        taken = std::min(count, rows.stop_after - done);
    }
    rows.bytes.insert(rows.bytes.end(), bytes, bytes + taken);
    const bool stops = rows.stop_after != 0 && rows.bytes.size() % rows.stop_after == 0;
    return stops ? Stop::rows_done : Stop::go_on;
}

// Hands out `piece` bytes at a time.
struct PieceInput {
    const uint8_t *next, *end;
    const uint8_t *last;
    ptrdiff_t piece;
};

inline bool more(PieceInput &input) {
    if (input.end == input.last) return false;
    input.next = input.end;
    input.end += std::min(input.piece, input.last - input.end);
    return true;
}

struct Options {
    ptrdiff_t piece = 0; // 0: all bytes at once
    uint32_t stop_after = 0;
    bool pause_at_blocks = false;
};

struct Outcome {
    Bytes bytes;
    Stop stop = Stop::go_on;
    std::vector<size_t> pauses; // bytes delivered when a block's end was reported
    size_t stops = 0;           // reported because of the rows
    size_t unread = 0;          // bytes of the input that were not even looked at
    uint32_t total = 0;

    // But for how far it looked ahead.
    bool equals(const Outcome &other) const {
        return bytes == other.bytes && stop == other.stop && pauses == other.pauses && stops == other.stops &&
               total == other.total;
    }
};

// One decompression, call by call. Its stream ends against an inaccessible page, and the blocks that it takes are those
// of the test host.
class Inflater {
public:
    explicit Inflater(const Bytes &stream, const Options &options = {}) : options_(options) {
        TestHost::get().reset();
        uint8_t *const copy = memory_.take(stream.size(), Edge::end);
        std::copy(stream.begin(), stream.end(), copy);
        whole_ = {copy, copy + stream.size()};
        pieces_ = {copy, copy, copy + stream.size(), options.piece};
        state.window.bytes = static_cast<uint8_t *>(ZOTARPELM_OsMalloc(window_allocation));
        rows.stop_after = options.stop_after;
        restart(state);
    }
    Inflater(const Inflater &) = delete;
    Inflater &operator=(const Inflater &) = delete;
    ~Inflater() {
        ZOTARPELM_OsFree(state.window.bytes);
        if (state.dynamic != nullptr) ZOTARPELM_OsFree(state.dynamic);
        PELMI_FreePNGHuffmanMemory(&pool);
    }

    Stop call() {
        if (options_.piece != 0) return inflate(state, pieces_, rows, pool, options_.pause_at_blocks);
        return inflate(state, whole_, rows, pool, options_.pause_at_blocks);
    }
    size_t unread() const {
        return static_cast<size_t>(options_.piece != 0 ? pieces_.last - pieces_.next : whole_.end - whole_.next);
    }

    InflateState state{};
    HuffmanNodePool *pool = nullptr;
    Collector rows;

private:
    Options options_;
    GuardedBuffer memory_;
    MemoryInput whole_{};
    PieceInput pieces_{};
};

// Called again and again until it ends for good.
inline Outcome inflated_one_way(const Bytes &stream, const Options &options = {}) {
    Inflater inflater(stream, options);
    Outcome outcome;
    for (;;) {
        outcome.stop = inflater.call();
        if (outcome.stop == Stop::block_ended)
            outcome.pauses.push_back(inflater.rows.bytes.size());
        else if (outcome.stop == Stop::rows_done)
            ++outcome.stops;
        else
            break;
    }
    outcome.bytes = inflater.rows.bytes;
    outcome.unread = inflater.unread();
    outcome.total = inflater.state.window.total;
    return outcome;
}

// The same, and the careful way must come to the same.
inline Outcome inflated(const Bytes &stream, const Options &options = {}) {
    const Outcome outcome = inflated_one_way(stream, options);
    const WithKernels with(Kernels::careful);
    const Outcome careful = inflated_one_way(stream, options);
    EXPECT_TRUE(outcome.equals(careful)) << "carefully: " << careful.stop << ", " << careful.bytes.size()
                                         << " bytes; fast: " << outcome.stop << ", " << outcome.bytes.size();
    return outcome;
}

// The stream of a Deflate, without caring for the checksum.
inline Bytes zlib_stream(const Deflate &deflate) {
    return zlib_stream(deflate.bytes(), {});
}

inline Bytes joined(std::initializer_list<Bytes> parts) {
    Bytes all;
    for (const Bytes &part : parts)
        all.insert(all.end(), part.begin(), part.end());
    return all;
}

inline Bytes text_bytes(const std::string &text) {
    return {text.begin(), text.end()};
}

inline void expect_inflates_to(const Bytes &stream, const Bytes &wanted, const Options &options = {}) {
    const Outcome got = inflated(stream, options);
    EXPECT_EQ(got.stop, Stop::finished);
    EXPECT_TRUE(got.bytes == wanted) << got.bytes.size() << " bytes, expected " << wanted.size();
    EXPECT_EQ(got.total, wanted.size());
}

inline void expect_fails(const Deflate &deflate, Stop wanted, const Bytes &bytes_before = {}) {
    Bytes stream = zlib_stream(deflate);
    stream.insert(stream.end(), 64, 0); // something to look ahead at
    for (const ptrdiff_t piece : {0, 1, 2}) {
        const Outcome got = inflated(stream, {.piece = piece});
        EXPECT_EQ(got.stop, wanted) << "piece " << piece;
        EXPECT_EQ(got.bytes, bytes_before) << "piece " << piece;
    }
}

} // namespace pelm::test
