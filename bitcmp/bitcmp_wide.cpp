// bitcmp's double path on AVX-512 registers: each double converted to T's
// value in a 64-bit lane, complemented there, and converted back.
#include "bitcmp/bitcmp_wide.hpp"

#include "engine/parallel_driver.hpp"
#include "engine/parallel_limits.hpp"
#include "frame/wide_lanes.hpp"

namespace bitfcns {
namespace {

template <class T>
struct WideComplement {
    static constexpr int arity = 1;
    static constexpr unsigned long parallelLimit = limits::bitcmpOnDouble;

    __mmask8 check(__m512d x) const noexcept { return wide::fits<T>(x); }
    __m512d apply(__m512d x) const noexcept {
        return wide::toDouble<T>(_mm512_xor_si512(wide::toInteger<T>(x), _mm512_set1_epi64(-1)));
    }
};

}  // namespace

template <class T>
bool complementWide(const double* in, double* out, unsigned long n) {
    return wide::runLanes(WideComplement<T>{}, in, nullptr, out, n, &runInRanges);
}

template bool complementWide<signed char>(const double*, double*, unsigned long);
template bool complementWide<unsigned char>(const double*, double*, unsigned long);
template bool complementWide<short>(const double*, double*, unsigned long);
template bool complementWide<unsigned short>(const double*, double*, unsigned long);
template bool complementWide<int>(const double*, double*, unsigned long);
template bool complementWide<unsigned int>(const double*, double*, unsigned long);
template bool complementWide<long>(const double*, double*, unsigned long);
template bool complementWide<unsigned long>(const double*, double*, unsigned long);

}  // namespace bitfcns
