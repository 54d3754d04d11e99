// bitshift's double path by one count on AVX-512 registers: each double
// converted to T's value in a 64-bit lane, shifted there (arithmetically to
// the right for signed T), cut to T's width and converted back.
#include "bitshift/double_shift.hpp"

#include "engine/parallel_driver.hpp"
#include "engine/parallel_limits.hpp"
#include "frame/wide_lanes.hpp"

#include <type_traits>

namespace bitfcns {
namespace {

template <class T, DoubleShift kind>
struct WideShift {
    static constexpr int arity = 1;
    static constexpr unsigned long parallelLimit = limits::bitshiftOnDouble;

    __m128i amount;  // in the low 64 bits
    __m512d fill;    // -1.0 or 0.0, kept where x is negative (out only)

    __mmask8 check(__m512d x) const noexcept { return wide::fits<T>(x); }
    __m512d apply(__m512d x) const noexcept {
        if constexpr (kind == DoubleShift::left) {
            return wide::toDouble<T>(_mm512_sll_epi64(wide::toInteger<T>(x), amount));
        } else if constexpr (kind == DoubleShift::right) {
            const __m512i v = wide::toInteger<T>(x);
            return wide::toDouble<T>(std::is_signed_v<T> ? _mm512_sra_epi64(v, amount)
                                                         : _mm512_srl_epi64(v, amount));
        } else {
            const __mmask8 negative = _mm512_cmp_pd_mask(x, _mm512_setzero_pd(), _CMP_LT_OQ);
            return _mm512_maskz_mov_pd(negative, fill);
        }
    }
};

// A count per element: shifted left by it where it is positive, right by
// its magnitude otherwise. Counts are clamped to 64 either way, and the
// shifts by a count per lane give 0 (or the sign, to the right for signed T)
// from 64 on; a count from T's width to 64 leaves no bit of T either, so
// every count at or beyond the width gives what the shift rule says.
template <class T>
struct WideShiftByCounts {
    static constexpr int arity = 2;
    static constexpr unsigned long parallelLimit = limits::bitshiftOnDouble;

    __mmask8 check(__m512d x, __m512d c) const noexcept {
        const __m512d magnitude = _mm512_abs_pd(c);
        const __mmask8 finite =
            _mm512_cmp_pd_mask(magnitude, _mm512_set1_pd(1.7976931348623157e308), _CMP_LE_OQ);
        const __m512d truncated =
            _mm512_maskz_roundscale_pd(0xFF, c, _MM_FROUND_TO_ZERO | _MM_FROUND_NO_EXC);
        return static_cast<__mmask8>(wide::fits<T>(x) &
                                     _mm512_mask_cmp_pd_mask(finite, truncated, c, _CMP_EQ_OQ));
    }
    __m512d apply(__m512d x, __m512d c) const noexcept {
        const __m512d clamped =
            _mm512_min_pd(_mm512_max_pd(c, _mm512_set1_pd(-64.0)), _mm512_set1_pd(64.0));
        const __m512i k = _mm512_cvttpd_epi64(clamped);
        const __m512i minusK = _mm512_sub_epi64(_mm512_setzero_si512(), k);
        const __m512i v = wide::toInteger<T>(x);
        const __m512i left = _mm512_sllv_epi64(v, k);
        const __m512i right =
            std::is_signed_v<T> ? _mm512_srav_epi64(v, minusK) : _mm512_srlv_epi64(v, minusK);
        const __mmask8 positive = _mm512_cmp_pd_mask(c, _mm512_setzero_pd(), _CMP_GT_OQ);
        return wide::toDouble<T>(_mm512_mask_blend_epi64(positive, right, left));
    }
};

template <class T, DoubleShift kind>
bool run(const double* in, int amount, double* out, unsigned long n) {
    const WideShift<T, kind> kernel{_mm_cvtsi32_si128(amount),
                                    _mm512_set1_pd(amount < 0 ? -1.0 : 0.0)};
    return wide::runLanes(kernel, in, nullptr, out, n, &runInRanges);
}

}  // namespace

template <class T>
bool shiftByCountsWide(const double* in, const double* counts, double* out, unsigned long n) {
    return wide::runLanes(WideShiftByCounts<T>{}, in, counts, out, n, &runInRanges);
}

template <class T>
bool shiftWide(const double* in, DoubleShift kind, int amount, double* out, unsigned long n) {
    switch (kind) {
        case DoubleShift::left: return run<T, DoubleShift::left>(in, amount, out, n);
        case DoubleShift::right: return run<T, DoubleShift::right>(in, amount, out, n);
        case DoubleShift::out: break;
    }
    return run<T, DoubleShift::out>(in, amount, out, n);
}

template bool shiftWide<signed char>(const double*, DoubleShift, int, double*, unsigned long);
template bool shiftWide<unsigned char>(const double*, DoubleShift, int, double*, unsigned long);
template bool shiftWide<short>(const double*, DoubleShift, int, double*, unsigned long);
template bool shiftWide<unsigned short>(const double*, DoubleShift, int, double*, unsigned long);
template bool shiftWide<int>(const double*, DoubleShift, int, double*, unsigned long);
template bool shiftWide<unsigned int>(const double*, DoubleShift, int, double*, unsigned long);
template bool shiftWide<long>(const double*, DoubleShift, int, double*, unsigned long);
template bool shiftWide<unsigned long>(const double*, DoubleShift, int, double*, unsigned long);
template bool shiftByCountsWide<signed char>(const double*, const double*, double*, unsigned long);
template bool shiftByCountsWide<unsigned char>(const double*, const double*, double*,
                                               unsigned long);
template bool shiftByCountsWide<short>(const double*, const double*, double*, unsigned long);
template bool shiftByCountsWide<unsigned short>(const double*, const double*, double*,
                                                unsigned long);
template bool shiftByCountsWide<int>(const double*, const double*, double*, unsigned long);
template bool shiftByCountsWide<unsigned int>(const double*, const double*, double*, unsigned long);
template bool shiftByCountsWide<long>(const double*, const double*, double*, unsigned long);
template bool shiftByCountsWide<unsigned long>(const double*, const double*, double*,
                                               unsigned long);

}  // namespace bitfcns
