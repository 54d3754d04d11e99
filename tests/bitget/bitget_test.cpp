// bitget through its entry point against the reference model: one below and
// at each parallel limit, fresh and in place (one position by the SIMD
// family, an array of positions by the plain loop, double values under an
// assumed type), and doubles at the edges of every class. Every class
// pairing, and refused calls (nothing written into flagged storage, the slot
// filled only where the model fills it), are checked by the fuzz target.
#include "bitfcns/entry_points.hpp"
#include "engine/parallel_limits.hpp"
#include "host/host_control.hpp"
#include "tests/support/model_check.hpp"

#include <random>

namespace {

using namespace testing_support;
namespace limits = bitfcns::limits;

void expectAsModel(const std::vector<const zqArray_tag*>& inputs) {
    expectModelOutcome(reference::Function::bitget, &ondelBitGetFcn, inputs);
}

// Positions 1 to the width in turn, as doubles.
std::vector<double> positions(unsigned long n, unsigned width) {
    std::vector<double> p(n);
    for (unsigned long i = 0; i < n; ++i) p[i] = static_cast<double>(i * 7 % width + 1);
    return p;
}

template <class T>
class IntegerValues : public ::testing::Test {};
TYPED_TEST_SUITE(IntegerValues, IntegerTypes);

TYPED_TEST(IntegerValues, SerialAndParallelRunsFreshAndInPlace) {
    using T = TypeParam;
    constexpr unsigned width = sizeof(T) * 8;
    const unsigned long oneBit = limits::getOneBit<T>, array = limits::bitgetPositionArray;
    std::mt19937_64 random(width);
    for (unsigned long n : {oneBit - 1, oneBit, array - 1, array}) {
        std::vector<T> values(n);
        for (T& v : values) v = static_cast<T>(random());
        const auto p = n < array + 1 ? makeOf(positions(n, width)) : scalarOf(double(width));
        for (bool inPlace : {false, true}) {
            SCOPED_TRACE(testing::Message() << n << (inPlace ? " in place" : " fresh"));
            expectAsModel({flagged(makeOf(values), inPlace).get(), p.get()});
        }
    }
}

// Doubles at the edges of T, at every position: one position for all, then
// arrays that pair each edge with every position in turn.
TYPED_TEST(IntegerValues, DoubleEdgesAtEveryPosition) {
    constexpr double width = sizeof(TypeParam) * 8;
    const std::vector<double> edges = edgeDoublesOf<TypeParam>();
    const auto values = makeOf(edges), type = classNameOf<TypeParam>();
    for (double p = 1; p <= width; ++p)
        expectAsModel({values.get(), scalarOf(p).get(), type.get()});
    const auto [pairedValues, positions] = pairedWithEach(edges, 1, width);
    expectAsModel({pairedValues.get(), positions.get(), type.get()});
}

TEST(DoubleValues, SerialAndParallelRunsFreshAndInPlace) {
    const auto int16 = host::makeCharArray(u"int16");
    for (unsigned long n : {limits::bitgetOnDouble - 1, limits::bitgetOnDouble}) {
        std::vector<double> values(n);
        for (unsigned long i = 0; i < n; ++i)
            values[i] = static_cast<double>(static_cast<short>(i * 2654435761u));
        const auto p = makeOf(positions(n, 16));
        expectAsModel({scalarOf(5.0).get(), p.get(), int16.get()});
        for (bool inPlace : {false, true})
            expectAsModel({flagged(makeOf(values), inPlace).get(), p.get(), int16.get()});
    }
}

}  // namespace
