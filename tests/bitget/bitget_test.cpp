// bitget through its entry point: every position class against every value
// class, the double path in each assumed class, the order of refusals, the
// boundaries of the scans, serial against parallel runs at each limit, and
// results that take over a flagged operand's storage.
#include "bitfcns/entry_points.hpp"
#include "host/array_factory.hpp"
#include "host/host_control.hpp"
#include "tests/support/host_arrays.hpp"

#include <gtest/gtest.h>

#include <cstdint>
#include <limits>
#include <new>
#include <random>
#include <string>
#include <type_traits>
#include <vector>

namespace {

using namespace testing_support;

constexpr double nan = std::numeric_limits<double>::quiet_NaN();
constexpr double inf = std::numeric_limits<double>::infinity();

CallOutcome bitget(std::vector<const zqArray_tag*> inputs, int nlhs = 1) {
    return callEntry(&ondelBitGetFcn, std::move(inputs), nlhs);
}

zqArraySlot text(std::u16string_view value) { return host::makeCharArray(value); }

zqArraySlot flagged(zqArraySlot array) {
    host::setWantsSharedResult(*array, true);
    return array;
}

template <class T>
constexpr int widthOf = static_cast<int>(sizeof(T) * 8);

// Bit p - 1 of a's stored pattern, in 64-bit arithmetic.
template <class T>
T bitModel(T a, int p) {
    const auto pattern = static_cast<std::uint64_t>(static_cast<std::make_unsigned_t<T>>(a));
    return static_cast<T>((pattern >> (p - 1)) & 1);
}

template <class T>
std::vector<T> randomValues(std::size_t n, std::uint64_t seed) {
    std::vector<T> values{std::numeric_limits<T>::min(), std::numeric_limits<T>::max(), T(0)};
    std::mt19937_64 random(seed);
    while (values.size() < n) values.push_back(static_cast<T>(random()));
    values.resize(n);
    return values;
}

// The ten numeric classes a position may have.
constexpr zqClassID positionClasses[] = {zqInt8Class,   zqUInt8Class,  zqInt16Class, zqUInt16Class,
                                         zqInt32Class,  zqUInt32Class, zqInt64Class, zqUInt64Class,
                                         zqSingleClass, zqDoubleClass};

// Positions given as doubles, converted by the host to class `cls` (rounded
// and saturated for the integer classes).
zqArraySlot positionsOf(std::vector<double> values, zqClassID cls, host::Dims dims = {}) {
    const auto doubles = makeOf(values, std::move(dims));
    return zqArraySlot(matrix::convert_if_needed(doubles.get(), cls).detach());
}

template <class T>
class IntegerValues : public ::testing::Test {
protected:
    void SetUp() override { liveBefore_ = host::liveArrayCount(); }
    void TearDown() override { EXPECT_EQ(host::liveArrayCount(), liveBefore_) << "arrays leaked"; }

private:
    std::size_t liveBefore_ = 0;
};
using IntegerTypes = ::testing::Types<signed char, unsigned char, short, unsigned short, int,
                                      unsigned int, long, unsigned long>;
TYPED_TEST_SUITE(IntegerValues, IntegerTypes);

TYPED_TEST(IntegerValues, EveryPositionClassReadsTheBitsOfTheValueClass) {
    using T = TypeParam;
    constexpr int width = widthOf<T>;
    const std::vector<T> values = randomValues<T>(2 * width, 1);
    const auto a = makeOf(values, {2, static_cast<unsigned long>(width)});
    std::vector<double> positions;
    for (int i = 0; i < 2 * width; ++i) positions.push_back(i % width + 1);
    for (zqClassID cls : positionClasses) {
        SCOPED_TRACE(testing::Message() << "position class " << cls);
        const auto p = positionsOf(positions, cls, {2, static_cast<unsigned long>(width)});
        const auto arrays = bitget({a.get(), p.get()});
        ASSERT_EQ(arrays.error, "");
        EXPECT_EQ(host::classOf(*arrays.result), classIdOf<T>);
        EXPECT_EQ(host::dimensions(*arrays.result), host::dimensions(*a));
        const auto bits = elementsOf<T>(arrays.result.get());
        for (std::size_t i = 0; i < values.size(); ++i)
            ASSERT_EQ(bits[i], bitModel(values[i], i % width + 1)) << i;

        for (int position : {1, width / 2, width}) {
            const auto scalar = bitget({a.get(), positionsOf({double(position)}, cls).get()});
            ASSERT_EQ(scalar.error, "");
            const auto got = elementsOf<T>(scalar.result.get());
            for (std::size_t i = 0; i < values.size(); ++i)
                ASSERT_EQ(got[i], bitModel(values[i], position)) << position << ", " << i;
        }

        // A scalar value with positions: the result has the positions' sizes.
        const auto minimum = scalarOf(std::numeric_limits<T>::min());
        const auto column = positionsOf(positions, cls, {static_cast<unsigned long>(2 * width), 1});
        const auto spread = bitget({minimum.get(), column.get()});
        ASSERT_EQ(spread.error, "");
        EXPECT_EQ(host::dimensions(*spread.result), host::dimensions(*column));
        const auto signBits = elementsOf<T>(spread.result.get());
        for (std::size_t i = 0; i < signBits.size(); ++i)
            ASSERT_EQ(signBits[i], bitModel(std::numeric_limits<T>::min(), i % width + 1));
    }
}

TYPED_TEST(IntegerValues, PositionsOutsideOneToTheWidthAreRefused) {
    using T = TypeParam;
    constexpr double width = widthOf<T>;
    const auto a = flagged(makeOf<T>({1, 2, 3}));
    const auto empty = makeOf<T>({}, {0, 3});
    for (zqClassID cls : positionClasses) {
        SCOPED_TRACE(testing::Message() << "position class " << cls);
        // Negative values and NaN become 0 in the unsigned classes, 255 becomes
        // 127 in int8; fractions survive only in single and double.
        std::vector<double> bad{0, width + 1, 127, 255, -1, nan, inf, -inf};
        if (cls == zqSingleClass || cls == zqDoubleClass) bad.insert(bad.end(), {1.5, width - 0.5});
        for (double position : bad) {
            SCOPED_TRACE(position);
            const auto scalar = positionsOf({position}, cls);
            EXPECT_EQ(bitget({a.get(), scalar.get()}).error, "VESPRA:bitSetGet:BITOutOfRange");
            // The last position of an array is read before any value is written.
            const auto p = positionsOf({1, width, position}, cls);
            EXPECT_EQ(bitget({a.get(), p.get()}).error, "VESPRA:bitSetGet:BITOutOfRange");
            EXPECT_EQ(elementsOf<T>(a.get()), (std::vector<T>{1, 2, 3}));
            // A scalar position is tested even when there are no values.
            EXPECT_EQ(bitget({empty.get(), scalar.get()}).error, "VESPRA:bitSetGet:BITOutOfRange");
        }
        const auto none = bitget({empty.get(), positionsOf({}, cls, {0, 3}).get()});
        ASSERT_EQ(none.error, "");
        EXPECT_EQ(host::dimensions(*none.result), (host::Dims{0, 3}));
    }
}

// Below and at each parallel limit, fresh and in place, the bits agree with
// the scalar model: one position through the SIMD family (the limit falls
// with the width), an array of positions through the plain loop.
TYPED_TEST(IntegerValues, SerialAndParallelRunsAgreeFreshAndInPlace) {
    using T = TypeParam;
    constexpr int width = widthOf<T>;
    constexpr unsigned long oneBitLimit = sizeof(T) == 1   ? 4500000
                                          : sizeof(T) == 2 ? 3500000
                                          : sizeof(T) == 4 ? 2000000
                                                           : 1000000;
    for (unsigned long n : {oneBitLimit - 1, oneBitLimit, 29999ul, 30000ul}) {
        const bool positionArray = n < 100000;
        const std::vector<T> values = randomValues<T>(n, n);
        std::vector<double> positions(positionArray ? n : 1, double(width));
        for (std::size_t i = 0; i < positions.size() && positionArray; ++i)
            positions[i] = static_cast<double>(i * 7 % width + 1);
        const auto p = makeOf(positions);
        for (bool inPlace : {false, true}) {
            SCOPED_TRACE(testing::Message() << n << (inPlace ? " in place" : " fresh"));
            const auto a = makeOf(values);
            host::setWantsSharedResult(*a, inPlace);
            const auto outcome = bitget({a.get(), p.get()});
            ASSERT_EQ(outcome.error, "");
            EXPECT_EQ(host::storageIdentity(*outcome.result) == host::storageIdentity(*a), inPlace);
            const auto bits = elementsOf<T>(outcome.result.get());
            for (std::size_t i = 0; i < n; ++i) {
                const int position = static_cast<int>(positions[positionArray ? i : 0]);
                ASSERT_EQ(bits[i], bitModel(values[i], position)) << i;
            }
        }
    }
}

// Below and at the limit, a scalar value or position against arrays, fresh
// and in place.
TEST(DoubleValues, SerialAndParallelRunsAgree) {
    for (unsigned long n : {7999ul, 8000ul}) {
        std::vector<double> values(n), positions(n);
        for (unsigned long i = 0; i < n; ++i) {
            values[i] = static_cast<double>(i * 2654435761u % 65536) - 32768;
            positions[i] = static_cast<double>(i % 16 + 1);
        }
        const auto expected = [&](double v, double p) {
            return double(
                (static_cast<std::uint16_t>(static_cast<int>(v)) >> (static_cast<int>(p) - 1)) & 1);
        };
        const auto int16 = text(u"int16");
        const auto p = makeOf(positions);
        const auto five = scalarOf(5.0);
        const auto spread = bitget({five.get(), p.get(), int16.get()});
        ASSERT_EQ(spread.error, "");
        for (bool inPlace : {false, true}) {
            const auto a = makeOf(values);
            host::setWantsSharedResult(*a, inPlace);
            const auto arrays = bitget({a.get(), p.get(), int16.get()});
            ASSERT_EQ(arrays.error, "");
            EXPECT_EQ(host::storageIdentity(*arrays.result) == host::storageIdentity(*a), inPlace);
            const auto bits = elementsOf<double>(arrays.result.get());
            const auto spreadBits = elementsOf<double>(spread.result.get());
            for (unsigned long i = 0; i < n; ++i) {
                ASSERT_EQ(bits[i], expected(values[i], positions[i])) << n << ", " << i;
                ASSERT_EQ(spreadBits[i], expected(5, positions[i])) << n << ", " << i;
            }
        }
    }
}

// Refusals whose point the evaluator can't show: the double path has put its
// result into the slot before it tests the assumed type and the elements; a
// double value with integer positions keeps it in a local slot instead. No
// array is left behind either way. (The order of reports is in bitget.case.)
struct Refusal {
    const char* what;
    std::vector<zqArraySlot> inputs;
    std::string expected;
    bool resultInSlot;
};

template <class... Arrays>
std::vector<zqArraySlot> inputs(Arrays... arrays) {
    std::vector<zqArraySlot> list;
    (list.push_back(std::move(arrays)), ...);
    return list;
}

std::vector<Refusal> refusals() {
    const auto d = [](std::vector<double> v, host::Dims dims = {}) { return makeOf(v, dims); };
    const auto u8 = [](std::vector<unsigned char> v) { return makeOf(v); };
    std::vector<Refusal> cases;
    const auto add = [&](const char* what, std::vector<zqArraySlot> in, std::string expected,
                         bool resultInSlot) {
        cases.push_back({what, std::move(in), std::move(expected), resultInSlot});
    };
    add("sizes differ, bad type", inputs(d({1, 2}), d({1, 2, 3}), text(u"int7")),
        "VESPRA:bitget:sizeMismatch", false);
    add("'double', bad value", inputs(d({-1}), d({1}), text(u"double")),
        "VESPRA:bitget:unknownTypeString", true);
    add("bad value, bad position", inputs(d({1, 256}), d({9, 1}), text(u"uint8")),
        "VESPRA:bitget:outOfRange", true);
    add("empty values, bad scalar position", inputs(d({}, {0, 2}), d({0})),
        "VESPRA:bitSetGet:BITOutOfRange", true);
    add("integer positions, bad type", inputs(d({5}), u8({1}), text(u"int7")),
        "VESPRA:bitget:unknownTypeString", false);
    add("integer position 9 of uint8", inputs(d({5}), u8({9}), text(u"uint8")),
        "VESPRA:bitSetGet:BITOutOfRange", false);
    add("integer values, bad type", inputs(u8({5}), d({1}), text(u"int7")),
        "VESPRA:bitget:unknownTypeString", false);
    add("integer values, position 9", inputs(u8({5}), d({9})), "VESPRA:bitSetGet:BITOutOfRange",
        false);
    return cases;
}

TEST(Refusals, FirstFailingTestNamesTheError) {
    for (Refusal& refusal : refusals()) {
        SCOPED_TRACE(refusal.what);
        std::vector<const zqArray_tag*> in;
        for (const auto& input : refusal.inputs) in.push_back(input.get());
        const std::size_t liveBefore = host::liveArrayCount();
        {
            const auto outcome = bitget(in);
            EXPECT_EQ(outcome.error, refusal.expected);
            EXPECT_EQ(outcome.result != nullptr, refusal.resultInSlot);
        }
        EXPECT_EQ(host::liveArrayCount(), liveBefore) << "an array was left behind";
    }
}

TEST(Refusals, RefusedCallsLeaveFlaggedStorageAsItWas) {
    const auto doubles = flagged(makeOf<double>({1, 2, 3}));
    EXPECT_EQ(bitget({doubles.get(), makeOf<double>({1, 2, 0}).get()}).error,
              "VESPRA:bitSetGet:BITOutOfRange");
    EXPECT_EQ(bitget({doubles.get(), scalarOf(1.0).get(), text(u"int7").get()}).error,
              "VESPRA:bitget:unknownTypeString");
    EXPECT_EQ(elementsOf<double>(doubles.get()), (std::vector<double>{1, 2, 3}));

    const auto shared = bitget({doubles.get(), scalarOf(2.0).get()});
    ASSERT_EQ(shared.error, "");
    EXPECT_EQ(host::storageIdentity(*shared.result), host::storageIdentity(*doubles));
    EXPECT_EQ(elementsOf<double>(doubles.get()), (std::vector<double>{0, 1, 1}));

    // A scalar never gives up its storage.
    const auto scalar = flagged(scalarOf<unsigned char>(6));
    const auto fresh = bitget({scalar.get(), scalarOf(2.0).get()});
    ASSERT_EQ(fresh.error, "");
    EXPECT_NE(host::storageIdentity(*fresh.result), host::storageIdentity(*scalar));
    EXPECT_EQ(elementsOf<unsigned char>(scalar.get()), std::vector<unsigned char>{6});
}

TEST(Refusals, AllocationFailureAtEachStepLeavesNothingBehind) {
    const auto u8 = makeOf<unsigned char>({5, 6});
    const auto d = makeOf<double>({5, 6});
    const auto positions = makeOf<unsigned char>({1, 2});
    for (const zqArray_tag* values : {u8.get(), d.get()}) {
        std::size_t successes = 0;
        for (; successes < 8; ++successes) {
            SCOPED_TRACE(testing::Message() << "class " << values->classId << ", after "
                                            << successes << " allocations");
            const std::size_t liveBefore = host::liveArrayCount();
            zqArraySlot slot;
            const zqArray_tag* in[] = {values, positions.get()};
            host::failNextAllocations(1, successes);
            bool failed = false;
            try {
                ondelBitGetFcn(1, &slot, 2, in);
            } catch (const std::bad_alloc&) {
                failed = true;
            }
            host::failNextAllocations(0);
            if (!failed) break;
            EXPECT_EQ(slot, nullptr);
            EXPECT_EQ(host::liveArrayCount(), liveBefore);
        }
        EXPECT_GE(successes, values == d.get() ? 2u : 1u);  // the conversion, then the result
    }
}

}  // namespace
