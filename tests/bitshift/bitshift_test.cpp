// bitshift through its entry point: the shift rule as one table, through a
// scalar count and an array of counts, fresh and in place; random values
// against the reference model one below and at each parallel limit; refused
// calls that write nothing, wherever the bad count stands.
#include "bitfcns/entry_points.hpp"
#include "engine/parallel_limits.hpp"
#include "host/host_control.hpp"
#include "tests/support/model_check.hpp"

#include <cstring>
#include <limits>
#include <random>

namespace {

using namespace testing_support;
namespace limits = bitfcns::limits;

void expectAsModel(const std::vector<const zqArray_tag*>& inputs) {
    expectModelOutcome(reference::Function::bitshift, &ondelBitShiftFcn, inputs);
}

// n elements of class `cls`, each `value`.
zqArraySlot arrayOf(zqClassID cls, long double value, unsigned long n) {
    return host::visitElementClass<host::NumericElements>(
        cls,
        [&]<class Tag>(Tag) {
            using U = typename Tag::type;
            return makeOf(std::vector<U>(n, static_cast<U>(value)));
        },
        []() -> zqArraySlot { return nullptr; });
}

// Rows of the rule, each with a class for its count. A long double holds
// every value and count here exactly; 2^63 + 1 is a count only uint64 holds.
struct Row {
    zqClassID cls, countCls;
    long double value, count, expected;
};

constexpr zqClassID i8 = zqInt8Class, u8 = zqUInt8Class, i16 = zqInt16Class, u16 = zqUInt16Class,
                    i32 = zqInt32Class, u32 = zqUInt32Class, i64 = zqInt64Class,
                    u64 = zqUInt64Class, sgl = zqSingleClass, dbl = zqDoubleClass;
constexpr long double top = 9223372036854775808.0L;  // 2^63

// clang-format off
const Row rows[] = {
    {u8, dbl, 255, 1, 254}, {u8, i8, 255, -1, 127}, {u8, dbl, 255, 7, 128}, {u8, u8, 255, 8, 0},
    {u8, i16, 255, -7, 1}, {u8, dbl, 255, -8, 0}, {u8, dbl, 5, -0.0L, 5}, {u8, i64, 1, -top, 0},
    {i8, i8, 1, 7, -128}, {i8, dbl, -128, 1, 0}, {i8, sgl, -1, 7, -128}, {i8, dbl, -1, 8, 0},
    {i8, i8, -128, -7, -1}, {i8, dbl, -1, -8, -1}, {i8, i8, -1, -127, -1}, {i8, dbl, 127, -7, 0},
    {i8, u64, 5, top + 1, 0}, {i16, u16, 1, 15, -32768}, {i16, dbl, -32768, -16, -1},
    {i16, sgl, -32768, -0.0L, -32768}, {u16, i32, 65535, -15, 1}, {i32, u32, 1, 31, -2147483648.0L},
    {i32, dbl, -7, 1e300, 0}, {i32, dbl, -7, -1e300, -1}, {u32, dbl, 4294967295.0L, 31, 2147483648.0L},
    {i64, i64, 1, 63, -top}, {i64, dbl, 1, 64, 0}, {i64, i8, -1, -64, -1}, {i64, dbl, -top, -1, -top / 2},
    {u64, u64, 1, 63, top}, {u64, dbl, top, -63, 1}, {u64, i8, 2 * top - 1, 0, 2 * top - 1},
};
// clang-format on

TEST(ShiftRule, OneTableThroughBothFormsFreshAndInPlace) {
    constexpr unsigned long n = 37;  // a register body and a tail at every width
    for (const Row& row : rows)
        for (bool scalarCount : {true, false})
            for (bool inPlace : {false, true}) {
                SCOPED_TRACE(testing::Message()
                             << "class " << row.cls << ", value " << row.value << ", count "
                             << row.count << " of class " << row.countCls
                             << (scalarCount ? ", scalar" : ", array")
                             << (inPlace ? ", in place" : ""));
                const auto values = flagged(arrayOf(row.cls, row.value, n), inPlace);
                const auto counts = arrayOf(row.countCls, row.count, scalarCount ? 1 : n);
                const auto expected = arrayOf(row.cls, row.expected, n);
                zqArraySlot result;
                ASSERT_EQ(callEntry(&ondelBitShiftFcn, {values.get(), counts.get()}, &result), "");
                ASSERT_EQ(host::classOf(*result), row.cls);
                EXPECT_EQ(std::memcmp(result->data, expected->data, n * host::elementSize(row.cls)),
                          0);
            }
}

// Scalar counts that shift left and right in registers, one below and at the
// limit of the width (the fills run serially at any size); random counts in
// an array, one below and at their limit.
template <class T>
class EveryValueClass : public ::testing::Test {};
TYPED_TEST_SUITE(EveryValueClass, IntegerTypes);

TYPED_TEST(EveryValueClass, SerialAndParallelRunsFreshAndInPlace) {
    using T = TypeParam;
    constexpr long w = sizeof(T) * 8;
    std::mt19937_64 random(42);
    const unsigned long scalar = limits::leftShift<T>, array = limits::bitshiftCountArray;
    for (unsigned long n : {scalar - 1, scalar, array - 1, array}) {
        std::vector<T> values(n);
        for (T& v : values) v = static_cast<T>(random());
        std::vector<zqArraySlot> countOperands;
        if (n > array) {
            for (double c : {3.0, -3.0}) countOperands.push_back(scalarOf(c));
        } else {
            std::vector<signed char> counts(n);
            for (auto& c : counts)
                c = static_cast<signed char>(long(random() % (2 * w + 5)) - w - 2);
            countOperands.push_back(makeOf(counts));
        }
        for (const auto& counts : countOperands)
            for (bool inPlace : {false, true}) {
                SCOPED_TRACE(testing::Message() << n << (inPlace ? " in place" : " fresh"));
                expectAsModel({flagged(makeOf(values), inPlace).get(), counts.get()});
            }
    }
}

TEST(DoubleValues, SerialAndParallelRunsFreshAndInPlace) {
    const auto int16 = host::makeCharArray(u"int16");
    for (unsigned long n : {limits::bitshiftOnDouble - 1, limits::bitshiftOnDouble}) {
        std::vector<double> values(n), counts(n);
        for (unsigned long i = 0; i < n; ++i) {
            values[i] = static_cast<double>(static_cast<short>(i * 40503));
            counts[i] = static_cast<double>(long(i % 37) - 18);
        }
        for (bool inPlace : {false, true})
            expectAsModel(
                {flagged(makeOf(values), inPlace).get(), makeOf(counts).get(), int16.get()});
    }
}

// Values flagged for sharing, so that any write into them shows.
TEST(Refusals, WriteNothingWhereverTheBadCountStands) {
    for (double bad : {std::numeric_limits<double>::quiet_NaN(), 1.5, -0.5,
                       -std::numeric_limits<double>::infinity(), -8388607.5})
        for (std::size_t at : {0, 5, 8}) {
            SCOPED_TRACE(testing::Message() << bad << " at " << at);
            std::vector<double> counts(9, 2.0);
            counts[at] = bad;
            const auto doubleCounts = makeOf(counts);
            const auto singleCounts = makeOf(std::vector<float>(counts.begin(), counts.end()));
            const auto doubles = flagged(makeOf(std::vector<double>(9, 1.0)));
            const auto integers = flagged(makeOf(std::vector<unsigned char>(9, 1)));
            expectAsModel({doubles.get(), doubleCounts.get()});
            expectAsModel({integers.get(), doubleCounts.get()});
            expectAsModel({integers.get(), singleCounts.get()});
        }
}

}  // namespace
