// Doubles that hold whole numbers of an integer class T, for tests of the
// double paths: the edges of T (zero of both signs, one, the extremes, the
// largest double below 2^63 and 2^64), powers of two near the top, and
// pseudo-random values spread over T's range; and the check of a lane
// kernel of the double paths against its scalar functor on all of them.
#pragma once

#include <emmintrin.h>
#include <gtest/gtest.h>

#include <bit>
#include <cmath>
#include <cstdint>
#include <limits>
#include <type_traits>
#include <vector>

namespace testing_support {

template <class T>
std::vector<double> wholeValuesOf() {
    constexpr int width = sizeof(T) * 8;
    const double lowest = static_cast<double>(std::numeric_limits<T>::min());
    // The largest double T holds: below 2^63 and 2^64 the doubles are 2^10
    // and 2^11 apart.
    const double highest = width < 64 ? static_cast<double>(std::numeric_limits<T>::max())
                                      : std::ldexp(1.0, width - std::is_signed_v<T>) -
                                            std::ldexp(1.0, width - std::is_signed_v<T> - 53);
    std::vector<double> values{0.0, -0.0, 1.0, 2.0, 3.0, lowest, highest, highest - 1};
    if (lowest < 0) values.insert(values.end(), {-1.0, -2.0, lowest + 1});
    for (int k = width - 12; k < width - std::is_signed_v<T>; ++k)
        if (k >= 0) values.push_back(std::ldexp(1.0, k));
    std::uint64_t state = 0x9E3779B97F4A7C15u;
    for (int i = 0; i < 200; ++i) {
        state = state * 6364136223846793005u + 1442695040888963407u;
        // Up to as many significant bits as T has for its magnitudes.
        const double fraction = static_cast<double>(state >> 11) / 9007199254740992.0;
        const int bits = static_cast<int>(state % (width - std::is_signed_v<T> + 1));
        const double magnitude = std::floor(std::ldexp(fraction, bits));
        values.push_back(lowest < 0 && (state & 0x400) ? -magnitude : magnitude);
    }
    return values;
}

// Each whole value of T, in both lanes, is accepted by the kernel and gives
// the bits of `expected(x)`.
template <class T, class Kernel, class Expected>
void expectLanesAgree(const Kernel& kernel, Expected expected) {
    for (double x : wholeValuesOf<T>()) {
        const __m128d lanes = _mm_set_pd(x, x);
        ASSERT_EQ(_mm_movemask_pd(kernel.check(lanes)), 3) << x;
        const __m128d result = kernel.apply(lanes);
        ASSERT_EQ(std::bit_cast<std::uint64_t>(_mm_cvtsd_f64(result)),
                  std::bit_cast<std::uint64_t>(expected(x)))
            << x << " gave " << _mm_cvtsd_f64(result);
    }
}

}  // namespace testing_support
