// bitget through its entry point: every position class against every value
// class, the boundaries of the position scans, serial against parallel runs
// at each limit, results that take over a flagged operand's storage, and what
// a refused call leaves. Results and refusals seen from outside are in
// tests/golden/bitget.case.
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

// What the evaluator can't show of a refusal: the double path has put its
// result into the slot before it tests the assumed type and the elements; a
// double value with integer positions, and the integer path, keep it in a
// local slot. No array is left behind either way. (The order of reports is
// in bitget.case.)
TEST(Refusals, TheSlotHoldsTheResultOnlyWhereTheDoublePathPutItThere) {
    const auto d = [](std::vector<double> v, host::Dims dims = {}) { return makeOf(v, dims); };
    const auto u8 = [](std::vector<unsigned char> v) { return makeOf(v); };
    const auto check = [](std::string expected, bool resultInSlot, zqArraySlot a, zqArraySlot p,
                          zqArraySlot type = nullptr) {
        SCOPED_TRACE(expected);
        const std::size_t liveBefore = host::liveArrayCount();
        {
            const auto outcome =
                type ? bitget({a.get(), p.get(), type.get()}) : bitget({a.get(), p.get()});
            EXPECT_EQ(outcome.error, expected);
            EXPECT_EQ(outcome.result != nullptr, resultInSlot);
        }
        EXPECT_EQ(host::liveArrayCount(), liveBefore) << "an array left behind";
    };
    check("VESPRA:bitget:sizeMismatch", false, d({1, 2}), d({1, 2, 3}), text(u"int7"));
    check("VESPRA:bitget:unknownTypeString", true, d({-1}), d({1}), text(u"double"));
    check("VESPRA:bitget:outOfRange", true, d({1, 256}), d({9, 1}), text(u"uint8"));
    check("VESPRA:bitSetGet:BITOutOfRange", true, d({}, {0, 2}), d({0}));
    check("VESPRA:bitSetGet:BITOutOfRange", false, d({5}), u8({9}), text(u"uint8"));
    check("VESPRA:bitSetGet:BITOutOfRange", false, u8({5}), d({9}));
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
