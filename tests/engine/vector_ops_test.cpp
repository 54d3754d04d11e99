// The parallel driver: one serial call on the calling thread below its limit,
// subranges covering the run exactly once from it; and the vector forms of
// the plain functors, lane for lane against their scalar operator(), alone
// and through a record at every placement. The element loop (broadcasts,
// three inputs) is checked through bitget's, bitset's and bitshift's entry
// points against the reference model, at and below each parallel limit.
#include "engine/vector_ops.hpp"
#include "bitget/bitget_ftors.hpp"
#include "bitset/bitset_functors.hpp"
#include "bitshift/shift_rule.hpp"

#include <gtest/gtest.h>
#include <tbb/task_arena.h>

#include <algorithm>
#include <cstdint>
#include <limits>
#include <mutex>
#include <numeric>
#include <random>
#include <sstream>
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

template <class Record>
void runWithLimit(const Record& record, unsigned long limit) {
    runInRanges(record.n, limit, &runRecordRange<Record>, &record);
}

// Element types (value, second operand) of the vector forms: values of 8,
// 16 and 32 bits with second operands of their own width, narrower, wider,
// of the other signedness, floating and logical.
template <class P>
class VectorForms : public ::testing::Test {};
template <class T, class U>
using P = std::pair<T, U>;
using i8 = std::int8_t;
using u8 = std::uint8_t;
using i16 = std::int16_t;
using u16 = std::uint16_t;
using i32 = std::int32_t;
using u32 = std::uint32_t;
using Pairs =
    ::testing::Types<P<u8, u8>, P<u8, i8>, P<i8, u8>, P<i8, i8>, P<i8, bool>, P<u8, i16>,
                     P<i8, u32>, P<u8, long>, P<i8, unsigned long>, P<u8, double>, P<i8, float>,
                     P<u16, i16>, P<i16, u16>, P<i16, i8>, P<u16, u8>, P<i16, i32>, P<u16, u32>,
                     P<i16, unsigned long>, P<u16, double>, P<i16, bool>, P<u32, i32>, P<i32, u32>,
                     P<i32, i8>, P<u32, u16>, P<i32, long>, P<u32, unsigned long>, P<i32, double>,
                     P<u32, float>, P<i32, bool>>;
TYPED_TEST_SUITE(VectorForms, Pairs);

// Every pair of 8-bit elements; for wider ones every pair of edge values
// (counts around the width, the limits of T and U, U's values that a
// narrower lane would wrap), then random pairs, half of them with small
// second operands. Floating second operands are whole.
template <class T, class U>
void operandPairs(std::vector<T>& a, std::vector<U>& b) {
    constexpr long w = 8 * sizeof(T), min = std::numeric_limits<T>::min(),
                   max = std::numeric_limits<T>::max();
    std::vector<long> edges{0,     1,  2,      -1,  w - 1,   w,       w + 1,
                            1 - w, -w, -w - 1, min, min + 1, max - 1, max};
    for (long wrap : {0x100l, 0x10000l, 0x100000000l})
        edges.insert(edges.end(), {wrap + 3, -wrap - 3});
    std::vector<U> ends{std::numeric_limits<U>::lowest(), std::numeric_limits<U>::max()};
    if (std::is_same_v<T, U> && w == 8) {
        edges.resize(256);
        std::iota(edges.begin(), edges.end(), 0l);
        ends.clear();
    }
    std::vector<U> seconds(ends);
    for (long y : edges) seconds.push_back(static_cast<U>(y));
    for (long x : edges)
        for (U y : seconds) a.push_back(static_cast<T>(x)), b.push_back(y);
    std::mt19937_64 random(13);
    while (a.size() % 16 != 0 || a.size() < 20000) {
        a.push_back(static_cast<T>(random()));
        const auto r = random();
        b.push_back(
            static_cast<U>(r % 2 ? static_cast<long>(r) : static_cast<long>(r % (4 * w)) - 2 * w));
    }
}

// ftor.lanes(a, more...) against ftor(a[i], more[i]...) in every lane, the
// other operands read into the lanes as the functor reads them.
template <class T, class Ftor, class... U>
void expectLanesMatchScalar(const char* name, const Ftor& ftor, const std::vector<T>& a,
                            const U*... more) {
    constexpr unsigned long count = 16 / sizeof(T);
    T results[count];
    const auto lanesAt = [&]<std::size_t... k>(unsigned long i, std::index_sequence<k...>) {
        const __m128i va = _mm_loadu_si128(reinterpret_cast<const __m128i*>(a.data() + i));
        return ftor.lanes(va,
                          lanes::readLanesOf<T, plain_detail::readingOf<Ftor, k>()>(more + i)...);
    };
    for (unsigned long i = 0; i < a.size(); i += count) {
        _mm_storeu_si128(reinterpret_cast<__m128i*>(results),
                         lanesAt(i, std::index_sequence_for<U...>{}));
        for (unsigned long k = 0; k < count; ++k) {
            const T expected = ftor(a[i + k], more[i + k]...);
            if (results[k] == expected) continue;
            std::ostringstream call;
            call << name << "(" << +a[i + k];
            ((call << ", " << +more[i + k]), ...);
            FAIL() << call.str() << "): " << +results[k] << ", expected " << +expected;
        }
    }
}

TYPED_TEST(VectorForms, LanesMatchTheScalarFunctor) {
    using T = typename TypeParam::first_type;
    using U = typename TypeParam::second_type;
    constexpr std::uint32_t w = 8 * sizeof(T);
    // Logicals are stored as bytes of 0 or 1, as the host holds them.
    using S = std::conditional_t<std::is_same_v<U, bool>, unsigned char, U>;
    std::vector<T> a;
    std::vector<S> b;
    operandPairs(a, b);
    if constexpr (std::is_same_v<U, bool>)
        for (S& v : b) v = v & 1;
    if constexpr (std::is_floating_point_v<U>) {
        // Truth values only: a NaN is true, -0.0 false.
        std::vector<U> truths(b);
        for (unsigned long i = 0; i < truths.size(); i += 7)
            truths[i] = i % 3 == 0   ? std::numeric_limits<U>::quiet_NaN()
                        : i % 3 == 1 ? U(-0.0)
                                     : U(0.5);
        for (std::uint32_t bit = 0; bit < w; bit += 3)
            expectLanesMatchScalar("bitset", IntBitsetFtor<T, U>(bit), a, truths.data());
    }
    const U* second = reinterpret_cast<const U*>(b.data());
    for (std::uint32_t bit = 0; bit < w; ++bit)
        expectLanesMatchScalar("bitset", IntBitsetFtor<T, U>(bit), a, second);
    if constexpr (!std::is_same_v<U, bool>) {
        expectLanesMatchScalar("bitshift", bitshiftVVFtor<T, U>{int(w)}, a, second);
        std::vector<U> positions(b.size());
        for (unsigned long i = 0; i < b.size(); ++i)
            positions[i] = static_cast<U>(1 + (i * 7 + i / 5) % w);
        // Counts that all point left, then all right, in whole registers.
        expectLanesMatchScalar("bitshift left", bitshiftVVFtor<T, U>{int(w)}, a, positions.data());
        if constexpr (std::is_signed_v<U> || std::is_floating_point_v<U>) {
            std::vector<U> rightward(positions);
            for (U& count : rightward) count = static_cast<U>(-count);
            expectLanesMatchScalar("bitshift right", bitshiftVVFtor<T, U>{int(w)}, a,
                                   rightward.data());
        }
        expectLanesMatchScalar("bitget", bitgetVVFtor<T, U>{}, a, positions.data());
        expectLanesMatchScalar("bitset", bitsetVVTFtor<T, U>{}, a, positions.data());
        expectLanesMatchScalar("bitclear", bitsetVVFFtor<T, U>{}, a, positions.data());
        expectLanesMatchScalar("bitset by values", bitsetVVVFtor<T, U>{}, a, positions.data(),
                               second);
    }
}

// The vector loop of a two-input record: every offset within a register of
// output and both inputs, in place or not, at lengths around multiples of a
// register and a cache line, nothing written outside the result; and a split
// run over inputs of exactly n elements, which a read past them would leave.
template <class T, class U>
void expectEveryPlacementToMatch() {
    using Record = bitfcnsTwoInputVectorOp<T, U, bitshiftVVFtor<T, U>>;
    const bitshiftVVFtor<T, U> ftor{8 * sizeof(T)};
    std::vector<T> a;
    std::vector<U> b;
    operandPairs(a, b);
    constexpr unsigned long room = 200;
    const T sentinel = 0x5A;
    std::vector<T> out(room), in1(room);
    std::vector<U> in2(room);
    for (unsigned long n : {0, 1, 15, 16, 17, 31, 33, 63, 64, 65, 79, 130})
        for (unsigned long form = 0; form < 2 * 16 * 16 * 16; ++form) {
            const unsigned long oo = form % 16, o1 = form / 16 % 16, o2 = form / 256 % 16;
            const bool inPlace = form >= 16 * 16 * 16;
            if (inPlace && o1 != oo) continue;
            const unsigned long from = (form * 97) % (a.size() - n);
            std::fill(out.begin(), out.end(), sentinel);
            T* const x = (inPlace ? out : in1).data() + o1;
            std::copy_n(a.begin() + from, n, x);
            std::copy_n(b.begin() + from, n, in2.data() + o2);
            runWithLimit(Record{x, in2.data() + o2, out.data() + oo, 1, 1, n, ftor}, n + 1);
            for (unsigned long i = 0; i < room; ++i) {
                const unsigned long k = i - oo;
                ASSERT_EQ(out[i], i >= oo && k < n ? ftor(a[from + k], b[from + k]) : sentinel)
                    << "element " << i << ", n " << n << ", out@" << oo << ", in@" << o1 << "/"
                    << o2 << (inPlace ? ", in place" : "");
            }
        }
    a.pop_back();
    b.pop_back();
    b.shrink_to_fit();
    std::vector<T> split(a.size());
    runWithLimit(Record{a.data(), b.data(), split.data(), 1, 1, a.size(), ftor}, 1);
    for (unsigned long i = 0; i < a.size(); ++i) ASSERT_EQ(split[i], ftor(a[i], b[i])) << i;
}

TEST(VectorLoop, RunsAtEveryPlacementMatchTheScalarFunctor) {
    expectEveryPlacementToMatch<std::int8_t, std::int8_t>();
    expectEveryPlacementToMatch<std::uint8_t, double>();
    expectEveryPlacementToMatch<std::int32_t, std::int8_t>();
}

}  // namespace
}  // namespace bitfcns
