#include "tests/sweeps/streams/code_sets.h"

#include <algorithm>
#include <numeric>

namespace pelm::sweeps {
namespace {

constexpr uint32_t longest_code = 15;

std::vector<uint32_t> some_symbols(Random &random, size_t alphabet, size_t count, uint32_t one_of_them) {
    std::vector<uint32_t> symbols(alphabet);
    std::iota(symbols.begin(), symbols.end(), 0u);
    std::swap(symbols[0], symbols[one_of_them]);
    for (size_t i = 1; i < count; ++i)
        std::swap(symbols[i], symbols[i + random.below(static_cast<uint32_t>(alphabet - i))]);
    symbols.resize(count);
    return symbols;
}

// Leaves of a tree that grows by splitting one of them at a time.
std::vector<uint8_t> leaf_depths(Random &random, size_t count, uint32_t longest, bool lopsided) {
    std::vector<uint8_t> depths = {1, 1};
    while (depths.size() < count) {
        const auto last = static_cast<uint32_t>(depths.size() - 1);
        size_t at = lopsided ? last - random.below(std::min(last, 3u) + 1) : random.below(last + 1);
        while (depths[at] >= longest)
            at = random.below(last + 1);
        depths.push_back(++depths[at]);
    }
    return depths;
}

void spoil(Random &random, Bytes &lengths) {
    for (uint32_t changes = random.between(1, 3); changes > 0; --changes) {
        uint8_t &length = lengths[random.below(static_cast<uint32_t>(lengths.size()))];
        length = static_cast<uint8_t>(random.one_in(3) ? random.below(16) : random.one_in(2) ? length / 2 : 15);
    }
}

} // namespace

Subscription subscription_of(const Bytes &lengths) {
    uint32_t taken = 0;
    for (const uint8_t length : lengths)
        taken += length == 0 ? 0 : 1u << (longest_code - length);
    const uint32_t whole = 1u << longest_code;
    return taken < whole ? Subscription::under : taken == whole ? Subscription::complete : Subscription::over;
}

Bytes complete_lengths(Random &random, size_t alphabet, size_t used, uint32_t symbol, uint32_t longest, bool lopsided) {
    const std::vector<uint32_t> symbols = some_symbols(random, alphabet, used, symbol);
    std::vector<uint8_t> depths = leaf_depths(random, used, longest, lopsided);
    std::swap(depths[0], depths[random.below(static_cast<uint32_t>(used))]);
    Bytes lengths(alphabet);
    for (size_t i = 0; i < used; ++i)
        lengths[symbols[i]] = depths[i];
    return lengths;
}

Bytes any_lengths(Random &random, size_t alphabet) {
    Bytes lengths(alphabet);
    const uint32_t kind = alphabet > 1 ? random.below(6) : 0;
    if (kind >= 3) {
        const auto used = random.between(2, static_cast<uint32_t>(alphabet));
        const auto symbol = random.below(static_cast<uint32_t>(alphabet));
        lengths = complete_lengths(random, alphabet, used, symbol, random.between(9, longest_code), kind == 3);
        spoil(random, lengths);
        return lengths;
    }
    const uint32_t low = kind == 0 ? 0 : random.below(12);
    const uint32_t high = kind == 0 ? longest_code : low + random.below(4);
    for (uint8_t &length : lengths)
        length = static_cast<uint8_t>(kind == 2 && !random.one_in(20) ? 0 : random.between(low, high));
    return lengths;
}

std::vector<uint32_t> used_symbols(const Bytes &lengths) {
    std::vector<uint32_t> used;
    for (uint32_t symbol = 0; symbol < lengths.size(); ++symbol)
        if (lengths[symbol] != 0) used.push_back(symbol);
    return used;
}

test::Tokens any_tokens(Random &random, const test::DynamicCodes &codes, uint32_t count) {
    const std::vector<uint32_t> literals = used_symbols(codes.literal_lengths);
    const std::vector<uint32_t> distances = used_symbols(codes.distance_lengths);
    test::Tokens tokens;
    if (literals.empty()) return tokens;
    for (uint32_t i = 0; i < count; ++i) {
        const uint32_t symbol = literals[random.below(static_cast<uint32_t>(literals.size()))];
        if (symbol == test::end_of_block) continue;
        if (symbol < test::end_of_block || distances.empty()) {
            tokens.push_back(test::symbol(symbol));
            continue;
        }
        const uint32_t distance = distances[random.below(static_cast<uint32_t>(distances.size()))];
        test::Token match = test::match_of_symbols(symbol, 0, distance, 0);
        match.extra = random.next() & ((1u << match.extra_bits) - 1);
        match.distance_extra = random.next() & ((1u << match.distance_extra_bits) - 1);
        tokens.push_back(match);
    }
    return tokens;
}

} // namespace pelm::sweeps
