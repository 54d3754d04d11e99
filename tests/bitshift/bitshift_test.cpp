// bitshift through its entry point against the reference model: random values
// one below and at each parallel limit, through a scalar count and an array of
// counts, fresh and in place; refused calls that write nothing, wherever the
// bad count stands.
#include "bitfcns/entry_points.hpp"
#include "engine/parallel_limits.hpp"
#include "host/host_control.hpp"
#include "tests/support/model_check.hpp"

#include <limits>
#include <random>

namespace {

using namespace testing_support;
namespace limits = bitfcns::limits;

void expectAsModel(const std::vector<const zqArray_tag*>& inputs) {
    expectModelOutcome(reference::Function::bitshift, &ondelBitShiftFcn, inputs);
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

// Doubles at the edges of T by every count within the width and one beyond:
// one count for all, then arrays that pair each edge with every count in
// turn, so that neighbouring elements shift by different counts and ways.
TYPED_TEST(EveryValueClass, DoubleEdgesByEveryCount) {
    constexpr double width = sizeof(TypeParam) * 8;
    const std::vector<double> edges = edgeDoublesOf<TypeParam>();
    const auto values = makeOf(edges), type = classNameOf<TypeParam>();
    for (double c = -width - 1; c <= width + 1; ++c)
        expectAsModel({values.get(), scalarOf(c).get(), type.get()});
    std::vector<double> pairedValues, pairedCounts;
    for (double x : edges)
        for (double c = -width - 1; c <= width + 1; ++c) {
            pairedValues.push_back(x);
            pairedCounts.push_back(c);
        }
    expectAsModel({makeOf(pairedValues).get(), makeOf(pairedCounts).get(), type.get()});
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
