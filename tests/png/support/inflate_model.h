// Inflating as it is defined: bit by bit, on plain arrays, without bounds of any window. Shares nothing with the
// library but the outcomes that both have: irregular codes, matches from before the beginning, streams that break off.
#pragma once

#include "tests/png/support/deflate_builder.h"

namespace pelm::test {

enum class InflationEnd : uint8_t { finished, bad_stream, bad_code, input_ended, input_ended_stored };

struct Inflation {
    struct Place {
        size_t bytes; // that came out
        size_t bits;  // of the stream, its header included
    };

    Bytes bytes;
    std::vector<Place> block_ends; // the last one is the stream's when it is finished
    InflationEnd end;
};

// What a zlib stream stands for, as far as it goes; its checksum is not looked at. Keep the model for many streams: it
// is large.
class InflateModel {
public:
    InflateModel();
    const Inflation &inflate(const Bytes &stream);

private:
    // A code as the set of its prefixes: number 1 << length | bits is one when some symbol's code begins like that.
    struct Code {
        std::vector<uint32_t> known; // the generation that knew the prefix last
        std::vector<uint16_t> symbols;
        uint32_t generation = 0;
        void build(const Bytes &lengths);
        bool has(size_t prefix) const { return prefix < known.size() && known[prefix] == generation; }
    };

    bool take(uint32_t count, uint32_t &value);
    bool take_symbol(const Code &code, uint32_t &symbol);
    bool header();
    bool block();
    bool stored();
    bool dynamic_header();
    bool code_lengths(size_t count, Bytes &lengths);
    bool symbols(const Code &literals, const Code &distances);
    bool match(uint32_t length_symbol, const Code &distances);
    bool ends(InflationEnd end);

    const Bytes *stream_ = nullptr;
    size_t position_ = 0; // bits
    Code fixed_literals_, fixed_distances_, code_lengths_, literals_, distances_;
    Inflation inflation_;
};

} // namespace pelm::test
