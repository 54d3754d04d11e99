// The math utility library's AND, OR and XOR under implicit expansion,
// against a naive element-by-element reference: lengths around the vector
// width and the parallel limit, expansion in many dimensions, and a double
// scalar partner. Random shapes come through bitand's fuzz target.
#include "host/math_utils.hpp"
#include "host/parallel_limits.hpp"
#include "tests/support/host_arrays.hpp"

#include <algorithm>
#include <random>

namespace {

using host::Dims;
using testing_support::classIdOf;
using Helper = zqArraySlot (*)(const zqArray_tag*, const zqArray_tag*);

struct Operation {
    Helper helper;
    unsigned long (*reference)(unsigned long, unsigned long);
};
const Operation operations[] = {
    {bitandBsxfunHelper, [](unsigned long a, unsigned long b) { return a & b; }},
    {bitorBsxfunHelper, [](unsigned long a, unsigned long b) { return a | b; }},
    {bitxorBsxfunHelper, [](unsigned long a, unsigned long b) { return a ^ b; }},
};

// Elements of class T as the tests hold them: logical ones as bytes 0 and 1.
template <class T>
using Values = std::vector<std::conditional_t<std::is_same_v<T, bool>, unsigned char, T>>;

unsigned long productOf(const Dims& dims) {
    unsigned long n = 1;
    for (unsigned long d : dims) n *= d;
    return n;
}

// An operand of class T with random elements, and the elements.
template <class T>
struct Operand {
    Dims dims;
    Values<T> values;
    zqArraySlot array;

    Operand(Dims sizes, std::mt19937_64& random) : dims(std::move(sizes)), values(productOf(dims)) {
        for (auto& v : values) v = static_cast<typename Values<T>::value_type>(random());
        if constexpr (std::is_same_v<T, bool>)
            for (auto& v : values) v &= 1;
        array = host::makeArray(classIdOf<T>, dims,
                                std::span<const typename Values<T>::value_type>(values));
    }
};

// The element of `dims` that result index `linear` reads under expansion.
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
void expectMatchesReference(const Operation& op, const Operand<T>& a, const Operand<T>& b) {
    const zqArraySlot result = op.helper(a.array.get(), b.array.get());
    Dims resultDims(std::max(a.dims.size(), b.dims.size()));
    for (std::size_t k = 0; k < resultDims.size(); ++k) {
        const unsigned long first = k < a.dims.size() ? a.dims[k] : 1;
        resultDims[k] = first == 1 && k < b.dims.size() ? b.dims[k] : first;
    }
    ASSERT_EQ(host::classOf(*result), classIdOf<T>);
    ASSERT_EQ(host::elementCount(*result), productOf(resultDims));
    const auto out = testing_support::elementsOf<typename Values<T>::value_type>(result.get());
    for (unsigned long i = 0; i < out.size(); ++i) {
        const auto x = static_cast<unsigned long>(a.values[sourceIndex(i, resultDims, a.dims)]);
        const auto y = static_cast<unsigned long>(b.values[sourceIndex(i, resultDims, b.dims)]);
        ASSERT_EQ(out[i], static_cast<T>(op.reference(x, y))) << "at " << i;
    }
}

template <class T>
class BsxfunTyped : public testing_support::LeakCheckedTest {};
using ElementTypes = ::testing::Types<signed char, unsigned char, short, unsigned short, int,
                                      unsigned int, long, unsigned long, bool>;
TYPED_TEST_SUITE(BsxfunTyped, ElementTypes);

// Rows of every length up to a few registers, and one element either side
// of the parallel limit, against a row and against a scalar on either side.
TYPED_TEST(BsxfunTyped, LengthsAroundVectorWidthAndParallelLimit) {
    std::mt19937_64 random(11);
    const unsigned long limit = host::parallelResultBytes / sizeof(TypeParam);
    std::vector<unsigned long> lengths{limit - 1, limit};
    for (unsigned long n = 0; n <= 40; ++n) lengths.push_back(n);
    const Operand<TypeParam> scalar({1, 1}, random);
    for (unsigned long n : lengths) {
        const Operand<TypeParam> a({1, n}, random), b({1, n}, random);
        const Operation& op = operations[n % 3];
        expectMatchesReference(op, a, b);
        expectMatchesReference(op, scalar, b);
        expectMatchesReference(op, a, scalar);
    }
}

class BsxfunShapes : public testing_support::LeakCheckedTest {};

TEST_F(BsxfunShapes, ExpansionAcrossTheParallelLimitAndInManyDimensions) {
    std::mt19937_64 random(3);
    expectMatchesReference(operations[2], Operand<unsigned short>({3, 1, 40000}, random),
                           Operand<unsigned short>({3, 5}, random));
    const Operand<int> many({2, 1, 2, 2, 1, 2, 2, 2, 1, 2, 2, 3}, random);
    expectMatchesReference(operations[0], many, Operand<int>({2, 1}, random));
    expectMatchesReference(operations[1], Operand<int>({2, 1, 1, 2}, random), many);
    EXPECT_THROW(bitandBsxfunHelper(many.array.get(), Operand<int>({2, 1, 3}, random).array.get()),
                 foundation::core::except::IMsgIDException);
}

TEST_F(BsxfunShapes, DoubleScalarPartnerTakesTheIntegerClass) {
    const auto wide = testing_support::makeOf<long>({-1, 5});
    const auto minimum = host::makeDoubleScalar(-9223372036854775808.0);
    const zqArraySlot result = bitandBsxfunHelper(minimum.get(), wide.get());
    EXPECT_EQ(host::classOf(*result), zqInt64Class);
    EXPECT_EQ(testing_support::elementsOf<long>(result.get()), (std::vector<long>{1L << 63, 0}));
}

}  // namespace
