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

// True when each of the n positions passes bitIsValid. The answer is that of
// testing them in order and stopping at the first failure; the stop comes at
// the end of the failing position's block, so that within a block the test
// has no branch and integer positions are tested a register at a time.
template <class U>
bool allPositionsValid(const U* positions, unsigned long n, int width) noexcept {
    constexpr unsigned long blockPositions = 4096;
    for (unsigned long block = 0; block < n; block += blockPositions) {
        const unsigned long end = n - block < blockPositions ? n : block + blockPositions;
        unsigned invalid = 0;
        for (unsigned long i = block; i < end; ++i)
            invalid |= bitIsValid(positions[i], width) ? 0u : 1u;
        if (invalid != 0) return false;
    }
    return true;
}

}  // namespace bitfcns
