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

// `x` rounded half away from zero and saturated to T's range; NaN gives 0.
// The work is done in a signed 64-bit integer, whose conversions are single
// instructions; only uint64's upper half, where every float is whole, is
// taken apart.
template <class T, class F>
T floatingToInteger(F x) {
    using Limits = std::numeric_limits<T>;
    constexpr F above = powerOfTwo<F>(Limits::digits);   // first value past the range
    constexpr F lowest = static_cast<F>(Limits::min());  // 0 or -2^digits, exact
    constexpr F signedAbove = powerOfTwo<F>(63);
    if (!(x < above)) return x != x ? T{0} : Limits::max();
    if (!(x > lowest)) return Limits::min();
    if constexpr (above > signedAbove) {
        if (x >= signedAbove)
            return static_cast<T>(static_cast<long>(x - signedAbove)) | (T{1} << 63);
    }
    // lowest < x < 2^63: truncation fits a long.
    auto whole = static_cast<long>(x);
    const F fraction = x - static_cast<F>(whole);
    whole += static_cast<long>(fraction >= F(0.5)) - static_cast<long>(fraction <= F(-0.5));
    return std::cmp_greater(whole, Limits::max()) ? Limits::max() : static_cast<T>(whole);
}

// True when `x` is a whole number that T holds; then `value` is it.
template <class T>
bool doubleHoldsInteger(double x, T& value) {
    using Limits = std::numeric_limits<T>;
    constexpr double above = powerOfTwo<double>(Limits::digits);
    if (!(x >= static_cast<double>(Limits::min()) && x < above)) return false;
    value = floatingToInteger<T>(x);
    return static_cast<double>(value) == x;
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
