// The block scan of whole arrays of bit positions: it finds the one bad
// position wherever it lies, in a register's body, its tail, or either side
// of a block boundary, also when the scan is split into ranges. Single positions of every class are checked through
// the entry points against the reference model by the fuzz targets.
#include "frame/position_scan.hpp"

#include <gtest/gtest.h>

#include <algorithm>
#include <limits>
#include <type_traits>
#include <vector>

namespace {

// Subranges of seven, as a split over threads may cut.
void runInSevens(unsigned long n, unsigned long, bitfcns::LaneRangeBody body, const void* context) {
    for (unsigned long begin = 0; begin < n; begin += 7) body(context, begin, std::min(n, begin + 7));
}

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
    EXPECT_TRUE(bitfcns::allPositionsValid(positions.data(), n, 16, {0, &runInSevens}));
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
            EXPECT_FALSE(bitfcns::allPositionsValid(withBad.data(), n, 16, {0, &runInSevens}))
                << at << " " << +b;
        }
}

}  // namespace
