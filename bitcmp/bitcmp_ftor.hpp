// The complement of a double taken for an integer of class T, given back as
// a double: BitcmpFtor<T> element by element, BitcmpLanes<T> two elements to
// a register for the double path's checked loop. Both agree to the last bit.
#pragma once

#include "engine/parallel_limits.hpp"
#include "frame/double_lanes.hpp"
#include "frame/element_scan.hpp"
#include "frame/integer_conversion.hpp"

#include <limits>
#include <type_traits>

namespace bitfcns {

// x, a whole number that class T holds (tested before), complemented in T:
// minus x minus 1 for signed T, the largest value of T minus x for unsigned
// T. With the 64-bit classes the complement is rounded to the nearest double.
template <class T>
struct BitcmpFtor {
    static constexpr unsigned long parallelLimit = limits::bitcmpOnDouble;

    double operator()(double x) const noexcept {
        return integerToDouble(static_cast<T>(~wholeDoubleTo<T>(x)));
    }
};

// The same complement as arithmetic on doubles. -1 - x and, for unsigned T
// of up to 32 bits, max - x are one subtraction of exact operands, so
// rounded once (exact up to 32 bits). For uint64, 2^64 - 1 - x: 2^64 - x
// rounded, its exact error (2^64 is at least x, so the two-sum needs no
// compare), and one rounding of the rounded part plus the error less one.
template <class T>
struct BitcmpLanes {
    static constexpr int arity = 1;
    static constexpr unsigned long parallelLimit = limits::bitcmpOnDouble;

    scan_detail::LaneTest<T> fits;

    __m128d check(__m128d x) const noexcept { return fits(x); }

    __m128d apply(__m128d x) const noexcept {
        if constexpr (std::is_same_v<T, unsigned long>) {
            const __m128d twoTo64 = lanes::broadcast(18446744073709551616.0);
            const __m128d rounded = _mm_sub_pd(twoTo64, x);
            const __m128d error =
                _mm_sub_pd(_mm_sub_pd(_mm_setzero_pd(), x), _mm_sub_pd(rounded, twoTo64));
            return _mm_add_pd(rounded, _mm_sub_pd(error, lanes::broadcast(1.0)));
        } else {
            constexpr double top =
                std::is_signed_v<T> ? -1.0 : static_cast<double>(std::numeric_limits<T>::max());
            return _mm_sub_pd(lanes::broadcast(top), x);
        }
    }
};

}  // namespace bitfcns
