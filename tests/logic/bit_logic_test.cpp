// bitand, bitor and bitxor through their entry points: of two faults, the one
// tested first is reported. Values, class pairs and sizes are checked by the
// golden cases and against the reference model by the fuzz targets.
#include "bitfcns/entry_points.hpp"
#include "tests/support/host_arrays.hpp"

namespace {

using namespace testing_support;

class BitLogic : public LeakCheckedTest {};

TEST_F(BitLogic, TwoFaultsYieldTheEarlierTest) {
    const struct {
        EntryPoint entry;
        const char* group;
    } functions[] = {{ondelBitAndFcn, "VESPRA:Bitand"},
                     {ondelBitOrFcn, "VESPRA:Bitor"},
                     {ondelBitXorFcn, "VESPRA:bitxor"}};
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

    for (const auto& function : functions) {
        SCOPED_TRACE(function.group);
        const auto refusal = [&](std::vector<const zqArray_tag*> inputs) {
            return callEntry(function.entry, std::move(inputs));
        };
        const auto id = [&](const char* leaf) { return std::string(function.group) + ":" + leaf; };
        EXPECT_EQ(refusal({sparseComplex.get()}), "VESPRA:minrhs");
        EXPECT_EQ(refusal({complexDouble.get(), sparseComplex.get()}), id("sparseArgs"));
        EXPECT_EQ(refusal({complexDouble.get(), text.get()}), id("operandsNotNumeric"));
        EXPECT_EQ(refusal({single3.get(), complexDouble.get()}), id("complexInputs"));
        EXPECT_EQ(refusal({single3.get(), double2.get()}), id("firstArgsNotInt"));
        EXPECT_EQ(refusal({u8x3.get(), i8x2.get()}), id("sizeMismatch"));
        EXPECT_EQ(refusal({u8x2.get(), i8x2.get(), badName.get()}), id("mixedClasses"));
        EXPECT_EQ(refusal({single3.get(), double2.get(), badName.get()}), id("firstArgsNotInt"));
        EXPECT_EQ(refusal({minusOne.get(), double2.get(), badName.get()}), id("unknownTypeString"));
        EXPECT_EQ(refusal({u8x2.get(), big.get(), int8Name.get()}), id("invalidTypeString"));
    }
}

}  // namespace
