// The parallel driver, the SIMD families as the kernels run them, and the
// plain records: one serial call below a limit, subranges covering the run
// exactly once from it, and bit-identical elements either way (in place, on
// one thread, at odd alignment).
#include "engine/operator_families.hpp"
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

using Ranges = std::vector<std::pair<unsigned long, unsigned long>>;

// Runs the driver with a body that records its subranges and whether any ran
// off the calling thread.
struct DriverLog {
    std::mutex mutex;
    Ranges ranges;
    std::thread::id caller = std::this_thread::get_id();
    bool offCaller = false;

    static void body(const void* context, unsigned long begin, unsigned long end) noexcept {
        auto* log = const_cast<DriverLog*>(static_cast<const DriverLog*>(context));
        const std::lock_guard lock(log->mutex);
        log->ranges.emplace_back(begin, end);
        log->offCaller = log->offCaller || std::this_thread::get_id() != log->caller;
    }
};

bool coversExactlyOnce(Ranges ranges, unsigned long n) {
    std::sort(ranges.begin(), ranges.end());
    unsigned long next = 0;
    for (const auto& [begin, end] : ranges) {
        if (begin != next || end <= begin) return false;
        next = end;
    }
    return next == n;
}

TEST(ParallelDriver, SerialBelowTheLimitSplitFromIt) {
    constexpr unsigned long limit = 5000;
    {
        DriverLog log;
        runInRanges(limit - 1, limit, &DriverLog::body, &log);
        EXPECT_EQ(log.ranges, (Ranges{{0, limit - 1}}));
        EXPECT_FALSE(log.offCaller);
    }
    {
        DriverLog log;
        runInRanges(limit, limit, &DriverLog::body, &log);
        EXPECT_TRUE(coversExactlyOnce(log.ranges, limit));
        if (tbb::this_task_arena::max_concurrency() > 1) {
            EXPECT_GT(log.ranges.size(), 1u);
        }
    }
    {
        DriverLog log;
        runInRanges(0, limit, &DriverLog::body, &log);
        EXPECT_EQ(log.ranges, (Ranges{{0, 0}}));
    }
}

// Each family as its callers call it, with a plain reference for one
// element; `values` are the new bit values where the family takes them.
struct SetOneBitCase {
    using Family = SetOneBit;
    template <class T>
    static void run(T* out, const T* data, const T*, unsigned long n, std::uint32_t p) {
        SetOneBit::run(out, data, 1, n, p);
    }
    template <class T>
    static T expected(T a, T, std::uint32_t p) {
        return BitorPair::expected(T(std::uint64_t{1} << p), a, p);
    }
};
struct ClearOneBitCase {
    using Family = ClearOneBit;
    template <class T>
    static void run(T* out, const T* data, const T*, unsigned long n, std::uint32_t p) {
        ClearOneBit::run(out, data, 1, n, p);
    }
    template <class T>
    static T expected(T a, T, std::uint32_t p) {
        return BitandPair::expected(T(~(std::uint64_t{1} << p)), a, p);
    }
};
struct GetOneBitCase {
    using Family = GetOneBit;
    template <class T>
    static void run(T* out, const T* data, const T*, unsigned long n, std::uint32_t p) {
        GetOneBit::run(out, data, 1, n, p);
    }
    template <class T>
    static T expected(T a, T, std::uint32_t p) {
        return RightShiftAndPair::expected(a, T(1), p);
    }
};
struct SetBitFromValuesCase {
    using Family = SetBitFromValues;
    template <class T>
    static void run(T* out, const T* data, const T* values, unsigned long n, std::uint32_t p) {
        SetBitFromValues::run(out, data, 1, values, 1, n, p);
    }
    template <class T>
    static T expected(T a, T v, std::uint32_t p) {
        return BitsetPair::expected(a, v, p);
    }
};
struct LeftShiftCase {
    using Family = LeftShift;
    template <class T>
    static void run(T* out, const T* data, const T*, unsigned long n, std::uint32_t p) {
        LeftShift::run(out, data, 1, n, p);
    }
    template <class T>
    static T expected(T a, T, std::uint32_t p) {
        return LeftShiftPair::expected(a, p);
    }
};
struct ComplementCase {
    using Family = Complement;
    template <class T>
    static void run(T* out, const T* data, const T*, unsigned long n, std::uint32_t) {
        Complement::run(out, data, 1, n);
    }
    template <class T>
    static T expected(T a, T, std::uint32_t p) {
        return ComplementPair::expected(a, p);
    }
};
struct RightShiftCase {
    using Family = RightShift;
    template <class T>
    static void run(T* out, const T* data, const T*, unsigned long n, std::uint32_t p) {
        RightShift::run(out, data, 1, n, p);
    }
    template <class T>
    static T expected(T a, T, std::uint32_t p) {
        return RightShiftPair::expected(a, p);
    }
};

// A family's run over n elements that start one element past a register
// boundary, checked element by element against the reference.
template <class Case, class T>
void checkRun(const std::vector<T>& data, const std::vector<T>& values, unsigned long n,
              bool inPlace) {
    const std::uint32_t p = bitsOf<T> - 1 - static_cast<std::uint32_t>(n % 3);
    AlignedBuffer<T> dataBuffer(n + 1), outBuffer(n + 1);
    T* const dataAt = dataBuffer.data() + 1;
    std::copy_n(data.begin(), n, dataAt);
    T* const out = inPlace ? dataAt : outBuffer.data() + 1;
    Case::run(out, dataAt, values.data(), n, p);
    unsigned long i = 0;
    while (i < n && out[i] == Case::expected(data[i], values[i], p)) ++i;
    ASSERT_EQ(i, n) << "first wrong element of " << n << (inPlace ? ", in place" : "");
}

// Just below and at the family's limit, in place or not, on all threads and
// on one.
template <class Case, class T>
void checkAroundLimit() {
    using Record = typename Case::Family::template Record<T>;
    const unsigned long limit = Record::parallelLimit;
    const std::vector<T> data = testValues<T>(limit, 5);
    const std::vector<T> values = newBitValues<T>(limit, 6);
    for (bool oneThread : {false, true}) {
        std::unique_ptr<tbb::global_control> control;
        if (oneThread)
            control = std::make_unique<tbb::global_control>(
                tbb::global_control::max_allowed_parallelism, 1);
        for (bool inPlace : {false, true}) {
            checkRun<Case>(data, values, limit - 1, inPlace);
            checkRun<Case>(data, values, limit, inPlace);
        }
    }
}

template <class T>
class EveryWidthFamilies : public ::testing::Test {};
TYPED_TEST_SUITE(EveryWidthFamilies, AllIntegers);

TYPED_TEST(EveryWidthFamilies, SetOneBit) { checkAroundLimit<SetOneBitCase, TypeParam>(); }
TYPED_TEST(EveryWidthFamilies, ClearOneBit) { checkAroundLimit<ClearOneBitCase, TypeParam>(); }
TYPED_TEST(EveryWidthFamilies, GetOneBit) { checkAroundLimit<GetOneBitCase, TypeParam>(); }
TYPED_TEST(EveryWidthFamilies, LeftShift) { checkAroundLimit<LeftShiftCase, TypeParam>(); }
TYPED_TEST(EveryWidthFamilies, Complement) { checkAroundLimit<ComplementCase, TypeParam>(); }

template <class T>
class RightShiftFamilies : public ::testing::Test {};
TYPED_TEST_SUITE(RightShiftFamilies, RightShiftIntegers);
TYPED_TEST(RightShiftFamilies, RightShift) { checkAroundLimit<RightShiftCase, TypeParam>(); }

template <class T>
class BitsetFamilies : public ::testing::Test {};
TYPED_TEST_SUITE(BitsetFamilies, BitsetIntegers);
TYPED_TEST(BitsetFamilies, SetBitFromValues) {
    checkAroundLimit<SetBitFromValuesCase, TypeParam>();
}

// A result large enough for streaming stores, at an odd element, split over
// the threads; and the same run in place, which keeps ordinary stores.
TEST(StreamedResults, AgreeWithTheReference) {
    using T = unsigned short;
    const unsigned long n = streamingResultBytes / sizeof(T) + 77;
    const std::vector<T> data = testValues<T>(n, 9);
    const std::vector<T> values = newBitValues<T>(n, 10);
    for (bool inPlace : {false, true}) {
        checkRun<SetBitFromValuesCase>(data, values, n, inPlace);
        checkRun<RightShiftCase>(data, values, n, inPlace);
    }
}

// Which results stream: large ones that overlap no input.
TEST(StreamedResults, OnlyLargeResultsClearOfEveryInput) {
    using record_detail::resultStoresFor;
    using record_detail::spanOf;
    constexpr unsigned long large = streamingResultBytes;
    const std::unique_ptr<unsigned char[]> memory(new unsigned char[2 * large + 1]);
    unsigned char* const out = memory.get();
    unsigned char* const apart = out + large;  // starts where the result ends
    const unsigned char one = 1;
    EXPECT_EQ(resultStoresFor(out, large, {spanOf(apart, 1, large), spanOf(&one, 0, large)}),
              ResultStores::streamed);
    EXPECT_EQ(resultStoresFor(out, large - 1, {spanOf(apart, 1, large)}), ResultStores::cached);
    EXPECT_EQ(resultStoresFor(out, large, {spanOf(out, 1, large)}), ResultStores::cached);
    EXPECT_EQ(resultStoresFor(out, large, {spanOf(apart - 1, 1, large)}), ResultStores::cached);
    EXPECT_EQ(resultStoresFor(apart, large, {spanOf(out + 1, 1, large)}), ResultStores::cached);
    EXPECT_EQ(resultStoresFor(out, large, {spanOf(apart, 1, large), spanOf(out + 9, 0, large)}),
              ResultStores::cached);
}

// Plain records: the same elements in one serial call and split down to
// single elements, with every input broadcast or not.
struct WeightedSum {
    unsigned long operator()(unsigned long a) const { return 3 * a + 1; }
    unsigned long operator()(unsigned long a, short b) const {
        return 3 * a + static_cast<unsigned long>(b);
    }
    unsigned long operator()(unsigned long a, short b, bool c) const {
        return c ? (*this)(a, b) : a - static_cast<unsigned long>(b);
    }
};

template <class Record>
void runWithLimit(const Record& record, unsigned long limit) {
    runInRanges(record.n, limit, &runRecordRange<Record>, &record);
}

TEST(PlainVectorOps, SerialAndSplitRunsAgree) {
    constexpr unsigned long n = 1001;
    const std::vector<unsigned long> a = testValues<unsigned long>(n, 7);
    const std::vector<short> b = testValues<short>(n, 8);
    const std::unique_ptr<bool[]> flags(new bool[n]);
    for (unsigned long i = 0; i < n; ++i) flags[i] = i % 3 == 0;

    for (unsigned long s1 : {0ul, 1ul})
        for (unsigned long s2 : {0ul, 1ul})
            for (unsigned long s3 : {0ul, 1ul})
                for (unsigned long limit : {n + 1, 1ul}) {
                    SCOPED_TRACE(testing::Message()
                                 << "strides " << s1 << s2 << s3 << " limit " << limit);
                    std::vector<unsigned long> one(n), two(n), three(n);
                    runWithLimit(
                        bitfcnsOneInputVectorOp<unsigned long, WeightedSum>{
                            a.data(), one.data(), s1, n, {}},
                        limit);
                    runWithLimit(
                        bitfcnsTwoInputVectorOp<unsigned long, short, WeightedSum>{
                            a.data(), b.data(), two.data(), s1, s2, n, {}},
                        limit);
                    runWithLimit(
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
