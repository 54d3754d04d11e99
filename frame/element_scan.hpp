// The element test over a whole array of doubles for one integer class,
// two elements per SSE2 register and without a branch per element.
#pragma once

#include "frame/floating.hpp"
#include "frame/range_runner.hpp"

#include <emmintrin.h>

#include <algorithm>
#include <cstdint>
#include <type_traits>

namespace bitfcns {

namespace scan_detail {

// All ones in each lane of x that is a whole number T holds. The bounds are
// finite, so their compares also refuse NaN and the infinities. A magnitude
// below 2^52 is whole exactly when adding and subtracting 2^52 gives it back,
// in any rounding mode, since the sum lies where doubles are one apart; from
// 2^52 up every double is whole, which capping the magnitude at 2^52 keeps.
template <class T>
struct LaneTest {
    using Bounds = IntegerBounds<T>;
    const __m128d twoTo52 = _mm_set1_pd(4503599627370496.0);
    const __m128d signBit = _mm_set1_pd(-0.0);
    const __m128d lowest = _mm_set1_pd(Bounds::lowest);
    const __m128d highest = _mm_set1_pd(Bounds::highest);

    __m128d operator()(__m128d x) const noexcept {
        // In range first: an unsigned value then needs no magnitude, and one
        // of up to 32 bits no cap.
        __m128d magnitude = std::is_signed_v<T> ? _mm_andnot_pd(signBit, x) : x;
        if constexpr (sizeof(T) == 8) magnitude = _mm_min_pd(magnitude, twoTo52);
        const __m128d whole =
            _mm_cmpeq_pd(_mm_sub_pd(_mm_add_pd(magnitude, twoTo52), twoTo52), magnitude);
        const __m128d belowTop =
            Bounds::upperExclusive ? _mm_cmplt_pd(x, highest) : _mm_cmple_pd(x, highest);
        return _mm_and_pd(whole, _mm_and_pd(_mm_cmpge_pd(x, lowest), belowTop));
    }
};

}  // namespace scan_detail

// True when every one of the n doubles passes: `lanes` tests two at a time
// (all ones in a lane that passes), `element` one, for the first element
// when it isn't on a register boundary and for the last odd ones. The
// answer is that of testing the elements in order and stopping at the first
// failure; the stop comes at the end of the failing element's block.
template <class LaneTest, class ElementTest>
bool allLanesPass(const double* data, unsigned long n, const LaneTest& lanes,
                  ElementTest element) noexcept {
    if (n != 0 && reinterpret_cast<std::uintptr_t>(data) % 16 != 0) {
        if (!element(*data)) return false;
        ++data;
        --n;
    }
    constexpr unsigned long blockElements = 1024;
    const unsigned long even = n - n % 4;
    for (unsigned long block = 0; block < even; block += blockElements) {
        const unsigned long end = std::min(even, block + blockElements);
        __m128d pass0 = _mm_castsi128_pd(_mm_set1_epi32(-1)), pass1 = pass0;
        for (unsigned long i = block; i < end; i += 4) {
            // The hardware prefetchers don't keep one core's loads ahead of
            // memory here; ask for the data 2 KiB ahead.
            __builtin_prefetch(data + i + 256);
            pass0 = _mm_and_pd(pass0, lanes(_mm_load_pd(data + i)));
            pass1 = _mm_and_pd(pass1, lanes(_mm_load_pd(data + i + 2)));
        }
        if (_mm_movemask_pd(_mm_and_pd(pass0, pass1)) != 3) return false;
    }
    for (unsigned long i = even; i < n; ++i)
        if (!element(data[i])) return false;
    return true;
}

// True when each of the n doubles is a whole number that T holds: the
// element test of fitsInteger<T>, two lanes at a time.
template <class T>
bool allFitInteger(const double* data, unsigned long n) noexcept {
    return allLanesPass(data, n, scan_detail::LaneTest<T>{},
                        [](double x) { return fitsInteger<T>(x); });
}

// The same, spread over threads by `runner` from its limit.
template <class T>
bool allFitInteger(const double* data, unsigned long n, ScanRunner runner) {
    return everyRangePasses(n, runner, [data](unsigned long begin, unsigned long end) {
        return allFitInteger<T>(data + begin, end - begin);
    });
}

}  // namespace bitfcns
