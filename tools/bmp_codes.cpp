#include "tools/bmp_codes.h"

#include <algorithm>

namespace pelm_tool {
namespace {

struct CodeFacts {
    int32_t rows = 0; // that are ended
    bool has_moves = false;
};

// The bytes of `count` literal indices, which are an even number.
size_t literal_bytes(size_t count, uint32_t bits) {
    const size_t filled = (count * bits + 7) / 8;
    return filled + filled % 2;
}

// As the decoder reads them: the end of the bitmap ends a row, and codes may go on behind it.
CodeFacts facts_of(Bytes codes, uint32_t bits, int32_t most_rows) {
    CodeFacts facts;
    for (size_t at = 0; at + 2 <= codes.size() && facts.rows < most_rows;) {
        const uint8_t count = codes[at];
        const uint8_t escape = codes[at + 1];
        at += 2;
        if (count > 0) continue;
        if (escape < 2) {
            ++facts.rows;
        } else if (escape == 2) {
            facts.has_moves = true;
            at += 2;
        } else {
            at += literal_bytes(escape, bits);
        }
    }
    return facts;
}

} // namespace

void describe_codes(ImageDescription &description, Bytes file) {
    const size_t offset = std::min<size_t>(read_le32(file, 10), file.size());
    const CodeFacts facts = facts_of(file.subspan(offset), description.run_length_bits, description.height);
    if (facts.rows < description.height) {
        description.shortage = "the run-length codes end after " + std::to_string(facts.rows) + " of " +
                               std::to_string(description.height) + " rows";
    }
    if (facts.has_moves)
        description.notes.push_back(
            "the decoder does not make the moves in the run-length codes: pixels are misplaced");
}

} // namespace pelm_tool
