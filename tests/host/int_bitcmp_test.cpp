// mu::IntVectorBitcmp over the eight integer types: counts around the vector
// width at several misalignments, with sentinels around the output. Parallel
// and in-place calls come through bitcmp's fuzz target.
#include "host/math_utils.hpp"
#include "tests/support/host_arrays.hpp"

namespace {

template <class T>
class IntVectorBitcmpTest : public ::testing::Test {};
TYPED_TEST_SUITE(IntVectorBitcmpTest, testing_support::IntegerTypes);

TYPED_TEST(IntVectorBitcmpTest, CountsAndMisalignmentsLeaveTheSentinels) {
    using T = TypeParam;
    const T sentinel = static_cast<T>(0x5A);
    for (std::size_t offset = 0; offset < 4; ++offset) {
        for (unsigned long count = 0; count <= 2 * 32 / sizeof(T) + 3; ++count) {
            std::vector<T> in(offset + count);
            for (std::size_t i = 0; i < in.size(); ++i) in[i] = static_cast<T>(i * 37 + 5);
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

}  // namespace
