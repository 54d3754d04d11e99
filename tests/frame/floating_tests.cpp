// Floor by bit pattern against std::floor, and the element test at the
// bounds of every integer class: element by element, over host arrays, and
// in the register scan at every position and alignment.
#include "frame/class_types.hpp"
#include "frame/element_scan.hpp"
#include "frame/floating.hpp"
#include "host/array_factory.hpp"

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

TEST(FloorDouble, AgreesWithFloorAtTheEdgesAndOnRandomValues) {
    const double belowOne = std::nextafter(1.0, 0.0);
    std::vector<double> values{0.0, 0.5, 1.5,      2147483647.5,       1e-310,
                               nan, inf, belowOne, largestFiniteDouble};
    for (int power : {31, 52, 53, 63, 64}) {
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
    for (double x : values) {
        ASSERT_TRUE(floorAgrees(x, floorDouble(x)));
        ASSERT_TRUE(floorAgrees(-x, floorDouble(-x)));
    }
}

TEST(FloorSingle, AgreesWithFloorAtTheEdgesAndOnRandomValues) {
    std::vector<float> values{0.0f,        0.5f,   2.5f,       8388609.0f, 8388607.5f,
                              16777216.0f, 1e-40f, float(inf), float(nan)};
    std::mt19937 random(7);
    for (int i = 0; i < 100'000; ++i)
        values.push_back(std::bit_cast<float>(static_cast<std::uint32_t>(random())));
    for (float x : values) {
        ASSERT_TRUE(floorAgrees(x, floorSingle(x)));
        ASSERT_TRUE(floorAgrees(-x, floorSingle(-x)));
    }
}

TEST(WholeNumber, NeedsFiniteAndNoFraction) {
    EXPECT_TRUE(isWholeNumber(-0.0));
    EXPECT_TRUE(isWholeNumber(largestFiniteDouble));
    EXPECT_TRUE(isWholeNumber(largestFiniteSingle));
    for (double bad : {nan, inf, -inf, 0.5, -1e-300}) EXPECT_FALSE(isWholeNumber(bad)) << bad;
    for (float bad : {float(nan), float(inf), -0.5f}) EXPECT_FALSE(isWholeNumber(bad)) << bad;
}

template <class Tag>
class ElementTestByClass : public ::testing::Test {};
using IntegerTags = ::testing::Types<Int8Tag, UInt8Tag, Int16Tag, UInt16Tag, Int32Tag, UInt32Tag,
                                     Int64Tag, UInt64Tag>;
TYPED_TEST_SUITE(ElementTestByClass, IntegerTags);

TYPED_TEST(ElementTestByClass, AcceptsExactlyTheWholeNumbersOfTheClass) {
    using T = typename TypeParam::type;
    constexpr double lowest = static_cast<double>(std::numeric_limits<T>::min());
    // The largest double that T holds: below 2^63 or 2^64 for the 64-bit types.
    const double highest = sizeof(T) == 8 ? std::nextafter(IntegerBounds<T>::highest, 0.0)
                                          : static_cast<double>(std::numeric_limits<T>::max());
    // The nearest whole numbers outside the class.
    const double belowLowest = lowest - 1 != lowest ? lowest - 1 : std::nextafter(lowest, -inf);
    const double aboveHighest = highest + 1 != highest ? highest + 1 : std::nextafter(highest, inf);
    for (double good : {lowest, highest, -0.0}) EXPECT_TRUE(fitsInteger<T>(good)) << good;
    for (double bad : {belowLowest, aboveHighest, nan, inf, -inf, 0.5, -0.5, 2147483647.5})
        EXPECT_FALSE(fitsInteger<T>(bad)) << bad;

    const auto array = [](const std::vector<double>& values) {
        return host::makeArray<double>(zqDoubleClass, {1, values.size()}, values);
    };
    EXPECT_TRUE(fitsIntegerClass(array({lowest, 0.0, highest}).get(), TypeParam::id));
    EXPECT_FALSE(fitsIntegerClass(array({lowest, 0.0, highest, nan}).get(), TypeParam::id));
    EXPECT_TRUE(fitsIntegerClass(host::makeArray(zqDoubleClass, {0, 3}).get(), TypeParam::id));
}

// The register scan of whole arrays answers as the element test does,
// element by element, wherever a failing value stands and however the data
// is aligned.
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
