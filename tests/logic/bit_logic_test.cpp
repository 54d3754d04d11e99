// bitand, bitor and bitxor through their entry points: the order of tests
// between two faults, and what a refused or failing call leaves behind. The
// class pairs, sizes and values are in the golden case file bit_logic.case.
#include "bitfcns/entry_points.hpp"
#include "host/host_control.hpp"
#include "tests/support/host_arrays.hpp"

#include <new>

namespace {

using namespace testing_support;

struct Bitand {
    static constexpr EntryPoint entry = ondelBitAndFcn;
    static constexpr const char* group = "VESPRA:Bitand";
};
struct Bitor {
    static constexpr EntryPoint entry = ondelBitOrFcn;
    static constexpr const char* group = "VESPRA:Bitor";
};
struct Bitxor {
    static constexpr EntryPoint entry = ondelBitXorFcn;
    static constexpr const char* group = "VESPRA:bitxor";
};

template <class Function>
class BitLogicTest : public LeakCheckedTest {
protected:
    void TearDown() override {
        host::setLegacyErrorRaises(true);
        LeakCheckedTest::TearDown();
    }

    // The identifier of a refused call, or "" when it succeeds.
    static std::string refusal(std::vector<const zqArray_tag*> inputs, int nlhs = 1) {
        return callEntry(Function::entry, std::move(inputs), nlhs).error;
    }
    static std::string id(const char* leaf) { return std::string(Function::group) + ":" + leaf; }
};

using Functions = ::testing::Types<Bitand, Bitor, Bitxor>;
TYPED_TEST_SUITE(BitLogicTest, Functions);

TYPED_TEST(BitLogicTest, TwoFaultsYieldTheEarlierTest) {
    const auto sparseComplex = makeOf<double>({1, 2});
    host::setSparse(*sparseComplex, true);
    const auto complexDouble = makeOf<double>({1, 2});
    const double imaginary[] = {1, 1};
    host::makeComplex(*complexDouble, std::as_bytes(std::span(imaginary)));
    const auto text = host::makeCharArray(u"ab");
    const auto single3 = makeOf<float>({1, 2, 3});
    const auto double2 = makeOf<double>({1, 2});
    const auto u8x3 = makeOf<unsigned char>({1, 2, 3});
    const auto i8x2 = makeOf<signed char>({1, 2});
    const auto u8x2 = makeOf<unsigned char>({1, 2});
    const auto badName = host::makeCharArray(u"int7");
    const auto int8Name = host::makeCharArray(u"int8");
    const auto minusOne = scalarOf<double>(-1);
    const auto big = scalarOf<double>(300);

    EXPECT_EQ(this->refusal({sparseComplex.get()}), "VESPRA:minrhs");
    EXPECT_EQ(this->refusal({complexDouble.get(), sparseComplex.get()}), this->id("sparseArgs"));
    EXPECT_EQ(this->refusal({complexDouble.get(), text.get()}), this->id("operandsNotNumeric"));
    EXPECT_EQ(this->refusal({single3.get(), complexDouble.get()}), this->id("complexInputs"));
    EXPECT_EQ(this->refusal({single3.get(), double2.get()}), this->id("firstArgsNotInt"));
    EXPECT_EQ(this->refusal({u8x3.get(), i8x2.get()}), this->id("sizeMismatch"));
    EXPECT_EQ(this->refusal({u8x2.get(), i8x2.get(), badName.get()}), this->id("mixedClasses"));
    EXPECT_EQ(this->refusal({single3.get(), double2.get(), badName.get()}),
              this->id("firstArgsNotInt"));
    EXPECT_EQ(this->refusal({minusOne.get(), double2.get(), badName.get()}),
              this->id("unknownTypeString"));
    EXPECT_EQ(this->refusal({u8x2.get(), big.get(), int8Name.get()}),
              this->id("invalidTypeString"));
    EXPECT_EQ(this->refusal({u8x2.get(), u8x2.get()}, 0), "");  // no outputs asked: one result
}

// A refused call leaves the output slot as it was and releases the
// conversions it made, whether the host's legacy report raises the error or
// comes back; so does an allocation failure at any step.
TYPED_TEST(BitLogicTest, FailuresLeaveTheSlotAndReleaseConversions) {
    const auto logical = makeOf<bool>({true, false});
    const auto bad = makeOf<double>({1, -1});
    const auto good = makeOf<double>({1, 2});
    const auto failing = [&](std::vector<const zqArray_tag*> inputs, std::size_t successes,
                             bool raises) {
        host::setLegacyErrorRaises(raises);
        zqArraySlot slot(host::makeDoubleScalar(42).release());
        const zqArray_tag* before = slot.get();
        host::failNextAllocations(1, successes);
        std::string error;
        try {
            TypeParam::entry(1, &slot, static_cast<int>(inputs.size()), inputs.data());
        } catch (const foundation::core::except::IMsgIDException& e) {
            error = e.GetID();
        } catch (const std::bad_alloc&) {
            error = "bad_alloc";
        }
        host::failNextAllocations(0);
        if (!error.empty()) {
            EXPECT_EQ(slot.get(), before) << "a refused call replaced the slot";
        }
        return error;
    };
    // The second operand fails after the first was converted.
    constexpr std::size_t noFailure = 1000;
    EXPECT_EQ(failing({logical.get(), bad.get()}, noFailure, true), this->id("outOfRange"));
    EXPECT_EQ(failing({logical.get(), bad.get()}, noFailure, false), this->id("outOfRange"));
    // The conversion of either operand, the element routine, the conversion
    // of the result.
    std::size_t successes = 0;
    for (; successes < 16; ++successes) {
        const std::string error = failing({logical.get(), good.get()}, successes, true);
        if (error.empty()) break;
        EXPECT_EQ(error, "bad_alloc") << "after " << successes << " allocations";
    }
    EXPECT_GE(successes, 4u);
}

}  // namespace
