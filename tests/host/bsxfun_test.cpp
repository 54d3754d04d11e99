// The math utility library's AND, OR and XOR under implicit expansion,
// against a naive element-by-element reference: random shapes in one to four
// dimensions, scalar partners on either side, logical pairs, lengths and
// offsets around the vector width and the parallel limit, and the refusals.
#include "host/exceptions.hpp"
#include "host/math_utils.hpp"
#include "host_test_support.hpp"

#include <algorithm>
#include <cstring>
#include <functional>
#include <random>

namespace host::testing {
namespace {

using Helper = zqArraySlot (*)(const zqArray_tag*, const zqArray_tag*);

struct Operation {
    const char* name;
    Helper helper;
    std::function<unsigned long(unsigned long, unsigned long)> reference;
};

const Operation kOperations[] = {
    {"and", bitandBsxfunHelper, [](unsigned long a, unsigned long b) { return a & b; }},
    {"or", bitorBsxfunHelper, [](unsigned long a, unsigned long b) { return a | b; }},
    {"xor", bitxorBsxfunHelper, [](unsigned long a, unsigned long b) { return a ^ b; }},
};

template <class T>
constexpr zqClassID classFor() {
    if constexpr (std::is_same_v<T, bool>) {
        return zqLogicalClass;
    } else {
        constexpr zqClassID bySize[] = {zqInt8Class, zqInt16Class, zqInt32Class, zqInt64Class};
        const int index = sizeof(T) == 1 ? 0 : sizeof(T) == 2 ? 1 : sizeof(T) == 4 ? 2 : 3;
        return static_cast<zqClassID>(bySize[index] + (std::is_signed_v<T> ? 0 : 1));
    }
}

// Elements of class T as the tests hold them: logical ones as bytes 0 and 1.
template <class T>
using Values = std::vector<std::conditional_t<std::is_same_v<T, bool>, unsigned char, T>>;

template <class T>
Values<T> randomValues(std::size_t count, std::mt19937_64& random) {
    Values<T> values(count);
    for (auto& v : values) {
        const unsigned long bits = random();
        if constexpr (std::is_same_v<T, bool>) {
            v = bits & 1;
        } else {
            std::memcpy(&v, &bits, sizeof v);
        }
    }
    return values;
}

unsigned long productOf(const Dims& dims) {
    unsigned long n = 1;
    for (unsigned long d : dims) n *= d;
    return n;
}

// The element of `dims` that result index `linear` of `result` reads under expansion.
unsigned long sourceIndex(unsigned long linear, const Dims& result, const Dims& dims) {
    unsigned long index = 0, stride = 1;
    for (std::size_t k = 0; k < result.size(); ++k) {
        const unsigned long coordinate = linear % result[k];
        linear /= result[k];
        const unsigned long size = k < dims.size() ? dims[k] : 1;
        if (size != 1) index += coordinate * stride;
        stride *= size;
    }
    return index;
}

template <class T>
void expectMatchesReference(const Operation& op, const Dims& firstDims, const Values<T>& first,
                            const Dims& secondDims, const Values<T>& second,
                            const zqArray_tag& result) {
    Dims resultDims(std::max(firstDims.size(), secondDims.size()));
    for (std::size_t k = 0; k < resultDims.size(); ++k) {
        const unsigned long a = k < firstDims.size() ? firstDims[k] : 1;
        const unsigned long b = k < secondDims.size() ? secondDims[k] : 1;
        resultDims[k] = a == 1 ? b : a;
    }
    ASSERT_EQ(classOf(result), classFor<T>());
    ASSERT_EQ(elementCount(result), productOf(resultDims));
    const auto out = elementsOf<T>(result);
    for (unsigned long i = 0; i < out.size(); ++i) {
        const auto a = static_cast<unsigned long>(first[sourceIndex(i, resultDims, firstDims)]);
        const auto b = static_cast<unsigned long>(second[sourceIndex(i, resultDims, secondDims)]);
        ASSERT_EQ(out[i], static_cast<T>(op.reference(a, b))) << op.name << " at " << i;
    }
}

template <class T>
class BsxfunTyped : public HostTest {};
using ElementTypes = ::testing::Types<signed char, unsigned char, short, unsigned short, int,
                                      unsigned int, long, unsigned long, bool>;
TYPED_TEST_SUITE(BsxfunTyped, ElementTypes);

TYPED_TEST(BsxfunTyped, RandomShapesWithExpansion) {
    using T = TypeParam;
    std::mt19937_64 random(7);
    for (int round = 0; round < 60; ++round) {
        const std::size_t ndims = 1 + random() % 4;
        Dims firstDims(ndims), secondDims(1 + random() % 4);
        for (std::size_t k = 0; k < std::max(firstDims.size(), secondDims.size()); ++k) {
            const unsigned long size = random() % 6;
            // Each side keeps the common size or expands with 1.
            if (k < firstDims.size()) firstDims[k] = random() % 3 ? size : 1;
            if (k < secondDims.size()) secondDims[k] = random() % 3 ? size : 1;
        }
        const auto first = randomValues<T>(productOf(firstDims), random);
        const auto second = randomValues<T>(productOf(secondDims), random);
        zqArraySlot a = arrayOf(classFor<T>(), firstDims, first);
        zqArraySlot b = arrayOf(classFor<T>(), secondDims, second);
        for (const Operation& op : kOperations) {
            zqArraySlot result = op.helper(a.get(), b.get());
            expectMatchesReference<T>(op, firstDims, first, secondDims, second, *result);
        }
    }
}

TYPED_TEST(BsxfunTyped, LengthsAndOffsetsAroundVectorWidthAndParallelLimit) {
    using T = TypeParam;
    std::mt19937_64 random(11);
    const unsigned long parallelLimit = (256UL << 10) / sizeof(T);
    std::vector<unsigned long> lengths;
    for (unsigned long n = 0; n <= 40; ++n) lengths.push_back(n);
    for (unsigned long n : {parallelLimit - 1, parallelLimit, parallelLimit + 17})
        lengths.push_back(n);
    for (unsigned long n : lengths) {
        const auto first = randomValues<T>(n, random);
        const auto second = randomValues<T>(n, random);
        const auto single = randomValues<T>(1, random);
        zqArraySlot a = arrayOf(classFor<T>(), {1, n}, first);
        zqArraySlot b = arrayOf(classFor<T>(), {1, n}, second);
        zqArraySlot scalar = arrayOf(classFor<T>(), {1, 1}, single);
        const Operation& op = kOperations[n % 3];
        expectMatchesReference<T>(op, {1, n}, first, {1, n}, second, *op.helper(a.get(), b.get()));
        // A scalar of the same class on either side: a pattern partner.
        expectMatchesReference<T>(op, {1, 1}, single, {1, n}, second,
                                  *op.helper(scalar.get(), b.get()));
        expectMatchesReference<T>(op, {1, n}, second, {1, 1}, single,
                                  *op.helper(b.get(), scalar.get()));
        // A column against a row: one pattern per run.
        if (n > 0 && n < 40) {
            zqArraySlot column = arrayOf(classFor<T>(), {n, 1}, second);
            expectMatchesReference<T>(op, {n, 1}, second, {1, n}, second,
                                      *op.helper(column.get(), b.get()));
        }
    }
}

class BsxfunLargeShapes : public HostTest {};

TEST_F(BsxfunLargeShapes, ExpansionAcrossTheParallelLimitAndManyDimensions) {
    std::mt19937_64 random(3);
    const Dims firstDims{3, 1, 40000}, secondDims{3, 5};
    const auto first = randomValues<unsigned short>(productOf(firstDims), random);
    const auto second = randomValues<unsigned short>(productOf(secondDims), random);
    zqArraySlot a = arrayOf(zqUInt16Class, firstDims, first);
    zqArraySlot b = arrayOf(zqUInt16Class, secondDims, second);
    expectMatchesReference<unsigned short>(kOperations[2], firstDims, first, secondDims, second,
                                           *bitxorBsxfunHelper(a.get(), b.get()));

    const Dims manyDims{2, 1, 2, 2, 1, 2, 2, 2, 1, 2, 2, 3}, fewDims{2, 1, 3};
    const auto many = randomValues<int>(productOf(manyDims), random);
    const auto few = randomValues<int>(productOf(fewDims), random);
    const auto column = randomValues<int>(2, random);
    const auto corners = randomValues<int>(4, random);
    zqArraySlot c = arrayOf(zqInt32Class, manyDims, many);
    zqArraySlot d = arrayOf(zqInt32Class, {2, 1, 1, 2}, corners);
    zqArraySlot e = arrayOf(zqInt32Class, {2, 1}, column);
    zqArraySlot f = arrayOf(zqInt32Class, fewDims, few);
    EXPECT_THROW(bitandBsxfunHelper(c.get(), f.get()), foundation::core::except::IMsgIDException);
    expectMatchesReference<int>(kOperations[0], manyDims, many, {2, 1}, column,
                                *bitandBsxfunHelper(c.get(), e.get()));
    expectMatchesReference<int>(kOperations[1], {2, 1, 1, 2}, corners, manyDims, many,
                                *bitorBsxfunHelper(d.get(), c.get()));
}

class BsxfunOperands : public HostTest {};

TEST_F(BsxfunOperands, DoubleScalarPartnerIsConvertedOnce) {
    zqArraySlot bytes = arrayOf(zqUInt8Class, {2, 2}, std::vector<unsigned char>{1, 2, 0xF0, 0xFF});
    zqArraySlot three = makeDoubleScalar(3);
    zqArraySlot result = bitorBsxfunHelper(three.get(), bytes.get());
    EXPECT_EQ(classOf(*result), zqUInt8Class);
    EXPECT_EQ(std::vector<unsigned char>(elementsOf<unsigned char>(*result).begin(),
                                         elementsOf<unsigned char>(*result).end()),
              (std::vector<unsigned char>{3, 3, 0xF3, 0xFF}));
    zqArraySlot wide = arrayOf(zqInt64Class, {1, 1}, std::vector<long>{-1});
    zqArraySlot minimum = makeDoubleScalar(-9223372036854775808.0);
    EXPECT_EQ(elementsOf<long>(*bitandBsxfunHelper(wide.get(), minimum.get()))[0], 1L << 63);
}

TEST_F(BsxfunOperands, LogicalPairGivesLogical) {
    zqArraySlot a = arrayOf(zqLogicalClass, {1, 3}, std::vector<unsigned char>{1, 0, 1});
    zqArraySlot yes = makeLogicalScalar(true);
    zqArraySlot result = bitxorBsxfunHelper(a.get(), yes.get());
    EXPECT_EQ(classOf(*result), zqLogicalClass);
    EXPECT_EQ(elementsOf<bool>(*result)[0], false);
    EXPECT_EQ(elementsOf<bool>(*result)[1], true);
}

TEST_F(BsxfunOperands, RefusesWhatItDoesNotAccept) {
    zqArraySlot bytes = makeArray(zqUInt8Class, {2, 3});
    zqArraySlot words = makeArray(zqUInt16Class, {2, 3});
    zqArraySlot doubles = makeArray(zqDoubleClass, {2, 3});
    zqArraySlot column = makeArray(zqUInt8Class, {3, 2});
    zqArraySlot logical = makeLogicalScalar(true);
    zqArraySlot fraction = makeDoubleScalar(2.5), tooLarge = makeDoubleScalar(300),
                negative = makeDoubleScalar(-1);
    zqArraySlot complexBytes = makeArray(zqUInt8Class, {2, 3});
    const unsigned char imaginary[6] = {};
    makeComplex(*complexBytes, std::as_bytes(std::span(imaginary)));
    const std::pair<const zqArray_tag*, const zqArray_tag*> refused[] = {
        {bytes.get(), words.get()},        {bytes.get(), doubles.get()},
        {doubles.get(), doubles.get()},    {bytes.get(), column.get()},
        {bytes.get(), logical.get()},      {bytes.get(), fraction.get()},
        {tooLarge.get(), bytes.get()},     {bytes.get(), negative.get()},
        {bytes.get(), complexBytes.get()},
    };
    for (const auto& [first, second] : refused) {
        try {
            bitandBsxfunHelper(first, second);
            ADD_FAILURE() << "accepted";
        } catch (const foundation::core::except::IMsgIDException& error) {
            EXPECT_EQ(error.GetID(), "VESPRA:bsxfun:badOperands");
        }
    }
}

TEST_F(BsxfunOperands, EmptyResults) {
    zqArraySlot empty = makeArray(zqInt8Class, {0, 3});
    zqArraySlot row = makeArray(zqInt8Class, {1, 3});
    zqArraySlot result = bitandBsxfunHelper(empty.get(), row.get());
    EXPECT_EQ(dimensions(*result), (Dims{0, 3}));
}

}  // namespace
}  // namespace host::testing
