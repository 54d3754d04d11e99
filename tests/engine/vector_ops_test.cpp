// The parallel driver: one serial call on the calling thread below its limit,
// subranges covering the run exactly once from it; and the plain records,
// whose elements are the same in one serial call and split down to single
// elements, with every input broadcast or not.
#include "engine/vector_ops.hpp"

#include <gtest/gtest.h>
#include <tbb/task_arena.h>

#include <algorithm>
#include <memory>
#include <mutex>
#include <thread>
#include <utility>
#include <vector>

namespace bitfcns {
namespace {

using Ranges = std::vector<std::pair<unsigned long, unsigned long>>;

// The subranges a run was given, and whether any ran off the calling thread.
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

TEST(ParallelDriver, SerialBelowTheLimitSplitFromIt) {
    constexpr unsigned long limit = 5000;
    for (unsigned long n : {0ul, limit - 1, limit}) {
        DriverLog log;
        runInRanges(n, limit, &DriverLog::body, &log);
        if (n < limit) {
            EXPECT_EQ(log.ranges, (Ranges{{0, n}}));
            EXPECT_FALSE(log.offCaller);
            continue;
        }
        std::sort(log.ranges.begin(), log.ranges.end());
        unsigned long next = 0;
        for (const auto& [begin, end] : log.ranges) {
            EXPECT_TRUE(begin == next && end > begin) << begin << ".." << end;
            next = end;
        }
        EXPECT_EQ(next, n);
        EXPECT_TRUE(tbb::this_task_arena::max_concurrency() == 1 || log.ranges.size() > 1);
    }
}

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
    std::vector<unsigned long> a(n);
    std::vector<short> b(n);
    const std::unique_ptr<bool[]> flags(new bool[n]);
    for (unsigned long i = 0; i < n; ++i) {
        a[i] = i * 0x9E3779B97F4A7C15u;
        b[i] = static_cast<short>(i * 40503);
        flags[i] = i % 3 == 0;
    }
    for (unsigned long strides = 0; strides < 8; ++strides)
        for (unsigned long limit : {n + 1, 1ul}) {
            const unsigned long s1 = strides & 1, s2 = strides >> 1 & 1, s3 = strides >> 2;
            SCOPED_TRACE(testing::Message() << "strides " << s1 << s2 << s3 << " limit " << limit);
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
                ASSERT_EQ(one[i], WeightedSum{}(a[i * s1])) << i;
                ASSERT_EQ(two[i], WeightedSum{}(a[i * s1], b[i * s2])) << i;
                ASSERT_EQ(three[i], WeightedSum{}(a[i * s1], b[i * s2], flags[i * s3])) << i;
            }
        }
}

}  // namespace
}  // namespace bitfcns
