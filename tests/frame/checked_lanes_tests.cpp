// The double paths' lane arithmetic and checked loop: the patterns of every
// integer class made and read back exactly, and the loop's passes over short
// and odd subranges, fresh and in place, refused anywhere.
#include "frame/checked_lanes.hpp"
#include "frame/double_lanes.hpp"
#include "frame/floating.hpp"
#include "frame/integer_conversion.hpp"
#include "tests/support/host_arrays.hpp"

#include <gtest/gtest.h>

#include <algorithm>
#include <bit>
#include <cstdint>
#include <vector>

namespace {

using namespace bitfcns;

template <class T>
class DoubleLanes : public ::testing::Test {};
TYPED_TEST_SUITE(DoubleLanes, testing_support::IntegerTypes);

// Random patterns of every length and of either sign read back as the double integerToDouble gives,
// to the last bit (rounded to nearest for the 64-bit classes); where that double is a whole number
// T holds, its pattern is T's two's complement again.
TYPED_TEST(DoubleLanes, PatternsMatchTheScalarConversions) {
    using T = TypeParam;
    std::uint64_t bits = 0x243F6A8885A308D3u;
    for (int i = 0; i < 2000; ++i) {
        bits = bits * 6364136223846793005u + 1442695040888963407u;
        const std::uint64_t pattern = i % 2 ? ~(bits >> (i % 64)) : bits >> (i % 64);
        const double made =
            _mm_cvtsd_f64(lanes::fromPattern<T>(_mm_set1_epi64x(static_cast<long long>(pattern))));
        ASSERT_EQ(std::bit_cast<std::uint64_t>(made),
                  std::bit_cast<std::uint64_t>(integerToDouble(static_cast<T>(pattern))))
            << pattern;
        if (!fitsInteger<T>(made)) continue;
        const __m128i back = lanes::patternOf<T>(_mm_set1_pd(made));
        ASSERT_EQ(static_cast<T>(_mm_cvtsi128_si64(back)), wholeDoubleTo<T>(made)) << made;
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
            for (unsigned long i = 0; i <= n; ++i) {
                ASSERT_EQ(once[i], i < n ? 2 * in[i] : -7.0) << n << " " << i;
                ASSERT_EQ(twice[i], once[i]) << n << " " << i;
            }
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
