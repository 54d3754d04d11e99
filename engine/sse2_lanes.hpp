// The SSE2 instructions by element width: every operation on a register of
// T's lanes that depends on the width (or signedness) of T is chosen here,
// and only here. The functors are written against these. Besides the shifts
// of all lanes by one count, powers of two of each lane's own count and the
// shifts of each lane by its own count that they give through products,
// which SSE2 lacks otherwise.
#pragma once

#include <emmintrin.h>

#include <concepts>
#include <cstdint>
#include <type_traits>

namespace bitfcns::lanes {

// Integer element types whose lanes the operations below serve: 8, 16 and
// 32 bits wide.
template <class T>
concept RegisterLanes = std::integral<T> && sizeof(T) <= 4;

// Elements of T in one 16-byte register.
template <class T>
inline constexpr unsigned long count = 16 / sizeof(T);

template <class T>
inline constexpr std::uint32_t bitsOf = sizeof(T) * 8;

// A shift count in the low part of a register, as the SSE2 shifts by
// register read it: all lanes move by the same count.
inline __m128i countRegister(std::uint32_t count) noexcept {
    return _mm_cvtsi32_si128(static_cast<int>(count));
}

// The register that shiftLeft<T> takes for `count`. 8-bit lanes are shifted
// inside 16-bit lanes by 8 more, which pushes the bits that leave the
// element out of the lane, so no mask is needed and the pack can't saturate.
template <class T>
__m128i leftShiftCount(std::uint32_t count) noexcept {
    return countRegister(sizeof(T) == 1 ? count + 8 : count);
}

// Each lane shifted left, bits leaving the lane lost; the same for signed
// and unsigned T. `count` comes from leftShiftCount<T>.
template <class T>
__m128i shiftLeft(__m128i v, __m128i count) noexcept {
    if constexpr (sizeof(T) == 1) {
        const __m128i zero = _mm_setzero_si128();
        const __m128i low = _mm_srli_epi16(_mm_sll_epi16(_mm_unpacklo_epi8(v, zero), count), 8);
        const __m128i high = _mm_srli_epi16(_mm_sll_epi16(_mm_unpackhi_epi8(v, zero), count), 8);
        return _mm_packus_epi16(low, high);
    } else if constexpr (sizeof(T) == 2) {
        return _mm_sll_epi16(v, count);
    } else if constexpr (sizeof(T) == 4) {
        return _mm_sll_epi32(v, count);
    } else {
        return _mm_sll_epi64(v, count);
    }
}

// Each lane shifted right logically, whatever the signedness of T. 8-bit
// lanes go through 16-bit lanes, zero-extended, and pack back unsaturated.
template <class T>
__m128i shiftRightLogical(__m128i v, __m128i count) noexcept {
    if constexpr (sizeof(T) == 1) {
        const __m128i zero = _mm_setzero_si128();
        const __m128i low = _mm_srl_epi16(_mm_unpacklo_epi8(v, zero), count);
        const __m128i high = _mm_srl_epi16(_mm_unpackhi_epi8(v, zero), count);
        return _mm_packus_epi16(low, high);
    } else if constexpr (sizeof(T) == 2) {
        return _mm_srl_epi16(v, count);
    } else if constexpr (sizeof(T) == 4) {
        return _mm_srl_epi32(v, count);
    } else {
        return _mm_srl_epi64(v, count);
    }
}

// Each lane shifted right arithmetically. SSE2 has no arithmetic shift of
// 64-bit lanes. 8-bit lanes are sign-extended into 16-bit lanes by
// unpacking against their sign mask, and pack back without saturating.
template <class T>
__m128i shiftRightArithmetic(__m128i v, __m128i count) noexcept {
    static_assert(sizeof(T) <= 4, "SSE2 has no arithmetic shift of 64-bit lanes");
    if constexpr (sizeof(T) == 1) {
        const __m128i sign = _mm_cmpgt_epi8(_mm_setzero_si128(), v);
        const __m128i low = _mm_sra_epi16(_mm_unpacklo_epi8(v, sign), count);
        const __m128i high = _mm_sra_epi16(_mm_unpackhi_epi8(v, sign), count);
        return _mm_packs_epi16(low, high);
    } else if constexpr (sizeof(T) == 2) {
        return _mm_sra_epi16(v, count);
    } else {
        return _mm_sra_epi32(v, count);
    }
}

// Arithmetic for signed T, logical for unsigned T.
template <class T>
__m128i shiftRight(__m128i v, __m128i count) noexcept {
    if constexpr (std::is_signed_v<T>) {
        return shiftRightArithmetic<T>(v, count);
    } else {
        return shiftRightLogical<T>(v, count);
    }
}

// All ones in each lane that is zero. 8, 16 and 32-bit lanes.
template <class T>
__m128i isZero(__m128i v) noexcept {
    static_assert(sizeof(T) <= 4, "SSE2 has no compare of 64-bit lanes");
    const __m128i zero = _mm_setzero_si128();
    if constexpr (sizeof(T) == 1) {
        return _mm_cmpeq_epi8(v, zero);
    } else if constexpr (sizeof(T) == 2) {
        return _mm_cmpeq_epi16(v, zero);
    } else {
        return _mm_cmpeq_epi32(v, zero);
    }
}

// The low bits of a 32-bit value repeated into every lane. 8, 16 and 32-bit
// lanes.
template <class T>
__m128i repeat(std::uint32_t value) noexcept {
    static_assert(sizeof(T) <= 4, "a 32-bit value fills lanes of up to 32 bits");
    __m128i v = _mm_cvtsi32_si128(static_cast<int>(value));
    if constexpr (sizeof(T) == 1) v = _mm_unpacklo_epi8(v, v);
    if constexpr (sizeof(T) <= 2) v = _mm_unpacklo_epi16(v, v);
    return _mm_shuffle_epi32(v, 0);
}

// Lanewise a - b, wrapping. 8, 16 and 32-bit lanes.
template <class T>
__m128i subtract(__m128i a, __m128i b) noexcept {
    static_assert(sizeof(T) <= 4, "8, 16 and 32-bit lanes");
    if constexpr (sizeof(T) == 1) {
        return _mm_sub_epi8(a, b);
    } else if constexpr (sizeof(T) == 2) {
        return _mm_sub_epi16(a, b);
    } else {
        return _mm_sub_epi32(a, b);
    }
}

// All ones in each lane where a is less than b, both signed. 8, 16 and
// 32-bit lanes.
template <class T>
__m128i isLess(__m128i a, __m128i b) noexcept {
    static_assert(sizeof(T) <= 4, "SSE2 has no compare of 64-bit lanes");
    if constexpr (sizeof(T) == 1) {
        return _mm_cmplt_epi8(a, b);
    } else if constexpr (sizeof(T) == 2) {
        return _mm_cmplt_epi16(a, b);
    } else {
        return _mm_cmplt_epi32(a, b);
    }
}

// All ones in each lane that is negative as a signed number.
template <class T>
__m128i isNegative(__m128i v) noexcept {
    return isLess<T>(v, _mm_setzero_si128());
}

// All ones in each lane that, read as unsigned, is below T's width.
template <class T>
__m128i isBelowWidth(__m128i k) noexcept {
    return isZero<T>(_mm_andnot_si128(repeat<T>(bitsOf<T> - 1), k));
}

// `whereTrue` picks a's lane, elsewhere b's.
inline __m128i select(__m128i whereTrue, __m128i a, __m128i b) noexcept {
    return _mm_or_si128(_mm_and_si128(whereTrue, a), _mm_andnot_si128(whereTrue, b));
}

namespace each_detail {

// All ones in each byte of k whose bit c is set: bit c moved to the sign bit
// by a 16-bit shift, which carries a byte's bits only into the low bits of
// the next byte, far from its sign.
template <int c>
__m128i whereBitSet8(__m128i k) noexcept {
    return _mm_cmplt_epi8(_mm_slli_epi16(k, 7 - c), _mm_setzero_si128());
}

// 2^k in each 32-bit lane, k in [0, 32): k made the exponent of a single
// and truncated back; 2^31 overflows the conversion into 0x80000000, which
// is its pattern.
inline __m128i powerOfTwo32(__m128i k) noexcept {
    const __m128i biased = _mm_add_epi32(_mm_slli_epi32(k, 23), _mm_set1_epi32(127 << 23));
    return _mm_cvttps_epi32(_mm_castsi128_ps(biased));
}

// The 64-bit products of the 32-bit lanes of a and b, their low halves and
// their high halves, lane by lane.
struct Products32 {
    __m128i low;
    __m128i high;
};
inline Products32 multiply32(__m128i a, __m128i b) noexcept {
    const __m128i even = _mm_mul_epu32(a, b);
    const __m128i odd = _mm_mul_epu32(_mm_srli_epi64(a, 32), _mm_srli_epi64(b, 32));
    return {_mm_unpacklo_epi32(_mm_shuffle_epi32(even, _MM_SHUFFLE(3, 1, 2, 0)),
                               _mm_shuffle_epi32(odd, _MM_SHUFFLE(3, 1, 2, 0))),
            _mm_unpacklo_epi32(_mm_shuffle_epi32(even, _MM_SHUFFLE(2, 0, 3, 1)),
                               _mm_shuffle_epi32(odd, _MM_SHUFFLE(2, 0, 3, 1)))};
}

}  // namespace each_detail

// 2^k in each lane, for each lane's k in [0, width), as T's pattern: 2^7,
// 2^15 and 2^31 are the sign bit. 8, 16 and 32-bit lanes.
template <class T>
__m128i powerOfTwoEach(__m128i k) noexcept {
    using namespace each_detail;
    if constexpr (sizeof(T) == 1) {
        // 1 or 2 by bit 0, times 4 by bit 1, times 16 by bit 2; a 16-bit
        // shift of bytes of at most 8 by 4 spills nothing into the next.
        __m128i power = _mm_sub_epi8(_mm_set1_epi8(1), whereBitSet8<0>(k));
        power = select(whereBitSet8<1>(k), _mm_slli_epi16(power, 2), power);
        return select(whereBitSet8<2>(k), _mm_slli_epi16(power, 4), power);
    } else if constexpr (sizeof(T) == 2) {
        // Through 32-bit lanes; each power sign-extended from 16 bits, so
        // the signed pack keeps its pattern.
        const __m128i zero = _mm_setzero_si128();
        const auto half = [](__m128i power) {
            return _mm_srai_epi32(_mm_slli_epi32(power, 16), 16);
        };
        return _mm_packs_epi32(half(powerOfTwo32(_mm_unpacklo_epi16(k, zero))),
                               half(powerOfTwo32(_mm_unpackhi_epi16(k, zero))));
    } else {
        return powerOfTwo32(k);
    }
}

// The bit of position p (bit p - 1) alone in each lane, every p from 1 to
// the width.
template <class T>
__m128i bitOfPositionEach(__m128i p) noexcept {
    return powerOfTwoEach<T>(subtract<T>(p, repeat<T>(1)));
}

// Each lane shifted left by its count k and, apart, right by width - k
// (arithmetically for signed T, logically for unsigned T), every count in
// [0, width): a right shift by the whole width leaves the lane's sign fill.
// Both come from one product by 2^k of the lane extended to twice its
// width: its low half is the lane shifted left, its high half the lane
// shifted right, arithmetically where the lane was extended by its sign.
struct ShiftedBothWays {
    __m128i left;
    __m128i right;
};
template <class T>
ShiftedBothWays shiftBothWaysEach(__m128i v, __m128i k) noexcept {
    const __m128i power = powerOfTwoEach<T>(k);
    if constexpr (sizeof(T) == 1) {
        // Even bytes are multiplied in the low halves of the 16-bit lanes,
        // odd ones in the high halves, each extended as T.
        const __m128i low = _mm_set1_epi16(0x00FF);
        const __m128i even =
            std::is_signed_v<T> ? _mm_srai_epi16(_mm_slli_epi16(v, 8), 8) : _mm_and_si128(v, low);
        const __m128i odd = std::is_signed_v<T> ? _mm_srai_epi16(v, 8) : _mm_srli_epi16(v, 8);
        const __m128i evenProduct = _mm_mullo_epi16(even, _mm_and_si128(power, low));
        const __m128i oddProduct = _mm_mullo_epi16(odd, _mm_srli_epi16(power, 8));
        return {_mm_or_si128(_mm_and_si128(evenProduct, low), _mm_slli_epi16(oddProduct, 8)),
                _mm_or_si128(_mm_srli_epi16(evenProduct, 8), _mm_andnot_si128(low, oddProduct))};
    } else {
        // SSE2 multiplies 16 and 32-bit lanes without sign only. A negative
        // lane of a signed T is multiplied inverted and its high half
        // inverted back, since x >> s is NOT((NOT x) >>> s) there; its low
        // half then differs from x shifted left by the inverted bits shifted
        // in, NOT(2^k - 1) = -2^k.
        const __m128i sign = std::is_signed_v<T> ? isNegative<T>(v) : _mm_setzero_si128();
        const __m128i x = _mm_xor_si128(v, sign);
        __m128i low, high;
        if constexpr (sizeof(T) == 2) {
            low = _mm_mullo_epi16(x, power);
            high = _mm_mulhi_epu16(x, power);
        } else {
            const each_detail::Products32 product = each_detail::multiply32(x, power);
            low = product.low;
            high = product.high;
        }
        if constexpr (!std::is_signed_v<T>) return {low, high};
        const __m128i shiftedIn = _mm_and_si128(sign, subtract<T>(_mm_setzero_si128(), power));
        return {_mm_xor_si128(low, shiftedIn), _mm_xor_si128(high, sign)};
    }
}

// Each lane shifted left by its own count k in [0, width): the low half of
// the product alone, which needs no sign.
template <class T>
__m128i shiftLeftEach(__m128i v, __m128i k) noexcept {
    if constexpr (sizeof(T) == 1) {
        return shiftBothWaysEach<T>(v, k).left;
    } else if constexpr (sizeof(T) == 2) {
        return _mm_mullo_epi16(v, powerOfTwoEach<T>(k));
    } else {
        return each_detail::multiply32(v, powerOfTwoEach<T>(k)).low;
    }
}

}  // namespace bitfcns::lanes
