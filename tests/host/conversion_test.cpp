// matrix::convert_if_needed: every integer class against a reference built
// on std::round on both the serial and the parallel path, and saturation
// between integer classes. The library's conversions to double and logical
// come through the fuzz targets.
#include "host/parallel_limits.hpp"
#include "tests/support/host_arrays.hpp"

#include <cmath>
#include <limits>

namespace {

using testing_support::classIdOf;
using testing_support::elementsOf;
using testing_support::makeOf;

constexpr double nan = std::numeric_limits<double>::quiet_NaN();
constexpr double inf = std::numeric_limits<double>::infinity();

class ConversionTest : public testing_support::LeakCheckedTest {};

template <class To, class From>
To convertOne(From value) {
    const zqArraySlot source = testing_support::scalarOf(value);
    const auto converted = matrix::convert_if_needed(source.get(), classIdOf<To>);
    EXPECT_EQ(host::classOf(*converted), classIdOf<To>);
    return elementsOf<To>(converted.get())[0];
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

template <class T>
class ConversionToInteger : public ConversionTest {};
TYPED_TEST_SUITE(ConversionToInteger, testing_support::IntegerTypes);

// Edges, then the edges moved by quarters and divided by 1 to 5 up to the
// parallel limit: one element fewer is converted serially, all in parallel.
TYPED_TEST(ConversionToInteger, MatchesRoundingReferenceOnBothPaths) {
    using T = TypeParam;
    const double top = std::ldexp(1.0, std::numeric_limits<T>::digits);
    std::vector<double> values = {
        0.5,       -0.5,    1.5,      -1.5, 2.5, -2.5, 0.49999999999999994,     top, -top,
        top - 0.5, top * 4, -top * 4, nan,  inf, -inf, std::nextafter(top, 0.0)};
    for (std::size_t i = values.size(); i < host::parallelConversionElements; ++i)
        values.push_back((values[i % 16] + static_cast<double>(i % 7) * 0.25 - 0.75) /
                         static_cast<double>(1 + i % 5));
    for (const std::size_t count : {host::parallelConversionElements - 1, values.size()}) {
        const auto source = makeOf(std::vector<double>(values.begin(), values.begin() + count));
        const auto converted = matrix::convert_if_needed(source.get(), classIdOf<T>);
        const auto out = elementsOf<T>(converted.get());
        for (std::size_t i = 0; i < count; ++i)
            ASSERT_EQ(out[i], referenceRound<T>(values[i])) << values[i];
    }
}

// The conversions that the evaluator's golden cases don't reach.
TEST_F(ConversionTest, SaturationBetweenIntegerClassesAndFromSingle) {
    EXPECT_EQ(convertOne<unsigned char>(short{-5}), 0);
    EXPECT_EQ(convertOne<signed char>(~0UL), 127);
    EXPECT_EQ(convertOne<unsigned long>(-1L), 0u);
    EXPECT_EQ(convertOne<long>(~0UL), std::numeric_limits<long>::max());
    EXPECT_EQ(convertOne<short>(2.5f), 3);
    EXPECT_EQ(convertOne<int>(-std::numeric_limits<float>::infinity()),
              std::numeric_limits<int>::min());
}

}  // namespace
