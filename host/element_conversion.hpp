// Conversion of one element between the host's element types: floating to
// integer rounds half away from zero and saturates (NaN gives 0), integer to
// integer saturates, integer to floating and floating to floating round as
// the hardware does, anything to logical tests for non-zero, logical gives 0
// or 1, char is read and written as its unsigned 16-bit code. Every step is
// defined behaviour for every input. Private to the host.
#pragma once

#include <limits>
#include <type_traits>
#include <utility>

namespace host {

// 2 to the power `exponent`, exactly, in a floating type.
template <class F>
constexpr F powerOfTwo(int exponent) {
    F value = 1;
    for (int i = 0; i < exponent; ++i) value *= 2;
    return value;
}

// The integer type wide enough to hold any value of T on the way to it.
template <class T>
using WideInteger = std::conditional_t<std::is_signed_v<T>, long, unsigned long>;

// `x` rounded half away from zero and saturated to T's range; NaN gives 0.
template <class T, class F>
T floatingToInteger(F x) {
    using Limits = std::numeric_limits<T>;
    constexpr F above = powerOfTwo<F>(Limits::digits);      // first value past the range
    constexpr F lowest = static_cast<F>(Limits::min());      // 0 or -2^digits, exact
    if (!(x < above)) return x != x ? T{0} : Limits::max();
    if (!(x > lowest)) return Limits::min();
    // lowest < x < above: truncation fits the wide type.
    auto whole = static_cast<WideInteger<T>>(x);
    const F fraction = x - static_cast<F>(whole);
    if (fraction >= F(0.5)) {
        ++whole;
    } else if (fraction <= F(-0.5)) {
        --whole;
    }
    return whole > Limits::max() ? Limits::max() : static_cast<T>(whole);
}

// True when `x` is a whole number that T holds; then `value` is it.
template <class T>
bool doubleHoldsInteger(double x, T& value) {
    using Limits = std::numeric_limits<T>;
    constexpr double above = powerOfTwo<double>(Limits::digits);
    if (!(x >= static_cast<double>(Limits::min()) && x < above)) return false;
    const auto whole = static_cast<WideInteger<T>>(x);
    if (static_cast<double>(whole) != x) return false;
    value = static_cast<T>(whole);
    return true;
}

template <class To, class From>
To convertElement(From x) {
    if constexpr (std::is_same_v<To, bool>) {
        return x != From{};  // NaN included
    } else if constexpr (std::is_same_v<To, char16_t>) {
        return static_cast<char16_t>(convertElement<unsigned short>(x));
    } else if constexpr (std::is_same_v<From, char16_t>) {
        return convertElement<To>(static_cast<unsigned short>(x));
    } else if constexpr (std::is_same_v<From, bool>) {
        return static_cast<To>(x ? 1 : 0);
    } else if constexpr (std::is_floating_point_v<From> && std::is_integral_v<To>) {
        return floatingToInteger<To>(x);
    } else if constexpr (std::is_integral_v<From> && std::is_integral_v<To>) {
        using Limits = std::numeric_limits<To>;
        if (std::cmp_less(x, Limits::min())) return Limits::min();
        if (std::cmp_greater(x, Limits::max())) return Limits::max();
        return static_cast<To>(x);
    } else {
        return static_cast<To>(x);  // to floating: round to nearest, ties to even
    }
}

}  // namespace host
