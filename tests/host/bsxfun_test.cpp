// The math utility library's AND, OR and XOR: rows of every length around
// the vector width and at the parallel limit, against a row and a scalar on
// either side, element by element; expansion across the parallel limit,
// also on one thread. Small shapes in any number of dimensions come through
// the fuzz targets of bitand, bitor and bitxor.
#include "host/math_utils.hpp"
#include "host/parallel_limits.hpp"
#include "tests/support/host_arrays.hpp"

#include <tbb/global_control.h>

#include <random>

namespace {

using host::Dims;
using testing_support::classIdOf;
using testing_support::elementsOf;

// Elements of class T as the tests hold them: logical ones as bytes 0 and 1.
template <class T>
using Stored = std::conditional_t<std::is_same_v<T, bool>, unsigned char, T>;

// An array of class T with random elements, and the elements.
template <class T>
struct RandomArray {
    std::vector<Stored<T>> values;
    zqArraySlot array;

    RandomArray(const Dims& dims, std::mt19937_64& random)
        : values(dims[0] * dims[1] * (dims.size() > 2 ? dims[2] : 1)) {
        for (auto& v : values)
            v = static_cast<Stored<T>>(std::is_same_v<T, bool> ? random() & 1 : random());
        array = host::makeArray(classIdOf<T>, dims, std::span<const Stored<T>>(values));
    }
};

template <class T>
class BsxfunTyped : public testing_support::LeakCheckedTest {};
using ElementTypes = ::testing::Types<signed char, unsigned char, short, unsigned short, int,
                                      unsigned int, long, unsigned long, bool>;
TYPED_TEST_SUITE(BsxfunTyped, ElementTypes);

TYPED_TEST(BsxfunTyped, RowsAroundVectorWidthAndParallelLimit) {
    using S = Stored<TypeParam>;
    std::mt19937_64 random(11);
    const unsigned long limit = host::parallelResultBytes / sizeof(TypeParam);
    std::vector<unsigned long> lengths{limit - 1, limit};
    for (unsigned long n = 0; n <= 40; ++n) lengths.push_back(n);
    const RandomArray<TypeParam> scalar({1, 1}, random);
    const auto& s = scalar.values;
    for (unsigned long n : lengths) {
        const RandomArray<TypeParam> rowA({1, n}, random), rowB({1, n}, random);
        const auto &a = rowA.values, &b = rowB.values;
        const auto expectRow = [&](const zqArraySlot& result, auto element) {
            ASSERT_EQ(host::classOf(*result), classIdOf<TypeParam>);
            const auto out = elementsOf<S>(result.get());
            ASSERT_EQ(out.size(), n);
            for (unsigned long i = 0; i < n; ++i) ASSERT_EQ(out[i], S(element(i))) << n << " " << i;
        };
        expectRow(bitandBsxfunHelper(rowA.array.get(), rowB.array.get()),
                  [&](auto i) { return a[i] & b[i]; });
        expectRow(bitorBsxfunHelper(scalar.array.get(), rowB.array.get()),
                  [&](auto i) { return s[0] | b[i]; });
        expectRow(bitxorBsxfunHelper(rowA.array.get(), scalar.array.get()),
                  [&](auto i) { return a[i] ^ s[0]; });
    }
}

class BsxfunShapes : public testing_support::LeakCheckedTest {};

TEST_F(BsxfunShapes, ExpansionAcrossTheParallelLimitOnManyThreadsAndOne) {
    std::mt19937_64 random(3);
    const RandomArray<unsigned short> slabs({3, 1, 40000}, random), matrix({3, 5}, random);
    const auto parallel =
        elementsOf<unsigned short>(bitxorBsxfunHelper(slabs.array.get(), matrix.array.get()).get());
    tbb::global_control oneThread(tbb::global_control::max_allowed_parallelism, 1);
    EXPECT_EQ(
        elementsOf<unsigned short>(bitxorBsxfunHelper(slabs.array.get(), matrix.array.get()).get()),
        parallel);
    ASSERT_EQ(parallel.size(), 3u * 5 * 40000);
    for (unsigned long i = 0; i < parallel.size(); ++i) {
        const unsigned short x = slabs.values[i % 3 + i / 15 * 3], y = matrix.values[i % 15];
        ASSERT_EQ(parallel[i], static_cast<unsigned short>(x ^ y)) << i;
    }
}

}  // namespace
