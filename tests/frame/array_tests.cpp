// The array layer on arrays the host makes: the flag and class rules that
// differ from the raw record, sizes in the record, behind a pointer or
// incomplete, and the size comparison without expansion.
#include "frame/array.hpp"
#include "tests/support/host_arrays.hpp"

namespace {

using namespace bitfcns;
using host::Dims;

class ArrayLayer : public testing_support::LeakCheckedTest {};

TEST_F(ArrayLayer, ComplexNeedsTheNumericFlagAndLogicalTheStoredId) {
    for (zqClassID cls : {zqLogicalClass, zqCharClass}) {
        auto array = host::makeArray(cls, {1, 1});
        array->flags |= zqComplexFlag;
        EXPECT_FALSE(isNumeric(array.get()) || isComplex(array.get())) << cls;
    }
    auto logical = host::makeArray(zqLogicalClass, {1, 3});
    host::setOpaqueClassId(*logical, zqOpaqueClass);
    EXPECT_EQ(classOf(logical.get()), zqLogicalClass);
    EXPECT_FALSE(isLogical(logical.get()));
}

TEST_F(ArrayLayer, SizesInTheRecordBehindAPointerOrIncomplete) {
    const auto sizesOf = [](const zqArray_tag* array) {
        const unsigned long* dims = dimensionsOf(array);
        return Dims(dims, dims + numberOfDimensions(array));
    };
    auto incomplete = host::makeArray(zqInt8Class, {2, 3, 4});
    host::setIncompleteDimensions(*incomplete);
    EXPECT_EQ(numberOfDimensions(incomplete.get()), 3u);  // readable before completion
    EXPECT_EQ(sizesOf(incomplete.get()), (Dims{2, 3, 4}));
    auto counted = host::makeArray(zqInt8Class, {2, 3, 4});
    host::setIncompleteDimensions(*counted);
    EXPECT_EQ(numberOfElements(counted.get()), 24u);

    const auto inRecord = host::makeArray(zqDoubleClass, {2, 3});
    const auto behindPointer = host::makeArrayWithSizePointer(zqDoubleClass, {2, 3});
    EXPECT_EQ(sizesOf(inRecord.get()), sizesOf(behindPointer.get()));
    EXPECT_EQ(numberOfElements(behindPointer.get()), 6u);
    const auto noSizes = host::makeArrayWithSizePointer(zqDoubleClass, {});
    EXPECT_EQ(numberOfDimensions(noSizes.get()), 0u);
    EXPECT_EQ(numberOfElements(noSizes.get()), 1u);
}

TEST_F(ArrayLayer, SameDimensionsHasNoExpansion) {
    const auto sized = [](const Dims& dims) { return host::makeArray(zqDoubleClass, dims); };
    EXPECT_FALSE(sameDimensions(sized({1, 3}).get(), sized({3, 1}).get()));
    EXPECT_FALSE(sameDimensions(sized({2, 3}).get(), sized({2, 3, 2}).get()));
    EXPECT_FALSE(sameDimensions(sized({1, 3}).get(), sized({1, 1}).get()));
    EXPECT_TRUE(sameDimensions(sized({2, 3}).get(),
                               host::makeArrayWithSizePointer(zqDoubleClass, {2, 3}).get()));
    auto incomplete = sized({2, 3, 4});
    host::setIncompleteDimensions(*incomplete);
    EXPECT_TRUE(sameDimensions(incomplete.get(), sized({2, 3, 4}).get()));
}

}  // namespace
