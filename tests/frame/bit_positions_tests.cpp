// Bit positions in every class: 0, 1, the width, one past it, negatives,
// values wider than the indexed class, and the odd floating values; and the
// scan of whole arrays of them.
#include "frame/bit_positions.hpp"
#include "frame/position_scan.hpp"

#include <gtest/gtest.h>

#include <cstdint>
#include <limits>
#include <type_traits>
#include <vector>

namespace {

using bitfcns::bitIsValid;

TEST(BitPositions, IntegerClassesComparedInTheirOwnWidth) {
    for (int width : {8, 16, 32, 64}) {
        SCOPED_TRACE(width);
        EXPECT_FALSE(bitIsValid<signed char>(0, width));
        EXPECT_TRUE(bitIsValid<signed char>(1, width));
        EXPECT_TRUE(bitIsValid<signed char>(8, width));
        EXPECT_FALSE(bitIsValid<signed char>(-1, width));
        EXPECT_FALSE(bitIsValid<signed char>(-128, width));
        EXPECT_FALSE(bitIsValid<signed char>(127, width));
        EXPECT_FALSE(bitIsValid<unsigned char>(255, width));
        EXPECT_TRUE(bitIsValid<unsigned long>(static_cast<unsigned long>(width), width));
        EXPECT_FALSE(bitIsValid<unsigned long>(static_cast<unsigned long>(width) + 1, width));
        EXPECT_FALSE(bitIsValid<long>(std::numeric_limits<long>::min(), width));
        EXPECT_FALSE(bitIsValid<unsigned long>(std::uint64_t{1} << 40, width));
        EXPECT_FALSE(bitIsValid<int>(width + 1, width));
    }
    EXPECT_TRUE(bitIsValid<unsigned char>(64, 64));
    EXPECT_FALSE(bitIsValid<unsigned short>(9, 8));
}

TEST(BitPositions, FloatingClassesMustBeWholeAndFinite) {
    constexpr double inf = std::numeric_limits<double>::infinity();
    constexpr double nan = std::numeric_limits<double>::quiet_NaN();
    for (double b : {0.0, -0.0, 0.5, 1.5, 8.5, 9.0, -1.0, inf, -inf, nan}) {
        EXPECT_FALSE(bitIsValid(b, 8)) << b;
        EXPECT_FALSE(bitIsValid(static_cast<float>(b), 8)) << b;
    }
    for (double b : {1.0, 8.0}) {
        EXPECT_TRUE(bitIsValid(b, 8)) << b;
        EXPECT_TRUE(bitIsValid(static_cast<float>(b), 8)) << b;
    }
    EXPECT_TRUE(bitIsValid(64.0, 64));
    EXPECT_FALSE(bitIsValid(65.0f, 64));
}

}  // namespace

// The block scan agrees with bitIsValid wherever the one bad position lies:
// in a register's body, its tail, or either side of a block boundary.
template <class U>
class PositionScan : public ::testing::Test {};
using PositionTypes = ::testing::Types<double, float, signed char, unsigned short, long>;
TYPED_TEST_SUITE(PositionScan, PositionTypes);

TYPED_TEST(PositionScan, FindsTheOneInvalidPositionAnywhere) {
    using U = TypeParam;
    constexpr unsigned long n = 2051;
    std::vector<U> positions(n);
    for (unsigned long i = 0; i < n; ++i) positions[i] = static_cast<U>(i % 16 + 1);
    EXPECT_TRUE(bitfcns::allPositionsValid(positions.data(), n, 16));
    EXPECT_FALSE(bitfcns::allPositionsValid(positions.data(), n, 15));
    std::vector<U> bad{0, 17, static_cast<U>(-1)};
    if constexpr (std::is_floating_point_v<U>)
        bad.insert(bad.end(), {U(1.5), std::numeric_limits<U>::quiet_NaN(),
                               std::numeric_limits<U>::infinity()});
    for (unsigned long at : {0ul, 1ul, 3ul, 1023ul, 1024ul, 2047ul, 2048ul, n - 1})
        for (U b : bad) {
            std::vector<U> withBad = positions;
            withBad[at] = b;
            EXPECT_FALSE(bitfcns::allPositionsValid(withBad.data(), n, 16)) << at << " " << +b;
        }
}
