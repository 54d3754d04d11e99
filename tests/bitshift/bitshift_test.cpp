// bitshift through its entry point: the shift rule as one table, through a
// scalar count and an array of counts of every class that holds the count,
// fresh and in place; random values against a reference model one below and
// at each parallel limit; refused calls that write nothing; allocation
// failures that leave nothing behind. The order of refusals is in the
// golden case file.
#include "bitfcns/entry_points.hpp"
#include "engine/parallel_limits.hpp"
#include "host/array_factory.hpp"
#include "host/host_control.hpp"
#include "tests/support/host_arrays.hpp"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <limits>
#include <new>
#include <random>
#include <utility>
#include <vector>

namespace {

using namespace testing_support;

CallOutcome bitshift(std::vector<const zqArray_tag*> inputs) {
    return callEntry(&ondelBitShiftFcn, std::move(inputs));
}

zqArraySlot flagged(zqArraySlot array, bool inPlace = true) {
    host::setWantsSharedResult(*array, inPlace);
    return array;
}

// The shift rule by arithmetic instead of shifts: a left shift multiplies
// modulo 2^64 and truncates, a right shift divides, rounding down.
template <class T>
T referenceShift(T x, long c) {
    using Bits = std::uint64_t;
    constexpr long w = sizeof(T) * 8;
    if (c >= w) return T(0);
    if (c <= -w) return std::cmp_less(x, 0) ? T(-1) : T(0);
    if (c >= 0) return static_cast<T>(static_cast<Bits>(x) * (Bits{1} << c));
    const Bits divisor = Bits{1} << -c;
    if (std::cmp_less(x, 0)) return static_cast<T>(~(static_cast<Bits>(~x) / divisor));
    return static_cast<T>(static_cast<Bits>(x) / divisor);
}

// Rows of the rule. A long double holds every value and count here exactly,
// 64-bit ones included; 2^63 + 1 is a count only uint64 holds, 1e300 one
// only double holds.
struct Row {
    zqClassID cls;
    long double value, count, expected;
};

constexpr zqClassID i8 = zqInt8Class, u8 = zqUInt8Class, i16 = zqInt16Class, u16 = zqUInt16Class,
                    i32 = zqInt32Class, u32 = zqUInt32Class, i64 = zqInt64Class,
                    u64 = zqUInt64Class;
constexpr long double top = 9223372036854775808.0L;  // 2^63

// clang-format off
const Row rows[] = {
    {u8, 255, 1, 254}, {u8, 255, -1, 127}, {u8, 255, 7, 128}, {u8, 255, 8, 0}, {u8, 255, -7, 1},
    {u8, 255, -8, 0}, {u8, 5, -0.0L, 5}, {u8, 1, -top, 0}, {i8, 1, 7, -128}, {i8, 64, 1, -128},
    {i8, -128, 1, 0}, {i8, -1, 1, -2}, {i8, -1, 7, -128}, {i8, -1, 8, 0}, {i8, -128, -7, -1},
    {i8, -1, -1, -1}, {i8, -1, -8, -1}, {i8, -1, -127, -1}, {i8, 127, -7, 0}, {i8, 127, -8, 0},
    {i8, -1, -top, -1}, {i8, 5, top + 1, 0}, {i16, 1, 15, -32768}, {i16, -32768, -15, -1},
    {i16, -32768, -16, -1}, {i16, -1, 16, 0}, {i16, -32768, -0.0L, -32768}, {u16, 65535, -15, 1},
    {u16, 65535, 16, 0}, {i32, 1, 31, -2147483648.0L}, {i32, -2147483648.0L, -32, -1},
    {i32, -7, 1e300, 0}, {i32, -7, -1e300, -1}, {u32, 4294967295.0L, 31, 2147483648.0L},
    {u32, 4294967295.0L, -32, 0}, {i64, 1, 63, -top}, {i64, 1, 64, 0}, {i64, -1, -63, -1},
    {i64, -1, -64, -1}, {i64, -top, -1, -top / 2}, {u64, 1, 63, top}, {u64, 1, 64, 0},
    {u64, top, -63, 1}, {u64, 2 * top - 1, 0, 2 * top - 1},
};
// clang-format on

// Whether class U holds the count exactly.
template <class U>
bool holds(long double count) {
    using Limits = std::numeric_limits<U>;
    if (std::fabs(count) > static_cast<long double>(Limits::max())) return false;
    if constexpr (Limits::is_integer) return count >= static_cast<long double>(Limits::min());
    return static_cast<long double>(static_cast<U>(count)) == count;
}

// n elements: a register body and a tail at every width.
template <class T, class U>
void checkRow(const Row& row) {
    constexpr unsigned long n = 37;
    const auto values = std::vector<T>(n, static_cast<T>(row.value));
    const U count = static_cast<U>(row.count);
    const auto expected = std::vector<T>(n, static_cast<T>(row.expected));
    for (bool scalarCount : {true, false})
        for (bool inPlace : {false, true}) {
            SCOPED_TRACE(testing::Message()
                         << "count class " << classIdOf<U> << (scalarCount ? ", scalar" : ", array")
                         << (inPlace ? ", in place" : ""));
            const auto operand = flagged(makeOf(values), inPlace);
            const auto counts = scalarCount ? scalarOf(count) : makeOf(std::vector<U>(n, count));
            const auto outcome = bitshift({operand.get(), counts.get()});
            ASSERT_EQ(outcome.error, "");
            EXPECT_EQ(host::classOf(*outcome.result), classIdOf<T>);
            EXPECT_EQ(elementsOf<T>(outcome.result.get()), expected);
        }
}

template <class T, class... Counts>
void checkRowForEachCountClass(const Row& row, host::TagList<Counts...>) {
    ((holds<typename Counts::type>(row.count) ? checkRow<T, typename Counts::type>(row) : void()),
     ...);
}

TEST(ShiftRule, OneTableThroughBothFormsAndEveryCountClass) {
    for (const Row& row : rows) {
        SCOPED_TRACE(testing::Message()
                     << "class " << row.cls << ", value " << row.value << ", count " << row.count);
        host::visitElementClass<host::IntegerElements>(
            row.cls,
            [&]<class Tag>(Tag) {
                using T = typename Tag::type;
                const long clamped = static_cast<long>(std::clamp(row.count, -1e3L, 1e3L));
                ASSERT_EQ(referenceShift(static_cast<T>(row.value), clamped),
                          static_cast<T>(row.expected));
                checkRowForEachCountClass<T>(row, host::NumericElements{});
            },
            [] { FAIL() << "no integer class"; });
    }
}

// Random values: scalar counts that shift left and right by SIMD (right by
// a plain serial loop for int64), fill with zeros and with signs, at one
// below and at the parallel limit of the width; random counts in an array
// at one below and at its limit.
template <class T>
class EveryValueClass : public ::testing::Test {};
using IntegerTypes = ::testing::Types<signed char, unsigned char, short, unsigned short, int,
                                      unsigned int, long, unsigned long>;
TYPED_TEST_SUITE(EveryValueClass, IntegerTypes);

template <class T, class U>
void checkAgainstReference(const std::vector<T>& values, const std::vector<U>& counts) {
    for (bool inPlace : {false, true}) {
        const auto operand = flagged(makeOf(values), inPlace);
        const auto countArray = makeOf(counts);
        const auto outcome = bitshift({operand.get(), countArray.get()});
        ASSERT_EQ(outcome.error, "");
        EXPECT_EQ(host::storageIdentity(*outcome.result) == host::storageIdentity(*operand),
                  inPlace);
        const auto result = elementsOf<T>(outcome.result.get());
        for (std::size_t i = 0; i < values.size(); ++i)
            ASSERT_EQ(result[i], referenceShift(values[i], counts[counts.size() == 1 ? 0 : i]))
                << "element " << i << " of " << values.size() << (inPlace ? ", in place" : "");
    }
}

TYPED_TEST(EveryValueClass, SerialAndParallelRunsFollowTheRule) {
    using T = TypeParam;
    constexpr long w = sizeof(T) * 8;
    std::mt19937_64 random(42);
    const auto randomValues = [&](unsigned long n) {
        std::vector<T> values(n);
        for (T& v : values) v = static_cast<T>(random());
        return values;
    };
    const unsigned long scalarLimit = bitfcns::limits::leftShift<T>;
    for (unsigned long n : {scalarLimit - 1, scalarLimit}) {
        const auto values = randomValues(n);
        for (long c : {3l, -3l, w, -w}) {
            SCOPED_TRACE(testing::Message() << "scalar count " << c);
            checkAgainstReference(values, std::vector<double>{static_cast<double>(c)});
        }
    }
    const unsigned long arrayLimit = bitfcns::limits::bitshiftCountArray;
    for (unsigned long n : {arrayLimit - 1, arrayLimit}) {
        std::vector<signed char> counts(n);
        for (auto& c : counts) c = static_cast<signed char>(long(random() % (2 * w + 5)) - w - 2);
        checkAgainstReference(randomValues(n), counts);
    }
}

// Double values: one below and at the limit, fresh and in place, against
// the rule in int16.
TEST(DoubleValues, SerialAndParallelRunsFollowTheRule) {
    const auto int16 = host::makeCharArray(u"int16");
    for (unsigned long n :
         {bitfcns::limits::bitshiftOnDouble - 1, bitfcns::limits::bitshiftOnDouble})
        for (bool inPlace : {false, true}) {
            std::vector<double> values(n), counts(n);
            for (unsigned long i = 0; i < n; ++i) {
                values[i] = static_cast<double>(static_cast<short>(i * 40503));
                counts[i] = static_cast<double>(long(i % 37) - 18);
            }
            const auto operand = flagged(makeOf(values), inPlace);
            const auto outcome = bitshift({operand.get(), makeOf(counts).get(), int16.get()});
            ASSERT_EQ(outcome.error, "");
            const auto result = elementsOf<double>(outcome.result.get());
            for (unsigned long i = 0; i < n; ++i)
                ASSERT_EQ(result[i], referenceShift(static_cast<short>(values[i]),
                                                    static_cast<long>(counts[i])))
                    << i << " of " << n;
        }
}

// A refused call writes nothing, also into values whose storage it shares,
// wherever the bad count stands among nine.
TEST(Refusals, NothingWrittenInPlace) {
    const std::vector<double> doubleValues(9, 1.0);
    const std::vector<unsigned char> integerValues(9, 1);
    for (double bad : {std::numeric_limits<double>::quiet_NaN(), 1.5, -0.5,
                       -std::numeric_limits<double>::infinity(), -8388607.5})
        for (std::size_t at : {0, 3, 5, 8}) {
            SCOPED_TRACE(testing::Message() << bad << " at " << at);
            std::vector<double> counts(9, 2.0);
            counts[at] = bad;
            std::vector<float> singleCounts(counts.begin(), counts.end());
            const auto doubles = flagged(makeOf(doubleValues));
            const auto integers = flagged(makeOf(integerValues));
            const auto doubleCounts = makeOf(counts);
            const auto floatCounts = makeOf(singleCounts);
            for (auto [values, countArray] : {std::pair{doubles.get(), doubleCounts.get()},
                                              {integers.get(), doubleCounts.get()},
                                              {integers.get(), floatCounts.get()}}) {
                const std::size_t liveBefore = host::liveArrayCount();
                EXPECT_EQ(bitshift({values, countArray}).error,
                          "VESPRA:bitshift:inputsMustBeIntegers");
                EXPECT_EQ(host::liveArrayCount(), liveBefore);
            }
            EXPECT_EQ(elementsOf<double>(doubles.get()), doubleValues);
            EXPECT_EQ(elementsOf<unsigned char>(integers.get()), integerValues);
        }
}

// An allocation failure at each step (the conversion of integer counts for
// double values, the result) raises and leaves no array behind.
TEST(Refusals, AllocationFailureLeavesNothingBehind) {
    const auto doubleValues = makeOf<double>({1, 2});
    const auto integerValues = makeOf<short>({1, 2});
    const auto counts = makeOf<short>({1, 2});
    for (const zqArray_tag* values : {doubleValues.get(), integerValues.get()}) {
        std::size_t successes = 0;
        for (;; ++successes) {
            const std::size_t liveBefore = host::liveArrayCount();
            host::failNextAllocations(1, successes);
            const auto outcome = bitshift({values, counts.get()});
            host::failNextAllocations(0);
            if (outcome.error.empty()) break;
            EXPECT_EQ(outcome.error, foundation::core::except::bad_alloc().what());
            EXPECT_EQ(outcome.result, nullptr);
            EXPECT_EQ(host::liveArrayCount(), liveBefore);
        }
        EXPECT_GE(successes, values == doubleValues.get() ? 2u : 1u);
    }
}

}  // namespace
