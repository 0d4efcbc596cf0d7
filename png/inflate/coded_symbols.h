// Which symbols of an alphabet a block uses.
#pragma once

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <type_traits>

namespace pelm {

// Whether eight symbols have no codes. Slow, but a constant, where the compiler asks.
constexpr bool have_no_codes(const uint8_t *code_lengths) {
    if (std::is_constant_evaluated())
        return std::all_of(code_lengths, code_lengths + 8, [](uint8_t l) { return l == 0; });
    uint64_t lengths;
    std::memcpy(&lengths, code_lengths, sizeof lengths);
    return lengths == 0;
}

// Lists the symbols that have codes and returns how many there are; one more may be written behind them. Small blocks
// use few symbols of many: those between are passed over.
constexpr uint32_t list_coded_symbols(const uint8_t *code_lengths, uint32_t count, uint16_t *symbols) {
    uint32_t listed = 0;
    const auto list = [&](uint32_t symbol) {
        symbols[listed] = static_cast<uint16_t>(symbol);
        listed += code_lengths[symbol] != 0 ? 1 : 0;
    };
    uint32_t symbol = 0;
    for (; count - symbol >= 8; symbol += 8)
        if (!have_no_codes(code_lengths + symbol))
            for (uint32_t k = 0; k < 8; ++k)
                list(symbol + k);
    for (; symbol < count; ++symbol)
        list(symbol);
    return listed;
}

} // namespace pelm
