// The decompressor (RFC 1950, RFC 1951): a resumable core that produces bytes and knows nothing of images.
//
// It writes into the window and hands runs of bytes to `rows`:
//   Stop take_run(Rows &, const uint8_t *bytes, uint32_t count, uint32_t &taken)
// takes as much of a run as it wants and says whether to go on. What it leaves waits in the window for the next call,
// and whatever ended the stream further on is reported only after the bytes before it have been delivered.
#pragma once

#include "png/inflate/dynamic_header.h"

namespace pelm {

template <class Rows>
Stop deliver(Window &window, Rows &rows) {
    while (window.delivered != window.write) {
        uint32_t taken = 0;
        const Stop stop = take_run(rows, window.bytes + window.delivered, window.write - window.delivered, taken);
        window.delivered += taken;
        if (stop != Stop::go_on) return stop;
    }
    wrap(window);
    return Stop::go_on;
}

// Required: neither the header's check bits nor the checksum at the end are looked at (docs/oddities.md, "Checksums").
template <class Input>
Stop read_zlib_header(InflateState &now, Input &input) {
    uint32_t method = 0;
    uint32_t flags = 0;
    if (!take_bits(now.bits, input, 8, method) || !take_bits(now.bits, input, 8, flags)) return Stop::input_ended;
    const bool preset_dictionary = (flags & 0x20) != 0;
    if ((method & 15) != 8 || method >> 4 > 7 || preset_dictionary) return Stop::bad_stream;
    now.step = Step::block_header;
    return Stop::go_on;
}

template <class Input>
Stop read_stored_header(InflateState &now, Input &input) {
    uint32_t length = 0;
    uint32_t complement = 0;
    align_to_byte(now.bits);
    if (!take_bits(now.bits, input, 16, length) || !take_bits(now.bits, input, 16, complement))
        return Stop::input_ended_stored;
    if (length != (complement ^ 0xFFFF)) return Stop::bad_stream;
    now.stored_left = length;
    now.step = Step::stored;
    return Stop::go_on;
}

template <class Input>
Stop read_block_header(InflateState &now, Input &input, HuffmanNodePool *&pool) {
    uint32_t bits = 0;
    if (!take_bits(now.bits, input, 3, bits)) return Stop::input_ended;
    now.final_block = (bits & 1) != 0;
    switch (bits >> 1) {
    case 0: return read_stored_header(now, input);
    case 1: return use_fixed_codes(now);
    case 2: return read_dynamic_header(now, input, pool);
    default: return Stop::bad_stream;
    }
}

inline Stop end_block(InflateState &now) {
    now.step = now.final_block ? Step::ended : Step::block_header;
    return now.final_block ? Stop::finished : Stop::block_ended;
}

template <class Input>
Stop copy_stored(InflateState &now, Input &input) {
    Window &window = now.window;
    const uint32_t wanted = std::min(now.stored_left, room(window));
    const uint32_t got = take_bytes(now.bits, input, window.bytes + window.write, wanted);
    produced(window, got);
    now.stored_left -= got;
    if (got < wanted) return Stop::input_ended_stored;
    return now.stored_left == 0 ? end_block(now) : Stop::go_on;
}

// The length symbol's extra bits and the distance that follows it.
template <class Input>
Stop read_match(InflateState &now, BitReader &bits, Input &input, Symbol length) {
    uint32_t extra = 0;
    if (length.op >= HUFFMAN_INVALID) return Stop::bad_code;
    if (!take_bits(bits, input, length.op - HUFFMAN_BASE, extra)) return Stop::input_ended;
    now.copy_length = length.value + extra;

    refill(bits, input);
    const Symbol distance = find_symbol(now.codes->distance, now.nodes, bits.bits);
    if (distance.bits > bits.count) return Stop::input_ended;
    if (distance.op == code_is_missing) return Stop::bad_code;
    drop(bits, distance.bits);
    if (!take_bits(bits, input, distance.op - HUFFMAN_BASE, extra)) return Stop::input_ended;
    now.copy_distance = distance.value + extra;
    now.step = Step::copy;
    return Stop::go_on;
}

inline void copy_pending_match(InflateState &now) {
    while (now.copy_length != 0 && room(now.window) != 0)
        now.copy_length -= copy_match(now.window, now.copy_length, now.copy_distance);
    if (now.copy_length == 0) now.step = Step::symbols;
}

// Literals and matches until the block ends or the window is full.
template <class Input>
Stop read_symbols(InflateState &now, Input &input) {
    BitReader bits = now.bits;
    Stop stop = Stop::go_on;
    while (stop == Stop::go_on && now.step == Step::symbols && room(now.window) != 0) {
        uint8_t *const begin = now.window.bytes + now.window.write;
        uint8_t *const end = now.window.bytes + window_size;
        uint8_t *out = begin;
        Symbol symbol{};
        do { // literals, as long as they last
            refill(bits, input);
            symbol = find_symbol(now.codes->literal, now.nodes, bits.bits);
            if (symbol.op != HUFFMAN_LITERAL || symbol.bits > bits.count) break;
            drop(bits, symbol.bits);
            *out++ = static_cast<uint8_t>(symbol.value);
        } while (out != end);
        produced(now.window, static_cast<uint32_t>(out - begin));
        if (out == end) break;

        if (symbol.bits > bits.count)
            stop = Stop::input_ended;
        else if (symbol.op == code_is_missing)
            stop = Stop::bad_code;
        else {
            drop(bits, symbol.bits);
            stop = symbol.op == HUFFMAN_END_OF_BLOCK ? end_block(now) : read_match(now, bits, input, symbol);
            if (now.step == Step::copy) copy_pending_match(now);
        }
    }
    now.bits = bits;
    return stop;
}

template <class Input>
Stop run_step(InflateState &now, Input &input, HuffmanNodePool *&pool) {
    switch (now.step) {
    case Step::zlib_header: return read_zlib_header(now, input);
    case Step::block_header: return read_block_header(now, input, pool);
    case Step::stored: return copy_stored(now, input);
    case Step::symbols: return read_symbols(now, input);
    case Step::copy: copy_pending_match(now); return Stop::go_on;
    case Step::ended: break;
    }
    return Stop::finished;
}

// Goes on with the stream until `rows` or the stream itself says stop; with `pause_at_blocks` also at the end of every
// block but the last. Called again after rows_done or block_ended it continues at the same bit, in either mode. It runs
// ahead of its rows up to the end of the window or of the block, whichever comes first.
//
// `pool` takes the trees of dynamic blocks; allocated for the first of them, and owned by whoever owns the pointer.
template <class Input, class Rows>
Stop inflate(InflateState &state, Input &input, Rows &rows, HuffmanNodePool *&pool, bool pause_at_blocks) {
    for (;;) {
        const bool must_deliver = state.held != Stop::go_on || room(state.window) == 0;
        const Stop rows_say = must_deliver ? deliver(state.window, rows) : Stop::go_on;
        if (rows_say != Stop::go_on) return rows_say;

        const Stop held = state.held;
        if (held == Stop::block_ended) state.held = Stop::go_on; // everything else is for good
        if (held == Stop::block_ended ? pause_at_blocks : held != Stop::go_on) return held;
        state.held = run_step(state, input, pool);
    }
}

} // namespace pelm
