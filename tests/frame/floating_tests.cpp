// Floor by bit pattern against std::floor, and the element test at the
// bounds of every integer class, alone and over host arrays.
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
constexpr double two31 = 2147483648.0, two52 = 4503599627370496.0, two53 = 9007199254740992.0;
constexpr double two63 = 9223372036854775808.0, two64 = 18446744073709551616.0;

// Same value, same sign of zero, NaN for NaN.
template <class F>
void expectFloorAgrees(F x, F floored) {
    const F expected = std::floor(x);
    if (std::isnan(expected)) {
        EXPECT_TRUE(std::isnan(floored)) << x;
    } else {
        EXPECT_EQ(floored, expected) << std::hexfloat << x;
        EXPECT_EQ(std::signbit(floored), std::signbit(expected)) << x;
    }
}

TEST(FloorDouble, AgreesWithFloorAtTheEdges) {
    std::vector<double> values{0.0,
                               0.5,
                               1.5,
                               2.5,
                               255.5,
                               2147483647.5,
                               1e-310,
                               nan,
                               inf,
                               largestFiniteDouble,
                               std::nextafter(1.0, 0.0)};
    for (double around : {two31, two52, two53, two63, two64}) {
        for (double offset : {-1.5, -1.0, -0.5, 0.0, 0.5, 1.0, 1.5})
            values.push_back(around + offset);
        values.push_back(std::nextafter(around, 0.0));
        values.push_back(std::nextafter(around, inf));
    }
    for (double x : values) {
        expectFloorAgrees(x, floorDouble(x));
        expectFloorAgrees(-x, floorDouble(-x));
    }
    EXPECT_EQ(floorDouble(-2147483648.5), -2147483649.0);
    EXPECT_EQ(floorDouble(2147483648.5), 2147483648.0);
}

TEST(FloorDouble, AgreesWithFloorOnRandomBitsAndRandomMagnitudes) {
    std::mt19937_64 random(20240229);
    for (int i = 0; i < 2'000'000; ++i) {
        const double x = std::bit_cast<double>(random());
        expectFloorAgrees(x, floorDouble(x));
        // Magnitudes up to 2^60, where the fractional bits are.
        const double y = std::ldexp(std::bit_cast<double>((random() >> 12) | 0x3FF0000000000000ull),
                                    static_cast<int>(random() % 64) - 4);
        expectFloorAgrees(i % 2 ? y : -y, floorDouble(i % 2 ? y : -y));
    }
}

TEST(FloorSingle, AgreesWithFloor) {
    for (float x :
         {0.0f, 0.5f, 2.5f, 8388609.0f, 8388607.5f, 16777216.0f, 1e-40f,
          std::numeric_limits<float>::infinity(), std::numeric_limits<float>::quiet_NaN()}) {
        expectFloorAgrees(x, floorSingle(x));
        expectFloorAgrees(-x, floorSingle(-x));
    }
    std::mt19937 random(7);
    for (int i = 0; i < 2'000'000; ++i) {
        const float x = std::bit_cast<float>(static_cast<std::uint32_t>(random()));
        expectFloorAgrees(x, floorSingle(x));
    }
    EXPECT_EQ(floorSingle(-2.5f), -3.0f);
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
    EXPECT_TRUE(fitsInteger<T>(lowest));
    EXPECT_TRUE(fitsInteger<T>(highest));
    EXPECT_TRUE(fitsInteger<T>(-0.0));
    // The nearest whole numbers outside the class.
    const double belowLowest = lowest - 1 != lowest ? lowest - 1 : std::nextafter(lowest, -inf);
    const double aboveHighest = highest + 1 != highest ? highest + 1 : std::nextafter(highest, inf);
    EXPECT_FALSE(fitsInteger<T>(belowLowest));
    EXPECT_FALSE(fitsInteger<T>(aboveHighest));
    for (double bad : {nan, inf, -inf, 0.5, -0.5, 255.5, 2147483647.5})
        EXPECT_FALSE(fitsInteger<T>(bad)) << bad;

    const std::vector<double> good{lowest, 0.0, highest};
    std::vector<double> badLast = good;
    badLast.push_back(nan);
    const auto array = [](const std::vector<double>& values) {
        return host::makeArray<double>(zqDoubleClass, {1, values.size()}, values);
    };
    EXPECT_TRUE(fitsIntegerClass(array(good).get(), TypeParam::id));
    EXPECT_FALSE(fitsIntegerClass(array(badLast).get(), TypeParam::id));
    EXPECT_TRUE(fitsIntegerClass(host::makeArray(zqDoubleClass, {0, 3}).get(), TypeParam::id));
}

TEST(ElementTest, BoundsOfTheWideClasses) {
    EXPECT_TRUE(fitsInteger<unsigned char>(255));
    EXPECT_FALSE(fitsInteger<unsigned char>(256));
    EXPECT_FALSE(fitsInteger<signed char>(-129));
    EXPECT_TRUE(fitsInteger<unsigned int>(4294967295.0));
    EXPECT_FALSE(fitsInteger<unsigned int>(4294967296.0));
    EXPECT_FALSE(fitsInteger<long>(two63));
    EXPECT_TRUE(fitsInteger<long>(-two63));
    EXPECT_TRUE(fitsInteger<unsigned long>(two63));
    EXPECT_FALSE(fitsInteger<unsigned long>(two64));
    EXPECT_TRUE(fitsInteger<unsigned long>(18446744073709549568.0));
    for (double beyond53 : {4503599627370497.0, two53}) {
        EXPECT_TRUE(fitsInteger<long>(beyond53));
        EXPECT_TRUE(fitsInteger<unsigned long>(beyond53));
    }
}

TEST(ElementTest, UnknownWorkingClassUsesInt64Bounds) {
    const std::vector<double> values{-1.0, two53};
    const auto array = host::makeArray<double>(zqDoubleClass, {2, 1}, values);
    EXPECT_TRUE(fitsIntegerClass(array.get(), zqNoClass));
    EXPECT_FALSE(fitsIntegerClass(host::makeDoubleScalar(two63).get(), zqNoClass));
}

// The register scan of whole arrays answers as the element test does,
// element by element, wherever a failing value stands and however the data
// is aligned.
TYPED_TEST(ElementTestByClass, ScanAgreesWithTheElementTest) {
    using T = typename TypeParam::type;
    using Bounds = bitfcns::IntegerBounds<T>;
    const double edges[] = {Bounds::lowest,
                            Bounds::lowest - 1,
                            Bounds::highest,
                            Bounds::highest + 1,
                            std::nextafter(Bounds::highest, 0.0),
                            std::nextafter(Bounds::lowest, 0.0),
                            0.5,
                            -0.5,
                            -0.0,
                            1.5,
                            4503599627370495.5,
                            4503599627370496.0,
                            9007199254740993.0,
                            9223372036854775808.0,
                            18446744073709551616.0,
                            -1.0,
                            255.0,
                            256.0,
                            nan,
                            inf,
                            -inf,
                            1e300,
                            -1e300};
    alignas(16) double data[12] = {};
    for (double edge : edges)
        for (std::size_t offset : {0, 1})
            for (std::size_t length = 1; length + offset <= 12; ++length)
                for (std::size_t at = offset; at < offset + length; ++at) {
                    std::fill(std::begin(data), std::end(data), 0.0);
                    data[at] = edge;
                    ASSERT_EQ(bitfcns::allFitInteger<T>(data + offset, length),
                              bitfcns::fitsInteger<T>(edge))
                        << edge << " at " << at << " of " << offset << ".." << offset + length;
                }
}

}  // namespace
