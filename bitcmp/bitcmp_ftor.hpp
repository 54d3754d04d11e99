// BitcmpFtor<T>: the complement of a double taken for an integer of class T,
// given back as a double, with the exact conversions of the 64-bit unsigned
// class.
#pragma once

#include "engine/parallel_limits.hpp"

#include <cstdint>
#include <type_traits>

namespace bitfcns {

// A double holding an integer from 0 to below 2^64, converted exactly. From
// 2^63 up the value is brought into the signed range first (the subtraction
// is exact there) and the top bit put back afterwards.
inline std::uint64_t doubleToUnsigned64(double x) noexcept {
    constexpr double twoTo63 = 9223372036854775808.0;
    if (x >= twoTo63)
        return static_cast<std::uint64_t>(static_cast<std::int64_t>(x - twoTo63)) ^
               (std::uint64_t{1} << 63);
    return static_cast<std::uint64_t>(static_cast<std::int64_t>(x));
}

// The nearest double (ties to even) of an unsigned 64-bit value, through
// signed conversions: with the top bit set, the value is halved keeping its
// lowest bit as a sticky bit, converted, and doubled.
inline double unsigned64ToDouble(std::uint64_t v) noexcept {
    if ((v >> 63) == 0) return static_cast<double>(static_cast<std::int64_t>(v));
    return static_cast<double>(static_cast<std::int64_t>((v >> 1) | (v & 1))) * 2.0;
}

// x, a whole number that class T holds (tested before), complemented in T:
// minus x minus 1 for signed T, the largest value of T minus x for unsigned
// T. With the 64-bit classes the complement is rounded to the nearest double.
template <class T>
struct BitcmpFtor {
    static constexpr unsigned long parallelLimit = limits::bitcmpOnDouble;

    double operator()(double x) const noexcept {
        if constexpr (sizeof(T) < 4 || std::is_same_v<T, int>) {
            return static_cast<double>(static_cast<T>(~static_cast<std::int32_t>(x)));
        } else if constexpr (std::is_same_v<T, unsigned int>) {
            return static_cast<double>(static_cast<std::uint32_t>(~static_cast<std::int64_t>(x)));
        } else if constexpr (std::is_same_v<T, long>) {
            return static_cast<double>(~static_cast<std::int64_t>(x));
        } else {
            static_assert(std::is_same_v<T, unsigned long>);
            return unsigned64ToDouble(~doubleToUnsigned64(x));
        }
    }
};

}  // namespace bitfcns
