// The operator records and runVectorOp: one serial call over the whole range
// just below a family's limit, subranges from the limit on, bit-identical
// results either way (also with an output that is the data operand, and on
// one thread), and the three plain records with broadcast inputs.
#include "engine/vector_ops.hpp"
#include "engine/parallel_limits.hpp"
#include "engine_test_support.hpp"

#include <tbb/global_control.h>
#include <tbb/task_arena.h>

#include <memory>
#include <mutex>
#include <thread>
#include <utility>

namespace bitfcns::test {
namespace {

// The calls a record received: ranges and whether any ran off the calling thread.
struct CallLog {
    std::mutex mutex;
    std::vector<std::pair<unsigned long, unsigned long>> ranges;
    std::thread::id caller = std::this_thread::get_id();
    bool offCaller = false;
};

// A record that logs each subrange before handing it to the real one.
template <class VectorOp>
struct Logged {
    VectorOp op;
    unsigned long n;
    CallLog* log;

    void operator()(const VectorRange& range) const {
        {
            const std::lock_guard lock(log->mutex);
            log->ranges.emplace_back(range.begin(), range.end());
            log->offCaller = log->offCaller || std::this_thread::get_id() != log->caller;
        }
        op(range);
    }
};

// True when the logged ranges cover [0, n) exactly once.
bool coversExactlyOnce(std::vector<std::pair<unsigned long, unsigned long>> ranges,
                       unsigned long n) {
    std::sort(ranges.begin(), ranges.end());
    unsigned long next = 0;
    for (const auto& [begin, end] : ranges) {
        if (begin != next || end <= begin) return false;
        next = end;
    }
    return next == n;
}

// Where a family's callers put the data operand, and what goes beside it: a
// broadcast constant (the plain or inverted mask, the 1 of bitget) or an
// array of new bit values.
enum class Layout { unary, dataThenConstant, constantThenData, dataThenValues };

struct SetOneBit {
    using Pair = BitorPair;
    static constexpr Layout layout = Layout::constantThenData;
    template <class T>
    static constexpr unsigned long limit = limits::setOneBit<T>;
    template <class T>
    static T constant(std::uint32_t p) {
        return T(std::uint64_t{1} << p);
    }
};
struct ClearOneBit {
    using Pair = BitandPair;
    static constexpr Layout layout = Layout::constantThenData;
    template <class T>
    static constexpr unsigned long limit = limits::clearOneBit<T>;
    template <class T>
    static T constant(std::uint32_t p) {
        return T(~(std::uint64_t{1} << p));
    }
};
struct GetOneBit {
    using Pair = RightShiftAndPair;
    static constexpr Layout layout = Layout::dataThenConstant;
    template <class T>
    static constexpr unsigned long limit = limits::getOneBit<T>;
    template <class T>
    static T constant(std::uint32_t) {
        return T(1);
    }
};
struct SetBitFromValues {
    using Pair = BitsetPair;
    static constexpr Layout layout = Layout::dataThenValues;
    template <class T>
    static constexpr unsigned long limit = limits::setBitFromValues<T>;
    template <class T>
    static T constant(std::uint32_t) {
        return T(0);
    }
};
struct LeftShift {
    using Pair = LeftShiftPair;
    static constexpr Layout layout = Layout::unary;
    template <class T>
    static constexpr unsigned long limit = limits::leftShift<T>;
    template <class T>
    static T constant(std::uint32_t) {
        return T(0);
    }
};
struct RightShift {
    using Pair = RightShiftPair;
    static constexpr Layout layout = Layout::unary;
    template <class T>
    static constexpr unsigned long limit = limits::rightShift<T>;
    template <class T>
    static T constant(std::uint32_t) {
        return T(0);
    }
};

// The record of a family, filled as its callers fill it; `second` is the
// constant or the new bit values.
template <class Family, class T>
auto familyRecord(T* out, const T* data, const T* second, unsigned long n, std::uint32_t p) {
    const auto simd = Family::Pair::template vector<T>(p);
    const auto scalar = Family::Pair::template scalar<T>(p);
    if constexpr (Family::layout == Layout::unary) {
        return bitfcnsUnarySIMDVectorOp<T, decltype(simd), decltype(scalar)>{data, out,  1,
                                                                             n,    simd, scalar};
    } else {
        using Record = bitfcnsBinarySIMDVectorOp<T, decltype(simd), decltype(scalar)>;
        if constexpr (Family::layout == Layout::constantThenData)
            return Record{second, data, out, 0, 1, n, simd, scalar};
        else if constexpr (Family::layout == Layout::dataThenConstant)
            return Record{data, second, out, 1, 0, n, simd, scalar};
        else
            return Record{data, second, out, 1, 1, n, simd, scalar};
    }
}

template <class Family, class T>
T expectedElement(T a, T value, T constant, std::uint32_t p) {
    using Pair = typename Family::Pair;
    if constexpr (Family::layout == Layout::unary)
        return Pair::expected(a, p);
    else if constexpr (Family::layout == Layout::constantThenData)
        return Pair::expected(constant, a, p);
    else if constexpr (Family::layout == Layout::dataThenConstant)
        return Pair::expected(a, constant, p);
    else
        return Pair::expected(a, value, p);
}

// Runs a family through runVectorOp over n elements, the data starting one
// element past a register boundary, and checks every element and the calls.
template <class Family, class T>
void checkFamilyRun(const std::vector<T>& data, const std::vector<T>& values, unsigned long n,
                    bool inPlace, bool expectSplit) {
    const std::uint32_t parameter = bitsOf<T> - 1 - static_cast<std::uint32_t>(n % 3);
    AlignedBuffer<T> dataBuffer(n + 1), outBuffer(n + 1);
    T* const dataAt = dataBuffer.data() + 1;
    std::copy_n(data.begin(), n, dataAt);
    T* const out = inPlace ? dataAt : outBuffer.data() + 1;
    const T constant = Family::template constant<T>(parameter);
    const T* second = Family::layout == Layout::dataThenValues ? values.data() : &constant;

    const unsigned long limit = Family::template limit<T>;
    CallLog log;
    runVectorOp(Logged{familyRecord<Family>(out, dataAt, second, n, parameter), n, &log}, limit);

    unsigned long i = 0;
    while (i < n && out[i] == expectedElement<Family>(data[i], values[i], constant, parameter)) ++i;
    ASSERT_EQ(i, n) << "first wrong element of " << n;
    if (n < limit) {
        ASSERT_EQ(log.ranges.size(), 1u);
        EXPECT_EQ(log.ranges[0], std::make_pair(0ul, n));
        EXPECT_FALSE(log.offCaller);
    } else {
        EXPECT_TRUE(coversExactlyOnce(log.ranges, n));
        if (expectSplit) {
            EXPECT_GT(log.ranges.size(), 1u);
        }
    }
}

template <class Family, class T>
void checkFamilyAtLimit() {
    const unsigned long limit = Family::template limit<T>;
    const std::vector<T> data = testValues<T>(limit, 5);
    const std::vector<T> values = newBitValues<T>(limit, 6);
    for (bool inPlace : {false, true}) {
        SCOPED_TRACE(inPlace ? "in place" : "separate output");
        const bool manyThreads = tbb::this_task_arena::max_concurrency() > 1;
        checkFamilyRun<Family>(data, values, limit - 1, inPlace, false);
        checkFamilyRun<Family>(data, values, limit, inPlace, manyThreads);
        const tbb::global_control oneThread(tbb::global_control::max_allowed_parallelism, 1);
        checkFamilyRun<Family>(data, values, limit - 1, inPlace, false);
        checkFamilyRun<Family>(data, values, limit, inPlace, false);
    }
}

template <class T>
class EveryWidthFamilies : public ::testing::Test {};
TYPED_TEST_SUITE(EveryWidthFamilies, AllIntegers);

TYPED_TEST(EveryWidthFamilies, SetOneBit) { checkFamilyAtLimit<SetOneBit, TypeParam>(); }
TYPED_TEST(EveryWidthFamilies, ClearOneBit) { checkFamilyAtLimit<ClearOneBit, TypeParam>(); }
TYPED_TEST(EveryWidthFamilies, GetOneBit) { checkFamilyAtLimit<GetOneBit, TypeParam>(); }
TYPED_TEST(EveryWidthFamilies, LeftShift) { checkFamilyAtLimit<LeftShift, TypeParam>(); }

template <class T>
class RightShiftFamilies : public ::testing::Test {};
TYPED_TEST_SUITE(RightShiftFamilies, RightShiftIntegers);

TYPED_TEST(RightShiftFamilies, RightShift) { checkFamilyAtLimit<RightShift, TypeParam>(); }

template <class T>
class BitsetFamilies : public ::testing::Test {};
TYPED_TEST_SUITE(BitsetFamilies, BitsetIntegers);

TYPED_TEST(BitsetFamilies, SetBitFromValues) { checkFamilyAtLimit<SetBitFromValues, TypeParam>(); }

// Plain records: the same elements serially and when split down to single
// elements (limit 1), with every input broadcast or not.
struct WeightedSum {
    unsigned long operator()(unsigned long a) const { return 3 * a + 1; }
    unsigned long operator()(unsigned long a, short b) const {
        return 3 * a + static_cast<unsigned long>(b);
    }
    unsigned long operator()(unsigned long a, short b, bool c) const {
        return c ? (*this)(a, b) : a - static_cast<unsigned long>(b);
    }
};

TEST(PlainVectorOps, SerialAndSplitRunsAgree) {
    constexpr unsigned long n = 1001;
    const std::vector<unsigned long> a = testValues<unsigned long>(n, 7);
    std::vector<short> b = testValues<short>(n, 8);
    const std::unique_ptr<bool[]> flags(new bool[n]);
    for (unsigned long i = 0; i < n; ++i) flags[i] = i % 3 == 0;

    for (unsigned long s1 : {0ul, 1ul})
        for (unsigned long s2 : {0ul, 1ul})
            for (unsigned long s3 : {0ul, 1ul})
                for (unsigned long limit : {n + 1, n, 1ul}) {
                    SCOPED_TRACE(testing::Message()
                                 << "strides " << s1 << s2 << s3 << " limit " << limit);
                    std::vector<unsigned long> one(n), two(n), three(n);
                    runVectorOp(
                        bitfcnsOneInputVectorOp<unsigned long, WeightedSum>{
                            a.data(), one.data(), s1, n, {}},
                        limit);
                    runVectorOp(
                        bitfcnsTwoInputVectorOp<unsigned long, short, WeightedSum>{
                            a.data(), b.data(), two.data(), s1, s2, n, {}},
                        limit);
                    runVectorOp(
                        bitfcnsThreeInputVectorOp<unsigned long, short, bool, WeightedSum>{
                            a.data(), b.data(), flags.get(), three.data(), s1, s2, s3, n, {}},
                        limit);
                    for (unsigned long i = 0; i < n; ++i) {
                        const unsigned long x = a[i * s1];
                        const short y = b[i * s2];
                        const bool z = flags[i * s3];
                        ASSERT_EQ(one[i], WeightedSum{}(x)) << i;
                        ASSERT_EQ(two[i], WeightedSum{}(x, y)) << i;
                        ASSERT_EQ(three[i], WeightedSum{}(x, y, z)) << i;
                    }
                }
}

}  // namespace
}  // namespace bitfcns::test
