// The decompressor (RFC 1950, RFC 1951): a resumable core that produces bytes and knows nothing of images.
//
// It writes into the window and hands runs of bytes to `rows`:
//   Stop take_run(Rows &, const uint8_t *bytes, uint32_t count, uint32_t &taken)
// takes as much of a run as it wants and says whether to go on. What it leaves waits in the window for the next call,
// and whatever ended the stream further on is reported only after the bytes before it have been delivered.
#pragma once

#include "png/inflate/dynamic_header.h"
#include "png/inflate/fast_loop.h"

namespace pelm {

template <class Rows>
Stop deliver(Window &window, Rows &rows) {
    while (window.delivered != window.write) {
        uint32_t taken = 0;
        const Stop stop = take_run(rows, window.bytes + window.delivered, window.write - window.delivered, taken);
        window.delivered += taken;
        if (stop != Stop::go_on) return stop;
    }
    slide(window);
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
    const uint32_t wanted = std::min(now.stored_left, window_full - window.write);
    const uint32_t got = take_bytes(now.bits, input, window.bytes + window.write, wanted);
    produced(window, got);
    now.stored_left -= got;
    if (got < wanted) return Stop::input_ended_stored;
    return now.stored_left == 0 ? end_block(now) : Stop::go_on;
}

constexpr Symbol symbol_of_base(uint32_t entry, uint32_t exceptional) {
    const uint32_t bits = entry >> 8 & 0xFF;
    return {static_cast<uint16_t>(entry_base(entry, exceptional)),
            static_cast<uint8_t>(HUFFMAN_BASE + entry_bits(entry) - bits), static_cast<uint8_t>(bits)};
}

// The next symbol, as far as the bits that are there tell.
inline Symbol find_literal(InflateState &now, const BitReader &bits) {
    if (now.literals.entries != nullptr) {
        const uint32_t entry = find_entry(now.literals, bits.bits, exceptional_literal);
        const auto code_bits = static_cast<uint8_t>(entry >> 26 & 15);
        if ((entry & entry_is_literal) != 0) return {static_cast<uint8_t>(entry >> 8), HUFFMAN_LITERAL, code_bits};
        if ((entry & exceptional_literal) == 0) return symbol_of_base(entry, exceptional_literal);
        if ((entry & entry_ends_block) != 0) return {256, HUFFMAN_END_OF_BLOCK, static_cast<uint8_t>(entry)};
    }
    grow_trees(now);
    return find_symbol(now.codes->literal, now.nodes, bits.bits);
}

inline Symbol find_distance(InflateState &now, const BitReader &bits) {
    if (now.literals.entries != nullptr) {
        const uint32_t entry = find_entry(now.distances, bits.bits, exceptional_distance);
        if ((entry & exceptional_distance) == 0) return symbol_of_base(entry, exceptional_distance);
    }
    grow_trees(now);
    return find_symbol(now.codes->distance, now.nodes, bits.bits);
}

// The length symbol's extra bits, the distance that follows it, and what they stand for.
template <class Input>
Stop take_match(InflateState &now, BitReader &bits, Input &input, Symbol symbol) {
    uint32_t length = 0;
    if (symbol.op >= HUFFMAN_INVALID) return Stop::bad_code;
    if (!take_bits(bits, input, symbol.op - HUFFMAN_BASE, length)) return Stop::input_ended;
    length += symbol.value;

    refill(bits, input);
    symbol = find_distance(now, bits);
    uint32_t distance = 0;
    if (symbol.bits > bits.count) return Stop::input_ended;
    if (symbol.op == code_is_missing) return Stop::bad_code;
    drop(bits, symbol.bits);
    if (!take_bits(bits, input, symbol.op - HUFFMAN_BASE, distance)) return Stop::input_ended;
    copy_match(now.window, length, symbol.value + distance);
    return Stop::go_on;
}

// One literal or match, or the end of the block. The window is not full.
template <class Input>
Stop take_symbol(InflateState &now, BitReader &bits, Input &input) {
    refill(bits, input);
    const Symbol symbol = find_literal(now, bits);
    if (symbol.bits > bits.count) return Stop::input_ended;
    if (symbol.op == code_is_missing) return Stop::bad_code;
    drop(bits, symbol.bits);
    switch (symbol.op) {
    case HUFFMAN_LITERAL:
        now.window.bytes[now.window.write] = static_cast<uint8_t>(symbol.value);
        produced(now.window, 1);
        return Stop::go_on;
    case HUFFMAN_END_OF_BLOCK: return end_block(now);
    default: return take_match(now, bits, input, symbol);
    }
}

// Until the block ends or the window is full.
template <class Input>
Stop take_symbols(InflateState &now, Input &input) {
    BitReader bits = now.bits;
    Stop stop = Stop::go_on;
    // The first symbol by itself: where it is the block's end, the fast loop would cost more.
    while (stop == Stop::go_on && !is_full(now.window)) {
        stop = take_symbol(now, bits, input);
        if (stop != Stop::go_on || now.literals.entries == nullptr) continue;
        if (run_fast(now.literals, now.distances, bits, input.next, input.end, now.window)) stop = end_block(now);
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
    case Step::symbols: return take_symbols(now, input);
    case Step::ended: break;
    }
    return Stop::finished;
}

// Goes on with the stream until `rows` or the stream itself says stop; with `pause_at_blocks` also at the end of every
// block but the last. Called again after rows_done or block_ended it continues at the same bit, in either mode. It runs
// ahead of its rows until the window is full or the block ends, whichever comes first.
//
// `pool` takes the trees of dynamic blocks; allocated for the first of them, and owned by whoever owns the pointer.
template <class Input, class Rows>
Stop inflate(InflateState &state, Input &input, Rows &rows, HuffmanNodePool *&pool, bool pause_at_blocks) {
    for (;;) {
        const bool must_deliver = state.held != Stop::go_on || is_full(state.window);
        const Stop rows_say = must_deliver ? deliver(state.window, rows) : Stop::go_on;
        if (rows_say != Stop::go_on) return rows_say;

        const Stop held = state.held;
        if (held == Stop::block_ended) state.held = Stop::go_on; // everything else is for good
        if (held == Stop::block_ended ? pause_at_blocks : held != Stop::go_on) return held;
        state.held = run_step(state, input, pool);
    }
}

} // namespace pelm
