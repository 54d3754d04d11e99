// The double paths' lane arithmetic and checked loop: the patterns of every
// integer class made and read back exactly, floors, and the loop's passes
// over short and odd subranges, fresh and in place, refused anywhere.
#include "frame/checked_lanes.hpp"
#include "frame/double_lanes.hpp"
#include "frame/integer_conversion.hpp"
#include "tests/support/host_arrays.hpp"
#include "tests/support/whole_values.hpp"

#include <gtest/gtest.h>

#include <algorithm>
#include <bit>
#include <cmath>
#include <cstdint>
#include <vector>

namespace {

using namespace bitfcns;
using testing_support::wholeValuesOf;

std::uint64_t bitsOf(double x) { return std::bit_cast<std::uint64_t>(x); }

template <class T>
class DoubleLanes : public ::testing::Test {};
TYPED_TEST_SUITE(DoubleLanes, testing_support::IntegerTypes);

// A whole value of T gives T's two's complement in the low bits of its
// pattern; any pattern reads back as the double integerToDouble gives, to
// the last bit (rounded to nearest for the 64-bit classes).
TYPED_TEST(DoubleLanes, PatternsMatchTheScalarConversions) {
    using T = TypeParam;
    for (double x : wholeValuesOf<T>()) {
        const __m128i pattern = lanes::patternOf<T>(_mm_set1_pd(x));
        EXPECT_EQ(static_cast<T>(_mm_cvtsi128_si64(pattern)), wholeDoubleTo<T>(x)) << x;
    }
    std::uint64_t bits = 0x243F6A8885A308D3u;
    for (int i = 0; i < 2000; ++i) {
        bits = bits * 6364136223846793005u + 1442695040888963407u;
        const std::uint64_t pattern = bits >> (i % 64);
        const double made =
            _mm_cvtsd_f64(lanes::fromPattern<T>(_mm_set1_epi64x(static_cast<long long>(pattern))));
        ASSERT_EQ(bitsOf(made), bitsOf(integerToDouble(static_cast<T>(pattern)))) << pattern;
    }
}

TEST(DoubleLanes, FloorsOfFiniteDoubles) {
    for (double y :
         {0.0, -0.0, 0.5, -0.5, 1.5, -1.5, 2.0, -3.25, 4503599627370495.5, -4503599627370495.5,
          2251799813685247.5, 2251799813685248.0, 9007199254740993.0, -1e300, 1e300}) {
        EXPECT_EQ(_mm_cvtsd_f64(lanes::floorFinite(_mm_set1_pd(y))), std::floor(y)) << y;
        if (std::fabs(y) < 2251799813685248.0) {
            EXPECT_EQ(_mm_cvtsd_f64(lanes::floorBelow2To51(_mm_set1_pd(y))), std::floor(y)) << y;
        }
    }
}

// Refuses negative numbers; doubles, or adds, the others.
struct Doubling {
    static constexpr int arity = 1;
    static constexpr unsigned long parallelLimit = 5;
    __m128d check(__m128d x) const noexcept { return _mm_cmpge_pd(x, _mm_setzero_pd()); }
    __m128d apply(__m128d x) const noexcept { return _mm_add_pd(x, x); }
};
struct Adding {
    static constexpr int arity = 2;
    static constexpr unsigned long parallelLimit = 5;
    __m128d check(__m128d x, __m128d y) const noexcept {
        return _mm_and_pd(_mm_cmpge_pd(x, _mm_setzero_pd()), _mm_cmpge_pd(y, _mm_setzero_pd()));
    }
    __m128d apply(__m128d x, __m128d y) const noexcept { return _mm_add_pd(x, y); }
};

// From the limit on, subranges of three, as a split over threads may cut.
void runInThrees(unsigned long n, unsigned long limit, LaneRangeBody body, const void* context) {
    for (unsigned long begin = 0; begin < n; begin += n < limit ? n : 3)
        body(context, begin, n < limit ? n : std::min(n, begin + 3));
}

// Counts around the head's eight and the pairs, from unaligned starts;
// the element after the end is never written.
TEST(CheckedLanes, FreshAndInPlaceOverEveryShape) {
    for (unsigned long n = 0; n < 40; ++n)
        for (unsigned long offset : {0, 1}) {
            std::vector<double> data(n + 2), once(n + 1, -7.0), twice(n + 1, -7.0);
            for (unsigned long i = 0; i < n + 2; ++i) data[i] = double(i);
            const double* in = data.data() + offset;
            ASSERT_TRUE(runCheckedLanes(Doubling{}, in, nullptr, once.data(), n, &runInThrees));
            ASSERT_TRUE(runCheckedLanes(Adding{}, in, in, twice.data(), n, &runInThrees));
            for (unsigned long i = 0; i < n; ++i) {
                ASSERT_EQ(once[i], 2 * in[i]) << n << " " << i;
                ASSERT_EQ(twice[i], 2 * in[i]) << n << " " << i;
            }
            EXPECT_EQ(once[n], -7.0);
            EXPECT_EQ(twice[n], -7.0);
            ASSERT_TRUE(
                runCheckedLanes(Doubling{}, data.data(), nullptr, data.data(), n, &runInThrees));
            for (unsigned long i = 0; i < n + 2; ++i) ASSERT_EQ(data[i], i < n ? 2.0 * i : i);
        }
}

// A refusal anywhere is reported; in place nothing is written.
TEST(CheckedLanes, RefusalAnywhere) {
    for (unsigned long n : {1, 2, 9, 17})
        for (unsigned long bad = 0; bad < n; ++bad) {
            std::vector<double> data(n, 1.0), out(n);
            data[bad] = -1.0;
            EXPECT_FALSE(
                runCheckedLanes(Doubling{}, data.data(), nullptr, out.data(), n, &runInThrees));
            EXPECT_FALSE(
                runCheckedLanes(Adding{}, out.data(), data.data(), out.data(), n, &runInThrees));
            EXPECT_FALSE(
                runCheckedLanes(Doubling{}, data.data(), nullptr, data.data(), n, &runInThrees));
            for (unsigned long i = 0; i < n; ++i) ASSERT_EQ(data[i], i == bad ? -1.0 : 1.0);
        }
}

}  // namespace
