// bitand, bitor and bitxor on doubles on AVX-512 registers: both operands
// converted to T's values in 64-bit lanes, combined there, cut to T's width
// and converted back.
#include "logic/bit_logic_wide.hpp"

#include "engine/parallel_driver.hpp"
#include "frame/wide_lanes.hpp"

namespace bitfcns {
namespace {

template <BitOp op>
__m512i combine(__m512i a, __m512i b) noexcept {
    if constexpr (op == BitOp::bitAnd) {
        return _mm512_and_si512(a, b);
    } else if constexpr (op == BitOp::bitOr) {
        return _mm512_or_si512(a, b);
    } else {
        return _mm512_xor_si512(a, b);
    }
}

template <class T, BitOp op>
struct WideArrays {
    static constexpr int arity = 2;
    static constexpr unsigned long parallelLimit = bitLogicOnDouble;

    __mmask8 check(__m512d x, __m512d y) const noexcept {
        return static_cast<__mmask8>(wide::fits<T>(x) & wide::fits<T>(y));
    }
    __m512d apply(__m512d x, __m512d y) const noexcept {
        return wide::toDouble<T>(combine<op>(wide::toInteger<T>(x), wide::toInteger<T>(y)));
    }
};

template <class T, BitOp op>
struct WideWithScalar {
    static constexpr int arity = 1;
    static constexpr unsigned long parallelLimit = bitLogicOnDouble;

    __m512i partner;

    __mmask8 check(__m512d x) const noexcept { return wide::fits<T>(x); }
    __m512d apply(__m512d x) const noexcept {
        return wide::toDouble<T>(combine<op>(wide::toInteger<T>(x), partner));
    }
};

template <class T, BitOp op>
bool run(const double* array, const double* partner, bool partnerIsScalar, double* out,
         unsigned long n) {
    if (!partnerIsScalar)
        return wide::runLanes(WideArrays<T, op>{}, array, partner, out, n, &runInRanges);
    const WideWithScalar<T, op> kernel{wide::toInteger<T>(_mm512_set1_pd(*partner))};
    return wide::runLanes(kernel, array, nullptr, out, n, &runInRanges);
}

}  // namespace

template <class T>
bool combineWide(BitOp op, const double* array, const double* partner, bool partnerIsScalar,
                 double* out, unsigned long n) {
    switch (op) {
        case BitOp::bitAnd: return run<T, BitOp::bitAnd>(array, partner, partnerIsScalar, out, n);
        case BitOp::bitOr: return run<T, BitOp::bitOr>(array, partner, partnerIsScalar, out, n);
        case BitOp::bitXor: break;
    }
    return run<T, BitOp::bitXor>(array, partner, partnerIsScalar, out, n);
}

template bool combineWide<signed char>(BitOp, const double*, const double*, bool, double*,
                                       unsigned long);
template bool combineWide<unsigned char>(BitOp, const double*, const double*, bool, double*,
                                         unsigned long);
template bool combineWide<short>(BitOp, const double*, const double*, bool, double*, unsigned long);
template bool combineWide<unsigned short>(BitOp, const double*, const double*, bool, double*,
                                          unsigned long);
template bool combineWide<int>(BitOp, const double*, const double*, bool, double*, unsigned long);
template bool combineWide<unsigned int>(BitOp, const double*, const double*, bool, double*,
                                        unsigned long);
template bool combineWide<long>(BitOp, const double*, const double*, bool, double*, unsigned long);
template bool combineWide<unsigned long>(BitOp, const double*, const double*, bool, double*,
                                         unsigned long);

}  // namespace bitfcns
