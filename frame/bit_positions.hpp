// The test of a bit position: a whole number from 1 to the width of the
// class it indexes, given in any numeric class. bitget and bitset check
// every position this way before the first element is written.
#pragma once

#include "frame/floating.hpp"

#include <emmintrin.h>

#include <cstdint>
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

namespace position_detail {

// All ones in each lane that holds a whole number from 1 to `top`. Out of
// that range a lane fails its compares (NaN fails both); within it the
// truncation to a 32-bit integer and back is exact, and gives the lane back
// just when it is whole.
inline __m128d wholeFromOneTo(__m128d x, __m128d top) noexcept {
    const __m128d inRange = _mm_and_pd(_mm_cmpge_pd(x, _mm_set1_pd(1.0)), _mm_cmple_pd(x, top));
    return _mm_and_pd(inRange, _mm_cmpeq_pd(_mm_cvtepi32_pd(_mm_cvttpd_epi32(x)), x));
}

// True when all n doubles, from a 16-byte boundary, pass wholeFromOneTo.
// Stops at the end of the failing position's block.
inline bool alignedDoublePositionsValid(const double* positions, unsigned long n,
                                        int width) noexcept {
    constexpr unsigned long blockPositions = 1024;
    const __m128d top = _mm_set1_pd(width);
    const unsigned long pairs = n - n % 2;
    for (unsigned long block = 0; block < pairs; block += blockPositions) {
        const unsigned long end = pairs - block < blockPositions ? pairs : block + blockPositions;
        __m128d pass = _mm_castsi128_pd(_mm_set1_epi32(-1));
        for (unsigned long i = block; i < end; i += 2)
            pass = _mm_and_pd(pass, wholeFromOneTo(_mm_load_pd(positions + i), top));
        if (_mm_movemask_pd(pass) != 3) return false;
    }
    return pairs == n || bitIsValid(positions[n - 1], width);
}

}  // namespace position_detail

// True when each of the n positions passes bitIsValid. The answer is that of
// testing them in order and stopping at the first failure; the stop comes at
// the end of the failing position's block, so that within a block the test
// has no branch: integer positions are tested a register at a time by the
// compiler's vectors, double positions by SSE2 lanes.
template <class U>
bool allPositionsValid(const U* positions, unsigned long n, int width) noexcept {
    if constexpr (std::is_same_v<U, double>) {
        // The first position alone when it isn't on a register boundary.
        if (n != 0 && reinterpret_cast<std::uintptr_t>(positions) % 16 != 0) {
            if (!bitIsValid(*positions, width)) return false;
            ++positions;
            --n;
        }
        return position_detail::alignedDoublePositionsValid(positions, n, width);
    } else {
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
}

}  // namespace bitfcns
