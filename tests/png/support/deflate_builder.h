// Writes deflate streams bit by bit, right or wrong, as a test describes them (RFC 1951, RFC 1950). What a decoder
// makes of them is not known here.
//
//     Deflate d;
//     d.stored({1, 2, 3}, Last::no);
//     d.fixed({literal('A'), literal('B'), match(4, 2)}, Last::yes);
//     const Bytes stream = zlib_stream(d.bytes(), {...});
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <vector>

#include "tests/support/bytes.h"

namespace pelm::test {

// Bits into bytes, least significant bit of a byte first.
class BitWriter {
public:
    // The lowest `count` bits of `value` (32 at most), lowest first: everything but Huffman codes.
    void put(uint32_t value, uint32_t count);
    // A Huffman code, highest bit first.
    void put_code(uint32_t code, uint32_t length);
    // Zeros up to the next whole byte, then the bytes.
    void align();
    void put_bytes(const Bytes &bytes);

    size_t bit_count() const { return bit_count_; }
    const Bytes &bytes() const { return bytes_; }

private:
    Bytes bytes_;
    size_t bit_count_ = 0;
};

// One element of a compressed block. A symbol is written as it is, with its extra bits; a match is a length symbol, a
// distance symbol and the extra bits of both.
struct Token {
    uint32_t symbol = 0; // of the literal/length alphabet
    uint32_t extra = 0;
    uint32_t extra_bits = 0;
    bool has_distance = false;
    uint32_t distance_symbol = 0;
    uint32_t distance_extra = 0;
    uint32_t distance_extra_bits = 0;
};

using Tokens = std::vector<Token>;

constexpr uint32_t end_of_block = 256;

// Any symbol of the literal/length alphabet, alone.
Token symbol(uint32_t value);
Token literal(uint32_t byte);
Tokens literals(const Bytes &bytes);
// `length` 3 to 258, `distance` 1 to 32768, with the symbols that RFC 1951 assigns.
Token match(uint32_t length, uint32_t distance);
// A length symbol (257 to 287) with its extra bits, and any distance symbol with its extra bits.
Token match_of_symbols(uint32_t length_symbol, uint32_t length_extra, uint32_t distance_symbol,
                       uint32_t distance_extra);

// What a stream of tokens stands for, with zeros before its beginning.
Bytes expand(const Tokens &tokens, Bytes history = {});

// The codes that RFC 1951, section 3.2.2, assigns to code lengths. Over-subscribed lengths give codes cut to their
// length.
struct Code {
    uint32_t bits = 0;
    uint32_t length = 0; // 0: no code
};
std::vector<Code> canonical_codes(const Bytes &lengths);

// Lengths of a complete code in which `used` symbols have codes and the others have none. One symbol gets length 1.
Bytes balanced_lengths(size_t alphabet_size, const std::vector<uint32_t> &used);

// One symbol of the code-length alphabet with what follows it: 0 to 15 alone, 16 to 18 with a run of extra bits.
struct LengthSymbol {
    uint32_t symbol = 0;
    uint32_t extra = 0;
};

// The head of a dynamic block. What is left out follows from the two lists of lengths.
struct DynamicCodes {
    Bytes literal_lengths;  // 257 to 288
    Bytes distance_lengths; // 1 to 32

    // The three counts as they stand in the stream: 5, 5 and 4 bits.
    std::optional<uint32_t> hlit, hdist, hclen;
    // Lengths of the code-length code, by symbol (19). Default: 4 bits for each of 0 to 15.
    std::optional<Bytes> code_length_lengths;
    // How both lists are sent. Default: every length by its own symbol.
    std::optional<std::vector<LengthSymbol>> sequence;
};

// Balanced codes for exactly the symbols that the tokens use, end of block included. Without distances one distance
// symbol has a code of one bit.
DynamicCodes codes_for(const Tokens &tokens);

enum class Last : bool { no, yes };
enum class EndOfBlock : bool { left_out, written };

// A deflate stream, block by block.
class Deflate {
public:
    BitWriter bits;

    // One stored block of at most 65535 bytes. LEN and NLEN as given, or as they should be.
    void stored(const Bytes &data, Last last, std::optional<uint32_t> len = {}, std::optional<uint32_t> nlen = {});
    // As many as it takes for blocks of `block_size` bytes; one empty block for no data.
    void stored_blocks(const Bytes &data, size_t block_size, Last last);
    void fixed(const Tokens &tokens, Last last, EndOfBlock end = EndOfBlock::written);
    void dynamic(const Tokens &tokens, Last last, EndOfBlock end = EndOfBlock::written);
    void dynamic(const DynamicCodes &codes, const Tokens &tokens, Last last, EndOfBlock end = EndOfBlock::written);

    // Pieces of the above, for streams that break off or go wrong in between.
    void block_header(uint32_t type, Last last);
    void dynamic_header(const DynamicCodes &codes);
    void tokens(const Tokens &tokens, const Bytes &literal_lengths, const Bytes &distance_lengths);

    const Bytes &bytes() const { return bits.bytes(); }
};

Bytes fixed_literal_lengths();  // 288
Bytes fixed_distance_lengths(); // 30

uint32_t adler32_of(const Bytes &data);

// Two header bytes, the deflate stream, and the Adler-32 of `data`.
Bytes zlib_stream(const Bytes &deflated, const Bytes &data, uint8_t cmf = 0x78, uint8_t flg = 0x9C);
// One stored, or fixed block after another.
Bytes zlib_stored(const Bytes &data, size_t block_size = 65535);

// A zlib stream of `data`, of whatever blocks. With zlib the blocks and matches are its own.
Bytes zlib_compressed(const Bytes &data, int level = 6);

// The compressor that cross builds use: fixed blocks of `block_size` bytes, matches only at the distances given (and
// only those that zlib's format has).
Bytes zlib_simple(const Bytes &data, size_t block_size = 65535, const std::vector<uint32_t> &distances = {1, 2, 3, 4});

} // namespace pelm::test
