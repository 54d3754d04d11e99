// mu::IntVectorBitcmp over the eight integer types: counts around the vector
// width at several misalignments, with sentinels around the output, and runs
// large enough for the parallel split and for streaming stores (aligned,
// misaligned and in place). Other parallel and in-place calls come through
// bitcmp's fuzz target.
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

TEST(IntVectorBitcmpLargeRun, StreamedMisalignedAndInPlaceRunsAgree) {
    // Past the streaming size, with a tail that fills no 16-byte chunk.
    const unsigned long count = (16ul << 20) + 17;
    std::vector<std::uint8_t> in(count + 1);
    for (std::size_t i = 0; i < in.size(); ++i) in[i] = static_cast<std::uint8_t>(i * 131 + i / 7);
    const std::uint8_t sentinel = 0x5A;
    for (std::size_t offset : {0, 1}) {  // the result on a 16-byte boundary, then off it
        std::vector<std::uint8_t> out(count + 2, sentinel);
        mu::IntVectorBitcmp<std::uint8_t>(out.data() + offset, in.data(), 1, 1, count);
        for (unsigned long i = 0; i < count; ++i)
            ASSERT_EQ(out[offset + i], static_cast<std::uint8_t>(~in[i])) << offset << " " << i;
        ASSERT_EQ(out[offset + count], sentinel);
    }
    std::vector<std::uint8_t> inPlace(in.begin(), in.end() - 1);
    mu::IntVectorBitcmp<std::uint8_t>(inPlace.data(), inPlace.data(), 1, 1, count);
    for (unsigned long i = 0; i < count; ++i)
        ASSERT_EQ(inPlace[i], static_cast<std::uint8_t>(~in[i])) << i;
}

}  // namespace
