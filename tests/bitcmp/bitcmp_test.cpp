// bitcmp through its entry point: both paths, all eight assumed classes, the
// order of refusals, results that take over a flagged operand's storage,
// values at the bounds, the rounding of 64-bit complements, and no array
// left behind by a refused call or a failed allocation.
#include "bitfcns/entry_points.hpp"
#include "frame/floating.hpp"
#include "host/array_factory.hpp"
#include "host/host_control.hpp"
#include "tests/support/host_arrays.hpp"

#include <gtest/gtest.h>

#include <cmath>
#include <limits>
#include <new>
#include <string>
#include <vector>

namespace {

using namespace testing_support;

constexpr double nan = std::numeric_limits<double>::quiet_NaN();
constexpr double inf = std::numeric_limits<double>::infinity();

CallOutcome bitcmp(std::vector<const zqArray_tag*> inputs, int nlhs = 1) {
    return callEntry(&ondelBitCmpFcn, std::move(inputs), nlhs);
}

zqArraySlot text(std::u16string_view value) { return host::makeCharArray(value); }

// The name of T's class, as an assumed-type operand spells it.
template <class T>
std::u16string_view classNameOf() {
    constexpr std::u16string_view names[] = {u"int8",  u"uint8",  u"int16", u"uint16",
                                             u"int32", u"uint32", u"int64", u"uint64"};
    return names[classIdOf<T> - zqInt8Class];
}

zqArraySlot flaggedForSharing(zqArraySlot array) {
    host::setWantsSharedResult(*array, true);
    return array;
}

// Integer operands: the complement in their own class, sizes kept, the
// class's own name accepted as second operand, and in place when flagged.
template <class T>
class IntegerOperand : public ::testing::Test {};
using IntegerTypes = ::testing::Types<signed char, unsigned char, short, unsigned short, int,
                                      unsigned int, long, unsigned long>;
TYPED_TEST_SUITE(IntegerOperand, IntegerTypes);

TYPED_TEST(IntegerOperand, ComplementsInItsOwnClass) {
    using T = TypeParam;
    using Limits = std::numeric_limits<T>;
    const std::vector<T> values{Limits::min(), Limits::max(), T(0),
                                T(1),          T(5),          T(Limits::max() - 1)};
    std::vector<T> expected;
    for (T v : values) expected.push_back(static_cast<T>(~v));
    const auto operand = makeOf(values, {2, 1, 3});

    const auto plain = bitcmp({operand.get()});
    ASSERT_EQ(plain.error, "");
    EXPECT_EQ(host::classOf(*plain.result), classIdOf<T>);
    EXPECT_EQ(host::dimensions(*plain.result), (host::Dims{2, 1, 3}));
    EXPECT_EQ(elementsOf<T>(plain.result.get()), expected);

    const auto sameClassNamed = bitcmp({operand.get(), text(classNameOf<T>()).get()});
    ASSERT_EQ(sameClassNamed.error, "");
    EXPECT_EQ(elementsOf<T>(sameClassNamed.result.get()), expected);
    EXPECT_EQ(elementsOf<T>(operand.get()), values);  // not flagged: untouched

    const auto shared = flaggedForSharing(makeOf(values));
    const auto inPlace = bitcmp({shared.get()});
    ASSERT_EQ(inPlace.error, "");
    EXPECT_EQ(host::storageIdentity(*inPlace.result), host::storageIdentity(*shared));
    EXPECT_EQ(elementsOf<T>(shared.get()), expected);
}

// Double operands: one row per assumed class, with the values at its bounds.
struct DoubleCase {
    const char16_t* assumed;  // null: no second operand, "uint64" assumed
    double value;
    double expected;
};

const DoubleCase doubleCases[] = {
    {u"int8", 5, -6},
    {u"int8", -128, 127},
    {u"int8", 127, -128},
    {u"uint8", 5, 250},
    {u"uint8", 255, 0},
    {u"int16", -32768, 32767},
    {u"uint16", 0, 65535},
    {u"int32", -2147483648.0, 2147483647},
    {u"int32", 2147483647, -2147483648.0},
    {u"uint32", 0, 4294967295.0},
    {u"uint32", 4294967295.0, 0},
    {u"int64", 0, -1},
    {u"int64", -9223372036854775808.0, 9223372036854775808.0},  // 2^63 - 1 rounds up
    {u"int64", 9223372036854774784.0, -9223372036854774784.0},  // 1023 - 2^63 rounds up
    {nullptr, 5, 18446744073709551616.0},                       // 2^64 - 6 rounds to 2^64
    {nullptr, 0, 18446744073709551616.0},
    {u"uint64", 18446744073709549568.0, 2047},
    {u"uint64", 9223372036854775808.0, 9223372036854775808.0},  // 2^63 - 1 rounds up
    // Complements just above and exactly at a midpoint between doubles:
    // 2^64 - 3071 rounds up, 2^64 - 3072 goes to the even neighbour below.
    {u"uint64", 3070, 18446744073709549568.0},
    {u"uint64", 3071, 18446744073709547520.0},
};

TEST(DoubleOperand, ComplementInTheAssumedClass) {
    for (const DoubleCase& c : doubleCases) {
        SCOPED_TRACE(
            c.assumed
                ? std::string(c.assumed, c.assumed + std::char_traits<char16_t>::length(c.assumed))
                : std::string("(none)"));
        SCOPED_TRACE(c.value);
        const auto operand = scalarOf(c.value);
        const auto assumed = c.assumed ? text(c.assumed) : nullptr;
        const auto outcome =
            c.assumed ? bitcmp({operand.get(), assumed.get()}) : bitcmp({operand.get()});
        ASSERT_EQ(outcome.error, "");
        EXPECT_EQ(host::classOf(*outcome.result), zqDoubleClass);
        EXPECT_EQ(elementsOf<double>(outcome.result.get()), std::vector<double>{c.expected});
    }
}

// One below the parallel limit and at it give the same bits.
TEST(DoubleOperand, SerialAndParallelRunsAgree) {
    for (unsigned long n : {11999ul, 12000ul}) {
        std::vector<double> values(n);
        for (unsigned long i = 0; i < n; ++i) values[i] = static_cast<double>((i * 7919) % 65536);
        const auto operand = makeOf(values);
        const auto outcome = bitcmp({operand.get(), text(u"uint16").get()});
        ASSERT_EQ(outcome.error, "");
        const auto result = elementsOf<double>(outcome.result.get());
        for (unsigned long i = 0; i < n; ++i)
            ASSERT_EQ(result[i], 65535 - values[i]) << i << " of " << n;
    }
}

TEST(DoubleOperand, InPlaceAndUntouchedWhenRefused) {
    const auto shared = flaggedForSharing(makeOf<double>({1, 2, 3}));
    const auto outcome = bitcmp({shared.get(), text(u"uint8").get()});
    ASSERT_EQ(outcome.error, "");
    EXPECT_EQ(host::storageIdentity(*outcome.result), host::storageIdentity(*shared));
    EXPECT_EQ(elementsOf<double>(shared.get()), (std::vector<double>{254, 253, 252}));

    const auto refused = flaggedForSharing(makeOf<double>({1, 2, 256}));
    EXPECT_EQ(bitcmp({refused.get(), text(u"uint8").get()}).error, "VESPRA:bitcmp:outOfRange");
    EXPECT_EQ(elementsOf<double>(refused.get()), (std::vector<double>{1, 2, 256}));
}

TEST(DoubleOperand, EmptyIsNotScanned) {
    const auto empty = makeOf(std::vector<double>{}, {3, 0});
    const auto outcome = bitcmp({empty.get(), text(u"int8").get()});
    ASSERT_EQ(outcome.error, "");
    EXPECT_EQ(host::dimensions(*outcome.result), (host::Dims{3, 0}));
    EXPECT_EQ(host::classOf(*outcome.result), zqDoubleClass);
}

TEST(DoubleOperand, ComplementOfAComplementOutOfRange) {
    const auto once = bitcmp({scalarOf(5.0).get()});
    ASSERT_EQ(once.error, "");
    EXPECT_EQ(bitcmp({once.result.get()}).error, "VESPRA:bitcmp:outOfRange");
}

// Refusals, each with the identifier that the order of tests gives first.
struct Refusal {
    const char* what;
    std::vector<zqArraySlot> inputs;
    int nlhs;
    std::string expected;
};

zqArraySlot opaque(zqArraySlot array) {
    host::setOpaqueClassId(*array, zqOpaqueClass);
    return array;
}

zqArraySlot sparse(zqArraySlot array) {
    host::setSparse(*array, true);
    return array;
}

template <class T>
zqArraySlot complexOf(T value) {
    auto array = scalarOf(value);
    const T imaginary = T(1);
    host::makeComplex(*array, std::as_bytes(std::span<const T>(&imaginary, 1)));
    return array;
}

std::vector<Refusal> refusals() {
    std::vector<Refusal> cases;
    const auto add = [&](const char* what, std::vector<zqArraySlot> inputs, std::string expected,
                         int nlhs = 1) {
        cases.push_back({what, std::move(inputs), nlhs, std::move(expected)});
    };
    const auto inputs = [](auto... arrays) {
        std::vector<zqArraySlot> list;
        (list.push_back(std::move(arrays)), ...);
        return list;
    };
    add("two outputs before three inputs", inputs(scalarOf(1.0), text(u"int8"), text(u"int8")),
        "VESPRA:maxlhs", 2);
    add("three inputs", inputs(scalarOf(1.0), text(u"int8"), text(u"int8")), "VESPRA:maxrhs");
    add("no input", inputs(), "VESPRA:minrhs");
    add("single", inputs(scalarOf(5.0f)), "VESPRA:bitcmp:firstArgNotInt");
    add("logical", inputs(scalarOf(true)), "VESPRA:bitcmp:firstArgNotInt");
    add("char", inputs(text(u"a")), "VESPRA:bitcmp:firstArgNotInt");
    add("double behind an opaque id", inputs(opaque(scalarOf(5.0))),
        "VESPRA:bitcmp:firstArgNotInt");
    add("sparse logical: class first", inputs(sparse(scalarOf(true))),
        "VESPRA:bitcmp:firstArgNotInt");
    add("sparse complex double", inputs(sparse(complexOf(1.0))), "VESPRA:bitcmp:sparseArgs");
    add("complex double, bad type", inputs(complexOf(1.0), text(u"double")),
        "VESPRA:bitcmp:complexOperands");
    add("double, 'double'", inputs(scalarOf(5.0), text(u"double")),
        "VESPRA:bitcmp:unknownTypeString");
    add("double, 7", inputs(scalarOf(5.0), scalarOf(7.0)), "VESPRA:bitcmp:unknownTypeString");
    add("empty double, 'double'", inputs(makeOf(std::vector<double>{}, {0, 0}), text(u"double")),
        "VESPRA:bitcmp:unknownTypeString");
    add("NaN, bad type: type first", inputs(scalarOf(nan), text(u"single")),
        "VESPRA:bitcmp:unknownTypeString");
    add("NaN", inputs(scalarOf(nan)), "VESPRA:bitcmp:outOfRange");
    add("infinity", inputs(scalarOf(inf), text(u"int64")), "VESPRA:bitcmp:outOfRange");
    add("1.5", inputs(scalarOf(1.5), text(u"int32")), "VESPRA:bitcmp:outOfRange");
    add("-1 unsigned", inputs(scalarOf(-1.0), text(u"uint32")), "VESPRA:bitcmp:outOfRange");
    add("256 uint8", inputs(scalarOf(256.0), text(u"uint8")), "VESPRA:bitcmp:outOfRange");
    add("2^63 int64", inputs(scalarOf(9223372036854775808.0), text(u"int64")),
        "VESPRA:bitcmp:outOfRange");
    add("complex int, bad type", inputs(complexOf<signed char>(5), text(u"double")),
        "VESPRA:bitcmp:complexOperands");
    add("uint8, 'int8'", inputs(scalarOf<unsigned char>(5), text(u"int8")),
        "VESPRA:bitcmp:invalidTypeString");
    add("uint8, 'double'", inputs(scalarOf<unsigned char>(5), text(u"double")),
        "VESPRA:bitcmp:unknownTypeString");
    return cases;
}

TEST(Refusals, FirstFailingTestNamesTheError) {
    for (Refusal& refusal : refusals()) {
        SCOPED_TRACE(refusal.what);
        std::vector<const zqArray_tag*> inputs;
        for (const auto& input : refusal.inputs) inputs.push_back(input.get());
        const std::size_t liveBefore = host::liveArrayCount();
        const auto outcome = bitcmp(inputs, refusal.nlhs);
        EXPECT_EQ(outcome.error, refusal.expected);
        EXPECT_EQ(outcome.result, nullptr);
        EXPECT_EQ(host::liveArrayCount(), liveBefore) << "an array was left behind";
    }
}

TEST(Refusals, SparseIntegerIsComplemented) {
    const auto operand = sparse(scalarOf<unsigned char>(5));
    const auto outcome = bitcmp({operand.get()});
    ASSERT_EQ(outcome.error, "");
    EXPECT_EQ(elementsOf<unsigned char>(outcome.result.get()), std::vector<unsigned char>{250});
}

TEST(Refusals, AllocationFailureLeavesNothingBehind) {
    for (bool shareable : {false, true})
        for (zqClassID cls : {zqDoubleClass, zqInt16Class}) {
            SCOPED_TRACE(testing::Message() << "class " << cls << (shareable ? ", flagged" : ""));
            auto operand = host::makeArray(cls, {2, 2});
            host::setWantsSharedResult(*operand, shareable);
            const std::size_t liveBefore = host::liveArrayCount();
            zqArraySlot result;
            const zqArray_tag* inputs[] = {operand.get()};
            host::failNextAllocations(1);
            EXPECT_THROW(ondelBitCmpFcn(1, &result, 1, inputs), std::bad_alloc);
            host::failNextAllocations(0);
            EXPECT_EQ(result, nullptr);
            EXPECT_EQ(host::liveArrayCount(), liveBefore);
        }
}

}  // namespace
