// bitcmp through its entry point: the serial and the parallel run of the
// double path, results that take over a flagged operand's storage, and no
// array left behind or operand touched by a refused call or a failed
// allocation. Values, classes and the order of refusals are in the golden
// case file bitcmp.case.
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

zqArraySlot flaggedForSharing(zqArraySlot array) {
    host::setWantsSharedResult(*array, true);
    return array;
}

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

// Every element is tested before any is written: a refused call leaves the
// operand whose storage the result would have shared untouched.
TEST_F(Bitcmp, InPlaceOnlyOnceAccepted) {
    const auto doubles = flaggedForSharing(makeOf<double>({1, 2, 3}));
    const auto outcome = bitcmp({doubles.get(), text(u"uint8").get()});
    ASSERT_EQ(outcome.error, "");
    EXPECT_EQ(host::storageIdentity(*outcome.result), host::storageIdentity(*doubles));
    EXPECT_EQ(elementsOf<double>(doubles.get()), (std::vector<double>{254, 253, 252}));

    const auto refused = flaggedForSharing(makeOf<double>({1, 2, 256}));
    EXPECT_EQ(bitcmp({refused.get(), text(u"uint8").get()}).error, "VESPRA:bitcmp:outOfRange");
    EXPECT_EQ(elementsOf<double>(refused.get()), (std::vector<double>{1, 2, 256}));

    // A sparse integer operand is complemented like any other.
    const auto integers = flaggedForSharing(makeOf<short>({5, -1}));
    host::setSparse(*integers, true);
    const auto inPlace = bitcmp({integers.get()});
    ASSERT_EQ(inPlace.error, "");
    EXPECT_EQ(host::storageIdentity(*inPlace.result), host::storageIdentity(*integers));
    EXPECT_EQ(elementsOf<short>(integers.get()), (std::vector<short>{-6, 0}));
}

// Refusals that come after the result exists, and one that the evaluator
// can't make: each leaves no array behind and no result.
TEST_F(Bitcmp, RefusalsLeaveNothingBehind) {
    const auto opaqueDouble = scalarOf(5.0);
    host::setOpaqueClassId(*opaqueDouble, zqOpaqueClass);
    const auto fraction = makeOf<double>({1, 1.5});
    const auto integer = scalarOf<unsigned char>(5);
    const auto complexInteger = scalarOf<signed char>(5);
    const signed char imaginary = 1;
    host::makeComplex(*complexInteger, std::as_bytes(std::span(&imaginary, 1)));
    const auto doubleName = text(u"double"), int8Name = text(u"int8");
    const std::pair<std::vector<const zqArray_tag*>, const char*> refusals[] = {
        {{opaqueDouble.get()}, "VESPRA:bitcmp:firstArgNotInt"},
        {{fraction.get(), doubleName.get()}, "VESPRA:bitcmp:unknownTypeString"},
        {{fraction.get(), int8Name.get()}, "VESPRA:bitcmp:outOfRange"},
        {{complexInteger.get(), doubleName.get()}, "VESPRA:bitcmp:complexOperands"},
        {{integer.get(), int8Name.get()}, "VESPRA:bitcmp:invalidTypeString"},
        {{integer.get(), doubleName.get()}, "VESPRA:bitcmp:unknownTypeString"},
    };
    for (const auto& [inputs, expected] : refusals) {
        const std::size_t liveBefore = host::liveArrayCount();
        const auto outcome = bitcmp(inputs);
        EXPECT_EQ(outcome.error, expected);
        EXPECT_EQ(outcome.result, nullptr);
        EXPECT_EQ(host::liveArrayCount(), liveBefore) << expected;
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
