// The test of shift counts given as floating numbers: each must be whole and
// finite. There is no bound on a whole count; a count beyond the width
// simply shifts everything out.
#pragma once

#include "frame/element_scan.hpp"
#include "frame/floating.hpp"

#include <emmintrin.h>

namespace bitfcns {

// True when each of the n counts is a finite whole number; stops at the
// first that isn't. NaN and the infinities fail.
inline bool allWholeCounts(const float* counts, unsigned long n) noexcept {
    for (unsigned long i = 0; i < n; ++i)
        if (!isWholeNumber(counts[i])) return false;
    return true;
}

// isWholeNumber of two double counts: all ones in each lane that holds a
// finite whole number. A magnitude below 2^52 is whole exactly when adding
// and subtracting 2^52 gives it back, as the sum lies where doubles are one
// apart; from 2^52 up every finite double is whole, which capping the
// magnitude at 2^52 keeps. NaN and the infinities pass that part (the cap
// replaces them) and fail the finiteness compare.
struct WholeCountLanes {
    __m128d twoTo52 = _mm_set1_pd(4503599627370496.0);
    __m128d signBit = _mm_set1_pd(-0.0);
    __m128d largest = _mm_set1_pd(largestFiniteDouble);

    __m128d operator()(__m128d x) const noexcept {
        const __m128d magnitude = _mm_andnot_pd(signBit, x);
        const __m128d capped = _mm_min_pd(magnitude, twoTo52);
        const __m128d whole =
            _mm_cmpeq_pd(_mm_sub_pd(_mm_add_pd(capped, twoTo52), twoTo52), capped);
        return _mm_and_pd(whole, _mm_cmple_pd(magnitude, largest));
    }
};

// The same for doubles, two lanes at a time and without a branch per
// element (the stop comes at the end of the failing element's block).
inline bool allWholeCounts(const double* counts, unsigned long n) noexcept {
    return allLanesPass(counts, n, WholeCountLanes{}, [](double x) { return isWholeNumber(x); });
}

// Either, spread over threads by `runner` from its limit.
template <class U>
bool allWholeCounts(const U* counts, unsigned long n, ScanRunner runner) {
    return everyRangePasses(n, runner, [counts](unsigned long begin, unsigned long end) {
        return allWholeCounts(counts + begin, end - begin);
    });
}

}  // namespace bitfcns
