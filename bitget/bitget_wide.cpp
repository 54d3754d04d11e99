// bitget's double path at one position on AVX-512 registers: each double
// converted to T's value in a 64-bit lane, shifted right by the bit index,
// its low bit converted back.
#include "bitget/bitget_wide.hpp"

#include "engine/parallel_driver.hpp"
#include "engine/parallel_limits.hpp"
#include "frame/wide_lanes.hpp"

namespace bitfcns {
namespace {

template <class T>
struct WideBitget {
    static constexpr int arity = 1;
    static constexpr unsigned long parallelLimit = limits::bitgetOnDouble;

    unsigned index;

    __mmask8 check(__m512d x) const noexcept { return wide::fits<T>(x); }
    __m512d apply(__m512d x) const noexcept {
        const __m512i shifted =
            _mm512_srl_epi64(wide::toInteger<T>(x), _mm_cvtsi32_si128(int(index)));
        return _mm512_cvtepi64_pd(_mm512_and_si512(shifted, _mm512_set1_epi64(1)));
    }
};

template <class T>
struct WideBitgetAtPositions {
    static constexpr int arity = 2;
    static constexpr unsigned long parallelLimit = limits::bitgetOnDouble;

    __mmask8 check(__m512d x, __m512d p) const noexcept {
        return static_cast<__mmask8>(wide::fits<T>(x) &
                                     wide::positionsValid(p, double(sizeof(T) * 8)));
    }
    __m512d apply(__m512d x, __m512d p) const noexcept {
        const __m512i shifted = _mm512_srlv_epi64(wide::toInteger<T>(x), wide::bitIndices(p));
        return _mm512_cvtepi64_pd(_mm512_and_si512(shifted, _mm512_set1_epi64(1)));
    }
};

}  // namespace

template <class T>
bool getBitsWide(const double* in, const double* positions, double* out, unsigned long n) {
    return wide::runLanes(WideBitgetAtPositions<T>{}, in, positions, out, n, &runInRanges);
}

template <class T>
bool getBitWide(const double* in, unsigned index, double* out, unsigned long n) {
    return wide::runLanes(WideBitget<T>{index}, in, nullptr, out, n, &runInRanges);
}

template bool getBitWide<signed char>(const double*, unsigned, double*, unsigned long);
template bool getBitWide<unsigned char>(const double*, unsigned, double*, unsigned long);
template bool getBitWide<short>(const double*, unsigned, double*, unsigned long);
template bool getBitWide<unsigned short>(const double*, unsigned, double*, unsigned long);
template bool getBitWide<int>(const double*, unsigned, double*, unsigned long);
template bool getBitWide<unsigned int>(const double*, unsigned, double*, unsigned long);
template bool getBitWide<long>(const double*, unsigned, double*, unsigned long);
template bool getBitWide<unsigned long>(const double*, unsigned, double*, unsigned long);
template bool getBitsWide<signed char>(const double*, const double*, double*, unsigned long);
template bool getBitsWide<unsigned char>(const double*, const double*, double*, unsigned long);
template bool getBitsWide<short>(const double*, const double*, double*, unsigned long);
template bool getBitsWide<unsigned short>(const double*, const double*, double*, unsigned long);
template bool getBitsWide<int>(const double*, const double*, double*, unsigned long);
template bool getBitsWide<unsigned int>(const double*, const double*, double*, unsigned long);
template bool getBitsWide<long>(const double*, const double*, double*, unsigned long);
template bool getBitsWide<unsigned long>(const double*, const double*, double*, unsigned long);

}  // namespace bitfcns
