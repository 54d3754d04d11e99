// The test of a bit position: a whole number from 1 to the width of the
// class it indexes, given in any numeric class. bitget and bitset check
// every position this way before the first element is written.
#pragma once

#include "frame/floating.hpp"

#include <type_traits>

namespace bitfcns {

// True when b is a whole number from 1 to `width`.
//
// For an integer class, b - 1 is computed in U's own width and read as
// unsigned, so one unsigned compare refuses 0 and every negative value, which
// wrap to large values; a value wider than the indexed class is compared in
// full. For single and double: below 1, above the width, not finite (NaN
// included) or not whole fails, in that order.
template <class U>
constexpr bool bitIsValid(U b, int width) noexcept {
    if constexpr (std::is_integral_v<U>) {
        using Bits = std::make_unsigned_t<U>;
        return static_cast<Bits>(static_cast<Bits>(b) - Bits{1}) <= static_cast<Bits>(width - 1);
    } else {
        static_assert(std::is_floating_point_v<U>);
        return !(b < U(1)) && !(b > static_cast<U>(width)) && isWholeNumber(b);
    }
}

// Index of the first of the n positions that fails bitIsValid, or n when
// all pass. Stops at the first failure.
template <class U>
unsigned long firstInvalidPosition(const U* positions, unsigned long n, int width) noexcept {
    for (unsigned long i = 0; i < n; ++i)
        if (!bitIsValid(positions[i], width)) return i;
    return n;
}

}  // namespace bitfcns
