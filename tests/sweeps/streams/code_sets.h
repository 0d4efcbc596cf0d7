// Code lengths without a pattern: complete codes of any shape, and what is too much or too little for one.
#pragma once

#include "tests/png/support/deflate_builder.h"
#include "tests/sweeps/random.h"

namespace pelm::sweeps {

using test::Bytes;

enum class Subscription { under, complete, over };

Subscription subscription_of(const Bytes &lengths);

// A complete code for `used` symbols of the alphabet, which include `symbol`, 2 to 288 of them; no code longer than
// `longest` bits. Lopsided ones have a few short codes and many of the longest.
Bytes complete_lengths(Random &random, size_t alphabet, size_t used, uint32_t symbol, uint32_t longest, bool lopsided);

// Any lengths of 0 to 15: spread evenly, from a narrow band, few, many, or of a code that a change or two have spoilt.
Bytes any_lengths(Random &random, size_t alphabet);

// Symbols that have a code.
std::vector<uint32_t> used_symbols(const Bytes &lengths);

// Up to `count` elements of the codes, at any length and distance that they can name, and no end of the block.
test::Tokens any_tokens(Random &random, const test::DynamicCodes &codes, uint32_t count);

} // namespace pelm::sweeps
