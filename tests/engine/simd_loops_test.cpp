// The seven SIMD functor pairs through unarySIMDApply and binarySIMDApply,
// against plain scalar references: every run length from 0 to 5L + 1 (a
// head, a whole cache line of registers and some left over), every
// start offset of output and contiguous inputs within a register (so also
// operands that can never be aligned together), broadcast, contiguous and
// wider-strided inputs, an output that is the first input, with ordinary
// and with streaming stores.
#include "engine/simd_loops.hpp"
#include "engine_test_support.hpp"

#include <string>

namespace bitfcns::test {
namespace {

// Input strides: broadcast, contiguous, and one the library never passes.
constexpr unsigned long inputStrides[] = {0, 1, 2};

// Element offsets within a register to try for an input of this stride.
template <class T>
std::size_t offsetsFor(unsigned long stride) {
    return stride == 1 ? lanesOf<T> : 1;
}

// Places `values` at `offset` with `stride` (one element for stride 0).
template <class T>
const T* place(AlignedBuffer<T>& buffer, const std::vector<T>& values, std::size_t offset,
               unsigned long stride, std::size_t n) {
    T* at = buffer.data() + offset;
    const std::size_t count = stride == 0 ? 1 : n;
    for (std::size_t i = 0; i < count; ++i) at[i * stride] = values[i];
    return at;
}

std::string layout(std::size_t n, std::size_t outOffset, std::size_t offset1, unsigned long stride1,
                   std::size_t offset2, unsigned long stride2, std::uint32_t parameter,
                   bool inPlace) {
    return "n=" + std::to_string(n) + " out@" + std::to_string(outOffset) + " in1@" +
           std::to_string(offset1) + "/" + std::to_string(stride1) + " in2@" +
           std::to_string(offset2) + "/" + std::to_string(stride2) +
           " parameter=" + std::to_string(parameter) + (inPlace ? " in place" : "");
}

constexpr ResultStores bothStores[] = {ResultStores::cached, ResultStores::streamed};

template <class Pair, class T>
void sweepBinary(ResultStores stores) {
    SCOPED_TRACE(stores == ResultStores::streamed ? "streaming stores" : "ordinary stores");
    constexpr std::size_t lanes = lanesOf<T>;
    constexpr std::size_t longest = 5 * lanes + 1;
    constexpr std::size_t room = 2 * longest + lanes;
    const std::vector<T> first = testValues<T>(longest, 1);
    const std::vector<T> second = Pair::template secondValues<T>(longest);
    AlignedBuffer<T> out(room), in1(room), in2(room);
    std::uint32_t run = 0;
    for (std::size_t n = 0; n <= longest; ++n)
        for (unsigned long stride1 : inputStrides)
            for (unsigned long stride2 : inputStrides)
                for (std::size_t outOffset = 0; outOffset < lanes; ++outOffset)
                    for (std::size_t offset1 = 0; offset1 < offsetsFor<T>(stride1); ++offset1)
                        for (std::size_t offset2 = 0; offset2 < offsetsFor<T>(stride2); ++offset2)
                            for (bool inPlace : {false, true}) {
                                if (inPlace && (stride1 != 1 || offset1 != outOffset)) continue;
                                const std::uint32_t parameter = run++ % bitsOf<T>;
                                out.reset();
                                const T* a = place(inPlace ? out : in1, first, offset1, stride1, n);
                                const T* b = place(in2, second, offset2, stride2, n);
                                binarySIMDApply(out.data() + outOffset, a, b, 1, stride1, stride2,
                                                n, Pair::template vector<T>(parameter),
                                                Pair::template scalar<T>(parameter), stores);
                                const T* result = out.data() + outOffset;
                                for (std::size_t i = 0; i < n; ++i)
                                    ASSERT_EQ(
                                        result[i],
                                        Pair::expected(first[stride1 == 0 ? 0 : i],
                                                       second[stride2 == 0 ? 0 : i], parameter))
                                        << "element " << i << ", "
                                        << layout(n, outOffset, offset1, stride1, offset2, stride2,
                                                  parameter, inPlace);
                                ASSERT_TRUE(out.untouchedOutside(outOffset, n))
                                    << layout(n, outOffset, offset1, stride1, offset2, stride2,
                                              parameter, inPlace);
                            }
}

template <class Pair, class T>
void sweepUnary(ResultStores stores) {
    SCOPED_TRACE(stores == ResultStores::streamed ? "streaming stores" : "ordinary stores");
    constexpr std::size_t lanes = lanesOf<T>;
    constexpr std::size_t longest = 5 * lanes + 1;
    constexpr std::size_t room = 2 * longest + lanes;
    const std::vector<T> values = testValues<T>(longest, 3);
    AlignedBuffer<T> out(room), in(room);
    std::uint32_t run = 0;
    for (std::size_t n = 0; n <= longest; ++n)
        for (unsigned long stride : inputStrides)
            for (std::size_t outOffset = 0; outOffset < lanes; ++outOffset)
                for (std::size_t offset = 0; offset < offsetsFor<T>(stride); ++offset)
                    for (bool inPlace : {false, true}) {
                        if (inPlace && (stride != 1 || offset != outOffset)) continue;
                        const std::uint32_t parameter = run++ % bitsOf<T>;
                        out.reset();
                        const T* a = place(inPlace ? out : in, values, offset, stride, n);
                        unarySIMDApply(out.data() + outOffset, a, 1, stride, n,
                                       Pair::template vector<T>(parameter),
                                       Pair::template scalar<T>(parameter), stores);
                        const T* result = out.data() + outOffset;
                        for (std::size_t i = 0; i < n; ++i)
                            ASSERT_EQ(result[i],
                                      Pair::expected(values[stride == 0 ? 0 : i], parameter))
                                << "element " << i << ", "
                                << layout(n, outOffset, offset, stride, 0, 0, parameter, inPlace);
                        ASSERT_TRUE(out.untouchedOutside(outOffset, n))
                            << layout(n, outOffset, offset, stride, 0, 0, parameter, inPlace);
                    }
}

template <class T>
class EveryWidthPairs : public ::testing::Test {};
TYPED_TEST_SUITE(EveryWidthPairs, AllIntegers);

TYPED_TEST(EveryWidthPairs, Bitand) {
    for (ResultStores stores : bothStores) sweepBinary<BitandPair, TypeParam>(stores);
}
TYPED_TEST(EveryWidthPairs, Bitor) {
    for (ResultStores stores : bothStores) sweepBinary<BitorPair, TypeParam>(stores);
}
TYPED_TEST(EveryWidthPairs, RightShiftAnd) {
    for (ResultStores stores : bothStores) sweepBinary<RightShiftAndPair, TypeParam>(stores);
}
TYPED_TEST(EveryWidthPairs, LeftShift) {
    for (ResultStores stores : bothStores) sweepUnary<LeftShiftPair, TypeParam>(stores);
}
TYPED_TEST(EveryWidthPairs, Complement) {
    for (ResultStores stores : bothStores) sweepUnary<ComplementPair, TypeParam>(stores);
}

template <class T>
class RightShiftPairs : public ::testing::Test {};
TYPED_TEST_SUITE(RightShiftPairs, RightShiftIntegers);

TYPED_TEST(RightShiftPairs, RightShift) {
    for (ResultStores stores : bothStores) sweepUnary<RightShiftPair, TypeParam>(stores);
}

template <class T>
class BitsetPairs : public ::testing::Test {};
TYPED_TEST_SUITE(BitsetPairs, BitsetIntegers);

TYPED_TEST(BitsetPairs, Bitset) {
    for (ResultStores stores : bothStores) sweepBinary<BitsetPair, TypeParam>(stores);
}

// The twin of bitset also serves value types other than T: a value is true
// when it isn't zero in its own type.
TEST(IntBitsetFtor, TruthOfOtherValueTypes) {
    EXPECT_EQ((IntBitsetFtor<unsigned char, short>(0)(0, 256)), 1);
    EXPECT_EQ((IntBitsetFtor<unsigned char, double>(7)(0, 0.5)), 128);
    EXPECT_EQ((IntBitsetFtor<unsigned char, double>(0)(1, -0.0)), 0);
    EXPECT_EQ((IntBitsetFtor<long, bool>(63)(0, true)), std::numeric_limits<long>::min());
    EXPECT_EQ((IntBitsetFtor<int, float>(31)(-1, 0.0f)), std::numeric_limits<int>::max());
}

}  // namespace
}  // namespace bitfcns::test
