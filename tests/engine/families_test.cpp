// Each SIMD operator family as its callers run it, against a plain model in
// 64-bit arithmetic: every length up to three registers and a lane, at every
// placement of output and operands within a register, broadcast or
// contiguous, in place or not, with nothing written outside the result; runs
// one below and at the family's parallel limit, on all threads and on one,
// and results large enough to be written with streaming stores.
#include "engine/operator_families.hpp"
#include "engine/vector_ops.hpp"

#include <gtest/gtest.h>
#include <tbb/global_control.h>

#include <algorithm>
#include <cstdint>
#include <limits>
#include <memory>
#include <random>
#include <type_traits>
#include <vector>

namespace bitfcns {
namespace {

using Bits = std::uint64_t;

template <class T>
Bits bitsOf(T x) {
    return static_cast<std::make_unsigned_t<T>>(x);
}

// The extremes, 0, 1 and -1, then random values, a quarter of them zero
// (the new bit values of SetBitFromValues come from here too).
template <class T>
std::vector<T> testValues(unsigned long n, std::uint64_t seed) {
    std::vector<T> values{std::numeric_limits<T>::min(), std::numeric_limits<T>::max(), T(0), T(1),
                          T(-1)};
    std::mt19937_64 random(seed);
    while (values.size() < n) values.push_back(random() % 4 ? static_cast<T>(random()) : T(0));
    values.resize(n);
    return values;
}

// The operands of one run; `values` only for the family that takes them.
template <class T>
struct Operands {
    T* out;
    const T* data;
    unsigned long dataStride;
    const T* values;
    unsigned long valueStride;
    unsigned long n;
};

// Calls check(name, limit, takesValues, run, model) for each family with an
// operator for T; model(a, v, p) is one element of the result.
template <class T>
void forEachFamily(auto check) {
    using O = const Operands<T>&;
    using P = std::uint32_t;
    check(
        "SetOneBit", SetOneBit::Record<T>::parallelLimit, false,
        [](O o, P p) { SetOneBit::run(o.out, o.data, o.dataStride, o.n, p); },
        [](T a, T, P p) { return T(bitsOf(a) | Bits{1} << p); });
    check(
        "ClearOneBit", ClearOneBit::Record<T>::parallelLimit, false,
        [](O o, P p) { ClearOneBit::run(o.out, o.data, o.dataStride, o.n, p); },
        [](T a, T, P p) { return T(bitsOf(a) & ~(Bits{1} << p)); });
    check(
        "GetOneBit", GetOneBit::Record<T>::parallelLimit, false,
        [](O o, P p) { GetOneBit::run(o.out, o.data, o.dataStride, o.n, p); },
        [](T a, T, P p) { return T(bitsOf(a) >> p & 1); });
    check(
        "LeftShift", LeftShift::Record<T>::parallelLimit, false,
        [](O o, P p) { LeftShift::run(o.out, o.data, o.dataStride, o.n, p); },
        [](T a, T, P p) { return T(bitsOf(a) << p); });
    if constexpr (std::is_unsigned_v<T> || sizeof(T) < 8)
        check(
            "RightShift", RightShift::Record<T>::parallelLimit, false,
            [](O o, P p) { RightShift::run(o.out, o.data, o.dataStride, o.n, p); },
            [](T a, T, P p) {
                return std::is_signed_v<T> ? T(static_cast<std::int64_t>(a) >> p)
                                           : T(bitsOf(a) >> p);
            });
    if constexpr (sizeof(T) < 8)
        check(
            "SetBitFromValues", SetBitFromValues::Record<T>::parallelLimit, true,
            [](O o, P p) {
                SetBitFromValues::run(o.out, o.data, o.dataStride, o.values, o.valueStride, o.n, p);
            },
            [](T a, T v, P p) {
                return T(v != 0 ? bitsOf(a) | Bits{1} << p : bitsOf(a) & ~(Bits{1} << p));
            });
}

template <class T>
class Families : public ::testing::Test {};
using Integers = ::testing::Types<signed char, unsigned char, short, unsigned short, int,
                                  unsigned int, long, unsigned long>;
TYPED_TEST_SUITE(Families, Integers);

// Every length up to five registers and a lane (the scalar twin alone, then
// head, a cache line of registers a step, and tail); the output and each contiguous operand at every
// element offset within a register, so also operands that are never aligned
// together; each operand broadcast or contiguous; in place or not.
TYPED_TEST(Families, ShortRunsAtEveryPlacementMatchTheModel) {
    using T = TypeParam;
    constexpr unsigned long lanes = lanesOf<T>, longest = 5 * lanes + 1, room = longest + lanes;
    const T sentinel = static_cast<T>(0xA5A5A5A5A5A5A5A5u);
    const std::vector<T> data = testValues<T>(longest, 1), values = testValues<T>(longest, 2);
    forEachFamily<T>([&](const char* name, unsigned long, bool takesValues, auto run, auto model) {
        std::vector<T> out(room), in(room), valueIn(room);
        std::uint32_t p = 0;
        // A run: its length, which operands are contiguous, in place or not,
        // and the offsets within a register of output, data and values.
        for (unsigned long n = 0; n <= longest; ++n)
            for (unsigned long form = 0; form < 8 * lanes * lanes * lanes; ++form) {
                const unsigned long sa = form & 1, sv = form >> 1 & 1, oo = form / 8 % lanes,
                                    ao = form / 8 / lanes % lanes, vo = form / 8 / lanes / lanes;
                const bool inPlace = form & 4;
                if ((!sa && ao) || (!sv && vo) || (sv && !takesValues) ||
                    (inPlace && (!sa || ao != oo)))
                    continue;
                p = (p + 1) % (8 * sizeof(T));
                std::fill(out.begin(), out.end(), sentinel);
                T* a = (inPlace ? out : in).data() + ao;
                std::copy_n(data.begin(), sa ? n : 1, a);
                std::copy_n(values.begin(), sv ? n : 1, valueIn.data() + vo);
                run(Operands<T>{out.data() + oo, a, sa, valueIn.data() + vo, sv, n}, p);
                for (unsigned long i = 0; i < room; ++i) {
                    const unsigned long k = i - oo;
                    ASSERT_EQ(out[i],
                              i >= oo && k < n ? model(data[sa * k], values[sv * k], p) : sentinel)
                        << name << ": element " << i << ", n " << n << ", out@" << oo << ", data@"
                        << ao << "/" << sa << ", values@" << vo << "/" << sv << ", bit " << p
                        << (inPlace ? ", in place" : "");
                }
            }
    });
}

// One below the limit (one serial call) and at it (split across threads),
// and both on one thread; in place or not; every operand one element past a
// register boundary. For one type also a result past the streaming size at
// an odd element: streamed when fresh, with ordinary stores in place.
TYPED_TEST(Families, RunsAroundTheParallelLimitMatchTheModel) {
    using T = TypeParam;
    forEachFamily<T>([](const char* name, unsigned long limit, bool, auto run, auto model) {
        std::vector<unsigned long> lengths{limit - 1, limit};
        if (std::is_same_v<T, unsigned short>)
            lengths.push_back(streamingResultBytes / sizeof(T) + 77);
        const unsigned long longest = lengths.back();
        const std::vector<T> data = testValues<T>(longest + 1, 5),
                             values = testValues<T>(longest + 1, 6);
        std::vector<T> in(longest + 1), out(longest + 1);
        for (bool oneThread : {false, true}) {
            std::unique_ptr<tbb::global_control> control;
            if (oneThread)
                control = std::make_unique<tbb::global_control>(
                    tbb::global_control::max_allowed_parallelism, 1);
            for (unsigned long n : lengths)
                for (bool inPlace : {false, true}) {
                    std::copy_n(data.begin(), n + 1, in.begin());
                    T* const o = (inPlace ? in : out).data() + 1;
                    const auto p = static_cast<std::uint32_t>(8 * sizeof(T) - 1 - n % 3);
                    run(Operands<T>{o, in.data() + 1, 1, values.data() + 1, 1, n}, p);
                    unsigned long i = 0;
                    while (i < n && o[i] == model(data[i + 1], values[i + 1], p)) ++i;
                    ASSERT_EQ(i, n)
                        << name << ": first wrong element of " << n << (inPlace ? ", in place" : "")
                        << (oneThread ? ", on one thread" : "");
                }
        }
    });
}

}  // namespace
}  // namespace bitfcns
