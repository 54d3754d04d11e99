// The element arithmetic of bitset: the position and mask that one valid
// BIT element gives, the truth of one V element, the functors of the integer
// path (bitsetVVVFtor, bitsetVVTFtor, bitsetVVFFtor) and BitsetFtor<T>, which
// works on doubles taken for integers of class T (BitsetLanes<T, set> two at
// a time with one position and one V).
//
// Everything works on the stored bit pattern of T: the sign bit of a signed
// T is an ordinary bit, and nothing saturates. BIT elements reach a functor
// only after every one of them has passed bitIsValid, so none is tested
// again here and no shift reaches the width of its mask.
#pragma once

#include "engine/lane_operands.hpp"
#include "engine/parallel_limits.hpp"
#include "engine/simd_functors.hpp"
#include "engine/sse2_lanes.hpp"
#include "frame/class_types.hpp"
#include "frame/double_lanes.hpp"
#include "frame/element_scan.hpp"
#include "frame/integer_conversion.hpp"
#include "frame/position_scan.hpp"

#include <cstdint>
#include <type_traits>

namespace bitfcns {

// The word a bit is set or cleared in: 32 bits for T of up to 32 bits, of
// which the store keeps T's low bits, and 64 bits for 64-bit T.
template <class T>
using BitMask = std::conditional_t<(sizeof(T) == 8), std::uint64_t, std::uint32_t>;

// The zero-based index of a valid position (1 to the width of T). An
// integer position has no bits beyond the low ones, so 32 bits of it do; a
// floating one is truncated to 32 bits first.
template <class U>
std::uint32_t bitIndexOf(U b) noexcept {
    if constexpr (std::is_integral_v<U>) {
        return static_cast<std::uint32_t>(b) - 1u;
    } else {
        return static_cast<std::uint32_t>(static_cast<std::int32_t>(b) - 1);
    }
}

template <class T>
BitMask<T> maskAt(std::uint32_t bitIndex) noexcept {
    return BitMask<T>{1} << bitIndex;
}

// The bits of `word` with those of `mask` set or cleared, cut to T; without
// a branch, since `set` may change from one element to the next.
template <class T>
T withMask(T word, BitMask<T> mask, bool set) noexcept {
    const auto bits = static_cast<BitMask<T>>(word);
    const auto setBits = static_cast<BitMask<T>>(mask & (BitMask<T>{0} - BitMask<T>{set}));
    return static_cast<T>((bits & ~mask) | setBits);
}

// A V element is true when it isn't zero in its own type: 256 in an int16 is
// true, a NaN is true, -0.0 is false.
template <class W>
bool isTrue(W v) noexcept {
    return v != W{};
}

// a with bit b set where v is true and cleared where it is false; BIT and V
// both arrays. The type of BIT is the call operator's own. lanes() does the
// same to a register of T of up to 32 bits.
template <class T, class W>
struct bitsetVVVFtor {
    static constexpr unsigned long parallelLimit = limits::bitsetPositionValueArrays;
    static constexpr lanes::Reading secondOperand = lanes::Reading::position;
    static constexpr lanes::Reading thirdOperand = lanes::Reading::truth;

    template <class U>
    T operator()(T a, U b, W v) const noexcept {
        return withMask(a, maskAt<T>(bitIndexOf(b)), isTrue(v));
    }

    __m128i lanes(__m128i a, __m128i b, __m128i v) const noexcept requires lanes::RegisterLanes<T> {
        return setWhereNonZero<T>(a, v, lanes::bitOfPositionEach<T>(b));
    }
};

// a with bit b set: an array of BIT with one true V, or with none. lanes()
// does the same to a register of T of up to 32 bits.
template <class T, class U>
struct bitsetVVTFtor {
    static constexpr unsigned long parallelLimit = limits::bitsetPositionArrayTrue;
    static constexpr lanes::Reading secondOperand = lanes::Reading::position;

    T operator()(T a, U b) const noexcept { return withMask(a, maskAt<T>(bitIndexOf(b)), true); }

    __m128i lanes(__m128i a, __m128i b) const noexcept requires lanes::RegisterLanes<T> {
        return _mm_or_si128(a, lanes::bitOfPositionEach<T>(b));
    }
};

// a with bit b cleared: an array of BIT with one false V. lanes() as above.
template <class T, class U>
struct bitsetVVFFtor {
    static constexpr unsigned long parallelLimit = limits::bitsetPositionArrayFalse;
    static constexpr lanes::Reading secondOperand = lanes::Reading::position;

    T operator()(T a, U b) const noexcept { return withMask(a, maskAt<T>(bitIndexOf(b)), false); }

    __m128i lanes(__m128i a, __m128i b) const noexcept requires lanes::RegisterLanes<T> {
        return _mm_andnot_si128(lanes::bitOfPositionEach<T>(b), a);
    }
};

// A double a, taken for the integer of class T that it holds (tested
// before), with bit b set where v is true and cleared where it is false,
// given back as a double: exact up to 32 bits, rounded to nearest for the
// 64-bit classes. Setting the top bit of a signed T makes the value negative.
template <class T>
struct BitsetFtor {
    static constexpr unsigned long parallelLimit = limits::bitsetOnDouble;

    double operator()(double a, double b, bool v) const noexcept {
        return integerToDouble(withMask(wholeDoubleTo<T>(a), maskAt<T>(bitIndexOf(b)), v));
    }
};

// BitsetFtor<T> with one position and one V for every element, as a lane
// kernel of the double path's checked loop. Setting bit i where it is clear
// adds its weight to x, clearing it where it is set subtracts it; the weight
// is 2^i, or -2^i for the sign bit of a signed T. x plus a whole number is
// the exact value rounded once, as integerToDouble rounds it. Where nothing
// changes, x + 0.0 turns -0.0 into the 0.0 that the integer route gives.
template <class T, bool set>
struct BitsetLanes {
    static constexpr int arity = 1;
    static constexpr unsigned long parallelLimit = limits::bitsetOnDouble;

    scan_detail::LaneTest<T> fits;
    __m128i bitIndex;  // in the low 64 bits
    __m128d change;    // the weight to add (set) or to subtract (clear)

    explicit BitsetLanes(std::uint32_t index) noexcept
        : bitIndex(_mm_cvtsi32_si128(static_cast<int>(index))),
          change(lanes::broadcast((std::is_signed_v<T> && index == sizeof(T) * 8 - 1) == set
                                      ? -std::ldexp(1.0, static_cast<int>(index))
                                      : std::ldexp(1.0, static_cast<int>(index)))) {}

    __m128d check(__m128d x) const noexcept { return fits(x); }

    __m128d apply(__m128d x) const noexcept {
        const __m128d isSet = lanes::lowBitMask(_mm_srl_epi64(lanes::patternOf<T>(x), bitIndex));
        const __m128d addend = set ? _mm_andnot_pd(isSet, change) : _mm_and_pd(isSet, change);
        return _mm_add_pd(x, addend);
    }
};

// BitsetFtor<T> with one position and an array of V, as a lane kernel of
// the double path's checked loop: BitsetLanes setting the bit where V is
// true and clearing it where V is false. V, logical, needs no test.
template <class T>
struct BitsetValuesLanes {
    static constexpr int arity = 2;
    static constexpr unsigned long parallelLimit = limits::bitsetOnDouble;
    using Second = bool;

    scan_detail::LaneTest<T> fits;
    __m128i bitIndex;   // in the low 64 bits
    __m128d setWeight;  // added where the bit is clear and V true

    explicit BitsetValuesLanes(std::uint32_t index) noexcept
        : bitIndex(_mm_cvtsi32_si128(static_cast<int>(index))),
          setWeight(lanes::broadcast(std::is_signed_v<T> && index == sizeof(T) * 8 - 1
                                         ? -std::ldexp(1.0, static_cast<int>(index))
                                         : std::ldexp(1.0, static_cast<int>(index)))) {}

    __m128d check(__m128d x, __m128d) const noexcept { return fits(x); }

    // Where the bit changes, x moves by its weight: up by setWeight where it
    // is set, down by it where it is cleared.
    __m128d apply(__m128d x, __m128d v) const noexcept {
        const __m128d isSet = lanes::lowBitMask(_mm_srl_epi64(lanes::patternOf<T>(x), bitIndex));
        const __m128d changes = _mm_xor_pd(isSet, v);
        const __m128d signOfClear = _mm_andnot_pd(v, lanes::broadcast(-0.0));
        return _mm_add_pd(x, _mm_and_pd(changes, _mm_xor_pd(setWeight, signOfClear)));
    }
};

// BitsetFtor<T> with an array of double positions and one V for every
// element, as a lane kernel of the double path's checked loop: BitsetLanes
// with each lane's own bit index and weight.
template <class T, bool set>
struct BitsetPositionsLanes {
    static constexpr int arity = 2;
    static constexpr unsigned long parallelLimit = limits::bitsetOnDouble;

    scan_detail::LaneTest<T> fits;
    position_scan_detail::PositionLanes validPosition{bitWidth<T>};

    __m128d check(__m128d x, __m128d b) const noexcept {
        return _mm_and_pd(fits(x), validPosition(b));
    }

    __m128d apply(__m128d x, __m128d b) const noexcept {
        const __m128d index = _mm_sub_pd(b, lanes::broadcast(1.0));
        const __m128d isSet = lanes::lowBitMask(
            lanes::shiftRightEach64(lanes::patternOf<T>(x), lanes::countLanes(index)));
        // The weight is negative where the sign bit of a signed T is set, or
        // another bit cleared.
        __m128d negative = _mm_setzero_pd();
        if constexpr (std::is_signed_v<T>)
            negative = _mm_cmpeq_pd(b, lanes::broadcast(bitWidth<T>));
        if constexpr (!set) negative = _mm_xor_pd(negative, _mm_cmpeq_pd(b, b));
        const __m128d change =
            _mm_xor_pd(lanes::powerOfTwo(index), _mm_and_pd(negative, lanes::broadcast(-0.0)));
        const __m128d addend = set ? _mm_andnot_pd(isSet, change) : _mm_and_pd(isSet, change);
        return _mm_add_pd(x, addend);
    }
};

}  // namespace bitfcns
