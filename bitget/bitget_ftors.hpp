// The element functions of bitget: BitgetFtor<T> for double values taken for
// integers of class T (BitgetLanes<T> two at a time with one position,
// BitgetPositionsLanes<T> with an array of positions), and
// bitgetVVFtor<T, U> for integer values of class T with an array of
// positions of class U. A position p names bit p - 1, the least significant
// bit being position 1.
#pragma once

#include "engine/lane_operands.hpp"
#include "engine/parallel_limits.hpp"
#include "engine/simd_functors.hpp"
#include "frame/class_types.hpp"
#include "frame/double_lanes.hpp"
#include "frame/element_scan.hpp"
#include "frame/integer_conversion.hpp"
#include "frame/position_scan.hpp"

#include <cstdint>
#include <type_traits>

namespace bitfcns {

// Masks a bit index to the width that T is shifted in (32 bits, or 64 for
// 64-bit T): a validated index passes unchanged, and no shift can ever reach
// the width.
template <class T>
constexpr unsigned shiftableIndex(std::uint64_t index) noexcept {
    return static_cast<unsigned>(index & (sizeof(Widened<T>) * 8 - 1));
}

// Bit `index` of v, read as 0 or 1 of T. Signed T shifts arithmetically, which
// reads the bits of v's two's complement within its width.
template <class T>
T bitOf(T v, std::uint64_t index) noexcept {
    return static_cast<T>((static_cast<Widened<T>>(v) >> shiftableIndex<T>(index)) & 1);
}

// x and p are whole numbers, x held by T and p from 1 to T's width (both
// tested before): bit p - 1 of x taken as a T, given back as 0.0 or 1.0.
template <class T>
struct BitgetFtor {
    static constexpr unsigned long parallelLimit = limits::bitgetOnDouble;

    double operator()(double x, double p) const noexcept {
        const T index = wholeDoubleTo<T>(p - 1.0);
        return static_cast<double>(bitOf(wholeDoubleTo<T>(x), static_cast<std::uint64_t>(index)));
    }
};

// BitgetFtor<T> with one position for every element, as a lane kernel of
// the double path's checked loop: the values' patterns in T shifted right
// by the bit index, the low bit as 0.0 or 1.0.
template <class T>
struct BitgetLanes {
    static constexpr int arity = 1;
    static constexpr unsigned long parallelLimit = limits::bitgetOnDouble;

    scan_detail::LaneTest<T> fits;
    __m128i bitIndex;  // in the low 64 bits, below T's width

    explicit BitgetLanes(unsigned index) noexcept
        : bitIndex(_mm_cvtsi32_si128(static_cast<int>(index))) {}

    __m128d check(__m128d x) const noexcept { return fits(x); }

    __m128d apply(__m128d x) const noexcept {
        const __m128d isSet = lanes::lowBitMask(_mm_srl_epi64(lanes::patternOf<T>(x), bitIndex));
        return _mm_and_pd(isSet, lanes::broadcast(1.0));
    }
};

// BitgetFtor<T> with an array of double positions, as a lane kernel of the
// double path's checked loop: each value's pattern in T shifted right by its
// own bit index, the low bit as 0.0 or 1.0.
template <class T>
struct BitgetPositionsLanes {
    static constexpr int arity = 2;
    static constexpr unsigned long parallelLimit = limits::bitgetOnDouble;

    scan_detail::LaneTest<T> fits;
    position_scan_detail::PositionLanes validPosition{bitWidth<T>};

    __m128d check(__m128d x, __m128d p) const noexcept {
        return _mm_and_pd(fits(x), validPosition(p));
    }

    __m128d apply(__m128d x, __m128d p) const noexcept {
        const __m128i index = lanes::countLanes(_mm_sub_pd(p, lanes::broadcast(1.0)));
        const __m128d isSet =
            lanes::lowBitMask(lanes::shiftRightEach64(lanes::patternOf<T>(x), index));
        return _mm_and_pd(isSet, lanes::broadcast(1.0));
    }
};

// a of class T, p a position of class U from 1 to T's width (tested
// before): bit p - 1 of a. An integer p is widened like T's elements, a
// single or double p truncated to an integer first. lanes() does the same
// to a register of T of up to 32 bits, with the positions in its lanes.
template <class T, class U>
struct bitgetVVFtor {
    static constexpr unsigned long parallelLimit = limits::bitgetPositionArray;
    static constexpr lanes::Reading secondOperand = lanes::Reading::position;

    T operator()(T a, U p) const noexcept {
        if constexpr (std::is_floating_point_v<U>) {
            return bitOf(a, static_cast<std::uint64_t>(static_cast<std::int32_t>(p) - 1));
        } else {
            return bitOf(a, static_cast<std::uint64_t>(static_cast<Widened<U>>(p) - 1));
        }
    }

    __m128i lanes(__m128i a, __m128i p) const noexcept requires lanes::RegisterLanes<T> {
        const __m128i bit = lanes::bitOfPositionEach<T>(p);
        return _mm_andnot_si128(lanes::isZero<T>(_mm_and_si128(a, bit)), lanes::repeat<T>(1));
    }
};

}  // namespace bitfcns
