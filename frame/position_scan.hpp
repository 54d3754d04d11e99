// The bit position test over a whole array: bitIsValid for each element,
// block by block and without a branch per element (SSE2 registers for
// single and double positions), for arrays of positions that are checked
// before a loop starts.
#pragma once

#include "frame/bit_positions.hpp"
#include "frame/range_runner.hpp"

#include <emmintrin.h>

#include <algorithm>
#include <type_traits>

namespace bitfcns {

namespace position_scan_detail {

// bitIsValid of two double positions: all ones in each lane that holds a
// whole number from 1 to the width. Between those bounds a position is
// whole exactly when truncating it to 32 bits and back gives it again; NaN
// fails every compare, and the infinities the range.
struct PositionLanes {
    __m128d one = _mm_set1_pd(1.0);
    __m128d top;

    explicit PositionLanes(int width) noexcept : top(_mm_set1_pd(static_cast<double>(width))) {}

    __m128d operator()(__m128d b) const noexcept {
        const __m128d whole = _mm_cmpeq_pd(_mm_cvtepi32_pd(_mm_cvttpd_epi32(b)), b);
        return _mm_and_pd(whole, _mm_and_pd(_mm_cmpge_pd(b, one), _mm_cmple_pd(b, top)));
    }
};

// Whether all `count` positions of one block are valid. An integer block is
// one or-reduction of the unsigned compare of bitIsValid, which the compiler
// vectorizes; double positions go through PositionLanes, single ones the
// same test four at a time.
template <class U>
bool blockValid(const U* positions, unsigned long count, int width) noexcept {
    if constexpr (std::is_integral_v<U>) {
        using Bits = std::make_unsigned_t<U>;
        const auto highestIndex = static_cast<Bits>(width - 1);
        unsigned invalid = 0;
        for (unsigned long i = 0; i < count; ++i)
            invalid |= static_cast<Bits>(static_cast<Bits>(positions[i]) - Bits{1}) > highestIndex;
        return invalid == 0;
    } else if constexpr (std::is_same_v<U, double>) {
        const PositionLanes test(width);
        __m128d valid = _mm_castsi128_pd(_mm_set1_epi32(-1));
        unsigned long i = 0;
        for (; i + 2 <= count; i += 2) {
            __builtin_prefetch(positions + i + 256);  // 2 KiB ahead, as the other scans
            valid = _mm_and_pd(valid, test(_mm_loadu_pd(positions + i)));
        }
        return _mm_movemask_pd(valid) == 3 && (i == count || bitIsValid(positions[i], width));
    } else {
        static_assert(std::is_same_v<U, float>);
        const __m128 one = _mm_set1_ps(1.0f);
        const __m128 top = _mm_set1_ps(static_cast<float>(width));
        __m128 valid = _mm_cmpeq_ps(one, one);
        unsigned long i = 0;
        for (; i + 4 <= count; i += 4) {
            __builtin_prefetch(positions + i + 512);
            const __m128 b = _mm_loadu_ps(positions + i);
            const __m128 whole = _mm_cmpeq_ps(_mm_cvtepi32_ps(_mm_cvttps_epi32(b)), b);
            valid = _mm_and_ps(
                valid, _mm_and_ps(whole, _mm_and_ps(_mm_cmpge_ps(b, one), _mm_cmple_ps(b, top))));
        }
        for (; i < count; ++i)
            if (!bitIsValid(positions[i], width)) return false;
        return _mm_movemask_ps(valid) == 15;
    }
}

}  // namespace position_scan_detail

// True when each of the n positions is a whole number from 1 to `width`:
// the answer of bitIsValid on every element. Stops at the end of the block
// of 1024 that holds the first failure.
template <class U>
bool allPositionsValid(const U* positions, unsigned long n, int width) noexcept {
    constexpr unsigned long blockElements = 1024;
    for (unsigned long start = 0; start < n; start += blockElements) {
        const unsigned long count = std::min(blockElements, n - start);
        if (!position_scan_detail::blockValid(positions + start, count, width)) return false;
    }
    return true;
}

// The same, spread over threads by `runner` from its limit.
template <class U>
bool allPositionsValid(const U* positions, unsigned long n, int width, ScanRunner runner) {
    return everyRangePasses(n, runner, [positions, width](unsigned long begin, unsigned long end) {
        return allPositionsValid(positions + begin, end - begin, width);
    });
}

}  // namespace bitfcns
