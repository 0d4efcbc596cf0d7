// Arithmetic in true single precision, whatever the processor computes in.
#pragma once

#include <limits>

namespace pelm {

// Rounded to single precision, also by processors that compute in more: they round when they store.
template <class Number>
float single(Number value) {
    const volatile float stored = static_cast<float>(value);
    return stored;
}

// Dividend, divisor and quotient are rounded, each once. The dividend is above 0; over 0 it is infinite.
template <class Number>
float single_quotient(Number dividend, Number divisor) {
    if (divisor == 0) return std::numeric_limits<float>::infinity();
    return single(single(dividend) / single(divisor));
}

} // namespace pelm
