// The loop of the double paths: a lane kernel that tests each element and
// computes its result, two doubles to an SSE2 register, run over subranges
// that the caller's range runner (the engine's parallel driver) spreads over
// threads. For a fresh result the test and the computation share one pass
// over memory; in place every element is tested before the first is written.
//
// A lane kernel has `arity` (1 or 2 array operands, read with unit stride;
// scalar operands live in the kernel), `parallelLimit`, optionally `Second`
// (the element type of the second operand: double unless it says bool, whose
// elements reach it as lanes of all ones or zeros), and
//   __m128d check(x[, y]) const: all ones in each lane it accepts;
//   __m128d apply(x[, y]) const: the result lanes, whatever bits where
//                                check refuses (never undefined behaviour).
#pragma once

#include "frame/range_runner.hpp"

#include <emmintrin.h>
#include <xmmintrin.h>

#include <atomic>
#include <type_traits>

namespace bitfcns {

namespace lane_loop_detail {

enum class Pass { checkAndApply, checkOnly, applyOnly };

template <class Kernel>
struct SecondOperand {
    using type = double;
};
template <class Kernel>
requires requires { typename Kernel::Second; }
struct SecondOperand<Kernel> {
    using type = typename Kernel::Second;
};

// Two elements of the second operand from p, and one (in the low lane).
inline __m128d twoLanes(const double* p) noexcept { return _mm_loadu_pd(p); }
inline __m128d oneLane(const double* p) noexcept { return _mm_load_sd(p); }
inline __m128d twoLanes(const bool* p) noexcept {
    return _mm_castsi128_pd(
        _mm_set_epi64x(-static_cast<long long>(p[1]), -static_cast<long long>(p[0])));
}
inline __m128d oneLane(const bool* p) noexcept {
    return _mm_castsi128_pd(_mm_set_epi64x(0, -static_cast<long long>(p[0])));
}

template <class Kernel>
struct Run {
    const double* first;
    const typename SecondOperand<Kernel>::type* second;
    double* out;
    Kernel kernel;
    std::atomic<bool>* refused;
};

template <class Kernel>
__m128d checkLanes(const Kernel& kernel, __m128d x, __m128d y) noexcept {
    if constexpr (Kernel::arity == 1) {
        return kernel.check(x);
    } else {
        return kernel.check(x, y);
    }
}

template <class Kernel>
__m128d applyLanes(const Kernel& kernel, __m128d x, __m128d y) noexcept {
    if constexpr (Kernel::arity == 1) {
        return kernel.apply(x);
    } else {
        return kernel.apply(x, y);
    }
}

// How far ahead of the element being read the loop asks for data: the
// hardware prefetchers don't keep one core's loads ahead of memory here.
inline constexpr unsigned long prefetchElements = 256;

// Flattened: every call in the loop, the kernel's among them, is inlined.
template <class Kernel, Pass pass>
[[gnu::flatten]] void runRange(const void* context, unsigned long begin,
                               unsigned long end) noexcept {
    const Run<Kernel>& run = *static_cast<const Run<Kernel>*>(context);
    // Locals: a store through `out` may not reload them.
    const double* const first = run.first;
    const auto* const second = run.second;
    double* const out = run.out;
    const Kernel kernel = run.kernel;
    constexpr bool two = Kernel::arity == 2;

    __m128d accepted = _mm_castsi128_pd(_mm_set1_epi32(-1));
    const auto pair = [&](unsigned long i) {
        const __m128d x = _mm_loadu_pd(first + i);
        const __m128d y = two ? twoLanes(second + i) : x;
        if constexpr (pass != Pass::applyOnly)
            accepted = _mm_and_pd(accepted, checkLanes(kernel, x, y));
        if constexpr (pass != Pass::checkOnly) _mm_storeu_pd(out + i, applyLanes(kernel, x, y));
    };

    unsigned long i = begin;
    // Head: cache lines of eight elements, each asked for ahead.
    for (; i + 8 <= end; i += 8) {
        _mm_prefetch(reinterpret_cast<const char*>(first + i + prefetchElements), _MM_HINT_T0);
        // A line of logical elements spans eight steps: asked for in one.
        if constexpr (two) {
            if (sizeof(*second) == sizeof(double) || (i & 63) < 8)
                _mm_prefetch(reinterpret_cast<const char*>(second + i + prefetchElements),
                             _MM_HINT_T0);
        }
        pair(i);
        pair(i + 2);
        pair(i + 4);
        pair(i + 6);
    }
    for (; i + 2 <= end; i += 2) pair(i);
    // Tail: one element in the low lane; the high lane's answer is ignored.
    if (i < end) {
        const __m128d x = _mm_load_sd(first + i);
        const __m128d y = two ? oneLane(second + i) : x;
        if constexpr (pass != Pass::applyOnly) {
            const __m128d highLane = _mm_castsi128_pd(_mm_set_epi32(-1, -1, 0, 0));
            accepted = _mm_and_pd(accepted, _mm_or_pd(highLane, checkLanes(kernel, x, y)));
        }
        if constexpr (pass != Pass::checkOnly) _mm_store_sd(out + i, applyLanes(kernel, x, y));
    }
    if (_mm_movemask_pd(accepted) != 3) run.refused->store(true, std::memory_order_relaxed);
}

}  // namespace lane_loop_detail

// Runs `kernel` over n elements of `first` (and of `second` for a kernel of
// two operands) into `out`. Returns whether every element was accepted. When
// `out` is an operand's own storage, every element is tested before the
// first is written, and a refusal leaves it untouched; otherwise one pass
// tests and writes, and a refusal leaves `out` partly written.
template <class Kernel>
bool runCheckedLanes(const Kernel& kernel, const double* first,
                     const typename lane_loop_detail::SecondOperand<Kernel>::type* second,
                     double* out, unsigned long n, RangeRunner runRanges) {
    using namespace lane_loop_detail;
    if (n == 0) return true;
    std::atomic<bool> refused{false};
    const Run<Kernel> run{first, second, out, kernel, &refused};
    constexpr unsigned long limit = Kernel::parallelLimit;
    if (out == first || static_cast<const void*>(out) == second) {
        runRanges(n, limit, &runRange<Kernel, Pass::checkOnly>, &run);
        if (refused.load(std::memory_order_relaxed)) return false;
        runRanges(n, limit, &runRange<Kernel, Pass::applyOnly>, &run);
        return true;
    }
    runRanges(n, limit, &runRange<Kernel, Pass::checkAndApply>, &run);
    return !refused.load(std::memory_order_relaxed);
}

}  // namespace bitfcns
