// Floor by bit pattern against std::floor, and the register scan of the
// element test against the element test, at the bounds of every integer
// class, at every position and alignment.
#include "frame/class_types.hpp"
#include "frame/element_scan.hpp"
#include "frame/floating.hpp"

#include <gtest/gtest.h>

#include <algorithm>
#include <bit>
#include <cmath>
#include <limits>
#include <random>
#include <vector>

namespace {

using namespace bitfcns;

constexpr double inf = std::numeric_limits<double>::infinity();
constexpr double nan = std::numeric_limits<double>::quiet_NaN();

// Same value, same sign of zero, NaN for NaN.
template <class F>
testing::AssertionResult floorAgrees(F x, F floored) {
    const F expected = std::floor(x);
    if (std::isnan(expected)
            ? std::isnan(floored)
            : floored == expected && std::signbit(floored) == std::signbit(expected))
        return testing::AssertionSuccess();
    return testing::AssertionFailure() << std::hexfloat << "floor of " << x << " gave " << floored;
}

// Each value and its negation, as a double and as a single.
TEST(Floor, AgreesWithStdFloorAtTheEdgesAndOnRandomValues) {
    std::vector<double> values{0.0,   0.5, 1.5, 2147483647.5,        1e-310,
                               1e-40, nan, inf, largestFiniteDouble, std::nextafter(1.0, 0.0)};
    for (int power : {23, 24, 31, 52, 53, 63, 64}) {
        const double around = std::ldexp(1.0, power);
        for (double offset : {-1.5, -1.0, -0.5, 0.0, 0.5, 1.0, 1.5})
            values.push_back(around + offset);
        values.push_back(std::nextafter(around, 0.0));
        values.push_back(std::nextafter(around, inf));
    }
    std::mt19937_64 random(20240229);
    for (int i = 0; i < 100'000; ++i) {
        values.push_back(std::bit_cast<double>(random()));
        // Magnitudes up to 2^60, where the fractional bits are.
        values.push_back(std::ldexp(std::bit_cast<double>((random() >> 12) | 0x3FF0000000000000ull),
                                    static_cast<int>(random() % 64) - 4));
    }
    for (double value : values)
        for (double x : {value, -value}) {
            ASSERT_TRUE(floorAgrees(x, floorDouble(x)));
            const auto single = static_cast<float>(x);
            ASSERT_TRUE(floorAgrees(single, floorSingle(single)));
        }
}

template <class Tag>
class ElementTestByClass : public ::testing::Test {};
using IntegerTags = ::testing::Types<Int8Tag, UInt8Tag, Int16Tag, UInt16Tag, Int32Tag, UInt32Tag,
                                     Int64Tag, UInt64Tag>;
TYPED_TEST_SUITE(ElementTestByClass, IntegerTags);

// The register scan of whole arrays answers as the element test does,
// wherever a failing value stands and however the data is aligned.
TYPED_TEST(ElementTestByClass, ScanAgreesWithTheElementTest) {
    using T = typename TypeParam::type;
    using Bounds = IntegerBounds<T>;
    std::vector<double> edges;
    for (double magnitude :
         {0.0, 0.5, 1.0, 1.5, 256.0, 4503599627370495.5, 4503599627370496.0, 9007199254740993.0,
          9223372036854775808.0, 18446744073709551616.0, 1e300, inf, nan}) {
        edges.push_back(magnitude);
        edges.push_back(-magnitude);
    }
    for (double bound : {Bounds::lowest, Bounds::highest})
        for (double near : {bound, bound - 1, bound + 1, std::nextafter(bound, 0.0)})
            edges.push_back(near);
    alignas(16) double data[12] = {};
    for (double edge : edges)
        for (std::size_t offset : {0, 1})
            for (std::size_t length = 1; length + offset <= 12; ++length)
                for (std::size_t at = offset; at < offset + length; ++at) {
                    std::fill(std::begin(data), std::end(data), 0.0);
                    data[at] = edge;
                    ASSERT_EQ(allFitInteger<T>(data + offset, length), fitsInteger<T>(edge))
                        << edge << " at " << at << " of " << offset << ".." << offset + length;
                }
}

}  // namespace
