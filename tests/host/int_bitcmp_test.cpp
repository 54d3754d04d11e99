// mu::IntVectorBitcmp over the eight integer types: counts around the vector
// width at several misalignments with a sentinel after the output, in place,
// strided, and past the parallel limit.
#include "host/math_utils.hpp"

#include <gtest/gtest.h>

#include <cstring>
#include <numeric>
#include <vector>

namespace {

template <class T>
class IntVectorBitcmpTest : public ::testing::Test {};
using IntegerTypes = ::testing::Types<signed char, unsigned char, short, unsigned short, int,
                                      unsigned int, long, unsigned long>;
TYPED_TEST_SUITE(IntVectorBitcmpTest, IntegerTypes);

template <class T>
std::vector<T> ramp(std::size_t count) {
    std::vector<T> values(count);
    for (std::size_t i = 0; i < count; ++i) values[i] = static_cast<T>(i * 37 + 5);
    return values;
}

TYPED_TEST(IntVectorBitcmpTest, CountsAndMisalignmentsLeaveTheSentinel) {
    using T = TypeParam;
    const T sentinel = static_cast<T>(0x5A);
    for (std::size_t offset = 0; offset < 4; ++offset) {
        for (unsigned long count = 0; count <= 2 * 32 / sizeof(T) + 3; ++count) {
            const std::vector<T> in = ramp<T>(offset + count);
            std::vector<T> out(offset + count + 1, sentinel);
            mu::IntVectorBitcmp<T>(out.data() + offset, const_cast<T*>(in.data()) + offset, 1, 1,
                                   count);
            for (unsigned long i = 0; i < count; ++i) {
                ASSERT_EQ(out[offset + i], static_cast<T>(~in[offset + i]))
                    << count << " " << offset;
            }
            ASSERT_EQ(out[offset + count], sentinel);
            if (offset > 0) {
                ASSERT_EQ(out[offset - 1], sentinel);
            }
        }
    }
}

TYPED_TEST(IntVectorBitcmpTest, InPlaceAcrossTheParallelLimit) {
    using T = TypeParam;
    for (unsigned long count : {5UL, (256UL << 10) / sizeof(T) + 3, (1UL << 20) + 1}) {
        std::vector<T> values = ramp<T>(count);
        mu::IntVectorBitcmp<T>(values.data(), values.data(), 1, 1, count);
        const std::vector<T> original = ramp<T>(count);
        for (unsigned long i = 0; i < count; ++i)
            ASSERT_EQ(values[i], static_cast<T>(~original[i])) << i;
    }
}

TYPED_TEST(IntVectorBitcmpTest, StridesTouchOnlyTheirElements) {
    using T = TypeParam;
    const std::vector<T> in = ramp<T>(30);
    std::vector<T> out(20, T{0});
    mu::IntVectorBitcmp<T>(out.data(), const_cast<T*>(in.data()), 2, 3, 10);
    for (unsigned long i = 0; i < 20; ++i) {
        EXPECT_EQ(out[i], i % 2 ? T{0} : static_cast<T>(~in[i / 2 * 3]));
    }
}

}  // namespace
