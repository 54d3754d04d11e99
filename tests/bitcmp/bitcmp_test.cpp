// bitcmp through its entry point against the reference model: the serial and
// the parallel run of the double path, fresh and in place, and doubles at the
// edges of every class. Values, classes, the order of refusals and refused
// calls that must write nothing are checked by the golden cases and the fuzz
// target.
#include "bitfcns/entry_points.hpp"
#include "engine/parallel_limits.hpp"
#include "tests/support/model_check.hpp"

namespace {

using namespace testing_support;

void expectAsModel(const std::vector<const zqArray_tag*>& inputs) {
    expectModelOutcome(reference::Function::bitcmp, &ondelBitCmpFcn, inputs);
}

TEST(Bitcmp, SerialAndParallelRunsFreshAndInPlace) {
    const auto uint16 = host::makeCharArray(u"uint16");
    for (unsigned long n : {bitfcns::limits::bitcmpOnDouble - 1, bitfcns::limits::bitcmpOnDouble}) {
        std::vector<double> values(n);
        for (unsigned long i = 0; i < n; ++i) values[i] = static_cast<double>((i * 7919) % 65536);
        for (bool inPlace : {false, true})
            expectAsModel({flagged(makeOf(values), inPlace).get(), uint16.get()});
    }
}

template <class T>
class EveryClass : public ::testing::Test {};
TYPED_TEST_SUITE(EveryClass, IntegerTypes);

TYPED_TEST(EveryClass, DoubleEdgesFreshAndInPlace) {
    for (bool inPlace : {false, true})
        expectAsModel({flagged(makeOf(edgeDoublesOf<TypeParam>()), inPlace).get(),
                       classNameOf<TypeParam>().get()});
}

}  // namespace
