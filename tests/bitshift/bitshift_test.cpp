// bitshift through its entry point against the reference model: random values
// one below and at each parallel limit, through a scalar count and an array of
// counts, fresh and in place, and doubles at the edges of every class by every
// count. Refused calls, which must write nothing, are checked by the fuzz
// target.
#include "bitfcns/entry_points.hpp"
#include "engine/parallel_limits.hpp"
#include "host/host_control.hpp"
#include "tests/support/model_check.hpp"

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
    const auto [pairedValues, counts] = pairedWithEach(edges, -width - 1, width + 1);
    expectAsModel({pairedValues.get(), counts.get(), type.get()});
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

}  // namespace
