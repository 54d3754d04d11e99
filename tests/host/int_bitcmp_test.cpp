// mu::IntVectorBitcmp over the eight integer types: counts around the vector
// width at several misalignments with sentinels around the output, and in
// place on either side of the parallel limit.
#include "host/math_utils.hpp"
#include "host/parallel_limits.hpp"
#include "tests/support/host_arrays.hpp"

namespace {

template <class T>
class IntVectorBitcmpTest : public ::testing::Test {};
TYPED_TEST_SUITE(IntVectorBitcmpTest, testing_support::IntegerTypes);

template <class T>
std::vector<T> ramp(std::size_t count) {
    std::vector<T> values(count);
    for (std::size_t i = 0; i < count; ++i) values[i] = static_cast<T>(i * 37 + 5);
    return values;
}

TYPED_TEST(IntVectorBitcmpTest, CountsAndMisalignmentsLeaveTheSentinels) {
    using T = TypeParam;
    const T sentinel = static_cast<T>(0x5A);
    for (std::size_t offset = 0; offset < 4; ++offset) {
        for (unsigned long count = 0; count <= 2 * 32 / sizeof(T) + 3; ++count) {
            std::vector<T> in = ramp<T>(offset + count);
            std::vector<T> out(offset + count + 1, sentinel);
            mu::IntVectorBitcmp<T>(out.data() + offset, in.data() + offset, 1, 1, count);
            for (unsigned long i = 0; i < count; ++i)
                ASSERT_EQ(out[offset + i], static_cast<T>(~in[offset + i]))
                    << count << " " << offset;
            ASSERT_EQ(out[offset + count], sentinel);
            if (offset > 0) {
                ASSERT_EQ(out[offset - 1], sentinel);
            }
        }
    }
}

TYPED_TEST(IntVectorBitcmpTest, InPlaceOnEitherSideOfTheParallelLimit) {
    using T = TypeParam;
    const unsigned long limit = host::parallelResultBytes / sizeof(T);
    for (unsigned long count : {limit - 1, limit + 3}) {
        std::vector<T> values = ramp<T>(count);
        mu::IntVectorBitcmp<T>(values.data(), values.data(), 1, 1, count);
        const std::vector<T> original = ramp<T>(count);
        for (unsigned long i = 0; i < count; ++i)
            ASSERT_EQ(values[i], static_cast<T>(~original[i])) << i;
    }
}

}  // namespace
