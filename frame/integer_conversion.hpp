// Exact conversions between doubles and the integer classes, for the double
// paths, which take each double for an integer of a working class T, work on
// its bits in T and give the answer back as a double.
#pragma once

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

// x, a whole number that T holds (validated before), as a T: through a
// 32-bit signed truncation for T of up to 16 bits and int, a 64-bit one for
// unsigned int and long, and exactly for unsigned long.
template <class T>
T wholeDoubleTo(double x) noexcept {
    static_assert(std::is_integral_v<T>);
    if constexpr (sizeof(T) < 4 || std::is_same_v<T, int>) {
        return static_cast<T>(static_cast<std::int32_t>(x));
    } else if constexpr (std::is_same_v<T, unsigned long>) {
        return doubleToUnsigned64(x);
    } else {
        return static_cast<T>(static_cast<std::int64_t>(x));
    }
}

// The value of v as a double: exact up to 32 bits, rounded to nearest (ties
// to even) for the 64-bit classes.
template <class T>
double integerToDouble(T v) noexcept {
    static_assert(std::is_integral_v<T>);
    if constexpr (std::is_same_v<T, unsigned long>) {
        return unsigned64ToDouble(v);
    } else {
        return static_cast<double>(v);
    }
}

}  // namespace bitfcns
