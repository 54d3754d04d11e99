// The array layer on arrays the host makes: flags, classes behind opaque ids,
// sizes in the record, behind a pointer or incomplete, and the two result
// makers with the host failing their allocation.
#include "frame/array.hpp"
#include "host/array_factory.hpp"
#include "host/host_control.hpp"

#include <gtest/gtest.h>

#include <new>
#include <span>
#include <vector>

namespace {

using namespace bitfcns;

class ArrayLayer : public ::testing::Test {
protected:
    void TearDown() override { EXPECT_EQ(host::liveArrayCount(), liveBefore_); }

private:
    std::size_t liveBefore_ = host::liveArrayCount();
};

std::vector<unsigned long> sizesOf(const zqArray_tag* array) {
    const unsigned long* dims = dimensionsOf(array);
    return {dims, dims + numberOfDimensions(array)};
}

TEST_F(ArrayLayer, FlagPredicates) {
    auto array = host::makeArray(zqDoubleClass, {2, 2});
    EXPECT_TRUE(isNumeric(array.get()));
    EXPECT_FALSE(isSparse(array.get()) || isComplex(array.get()) || wantsSharedResult(array.get()));
    host::setSparse(*array, true);
    host::setWantsSharedResult(*array, true);
    EXPECT_TRUE(isSparse(array.get()) && wantsSharedResult(array.get()));

    const std::vector<double> imaginary(4, 1.0);
    host::makeComplex(*array, std::as_bytes(std::span(imaginary)));
    EXPECT_TRUE(isComplex(array.get()));

    // Logical and char are not numeric, and the complex flag alone means nothing.
    for (zqClassID cls : {zqLogicalClass, zqCharClass}) {
        auto other = host::makeArray(cls, {1, 1});
        other->flags |= zqComplexFlag;
        EXPECT_FALSE(isNumeric(other.get()) || isComplex(other.get())) << cls;
        EXPECT_EQ(isLogical(other.get()), cls == zqLogicalClass);
    }
}

TEST_F(ArrayLayer, OpaqueClassIdIsResolvedByClassOfOnly) {
    auto array = host::makeArray(zqLogicalClass, {1, 3});
    host::setOpaqueClassId(*array, static_cast<zqClassID>(23));
    EXPECT_EQ(classOf(array.get()), zqLogicalClass);
    EXPECT_FALSE(isLogical(array.get()));
    EXPECT_EQ(classOf(host::makeArray(zqUInt16Class, {1, 1}).get()), zqUInt16Class);
}

TEST_F(ArrayLayer, IncompleteSizesAreCompletedWhenReadAndOnlyThen) {
    auto array = host::makeArray(zqInt8Class, {2, 3, 4});
    host::setIncompleteDimensions(*array);
    EXPECT_EQ(numberOfDimensions(array.get()), 3u);
    EXPECT_NE(array->flags & zqIncompleteDimsFlag, 0u);
    EXPECT_EQ(sizesOf(array.get()), (std::vector<unsigned long>{2, 3, 4}));
    EXPECT_EQ(array->flags & zqIncompleteDimsFlag, 0u);

    auto counted = host::makeArray(zqInt8Class, {2, 3, 4});
    host::setIncompleteDimensions(*counted);
    EXPECT_EQ(numberOfElements(counted.get()), 24u);
    EXPECT_EQ(counted->flags & zqIncompleteDimsFlag, 0u);
}

TEST_F(ArrayLayer, SizesInTheRecordOrBehindAPointer) {
    auto inRecord = host::makeArray(zqDoubleClass, {2, 3});
    ASSERT_TRUE(isTwoDimensional(inRecord.get()));
    EXPECT_EQ(dimensionsOf(inRecord.get()), inRecord->sizes2);
    EXPECT_EQ(numberOfElements(inRecord.get()), 6u);

    auto behindPointer = host::makeArrayWithSizePointer(zqDoubleClass, {2, 3});
    EXPECT_FALSE(isTwoDimensional(behindPointer.get()));
    EXPECT_EQ(dimensionsOf(behindPointer.get()), behindPointer->sizesN.dims);
    EXPECT_EQ(numberOfElements(behindPointer.get()), 6u);
    EXPECT_TRUE(sameDimensions(inRecord.get(), behindPointer.get()));

    auto noSizes = host::makeArrayWithSizePointer(zqDoubleClass, {});
    EXPECT_EQ(numberOfDimensions(noSizes.get()), 0u);
    EXPECT_EQ(numberOfElements(noSizes.get()), 1u);
    EXPECT_EQ(numberOfElements(host::makeArray(zqDoubleClass, {0, 3}).get()), 0u);
}

TEST_F(ArrayLayer, SameDimensionsHasNoExpansion) {
    const auto sized = [](const host::Dims& dims) { return host::makeArray(zqDoubleClass, dims); };
    EXPECT_FALSE(sameDimensions(sized({1, 3}).get(), sized({3, 1}).get()));
    EXPECT_FALSE(sameDimensions(sized({2, 3}).get(), sized({2, 3, 2}).get()));
    EXPECT_FALSE(sameDimensions(sized({1, 3}).get(), sized({1, 1}).get()));
    auto incomplete = sized({2, 3, 4});
    host::setIncompleteDimensions(*incomplete);
    EXPECT_TRUE(sameDimensions(incomplete.get(), sized({2, 3, 4}).get()));
}

TEST_F(ArrayLayer, CreateResultMakesTheAskedArrayOrRaisesBadAlloc) {
    const unsigned long dims[] = {3, 1, 2};
    const zqArraySlot result = createResult(3, dims, zqUInt32Class);
    EXPECT_EQ(classOf(result.get()), zqUInt32Class);
    EXPECT_EQ(sizesOf(result.get()), (std::vector<unsigned long>{3, 1, 2}));

    host::failNextAllocations();
    EXPECT_THROW(createResult(3, dims, zqUInt32Class), std::bad_alloc);
}

TEST_F(ArrayLayer, ShareResultSharesStorageOrRaisesBadAlloc) {
    const auto first = host::makeArray(zqInt16Class, {4, 5});
    const zqArraySlot shared = shareResult(first.get());
    EXPECT_EQ(host::storageIdentity(*shared), host::storageIdentity(*first));
    EXPECT_EQ(classOf(shared.get()), zqInt16Class);
    EXPECT_TRUE(sameDimensions(shared.get(), first.get()));

    host::failNextAllocations();
    EXPECT_THROW(shareResult(first.get()), std::bad_alloc);
}

}  // namespace
