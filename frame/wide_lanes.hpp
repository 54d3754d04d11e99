// The double paths' checked loop on AVX-512 registers, eight doubles at a
// time: the test that a double is a whole number of class T, conversions
// between doubles and T's values held in 64-bit lanes, and the loop itself,
// which works as runCheckedLanes does (one pass for a fresh result, test
// then write in place).
//
// Include only in translation units compiled for AVX-512 F and DQ, whose
// functions are called only where laneWidth() says the processor has them.
// Nothing here is compiled for other units, so no copy of it built for the
// wide registers can stand in for code the baseline build calls.
#pragma once

#include "frame/checked_lanes.hpp"

#include <immintrin.h>

#include <limits>
#include <type_traits>

namespace bitfcns::wide {

inline __m512d broadcast(double x) noexcept { return _mm512_set1_pd(x); }

// The lanes of x that are whole numbers T holds: x within T's bounds (the
// upper one exclusive for the 64-bit classes, where it is 2^63 or 2^64;
// NaN fails both compares) and equal to x truncated.
template <class T>
__mmask8 fits(__m512d x) noexcept {
    constexpr bool upperExclusive = sizeof(T) == 8;
    constexpr double lowest = static_cast<double>(std::numeric_limits<T>::min());
    constexpr double highest =
        upperExclusive ? static_cast<double>(std::numeric_limits<T>::max() / 2 + 1) * 2.0
                       : static_cast<double>(std::numeric_limits<T>::max());
    const __mmask8 above = _mm512_cmp_pd_mask(x, broadcast(lowest), _CMP_GE_OQ);
    const __mmask8 within = _mm512_mask_cmp_pd_mask(above, x, broadcast(highest),
                                                    upperExclusive ? _CMP_LT_OQ : _CMP_LE_OQ);
    const __m512d truncated =
        _mm512_maskz_roundscale_pd(0xFF, x, _MM_FROUND_TO_ZERO | _MM_FROUND_NO_EXC);
    return _mm512_mask_cmp_pd_mask(within, truncated, x, _CMP_EQ_OQ);
}

// The lanes of p that are whole numbers from 1 to `width`: bit positions.
inline __mmask8 positionsValid(__m512d p, double width) noexcept {
    const __mmask8 above = _mm512_cmp_pd_mask(p, broadcast(1.0), _CMP_GE_OQ);
    const __mmask8 within = _mm512_mask_cmp_pd_mask(above, p, broadcast(width), _CMP_LE_OQ);
    const __m512d truncated =
        _mm512_maskz_roundscale_pd(0xFF, p, _MM_FROUND_TO_ZERO | _MM_FROUND_NO_EXC);
    return _mm512_mask_cmp_pd_mask(within, truncated, p, _CMP_EQ_OQ);
}

// The zero-based bit index of each valid position, in a 64-bit lane.
inline __m512i bitIndices(__m512d p) noexcept {
    return _mm512_sub_epi64(_mm512_cvttpd_epi64(p), _mm512_set1_epi64(1));
}

// Each lane's value in T, in a 64-bit lane: exact for whole numbers of T.
template <class T>
__m512i toInteger(__m512d x) noexcept {
    if constexpr (std::is_same_v<T, unsigned long>) {
        return _mm512_cvttpd_epu64(x);
    } else {
        return _mm512_cvttpd_epi64(x);
    }
}

// The value of T in the low bits of each 64-bit lane, as a double: exact up
// to 32 bits, rounded to nearest for the 64-bit classes.
template <class T>
__m512d toDouble(__m512i v) noexcept {
    constexpr unsigned spare = 64 - sizeof(T) * 8;
    if constexpr (std::is_same_v<T, unsigned long>) {
        return _mm512_cvtepu64_pd(v);
    } else if constexpr (std::is_signed_v<T>) {
        return _mm512_cvtepi64_pd(_mm512_srai_epi64(_mm512_slli_epi64(v, spare), spare));
    } else {
        return _mm512_cvtepi64_pd(_mm512_srli_epi64(_mm512_slli_epi64(v, spare), spare));
    }
}

namespace detail {

enum class Pass { checkAndApply, checkOnly, applyOnly };

template <class Kernel>
struct Run {
    const double* first;
    const double* second;
    double* out;
    Kernel kernel;
    bool* refused;  // written with atomic builtins only
};

// A kernel has `arity` (1 or 2), `parallelLimit`, `__mmask8 check(x[, y])`
// and `__m512d apply(x[, y])`, as the lane kernels of checked_lanes.hpp.
// Flattened: every call in the loop, the kernel's among them, is inlined.
template <class Kernel, Pass pass>
[[gnu::flatten]] void runRange(const void* context, unsigned long begin,
                               unsigned long end) noexcept {
    const Run<Kernel>& run = *static_cast<const Run<Kernel>*>(context);
    const double* const first = run.first;
    const double* const second = run.second;
    double* const out = run.out;
    const Kernel kernel = run.kernel;
    __mmask8 accepted = 0xFF;
    const auto lanes = [&](unsigned long i, __mmask8 mask) {
        const __m512d x = _mm512_maskz_loadu_pd(mask, first + i);
        __m512d y = x;
        if constexpr (Kernel::arity == 2) y = _mm512_maskz_loadu_pd(mask, second + i);
        if constexpr (pass != Pass::applyOnly) {
            if constexpr (Kernel::arity == 1) {
                accepted &= static_cast<__mmask8>(kernel.check(x) | ~mask);
            } else {
                accepted &= static_cast<__mmask8>(kernel.check(x, y) | ~mask);
            }
        }
        if constexpr (pass != Pass::checkOnly) {
            if constexpr (Kernel::arity == 1) {
                _mm512_mask_storeu_pd(out + i, mask, kernel.apply(x));
            } else {
                _mm512_mask_storeu_pd(out + i, mask, kernel.apply(x, y));
            }
        }
    };
    unsigned long i = begin;
    for (; i + 8 <= end; i += 8) {
        _mm_prefetch(reinterpret_cast<const char*>(first + i + lane_loop_detail::prefetchElements),
                     _MM_HINT_T0);
        if constexpr (Kernel::arity == 2)
            _mm_prefetch(
                reinterpret_cast<const char*>(second + i + lane_loop_detail::prefetchElements),
                _MM_HINT_T0);
        lanes(i, 0xFF);
    }
    if (i < end) lanes(i, static_cast<__mmask8>((1u << (end - i)) - 1));
    if (accepted != 0xFF) __atomic_store_n(run.refused, true, __ATOMIC_RELAXED);
}

}  // namespace detail

// runCheckedLanes on AVX-512 registers, for a kernel of this header's form.
template <class Kernel>
bool runLanes(const Kernel& kernel, const double* first, const double* second, double* out,
              unsigned long n, RangeRunner runRanges) {
    using detail::Pass;
    using detail::runRange;
    if (n == 0) return true;
    bool refused = false;
    const detail::Run<Kernel> run{first, second, out, kernel, &refused};
    constexpr unsigned long limit = Kernel::parallelLimit;
    if (out == first || out == second) {
        runRanges(n, limit, &runRange<Kernel, Pass::checkOnly>, &run);
        if (__atomic_load_n(&refused, __ATOMIC_RELAXED)) return false;
        runRanges(n, limit, &runRange<Kernel, Pass::applyOnly>, &run);
        return true;
    }
    runRanges(n, limit, &runRange<Kernel, Pass::checkAndApply>, &run);
    return !__atomic_load_n(&refused, __ATOMIC_RELAXED);
}

}  // namespace bitfcns::wide
