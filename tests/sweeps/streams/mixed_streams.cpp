#include "tests/sweeps/streams/mixed_streams.h"

#include "tests/sweeps/streams/inflate_ways.h"

namespace pelm::sweeps {
namespace {

using test::Deflate;
using test::DynamicCodes;
using test::Last;
using test::Tokens;

Tokens fixed_tokens(Random &random, uint32_t count) {
    Tokens tokens;
    for (uint32_t i = 0; i < count; ++i) {
        const uint32_t farthest = random.one_in(3) ? 32768 : random.one_in(2) ? 20 : 400;
        if (random.one_in(3))
            tokens.push_back(test::match(random.one_in(2) ? random.between(3, 12) : random.between(3, 258),
                                         random.between(1, farthest)));
        else
            tokens.push_back(test::literal(random.byte()));
    }
    return tokens;
}

void dynamic_block(Random &random, Deflate &deflate, uint32_t elements, Last last) {
    if (random.one_in(2)) return deflate.dynamic(fixed_tokens(random, elements), last);
    DynamicCodes codes;
    const bool lopsided = random.one_in(2);
    codes.literal_lengths = complete_lengths(random, 286, random.between(2, 286), 256, random.between(9, 15), lopsided);
    codes.distance_lengths = complete_lengths(random, 30, random.between(2, 30), random.below(30), 15, lopsided);
    deflate.dynamic(codes, any_tokens(random, codes, elements), last);
}

void block(Random &random, Deflate &deflate, Last last) {
    const uint32_t elements = random.one_in(3) ? random.below(400) : random.below(30);
    switch (random.below(4)) {
    case 0: return deflate.stored(random.noise(elements), last);
    case 1: return deflate.fixed(fixed_tokens(random, elements), last);
    default: return dynamic_block(random, deflate, elements, last);
    }
}

Bytes stream_of_blocks(Random &random, bool may_begin_with_a_window) {
    Deflate deflate;
    if (may_begin_with_a_window && random.one_in(4)) deflate.stored(random.noise(32768 - random.below(600)), Last::no);
    for (uint32_t blocks = random.below(5); blocks > 0; --blocks)
        block(random, deflate, Last::no);
    block(random, deflate, Last::yes);
    deflate.bits.put_bytes(random.noise(random.below(20)));
    return zlib_of(deflate.bytes());
}

} // namespace

Bytes mixed_stream(Random &random) {
    return stream_of_blocks(random, true);
}

Bytes short_mixed_stream(Random &random, size_t most) {
    for (;;) {
        Bytes stream = stream_of_blocks(random, false);
        if (stream.size() <= most && stream.size() >= most / 3) return stream;
    }
}

Bytes damaged(Random &random, Bytes stream) {
    for (uint32_t changes = random.between(1, 3); changes > 0; --changes) {
        uint8_t &byte = stream[random.below(static_cast<uint32_t>(stream.size()))];
        byte = static_cast<uint8_t>(byte ^ (random.one_in(4) ? random.byte() : 1u << random.below(8)));
    }
    return stream;
}

} // namespace pelm::sweeps
