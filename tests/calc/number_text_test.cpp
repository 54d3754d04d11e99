// Canonical text of numbers at the edges: halves, whole numbers beyond 2^53,
// signed zero, subnormals, huge whole doubles and single values.
#include "calc/number_text.hpp"

#include <gtest/gtest.h>

#include <cmath>
#include <cstdint>
#include <limits>
#include <string>

namespace bitcalc {
namespace {

struct DoubleCase {
    double value;
    const char* text;
};

class DoubleText : public testing::TestWithParam<DoubleCase> {};

TEST_P(DoubleText, IsExactAndShortest) {
    EXPECT_EQ(canonicalText(GetParam().value), GetParam().text);
    // Every text reads back to the same value.
    const std::string text = canonicalText(GetParam().value);
    if (!std::isnan(GetParam().value) && !std::isinf(GetParam().value)) {
        EXPECT_EQ(std::strtod(text.c_str(), nullptr), GetParam().value) << text;
    }
}

INSTANTIATE_TEST_SUITE_P(
    Edges, DoubleText,
    testing::Values(
        DoubleCase{0.5, "0.5"}, DoubleCase{-0.5, "-0.5"}, DoubleCase{2.5, "2.5"},
        DoubleCase{-2.5, "-2.5"}, DoubleCase{4503599627370495.5, "4503599627370495.5"},
        DoubleCase{0.1, "0.1"}, DoubleCase{1.0 / 3, "0.3333333333333333"},
        DoubleCase{123456.5, "123456.5"}, DoubleCase{0.0015, "0.0015"}, DoubleCase{0.001, "1e-3"},
        DoubleCase{1.5e-7, "1.5e-7"}, DoubleCase{1e-300, "1e-300"}, DoubleCase{0.0, "0"},
        DoubleCase{-0.0, "-0"}, DoubleCase{1.0, "1"}, DoubleCase{-1.0, "-1"},
        DoubleCase{9007199254740992.0, "9007199254740992"},
        DoubleCase{9007199254740994.0, "9007199254740994"},
        DoubleCase{0x1p63, "9223372036854775808"}, DoubleCase{-0x1p63, "-9223372036854775808"},
        DoubleCase{0x1p64, "18446744073709551616"},
        DoubleCase{18446744073709549568.0, "18446744073709549568"},
        DoubleCase{1e300,
                   "1000000000000000052504760255204420248704468581108159154915854115511802457988908"
                   "1957863713750804478640437044438328838781769425232353604305756447921847867069828"
                   "4838720092657580373783023379478809005936895323497079994508111903896764088007465"
                   "2742780142494579258788820056842838115669472196386865459400540160"},
        DoubleCase{std::numeric_limits<double>::denorm_min(), "5e-324"},
        DoubleCase{-std::numeric_limits<double>::denorm_min(), "-5e-324"},
        DoubleCase{std::numeric_limits<double>::min(), "2.2250738585072014e-308"},
        DoubleCase{2.225073858507201e-308, "2.225073858507201e-308"},
        DoubleCase{std::numeric_limits<double>::quiet_NaN(), "NaN"},
        DoubleCase{std::numeric_limits<double>::infinity(), "Inf"},
        DoubleCase{-std::numeric_limits<double>::infinity(), "-Inf"}));

TEST(DoubleText, LargestDoubleIsItsWholeInteger) {
    const std::string text = canonicalText(std::numeric_limits<double>::max());
    EXPECT_EQ(text.size(), 309u);
    EXPECT_EQ(text.substr(0, 17), "17976931348623157");
    EXPECT_TRUE(text.ends_with("404026184124858368")) << text;
}

struct SingleCase {
    float value;
    const char* text;
};

class SingleText : public testing::TestWithParam<SingleCase> {};

TEST_P(SingleText, IsShortestForItsOwnWidth) {
    EXPECT_EQ(canonicalText(GetParam().value), GetParam().text);
}

INSTANTIATE_TEST_SUITE_P(
    Edges, SingleText,
    testing::Values(SingleCase{0.5f, "0.5"}, SingleCase{1.1f, "1.1"}, SingleCase{0.1f, "0.1"},
                    SingleCase{-2.5f, "-2.5"}, SingleCase{-0.0f, "-0"},
                    SingleCase{16777216.0f, "16777216"}, SingleCase{4194304.5f, "4194304.5"},
                    SingleCase{3e-5f, "3e-5"},
                    SingleCase{std::numeric_limits<float>::max(),
                               "340282346638528859811704183484516925440"},
                    SingleCase{std::numeric_limits<float>::denorm_min(), "1e-45"},
                    SingleCase{std::numeric_limits<float>::quiet_NaN(), "NaN"},
                    SingleCase{-std::numeric_limits<float>::infinity(), "-Inf"}));

TEST(IntegerText, IsExactDecimalAtTheLimitsOfEveryWidth) {
    EXPECT_EQ(canonicalText(std::numeric_limits<signed char>::min()), "-128");
    EXPECT_EQ(canonicalText(std::numeric_limits<unsigned char>::max()), "255");
    EXPECT_EQ(canonicalText(std::numeric_limits<short>::min()), "-32768");
    EXPECT_EQ(canonicalText(std::numeric_limits<unsigned int>::max()), "4294967295");
    EXPECT_EQ(canonicalText(std::numeric_limits<long>::min()), "-9223372036854775808");
    EXPECT_EQ(canonicalText(std::numeric_limits<unsigned long>::max()), "18446744073709551615");
    EXPECT_EQ(canonicalText(true), "1");
    EXPECT_EQ(canonicalText(false), "0");
}

TEST(ShortestText, KeepsExponentsForLargeNonIntegers) {
    EXPECT_EQ(shortestText(1e300), "1e300");
    EXPECT_EQ(shortestText(0x1p64), "18446744073709552000");
    EXPECT_EQ(shortestText(1.5e20f), "1.5e20");
}

}  // namespace
}  // namespace bitcalc
