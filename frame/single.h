// Arithmetic in true single precision, whatever the processor computes in.
#pragma once

namespace pelm {

// Rounded to single precision, also by processors that compute in more: they round when they store.
template <class Number>
float single(Number value) {
    const volatile float stored = static_cast<float>(value);
    return stored;
}

// Dividend, divisor and quotient are rounded, each once.
template <class Number>
float single_quotient(Number dividend, Number divisor) {
    return single(single(dividend) / single(divisor));
}

} // namespace pelm
