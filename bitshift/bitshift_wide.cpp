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

template <class T, DoubleShift kind>
bool run(const double* in, int amount, double* out, unsigned long n) {
    const WideShift<T, kind> kernel{_mm_cvtsi32_si128(amount),
                                    _mm512_set1_pd(amount < 0 ? -1.0 : 0.0)};
    return wide::runLanes(kernel, in, nullptr, out, n, &runInRanges);
}

}  // namespace

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

}  // namespace bitfcns
