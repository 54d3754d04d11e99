// matrix::convert_if_needed: the rounding and saturation edges, every integer
// class against a libm reference, hardware rounding to floating classes,
// logical and char, complex arrays, and the parallel path.
#include "host/exceptions.hpp"
#include "host_test_support.hpp"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <random>

namespace host::testing {
namespace {

class ConversionTest : public HostTest {};

template <class To, class From>
To convertOne(zqClassID fromClass, From value, zqClassID toClass) {
    zqArraySlot source = makeArray(fromClass, {1, 1}, std::span<const From>(&value, 1));
    auto converted = matrix::convert_if_needed(source.get(), toClass);
    EXPECT_EQ(classOf(*converted), toClass);
    return *static_cast<const To*>(converted->data);
}

constexpr double kTwo63 = 9223372036854775808.0;
constexpr double kTwo64 = 18446744073709551616.0;
constexpr double kNaN = std::numeric_limits<double>::quiet_NaN();

TEST_F(ConversionTest, FloatingToIntegerEdges) {
    EXPECT_EQ((convertOne<long>(zqDoubleClass, 2.5, zqInt64Class)), 3);
    EXPECT_EQ((convertOne<long>(zqDoubleClass, -2.5, zqInt64Class)), -3);
    EXPECT_EQ((convertOne<int>(zqDoubleClass, 0.49999999999999994, zqInt32Class)), 0);
    EXPECT_EQ((convertOne<unsigned char>(zqDoubleClass, 300.0, zqUInt8Class)), 255);
    EXPECT_EQ((convertOne<unsigned char>(zqDoubleClass, -1.0, zqUInt8Class)), 0);
    EXPECT_EQ((convertOne<unsigned char>(zqDoubleClass, 254.5, zqUInt8Class)), 255);
    EXPECT_EQ((convertOne<signed char>(zqDoubleClass, -128.6, zqInt8Class)), -128);
    EXPECT_EQ((convertOne<unsigned char>(zqDoubleClass, kNaN, zqUInt8Class)), 0);
    EXPECT_EQ((convertOne<long>(zqDoubleClass, kNaN, zqInt64Class)), 0);
    EXPECT_EQ((convertOne<long>(zqDoubleClass, kTwo63, zqInt64Class)),
              std::numeric_limits<long>::max());
    EXPECT_EQ((convertOne<long>(zqDoubleClass, -kTwo63, zqInt64Class)),
              std::numeric_limits<long>::min());
    EXPECT_EQ((convertOne<unsigned long>(zqDoubleClass, kTwo64, zqUInt64Class)),
              std::numeric_limits<unsigned long>::max());
    EXPECT_EQ((convertOne<unsigned long>(zqDoubleClass, kTwo63, zqUInt64Class)), 1UL << 63);
    EXPECT_EQ((convertOne<int>(zqSingleClass, -INFINITY, zqInt32Class)),
              std::numeric_limits<int>::min());
    EXPECT_EQ((convertOne<short>(zqSingleClass, 2.5f, zqInt16Class)), 3);
}

TEST_F(ConversionTest, ToFloatingRoundsToNearestEven) {
    EXPECT_EQ((convertOne<double>(zqUInt64Class, std::numeric_limits<unsigned long>::max(),
                                  zqDoubleClass)),
              kTwo64);
    EXPECT_EQ((convertOne<double>(zqInt64Class, (1L << 53) + 1, zqDoubleClass)),
              9007199254740992.0);
    EXPECT_EQ((convertOne<float>(zqInt32Class, 16777217, zqSingleClass)), 16777216.0f);
    EXPECT_EQ((convertOne<float>(zqInt32Class, 16777219, zqSingleClass)), 16777220.0f);
    EXPECT_EQ((convertOne<float>(zqDoubleClass, 0.1, zqSingleClass)), 0.1f);
    EXPECT_EQ((convertOne<double>(zqSingleClass, 0.1f, zqDoubleClass)), static_cast<double>(0.1f));
}

TEST_F(ConversionTest, LogicalAndChar) {
    EXPECT_TRUE((convertOne<bool>(zqDoubleClass, kNaN, zqLogicalClass)));
    EXPECT_TRUE((convertOne<bool>(zqDoubleClass, -0.5, zqLogicalClass)));
    EXPECT_FALSE((convertOne<bool>(zqDoubleClass, -0.0, zqLogicalClass)));
    EXPECT_EQ((convertOne<double>(zqLogicalClass, true, zqDoubleClass)), 1.0);
    EXPECT_EQ((convertOne<unsigned long>(zqLogicalClass, false, zqUInt64Class)), 0u);
    EXPECT_EQ((convertOne<double>(zqCharClass, u'A', zqDoubleClass)), 65.0);
    EXPECT_EQ((convertOne<signed char>(zqCharClass, u'\u00e9', zqInt8Class)), 127);
}

TEST_F(ConversionTest, IntegerToIntegerSaturates) {
    EXPECT_EQ((convertOne<unsigned char>(zqInt16Class, short{-5}, zqUInt8Class)), 0);
    EXPECT_EQ((convertOne<signed char>(zqUInt64Class, ~0UL, zqInt8Class)), 127);
    EXPECT_EQ((convertOne<unsigned long>(zqInt64Class, -1L, zqUInt64Class)), 0u);
    EXPECT_EQ((convertOne<long>(zqUInt64Class, ~0UL, zqInt64Class)),
              std::numeric_limits<long>::max());
}

// Every integer class against a reference built on std::round.
template <class T>
class ConversionToInteger : public ConversionTest {};
using IntegerTypes = ::testing::Types<signed char, unsigned char, short, unsigned short, int,
                                      unsigned int, long, unsigned long>;
TYPED_TEST_SUITE(ConversionToInteger, IntegerTypes);

template <class T>
constexpr zqClassID integerClass() {
    constexpr zqClassID bySize[] = {zqInt8Class, zqInt16Class, zqInt32Class, zqInt64Class};
    const int index = sizeof(T) == 1 ? 0 : sizeof(T) == 2 ? 1 : sizeof(T) == 4 ? 2 : 3;
    return static_cast<zqClassID>(bySize[index] + (std::is_signed_v<T> ? 0 : 1));
}

template <class T>
T referenceRound(double x) {
    if (std::isnan(x)) return 0;
    const double rounded = std::round(x);
    if (rounded <= static_cast<double>(std::numeric_limits<T>::min()))
        return std::numeric_limits<T>::min();
    if (rounded >= std::ldexp(1.0, std::numeric_limits<T>::digits))
        return std::numeric_limits<T>::max();
    return static_cast<T>(rounded);
}

TYPED_TEST(ConversionToInteger, MatchesRoundingReferenceOnBothPaths) {
    using T = TypeParam;
    const double top = std::ldexp(1.0, std::numeric_limits<T>::digits);
    std::vector<double> values = {0.5,
                                  -0.5,
                                  1.5,
                                  -1.5,
                                  top,
                                  -top,
                                  top - 0.5,
                                  top * 4,
                                  -top * 4,
                                  kNaN,
                                  INFINITY,
                                  -INFINITY,
                                  std::nextafter(top, 0.0)};
    std::mt19937_64 random(42);
    std::uniform_real_distribution<double> spread(-top * 1.25, top * 1.25);
    const double nearTop = std::min(top * 1.25, std::ldexp(1.0, 53));
    std::uniform_real_distribution<double> small(-nearTop, nearTop);
    // Runs of whole numbers (over the whole range and near the fast path's
    // bounds), of fractions and of halves; past the parallel limit, so both
    // the serial and the parallel body run.
    while (values.size() < 70000) {
        switch (values.size() / 8 % 4) {
            case 0: values.push_back(std::trunc(spread(random))); break;
            case 1: values.push_back(spread(random)); break;
            case 2: values.push_back(std::trunc(spread(random)) + 0.5); break;
            default: values.push_back(std::trunc(small(random))); break;
        }
    }
    zqArraySlot source = arrayOf(zqDoubleClass, {values.size(), 1}, values);
    auto converted = matrix::convert_if_needed(source.get(), integerClass<T>());
    const auto out = elementsOf<T>(*converted);
    for (std::size_t i = 0; i < values.size(); ++i) {
        ASSERT_EQ(out[i], referenceRound<T>(values[i])) << values[i];
    }
    // Back to double and single: the hardware's conversion.
    auto back = matrix::convert_if_needed(converted.get(), zqDoubleClass);
    auto single = matrix::convert_if_needed(converted.get(), zqSingleClass);
    for (std::size_t i = 0; i < values.size(); i += 97) {
        EXPECT_EQ(elementsOf<double>(*back)[i], static_cast<double>(out[i]));
        EXPECT_EQ(elementsOf<float>(*single)[i], static_cast<float>(out[i]));
    }
}

TEST_F(ConversionTest, KeepsSizesSparseFlagAndImaginaryPart) {
    zqArraySlot source = arrayOf(zqDoubleClass, {1, 2, 3}, std::vector<double>{1, 2, 3, 4, 5, 6.5});
    const std::vector<double> imaginary{-1, -2, -3, -4, -5, 300};
    makeComplex(*source, std::as_bytes(std::span(imaginary)));
    setSparse(*source, true);
    auto converted = matrix::convert_if_needed(source.get(), zqUInt8Class);
    EXPECT_EQ(dimensions(*converted), (Dims{1, 2, 3}));
    EXPECT_TRUE(isSparse(*converted));
    ASSERT_TRUE(isComplex(*converted));
    const auto* imaginaryOut = static_cast<const unsigned char*>(imaginaryData(*converted));
    EXPECT_EQ(imaginaryOut[0], 0);
    EXPECT_EQ(imaginaryOut[5], 255);
    EXPECT_EQ(elementsOf<unsigned char>(*converted)[5], 7);
    EXPECT_THROW(matrix::convert_if_needed(source.get(), zqLogicalClass),
                 foundation::core::except::IMsgIDException);
}

TEST_F(ConversionTest, RefusesClassesWithoutElements) {
    zqArraySlot strings = makeStringArray({1, 1}, {u"a"});
    EXPECT_THROW(matrix::convert_if_needed(strings.get(), zqDoubleClass),
                 foundation::core::except::IMsgIDException);
}

}  // namespace
}  // namespace host::testing
