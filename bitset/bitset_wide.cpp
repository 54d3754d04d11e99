// bitset's double path with one position and one V on AVX-512 registers:
// each double converted to T's value in a 64-bit lane, the bit set or
// cleared there, cut to T's width and converted back.
#include "bitset/bitset_wide.hpp"

#include "engine/parallel_driver.hpp"
#include "engine/parallel_limits.hpp"
#include "frame/wide_lanes.hpp"

namespace bitfcns {
namespace {

template <class T, bool set>
struct WideBitset {
    static constexpr int arity = 1;
    static constexpr unsigned long parallelLimit = limits::bitsetOnDouble;

    __m512i mask;

    __mmask8 check(__m512d x) const noexcept { return wide::fits<T>(x); }
    __m512d apply(__m512d x) const noexcept {
        const __m512i v = wide::toInteger<T>(x);
        return wide::toDouble<T>(set ? _mm512_or_si512(v, mask) : _mm512_andnot_si512(mask, v));
    }
};

template <class T, bool set>
struct WideBitsetAtPositions {
    static constexpr int arity = 2;
    static constexpr unsigned long parallelLimit = limits::bitsetOnDouble;

    __mmask8 check(__m512d x, __m512d b) const noexcept {
        return static_cast<__mmask8>(wide::fits<T>(x) &
                                     wide::positionsValid(b, double(sizeof(T) * 8)));
    }
    __m512d apply(__m512d x, __m512d b) const noexcept {
        const __m512i v = wide::toInteger<T>(x);
        const __m512i mask = _mm512_sllv_epi64(_mm512_set1_epi64(1), wide::bitIndices(b));
        return wide::toDouble<T>(set ? _mm512_or_si512(v, mask) : _mm512_andnot_si512(mask, v));
    }
};

}  // namespace

template <class T>
bool setBitsWide(const double* in, const double* positions, bool set, double* out,
                 unsigned long n) {
    if (set)
        return wide::runLanes(WideBitsetAtPositions<T, true>{}, in, positions, out, n,
                              &runInRanges);
    return wide::runLanes(WideBitsetAtPositions<T, false>{}, in, positions, out, n, &runInRanges);
}

template <class T>
bool setBitWide(const double* in, unsigned index, bool set, double* out, unsigned long n) {
    const __m512i mask = _mm512_set1_epi64(static_cast<long long>(1ull << index));
    if (set) return wide::runLanes(WideBitset<T, true>{mask}, in, nullptr, out, n, &runInRanges);
    return wide::runLanes(WideBitset<T, false>{mask}, in, nullptr, out, n, &runInRanges);
}

template bool setBitWide<signed char>(const double*, unsigned, bool, double*, unsigned long);
template bool setBitWide<unsigned char>(const double*, unsigned, bool, double*, unsigned long);
template bool setBitWide<short>(const double*, unsigned, bool, double*, unsigned long);
template bool setBitWide<unsigned short>(const double*, unsigned, bool, double*, unsigned long);
template bool setBitWide<int>(const double*, unsigned, bool, double*, unsigned long);
template bool setBitWide<unsigned int>(const double*, unsigned, bool, double*, unsigned long);
template bool setBitWide<long>(const double*, unsigned, bool, double*, unsigned long);
template bool setBitWide<unsigned long>(const double*, unsigned, bool, double*, unsigned long);
template bool setBitsWide<signed char>(const double*, const double*, bool, double*, unsigned long);
template bool setBitsWide<unsigned char>(const double*, const double*, bool, double*,
                                         unsigned long);
template bool setBitsWide<short>(const double*, const double*, bool, double*, unsigned long);
template bool setBitsWide<unsigned short>(const double*, const double*, bool, double*,
                                          unsigned long);
template bool setBitsWide<int>(const double*, const double*, bool, double*, unsigned long);
template bool setBitsWide<unsigned int>(const double*, const double*, bool, double*, unsigned long);
template bool setBitsWide<long>(const double*, const double*, bool, double*, unsigned long);
template bool setBitsWide<unsigned long>(const double*, const double*, bool, double*,
                                         unsigned long);

}  // namespace bitfcns
