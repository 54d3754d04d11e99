// bitset through its entry point against the reference model: one run below
// the limit of each route and one at it, fresh and in place, and doubles at
// the edges of every class. The call forms, the truth of V, every class
// combination and refused calls are checked against the model by the fuzz
// target; the engine's tests take the SIMD families through every width.
#include "bitfcns/entry_points.hpp"
#include "engine/parallel_limits.hpp"
#include "tests/support/model_check.hpp"

#include <random>

namespace {

using namespace testing_support;

constexpr zqClassID noValue = zqNoClass;

void expectAsModel(const std::vector<const zqArray_tag*>& inputs) {
    expectModelOutcome(reference::Function::bitset, &ondelBitSetFcn, inputs);
}

// `values` converted by the host to class `cls`.
zqArraySlot converted(const std::vector<double>& values, zqClassID cls) {
    return zqArraySlot(matrix::convert_if_needed(makeOf(values).get(), cls).detach());
}

// n elements of class `cls`: whole doubles below 2^32, or random bit patterns.
zqArraySlot randomOf(zqClassID cls, unsigned long n) {
    std::mt19937_64 random(n);
    if (cls == zqDoubleClass) {
        std::vector<double> values(n);
        for (double& v : values) v = static_cast<double>(random() >> 32);
        return makeOf(values);
    }
    std::vector<std::byte> bytes(n * host::elementSize(cls));
    for (std::byte& b : bytes) b = static_cast<std::byte>(random());
    return host::makeArray(cls, {1, n}, bytes);
}

// Position i is i modulo the width, plus 1; V is true unless i is a multiple
// of 3 (a scalar V is 0).
TEST(Bitset, SerialAndParallelRunsAgreeAtEveryLimit) {
    using namespace bitfcns::limits;
    const struct {
        zqClassID aClass, bitClass, valueClass;
        bool bitArray, valueArray;
        unsigned long limit;
    } cases[] = {
        {zqDoubleClass, zqDoubleClass, noValue, true, false, bitsetOnDouble},
        {zqUInt8Class, zqDoubleClass, noValue, true, false, bitsetPositionArrayTrue},
        {zqInt16Class, zqUInt8Class, zqDoubleClass, true, false, bitsetPositionArrayFalse},
        {zqInt32Class, zqSingleClass, zqLogicalClass, true, true, bitsetPositionValueArrays},
        {zqUInt8Class, zqDoubleClass, zqInt8Class, false, true, bitsetScalarPosition},
        {zqInt64Class, zqDoubleClass, zqInt64Class, false, true, bitsetScalarPosition},
        {zqUInt16Class, zqDoubleClass, zqUInt16Class, false, true, setBitFromValues<short>},
        {zqInt32Class, zqDoubleClass, noValue, false, false, setOneBit<int>},
        {zqInt64Class, zqDoubleClass, zqDoubleClass, false, false, clearOneBit<long>},
    };
    for (const auto& c : cases)
        for (unsigned long n : {c.limit - 1, c.limit})
            for (bool inPlace : {false, true}) {
                SCOPED_TRACE(testing::Message() << c.aClass << " " << n << " " << inPlace);
                const auto width =
                    c.aClass == zqDoubleClass ? 64u : 8 * host::elementSize(c.aClass);
                std::vector<double> positions(c.bitArray ? n : 1, double(width));
                std::vector<double> values(c.valueArray ? n : 1, 0);
                for (unsigned long i = 0; i < n; ++i) {
                    if (c.bitArray) positions[i] = static_cast<double>(i % width + 1);
                    if (c.valueArray) values[i] = static_cast<double>(i % 3);
                }
                const auto a = flagged(randomOf(c.aClass, n), inPlace);
                const auto bit = converted(positions, c.bitClass);
                std::vector<const zqArray_tag*> inputs{a.get(), bit.get()};
                const auto value =
                    c.valueClass == noValue ? nullptr : converted(values, c.valueClass);
                if (value) inputs.push_back(value.get());
                expectAsModel(inputs);
            }
}

template <class T>
class EveryClass : public ::testing::Test {};
TYPED_TEST_SUITE(EveryClass, IntegerTypes);

// Doubles at the edges of T, each bit set and cleared: one position for all,
// with one V or an array of them, then arrays that pair each edge with every
// position in turn.
TYPED_TEST(EveryClass, DoubleEdgesAtEveryPosition) {
    constexpr double width = sizeof(TypeParam) * 8;
    const std::vector<double> edges = edgeDoublesOf<TypeParam>();
    const auto values = makeOf(edges), type = classNameOf<TypeParam>();
    const auto [manyValues, manyPositions] = pairedWithEach(edges, 1, width);
    std::vector<double> mixed(edges.size());  // V for each element: set, clear, clear, ...
    for (std::size_t i = 0; i < mixed.size(); ++i) mixed[i] = i % 3 == 0;
    const auto mixedValues = makeOf(mixed);
    for (double p = 1; p <= width; ++p)
        expectAsModel({values.get(), scalarOf(p).get(), mixedValues.get(), type.get()});
    for (bool v : {false, true}) {
        const auto value = scalarOf(double(v));
        for (double p = 1; p <= width; ++p)
            expectAsModel({values.get(), scalarOf(p).get(), value.get(), type.get()});
        expectAsModel({manyValues.get(), manyPositions.get(), value.get(), type.get()});
    }
}

}  // namespace
