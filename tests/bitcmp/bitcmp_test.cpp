// bitcmp through its entry point: the serial and the parallel run of the
// double path, and no array left behind by a failed allocation. Values,
// classes and the order of refusals are in the golden case file bitcmp.case;
// in-place results and refused calls are checked by the fuzz target.
#include "bitcmp/bitcmp_ftor.hpp"
#include "bitfcns/entry_points.hpp"
#include "host/host_control.hpp"
#include "tests/support/host_arrays.hpp"

#include <new>

namespace {

using namespace testing_support;

CallOutcome bitcmp(std::vector<const zqArray_tag*> inputs) {
    return callEntry(&ondelBitCmpFcn, std::move(inputs));
}

zqArraySlot text(std::u16string_view value) { return host::makeCharArray(value); }

class Bitcmp : public LeakCheckedTest {};

// One below the parallel limit and at it give the same bits.
TEST_F(Bitcmp, SerialAndParallelRunsAgree) {
    const unsigned long limit = bitfcns::BitcmpFtor<unsigned short>::parallelLimit;
    for (unsigned long n : {limit - 1, limit}) {
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

TEST_F(Bitcmp, AllocationFailureLeavesNothingBehind) {
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
