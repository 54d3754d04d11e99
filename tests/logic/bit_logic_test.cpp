// bitand, bitor and bitxor through their entry points: argument counts, the
// order of tests, the class-pair table, implicit expansion, the default path
// with its working class, and what is released on the way out.
#include "bitfcns/entry_points.hpp"
#include "host/array_factory.hpp"
#include "host/host_control.hpp"
#include "tests/support/host_arrays.hpp"

#include <gtest/gtest.h>

#include <cmath>
#include <functional>
#include <limits>

namespace {

using namespace testing_support;

constexpr double nan = std::numeric_limits<double>::quiet_NaN();
constexpr double inf = std::numeric_limits<double>::infinity();

struct Bitand {
    static constexpr EntryPoint entry = ondelBitAndFcn;
    static constexpr const char* group = "VESPRA:Bitand";
    static unsigned long apply(unsigned long a, unsigned long b) { return a & b; }
};
struct Bitor {
    static constexpr EntryPoint entry = ondelBitOrFcn;
    static constexpr const char* group = "VESPRA:Bitor";
    static unsigned long apply(unsigned long a, unsigned long b) { return a | b; }
};
struct Bitxor {
    static constexpr EntryPoint entry = ondelBitXorFcn;
    static constexpr const char* group = "VESPRA:bitxor";
    static unsigned long apply(unsigned long a, unsigned long b) { return a ^ b; }
};

template <class Function>
class BitLogicTest : public ::testing::Test {
protected:
    void SetUp() override { liveBefore_ = host::liveArrayCount(); }
    void TearDown() override {
        host::setLegacyErrorRaises(true);
        EXPECT_EQ(host::liveArrayCount(), liveBefore_) << "array records leaked";
    }

    static CallOutcome call(std::vector<const zqArray_tag*> inputs, int nlhs = 1) {
        return callEntry(Function::entry, std::move(inputs), nlhs);
    }
    static std::string id(const char* leaf) { return std::string(Function::group) + ":" + leaf; }

    // The identifier of a refused call, or "" with the result's class.
    static std::string refusal(std::vector<const zqArray_tag*> inputs) {
        return call(std::move(inputs)).error;
    }

private:
    std::size_t liveBefore_ = 0;
};

using Functions = ::testing::Types<Bitand, Bitor, Bitxor>;
TYPED_TEST_SUITE(BitLogicTest, Functions);

TYPED_TEST(BitLogicTest, CountsAreTestedFirstOutputsBeforeInputs) {
    const auto a = scalarOf<double>(1);
    EXPECT_EQ(this->call({a.get(), a.get(), a.get(), a.get(), a.get()}, 2).error, "VESPRA:maxlhs");
    EXPECT_EQ(this->call({a.get(), a.get(), a.get(), a.get()}).error, "VESPRA:maxrhs");
    EXPECT_EQ(this->call({a.get()}).error, "VESPRA:minrhs");
    const auto sparse = scalarOf<double>(1);
    host::setSparse(*sparse, true);
    EXPECT_EQ(this->call({sparse.get()}).error, "VESPRA:minrhs");

    const CallOutcome noOutputs = this->call({a.get(), a.get()}, 0);
    ASSERT_TRUE(noOutputs.result) << noOutputs.error;
    EXPECT_EQ(host::classOf(*noOutputs.result), zqDoubleClass);
}

// One row of the table of class pairs: the operands, and either the class of
// the result or the leaf of the refusal.
struct PairRow {
    const char* name;
    std::function<zqArraySlot()> first;
    std::function<zqArraySlot()> second;
    zqClassID resultClass;
    const char* leaf;
};

TYPED_TEST(BitLogicTest, ClassPairTable) {
    const auto u8 = [] { return makeOf<unsigned char>({12, 10}); };
    const auto i16 = [] { return makeOf<short>({12, 10}); };
    const auto i8 = [] { return makeOf<signed char>({12, 10}); };
    const auto doubleScalar = [] { return scalarOf<double>(6); };
    const auto doublePair = [] { return makeOf<double>({6, 3}); };
    const auto doubleEmpty = [] { return makeOf<double>({}, {0, 0}); };
    const auto logical = [] { return makeOf<bool>({true, false}); };
    const auto single = [] { return makeOf<float>({6, 3}); };
    const std::vector<PairRow> rows = {
        {"same integer class", u8, u8, zqUInt8Class, nullptr},
        {"two integer classes", u8, i8, zqNoClass, "mixedClasses"},
        {"integer, double scalar", u8, doubleScalar, zqUInt8Class, nullptr},
        {"integer, double array", u8, doublePair, zqNoClass, "mixedClasses"},
        {"integer scalar, empty double", [] { return scalarOf<unsigned char>(1); }, doubleEmpty,
         zqNoClass, "mixedClasses"},
        {"integer, logical", u8, logical, zqNoClass, "mixedClasses"},
        {"integer, single", u8, single, zqNoClass, "mixedClasses"},
        {"double scalar, integer", doubleScalar, i16, zqInt16Class, nullptr},
        {"double array, integer", doublePair, i16, zqNoClass, "mixedClasses"},
        {"logical, integer", logical, i16, zqNoClass, "mixedClasses"},
        {"single, integer", single, i16, zqNoClass, "mixedClasses"},
        {"double, double", doublePair, doublePair, zqDoubleClass, nullptr},
        {"double, logical", doublePair, logical, zqDoubleClass, nullptr},
        {"logical, double", logical, doublePair, zqDoubleClass, nullptr},
        {"logical, logical", logical, logical, zqLogicalClass, nullptr},
        {"single, double", single, doublePair, zqNoClass, "firstArgsNotInt"},
        {"single, single", single, single, zqNoClass, "firstArgsNotInt"},
        {"single, logical", single, logical, zqNoClass, "firstArgsNotInt"},
        {"double, single", doublePair, single, zqNoClass, "firstArgsNotInt"},
        {"logical, single", logical, single, zqNoClass, "firstArgsNotInt"},
    };
    for (const PairRow& row : rows) {
        const auto first = row.first();
        const auto second = row.second();
        const CallOutcome outcome = this->call({first.get(), second.get()});
        if (row.leaf != nullptr) {
            EXPECT_EQ(outcome.error, this->id(row.leaf)) << row.name;
        } else {
            ASSERT_TRUE(outcome.result) << row.name << ": " << outcome.error;
            EXPECT_EQ(host::classOf(*outcome.result), row.resultClass) << row.name;
        }
    }
}

TYPED_TEST(BitLogicTest, IntegerPathComputesInTheIntegerClass) {
    const auto a = makeOf<unsigned long>({0, 1, 18446744073709551615ul, 0x8000000000000000ul});
    const auto b = makeOf<unsigned long>({0, 3, 0x0F0F0F0F0F0F0F0Ful, 1});
    const CallOutcome arrays = this->call({a.get(), b.get()});
    ASSERT_TRUE(arrays.result) << arrays.error;
    const std::vector<unsigned long> got = elementsOf<unsigned long>(arrays.result.get());
    const std::vector<unsigned long> left = elementsOf<unsigned long>(a.get());
    const std::vector<unsigned long> right = elementsOf<unsigned long>(b.get());
    for (std::size_t i = 0; i < got.size(); ++i)
        EXPECT_EQ(got[i], TypeParam::apply(left[i], right[i]));

    // A double scalar partner, on either side, is taken in the integer class.
    const auto values = makeOf<signed char>({-1, 5, -128});
    const auto three = scalarOf<double>(3);
    for (const auto& inputs : {std::vector<const zqArray_tag*>{values.get(), three.get()},
                               std::vector<const zqArray_tag*>{three.get(), values.get()}}) {
        const CallOutcome outcome = this->call(inputs);
        ASSERT_TRUE(outcome.result) << outcome.error;
        EXPECT_EQ(host::classOf(*outcome.result), zqInt8Class);
        const auto out = elementsOf<signed char>(outcome.result.get());
        const signed char expected[] = {-1, 5, -128};
        for (std::size_t i = 0; i < 3; ++i) {
            EXPECT_EQ(out[i], static_cast<signed char>(
                                  TypeParam::apply(static_cast<unsigned char>(expected[i]), 3)));
        }
    }
}

TYPED_TEST(BitLogicTest, DoublePartnerOfAnIntegerMustFitItsClass) {
    const auto u8 = makeOf<unsigned char>({1, 2});
    for (double bad : {300.0, 256.0, 2.5, -1.0, nan, inf}) {
        const auto partner = scalarOf<double>(bad);
        EXPECT_EQ(this->refusal({u8.get(), partner.get()}), this->id("outOfRangeMixedType")) << bad;
        EXPECT_EQ(this->refusal({partner.get(), u8.get()}), this->id("outOfRangeMixedType")) << bad;
    }
    const auto edge = scalarOf<double>(255);
    EXPECT_EQ(this->refusal({u8.get(), edge.get()}), "");
    const auto negativeZero = scalarOf<double>(-0.0);
    EXPECT_EQ(this->refusal({u8.get(), negativeZero.get()}), "");
}

TYPED_TEST(BitLogicTest, AssumedTypeOnTheIntegerPathOnlyConfirmsTheClass) {
    const auto u16 = makeOf<unsigned short>({1, 2});
    const auto d = scalarOf<double>(3);
    const auto uint16Name = host::makeCharArray(u"uint16");
    const auto cutName = host::makeCharArray(u"UINT1");
    const auto uint8Name = host::makeCharArray(u"uint8");
    const auto noName = host::makeCharArray(u"int7");
    EXPECT_EQ(this->refusal({u16.get(), d.get(), uint16Name.get()}), "");
    EXPECT_EQ(this->refusal({d.get(), u16.get(), cutName.get()}), "");
    EXPECT_EQ(this->refusal({u16.get(), d.get(), uint8Name.get()}), this->id("invalidTypeString"));
    EXPECT_EQ(this->refusal({u16.get(), u16.get(), noName.get()}), this->id("unknownTypeString"));
    const auto number = scalarOf<double>(11);
    EXPECT_EQ(this->refusal({u16.get(), u16.get(), number.get()}), this->id("unknownTypeString"));
}

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
}

TYPED_TEST(BitLogicTest, SizesExpandWhereOneOfThemIsOne) {
    struct SizeRow {
        host::Dims first, second, result;
    };
    const std::vector<SizeRow> passing = {
        {{2, 3}, {2, 1}, {2, 3}}, {{2, 1}, {1, 3}, {2, 3}},       {{2, 3, 4}, {2, 3}, {2, 3, 4}},
        {{0, 3}, {1, 3}, {0, 3}}, {{1, 1, 5}, {4, 1}, {4, 1, 5}}, {{2, 3}, {1, 1}, {2, 3}},
    };
    for (const SizeRow& row : passing) {
        const auto a = host::makeArray(zqUInt8Class, row.first);
        const auto b = host::makeArray(zqUInt8Class, row.second);
        const CallOutcome outcome = this->call({a.get(), b.get()});
        ASSERT_TRUE(outcome.result) << outcome.error;
        EXPECT_EQ(host::dimensions(*outcome.result), row.result);
    }
    for (const auto& [first, second] : std::vector<std::pair<host::Dims, host::Dims>>{
             {{2, 3}, {3, 2}}, {{0, 3}, {2, 3}}, {{1, 3}, {1, 4}}, {{2, 3, 4}, {2, 3, 5}}}) {
        const auto a = host::makeArray(zqUInt8Class, first);
        const auto b = host::makeArray(zqInt8Class, second);
        EXPECT_EQ(this->refusal({a.get(), b.get()}), this->id("sizeMismatch"));
    }
}

TYPED_TEST(BitLogicTest, DoublesAreIntegersOfTheWorkingClass) {
    const auto check = [this](double a, double b, const char16_t* type, double expected) {
        const auto x = scalarOf<double>(a);
        const auto y = scalarOf<double>(b);
        const auto name = type ? host::makeCharArray(type) : zqArraySlot();
        std::vector<const zqArray_tag*> inputs{x.get(), y.get()};
        if (name) inputs.push_back(name.get());
        const CallOutcome outcome = this->call(inputs);
        ASSERT_TRUE(outcome.result) << a << ", " << b << ": " << outcome.error;
        EXPECT_EQ(host::classOf(*outcome.result), zqDoubleClass);
        EXPECT_EQ(elementsOf<double>(outcome.result.get())[0], expected) << a << ", " << b;
    };
    const auto expect = [](unsigned long a, unsigned long b) {
        return static_cast<double>(TypeParam::apply(a, b));
    };
    check(300, 1, nullptr, expect(300, 1));
    check(255, 1, u"uint8", expect(255, 1));
    check(-1, -128, u"int8",
          static_cast<double>(static_cast<signed char>(TypeParam::apply(0xFFul, 0x80ul))));
    // Far apart in size, the pattern of bitor and bitxor can need more than
    // 53 bits; the conversion back to double rounds it.
    check(9223372036854775808.0, 1, nullptr, expect(1ul << 63, 1));
    check(18446744073709549568.0, 2047, nullptr, expect(18446744073709549568ul, 2047));
    check(9007199254740992.0, 1, nullptr, expect(9007199254740992ul, 1));

    for (const auto& [a, b, type] : std::vector<std::tuple<double, double, const char16_t*>>{
             {-1, 1, nullptr},
             {1.5, 1, nullptr},
             {nan, 1, nullptr},
             {1, inf, nullptr},
             {18446744073709551616.0, 1, nullptr},
             {300, 1, u"uint8"},
             {1, -129, u"int8"}}) {
        const auto x = scalarOf<double>(a);
        const auto y = scalarOf<double>(b);
        const auto name = type ? host::makeCharArray(type) : host::makeCharArray(u"uint64");
        EXPECT_EQ(this->refusal({x.get(), y.get(), name.get()}), this->id("outOfRange"))
            << a << ", " << b;
    }
}

TYPED_TEST(BitLogicTest, LogicalsStayLogicalUnlessATypeIsNamed) {
    const auto a = makeOf<bool>({true, true, false, false});
    const auto b = makeOf<bool>({true, false, true, false});
    const CallOutcome plain = this->call({a.get(), b.get()});
    ASSERT_TRUE(plain.result) << plain.error;
    EXPECT_EQ(host::classOf(*plain.result), zqLogicalClass);

    const auto name = host::makeCharArray(u"uint8");
    const CallOutcome typed = this->call({a.get(), b.get(), name.get()});
    ASSERT_TRUE(typed.result) << typed.error;
    EXPECT_EQ(host::classOf(*typed.result), zqDoubleClass);
    const std::vector<double> values = elementsOf<double>(typed.result.get());
    const unsigned long left[] = {1, 1, 0, 0}, right[] = {1, 0, 1, 0};
    for (std::size_t i = 0; i < 4; ++i) EXPECT_EQ(values[i], TypeParam::apply(left[i], right[i]));

    const auto empty = makeOf<double>({}, {0, 0});
    const CallOutcome none = this->call({empty.get(), empty.get()});
    ASSERT_TRUE(none.result) << none.error;
    EXPECT_EQ(host::dimensions(*none.result), (host::Dims{0, 0}));
}

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
    // An allocation failure at each step: the conversion of either operand,
    // the element routine, the conversion of the result.
    std::size_t successes = 0;
    for (; successes < 16; ++successes) {
        const std::string error = failing({logical.get(), good.get()}, successes, true);
        if (error.empty()) break;
        EXPECT_EQ(error, "bad_alloc") << "after " << successes << " allocations";
    }
    EXPECT_GE(successes, 4u);
}

}  // namespace
