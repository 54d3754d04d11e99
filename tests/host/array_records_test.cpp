// Array records: refused creation, shared copies and references outliving
// their source, lent elements, alignment of the storage.
#include "host/array_factory.hpp"
#include "host/host_control.hpp"
#include "tests/support/host_arrays.hpp"

#include <cstdint>

namespace {

using host::Dims;
using matrix::detail::create_uninitnumeric;

class ArrayRecordTest : public testing_support::LeakCheckedTest {};

zqArraySlot create(const Dims& dims, zqClassID cls = zqDoubleClass) {
    return zqArraySlot(create_uninitnumeric(dims.size(), dims.data(), cls, zqReal, 0, nullptr));
}

// Only sizes none of which is 0 can overflow the byte count.
TEST_F(ArrayRecordTest, CreationRefusesASizeWhoseByteCountOverflows) {
    EXPECT_FALSE(create({1UL << 40, 1UL << 40}));
    EXPECT_FALSE(create({1UL << 61}));
    const zqArraySlot empty = create({1UL << 62, 1UL << 62, 0});
    ASSERT_TRUE(empty);
    EXPECT_EQ(host::elementCount(*empty), 0u);
}

// In-place results rely on a shared copy staying valid whichever record
// goes first, for storage in the record's own chunk and for mapped storage.
TEST_F(ArrayRecordTest, SharedCopySurvivesEitherDestructionOrder) {
    for (bool sourceFirst : {true, false}) {
        for (unsigned long n : {5UL, 100000UL}) {
            std::vector<double> values(n);
            for (unsigned long i = 0; i < n; ++i) values[i] = static_cast<double>(i);
            zqArraySlot source = testing_support::makeOf(values);
            host::setWantsSharedResult(*source, true);
            zqArraySlot copy(matrix::detail::shared_copy(source.get()));
            ASSERT_TRUE(copy);
            EXPECT_EQ(host::storageIdentity(*copy), host::storageIdentity(*source));
            EXPECT_EQ(host::dimensions(*copy), host::dimensions(*source));
            EXPECT_FALSE(copy->flags & zqSharedResultFlag);
            (sourceFirst ? source : copy).reset();
            const zqArray_tag& survivor = sourceFirst ? *copy : *source;
            EXPECT_EQ(static_cast<const double*>(survivor.data)[n - 1], static_cast<double>(n - 1));
        }
    }
}

// The lender gets its elements back once, when the last record reading them
// goes, whichever that is; a record that can't be made gives them back too.
TEST_F(ArrayRecordTest, LentElementsAreReadInPlaceAndGivenBackOnce) {
    struct Lender {
        int returns = 0;
        static void giveBack(void* owner) noexcept { ++static_cast<Lender*>(owner)->returns; }
    };
    std::vector<short> elements{1, 2, 3, 4, 5, 6};
    const unsigned long dims[] = {3, 2, 1};
    Lender lender;
    zqArraySlot lent = host::makeArrayOverLentElements(
        zqInt16Class, dims, {elements.data(), &lender, Lender::giveBack});
    EXPECT_EQ(lent->data, elements.data());
    EXPECT_EQ(host::dimensions(*lent), (Dims{3, 2}));
    EXPECT_TRUE(lent->flags & zqNumericFlag);
    zqArraySlot copy(matrix::detail::shared_copy(lent.get()));
    EXPECT_EQ(copy->data, elements.data());
    lent.reset();
    EXPECT_EQ(lender.returns, 0);
    copy.reset();
    EXPECT_EQ(lender.returns, 1);

    host::failNextAllocations(1);
    EXPECT_THROW(host::makeArrayOverLentElements(zqLogicalClass, {},
                                                 {elements.data(), &lender, Lender::giveBack}),
                 std::bad_alloc);
    EXPECT_EQ(lender.returns, 2);
}

TEST_F(ArrayRecordTest, DataIsAlignedForEverySize) {
    for (unsigned long n : {1UL, 3UL, 17UL, 4097UL, 100000UL}) {
        zqArraySlot array = create({1, n}, zqUInt8Class);
        EXPECT_EQ(reinterpret_cast<std::uintptr_t>(array->data) % 16, 0u) << n;
    }
}

}  // namespace
