// Floating operands taken for integers: floor by bit pattern for double and
// single, the bounds of the integer classes as doubles, and the element test
// that a double is a whole number an integer class holds.
#pragma once

#include "host/zq_array.hpp"

#include <bit>
#include <cmath>
#include <cstdint>
#include <limits>

namespace bitfcns {

inline constexpr double largestFiniteDouble = 1.7976931348623157e308;
inline constexpr float largestFiniteSingle = 3.4028234663852886e+38f;

// The largest integer not above x. Keeps the sign of a zero and hands back
// NaN and the infinities as they are; needs no library call and no rounding
// mode.
inline double floorDouble(double x) {
    if (std::fabs(x) <= 2147483647.0) {
        if (x == 0.0) return x;
        const double truncated = static_cast<double>(static_cast<std::int32_t>(x));
        return truncated > x ? truncated - 1.0 : truncated;
    }
    // From 2^52 up no fractional bits are left; NaN has no value to round.
    if (!(std::fabs(x) < 4503599627370496.0)) return x;

    // Between 2^31 and 2^52 every fractional bit lies in the low word.
    std::uint64_t bits = std::bit_cast<std::uint64_t>(x);
    const int exponent = static_cast<int>((bits >> 52) & 0x7FF);
    const std::uint64_t fraction = 0xFFFFFFFFu >> (exponent - 1043);
    if ((bits & fraction) == 0) return x;
    if (x < 0) bits += std::uint64_t{1} << (1075 - exponent);  // one unit further down
    return std::bit_cast<double>(bits & ~fraction);
}

// The largest integer not above x, in single precision, by bit pattern alone.
inline float floorSingle(float x) {
    std::uint32_t bits = std::bit_cast<std::uint32_t>(x);
    const int exponent = static_cast<int>((bits >> 23) & 0xFF) - 127;
    if (exponent > 22) return x;  // whole already, or infinite, or NaN
    const bool negative = (bits >> 31) != 0;
    if (exponent < 0) {
        if (!negative) return 0.0f;
        return bits == 0x80000000u ? x : -1.0f;
    }
    const std::uint32_t fraction = 0x7FFFFFu >> exponent;
    if ((bits & fraction) == 0) return x;
    if (negative) bits += 0x800000u >> exponent;  // one unit further down
    return std::bit_cast<float>(bits & ~fraction);
}

// Finite and equal to its floor.
inline bool isWholeNumber(double x) {
    return std::fabs(x) <= largestFiniteDouble && x == floorDouble(x);
}
inline bool isWholeNumber(float x) {
    return std::fabs(x) <= largestFiniteSingle && x == floorSingle(x);
}

// The values of integer type T as doubles. The 64-bit upper bounds, 2^63 and
// 2^64, are exclusive: they are doubles that the type doesn't hold.
template <class T>
struct IntegerBounds {
    static_assert(std::numeric_limits<T>::is_integer);
    static constexpr bool upperExclusive = sizeof(T) == 8;
    static constexpr double lowest = static_cast<double>(std::numeric_limits<T>::min());
    static constexpr double highest =
        upperExclusive ? static_cast<double>(std::numeric_limits<T>::max() / 2 + 1) * 2.0
                       : static_cast<double>(std::numeric_limits<T>::max());
};

// The element test: x is a finite whole number that integer type T holds.
template <class T>
inline bool fitsInteger(double x) {
    using Bounds = IntegerBounds<T>;
    if (!isWholeNumber(x) || !(x >= Bounds::lowest)) return false;
    if constexpr (Bounds::upperExclusive) {
        return x < Bounds::highest;
    } else {
        return x <= Bounds::highest;
    }
}

// Every element of the double array passes the element test for the
// working class; stops at the first that fails. An empty array passes
// without its data being read. A working class outside the integer classes
// gets the bounds of int64.
bool fitsIntegerClass(const zqArray_tag* array, zqClassID workingClass);

}  // namespace bitfcns
