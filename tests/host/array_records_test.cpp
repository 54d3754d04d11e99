// Array records: creation and the sizes and flags the host shows, shared
// copies, reference counts, incomplete sizes, opaque ids, size pointers,
// allocation failures, alignment and reuse of storage, cell and string arrays.
#include "host/array_factory.hpp"
#include "host/exceptions.hpp"
#include "host/host_control.hpp"
#include "host/math_utils.hpp"
#include "host_test_support.hpp"

#include <cstdint>
#include <cstring>
#include <new>

namespace host::testing {
namespace {

using matrix::detail::create_uninitnumeric;
using matrix::detail::shared_copy;
using matrix::detail::noninlined::zq_array_api::zqIsScalar;

class ArrayRecordTest : public HostTest {};

zqArraySlot create(const Dims& dims, zqClassID cls = zqDoubleClass) {
    return zqArraySlot(create_uninitnumeric(dims.size(), dims.data(), cls, zqReal, 0, nullptr));
}

TEST_F(ArrayRecordTest, SizesAreNormalisedTheWayTheHostShowsThem) {
    struct Case {
        Dims given;
        Dims shown;
    };
    const Case cases[] = {{{}, {1, 1}},           {{3}, {3, 1}},
                          {{2, 3, 1, 1}, {2, 3}}, {{2, 1, 4, 1}, {2, 1, 4}},
                          {{0, 3}, {0, 3}},       {{1, 1, 1}, {1, 1}}};
    for (const Case& c : cases) {
        zqArraySlot array = create(c.given);
        ASSERT_TRUE(array);
        EXPECT_EQ(dimensions(*array), c.shown);
        const bool twoDimensional = c.shown.size() == 2;
        EXPECT_EQ((array->flags & zqTwoDimensionalFlag) != 0, twoDimensional);
        if (twoDimensional) {
            EXPECT_EQ(array->sizes2[0], c.shown[0]);
            EXPECT_EQ(array->sizes2[1], c.shown[1]);
        } else {
            ASSERT_EQ(array->sizesN.ndims, c.shown.size());
            EXPECT_EQ(Dims(array->sizesN.dims, array->sizesN.dims + c.shown.size()), c.shown);
        }
    }
}

TEST_F(ArrayRecordTest, NumericFlagOnNumericClassesOnly) {
    const zqClassID numeric[] = {zqDoubleClass, zqSingleClass, zqInt8Class, zqUInt64Class};
    for (zqClassID cls : numeric) EXPECT_TRUE(create({2, 2}, cls)->flags & zqNumericFlag) << cls;
    EXPECT_FALSE(create({2, 2}, zqLogicalClass)->flags & zqNumericFlag);
    EXPECT_FALSE(makeCharArray(u"ab")->flags & zqNumericFlag);
    EXPECT_FALSE(makeStringArray({1, 1}, {u"x"})->flags & zqNumericFlag);
}

TEST_F(ArrayRecordTest, CreationRefusesWhatItCannotMake) {
    EXPECT_FALSE(create({2, 2}, zqCellClass));
    const unsigned long huge[] = {1UL << 40, 1UL << 40};
    EXPECT_FALSE(create_uninitnumeric(2, huge, zqDoubleClass, zqReal, 0, nullptr));
    EXPECT_FALSE(create_uninitnumeric(2, nullptr, zqDoubleClass, zqReal, 0, nullptr));
}

TEST_F(ArrayRecordTest, ASizeOfZeroMakesNoElementsWhateverTheOtherSizes) {
    zqArraySlot array = create({1UL << 62, 1UL << 62, 0});
    ASSERT_TRUE(array);
    EXPECT_EQ(elementCount(*array), 0u);
}

TEST_F(ArrayRecordTest, ComplexCreationHasAnImaginaryPart) {
    const unsigned long dims[] = {3, 2};
    zqArraySlot array(create_uninitnumeric(2, dims, zqSingleClass, zqComplex, 0, nullptr));
    ASSERT_TRUE(array);
    EXPECT_TRUE(isComplex(*array));
    EXPECT_NE(imaginaryData(*array), nullptr);
    EXPECT_FALSE(create_uninitnumeric(2, dims, zqLogicalClass, zqComplex, 0, nullptr));
}

TEST_F(ArrayRecordTest, SharedCopySurvivesEitherDestructionOrder) {
    for (bool sourceFirst : {true, false}) {
        for (unsigned long n : {5UL, 100000UL}) {  // storage in the record's chunk, and mapped
            std::vector<double> values(n);
            for (unsigned long i = 0; i < n; ++i) values[i] = static_cast<double>(i);
            zqArraySlot source = arrayOf(zqDoubleClass, {1, n}, values);
            setWantsSharedResult(*source, true);
            zqArraySlot copy(shared_copy(source.get()));
            ASSERT_TRUE(copy);
            EXPECT_EQ(copy->data, source->data);
            EXPECT_EQ(storageIdentity(*copy), storageIdentity(*source));
            EXPECT_EQ(dimensions(*copy), dimensions(*source));
            EXPECT_EQ(copy->classId, zqDoubleClass);
            EXPECT_FALSE(copy->flags & zqSharedResultFlag);
            (sourceFirst ? source : copy).reset();
            const zqArray_tag& survivor = sourceFirst ? *copy : *source;
            EXPECT_EQ(static_cast<const double*>(survivor.data)[n - 1], static_cast<double>(n - 1));
        }
    }
}

TEST_F(ArrayRecordTest, SharedCopyKeepsSizesBehindAPointerAndTheImaginaryPart) {
    zqArraySlot source = makeArrayWithSizePointer(zqInt16Class, {2, 3});
    const std::vector<short> imaginary(6, 7);
    makeComplex(*source, std::as_bytes(std::span(imaginary)));
    zqArraySlot copy(shared_copy(source.get()));
    EXPECT_FALSE(copy->flags & zqTwoDimensionalFlag);
    EXPECT_EQ(copy->sizesN.ndims, 2u);
    EXPECT_TRUE(isComplex(*copy));
    EXPECT_EQ(imaginaryData(*copy), imaginaryData(*source));
}

TEST_F(ArrayRecordTest, ReferencesFromConversionKeepTheArrayAlive) {
    zqArraySlot array = makeDoubleScalar(4);
    boost::intrusive_ptr<zqArray_tag> same = matrix::convert_if_needed(array.get(), zqDoubleClass);
    EXPECT_EQ(same.get(), array.get());
    const std::size_t live = liveArrayCount();
    array.reset();
    EXPECT_EQ(liveArrayCount(), live);
    EXPECT_EQ(*static_cast<const double*>(same->data), 4.0);
    same.reset();
    EXPECT_EQ(liveArrayCount(), live - 1);
}

TEST_F(ArrayRecordTest, IncompleteSizesAreCompletedOnDemand) {
    for (const Dims& dims : {Dims{2, 3}, Dims{2, 3, 4}, Dims{2, 1, 1, 1, 1, 3}}) {
        zqArraySlot array = makeArray(zqUInt8Class, dims);
        setIncompleteDimensions(*array);
        EXPECT_TRUE(array->flags & zqIncompleteDimsFlag);
        EXPECT_FALSE(array->flags & zqTwoDimensionalFlag);
        EXPECT_EQ(array->sizesN.ndims, dims.size());  // readable before completion
        array->_complete_opaque_dimensions();
        EXPECT_FALSE(array->flags & zqIncompleteDimsFlag);
        EXPECT_EQ(dimensions(*array), dims);
        if (dims.size() == 2) {
            EXPECT_TRUE(array->flags & zqTwoDimensionalFlag);
            EXPECT_EQ(array->sizes2[1], 3u);
        } else {
            EXPECT_EQ(Dims(array->sizesN.dims, array->sizesN.dims + dims.size()), dims);
        }
    }
    zqArraySlot scalar = makeDoubleScalar(1);
    setIncompleteDimensions(*scalar);
    EXPECT_TRUE(zqIsScalar(scalar.get()));  // host operations complete by themselves
    EXPECT_FALSE(scalar->flags & zqIncompleteDimsFlag);
}

TEST_F(ArrayRecordTest, OpaqueIdsResolveToTheTrueClass) {
    zqArraySlot array = makeArray(zqInt32Class, {2, 2});
    setOpaqueClassId(*array, static_cast<zqClassID>(40));
    EXPECT_EQ(array->classId, 40);
    EXPECT_EQ(array->_get_class_id_non_trivial(), zqInt32Class);
    EXPECT_EQ(classOf(*array), zqInt32Class);
    zqArraySlot copy(shared_copy(array.get()));
    EXPECT_EQ(copy->classId, 40);
    EXPECT_EQ(copy->_get_class_id_non_trivial(), zqInt32Class);
    EXPECT_EQ(matrix::convert_if_needed(array.get(), zqInt32Class).get(), array.get());
}

TEST_F(ArrayRecordTest, SizePointerAndNoStoredSizes) {
    zqArraySlot pointer = makeArrayWithSizePointer(zqDoubleClass, {2, 3});
    EXPECT_FALSE(pointer->flags & zqTwoDimensionalFlag);
    ASSERT_EQ(pointer->sizesN.ndims, 2u);
    EXPECT_EQ(pointer->sizesN.dims[1], 3u);
    EXPECT_EQ(elementCount(*pointer), 6u);

    zqArraySlot none = makeArrayWithSizePointer(zqDoubleClass, {});
    EXPECT_EQ(none->sizesN.ndims, 0u);
    EXPECT_EQ(elementCount(*none), 1u);
    EXPECT_TRUE(zqIsScalar(none.get()));
    EXPECT_NE(none->data, nullptr);
}

TEST_F(ArrayRecordTest, ScalarMeansExactlyOneElement) {
    EXPECT_TRUE(zqIsScalar(create({1, 1, 1}).get()));
    EXPECT_FALSE(zqIsScalar(create({0, 0}).get()));
    EXPECT_FALSE(zqIsScalar(create({1, 2}).get()));
    EXPECT_TRUE(zqIsScalar(makeLogicalScalar(true).get()));
}

TEST_F(ArrayRecordTest, AllocationFailuresOnDemand) {
    zqArraySlot source = makeDoubleScalar(1);
    failNextAllocations(2);
    EXPECT_FALSE(create({4, 4}));
    EXPECT_FALSE(shared_copy(source.get()));
    EXPECT_TRUE(create({4, 4}));

    failNextAllocations(1);
    EXPECT_THROW(makeArray(zqUInt8Class, {3, 3}), std::bad_alloc);
    failNextAllocations(1);
    EXPECT_THROW(matrix::convert_if_needed(source.get(), zqUInt8Class), std::bad_alloc);
    zqArraySlot bytes = makeArray(zqUInt8Class, {2, 2});
    failNextAllocations(1);
    EXPECT_THROW(bitandBsxfunHelper(bytes.get(), bytes.get()), std::bad_alloc);
    failNextAllocations(0);
}

TEST_F(ArrayRecordTest, DataIsAlignedForEverySize) {
    for (unsigned long n : {0UL, 1UL, 3UL, 17UL, 1000UL, 4097UL, 100000UL, 3000000UL}) {
        for (zqClassID cls : {zqUInt8Class, zqDoubleClass}) {
            zqArraySlot array = create({1, n}, cls);
            ASSERT_TRUE(array);
            EXPECT_EQ(reinterpret_cast<std::uintptr_t>(array->data) % 16, 0u) << n;
        }
    }
}

TEST_F(ArrayRecordTest, FreedLargeStorageIsReused) {
    const Dims dims{1000, 1000};
    void* first = nullptr;
    {
        zqArraySlot array = create(dims);
        first = array->data;
        std::memset(first, 1, 8 * 1000 * 1000);
    }
    zqArraySlot again = create(dims);
    EXPECT_EQ(again->data, first);
}

TEST_F(ArrayRecordTest, CellsOwnTheirElementsAndStringsKeepMissingValues) {
    std::vector<zqArraySlot> elements;
    elements.push_back(makeDoubleScalar(2));
    elements.push_back(makeCharArray(u"abc"));
    zqArraySlot cell = makeCellArray({1, 2}, std::move(elements));
    EXPECT_EQ(classOf(*cellElement(*cell, 1)), zqCharClass);
    zqArraySlot copy(shared_copy(cell.get()));
    cell.reset();
    EXPECT_EQ(*static_cast<const double*>(cellElement(*copy, 0)->data), 2.0);

    zqArraySlot strings = makeStringArray({2, 1}, {u"int8", std::nullopt});
    EXPECT_EQ(stringElement(*strings, 0), u"int8");
    EXPECT_EQ(stringElement(*strings, 1), std::nullopt);
}

}  // namespace
}  // namespace host::testing
