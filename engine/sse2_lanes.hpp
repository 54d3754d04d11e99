// The SSE2 instructions by element width: every operation on a register of
// T's lanes that depends on the width (or signedness) of T is chosen here,
// and only here. The functors are written against these. Besides the shifts
// of all lanes by one count, shifts of each lane by its own count, which
// SSE2 lacks, built from shifts by constants.
#pragma once

#include <emmintrin.h>

#include <concepts>
#include <cstdint>
#include <type_traits>
#include <utility>

namespace bitfcns::lanes {

// Integer (or logical) element types that line up lane for lane in one
// register: the same width, of 8, 16 or 32 bits.
template <class T, class U>
concept SameWidthLanes = std::integral<T> && std::integral<U> && sizeof(T) == sizeof(U) &&
                         sizeof(T) <= 4;

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

enum class Shift { left, rightLogical, rightArithmetic };

// Every lane shifted by the constant s. 8-bit lanes move inside 16-bit
// lanes and lose, by a mask, the bits that crossed from the neighbour.
template <class T, Shift kind, int s>
__m128i shiftBy(__m128i v) noexcept {
    static_assert(sizeof(T) > 1 || kind != Shift::rightArithmetic,
                  "bytes shift arithmetically by their sign");
    if constexpr (sizeof(T) == 1 && kind == Shift::left && s == 1) {
        return _mm_add_epi8(v, v);
    } else if constexpr (sizeof(T) == 1 && kind == Shift::left) {
        return _mm_and_si128(_mm_slli_epi16(v, s), _mm_set1_epi8(static_cast<char>(0xFF << s)));
    } else if constexpr (sizeof(T) == 1) {
        return _mm_and_si128(_mm_srli_epi16(v, s), _mm_set1_epi8(static_cast<char>(0xFF >> s)));
    } else if constexpr (sizeof(T) == 2 && kind == Shift::left) {
        return _mm_slli_epi16(v, s);
    } else if constexpr (sizeof(T) == 2 && kind == Shift::rightLogical) {
        return _mm_srli_epi16(v, s);
    } else if constexpr (sizeof(T) == 2) {
        return _mm_srai_epi16(v, s);
    } else if constexpr (kind == Shift::left) {
        return _mm_slli_epi32(v, s);
    } else if constexpr (kind == Shift::rightLogical) {
        return _mm_srli_epi32(v, s);
    } else {
        return _mm_srai_epi32(v, s);
    }
}

// All ones in each lane of k whose bit c is set, k's lanes in [0, width):
// bit c moved to the sign bit and spread. A 16-bit shift of byte lanes
// carries a count's bits only into the low bits of the next byte, far from
// its sign.
template <class T, int c>
__m128i whereBitSet(__m128i k) noexcept {
    if constexpr (sizeof(T) == 1) {
        return _mm_cmplt_epi8(_mm_slli_epi16(k, 7 - c), _mm_setzero_si128());
    } else if constexpr (sizeof(T) == 2) {
        return _mm_srai_epi16(_mm_slli_epi16(k, 15 - c), 15);
    } else {
        return _mm_srai_epi32(_mm_slli_epi32(k, 31 - c), 31);
    }
}

// Each lane of v shifted by its own count in k: for each bit c of the
// counts, the shift by 2^c kept in the lanes whose count has that bit.
template <class T, Shift kind, int... c>
__m128i shiftEach(__m128i v, __m128i k, std::integer_sequence<int, c...>) noexcept {
    ((v = select(whereBitSet<T, c>(k), shiftBy<T, kind, (1 << c)>(v), v)), ...);
    return v;
}

// The bits of a count below T's width: 3, 4 or 5.
template <class T>
using CountBits = std::make_integer_sequence<int, sizeof(T) == 1   ? 3
                                                  : sizeof(T) == 2 ? 4
                                                                   : 5>;

}  // namespace each_detail

// Each lane of v shifted left by the count in the same lane of k, every
// count in [0, width). Signed and unsigned alike. 8, 16 and 32-bit lanes.
template <class T>
__m128i shiftLeftEach(__m128i v, __m128i k) noexcept {
    using namespace each_detail;
    return shiftEach<T, Shift::left>(v, k, CountBits<T>{});
}

// As shiftLeftEach, shifting right logically.
template <class T>
__m128i shiftRightLogicalEach(__m128i v, __m128i k) noexcept {
    using namespace each_detail;
    return shiftEach<T, Shift::rightLogical>(v, k, CountBits<T>{});
}

// As shiftLeftEach, shifting right arithmetically. Bytes are shifted
// logically with their sign bits inverted, and inverted back: for a negative
// x, x >> k is NOT((NOT x) >> k).
template <class T>
__m128i shiftRightArithmeticEach(__m128i v, __m128i k) noexcept {
    using namespace each_detail;
    if constexpr (sizeof(T) == 1) {
        const __m128i sign = isNegative<T>(v);
        return _mm_xor_si128(shiftRightLogicalEach<T>(_mm_xor_si128(v, sign), k), sign);
    } else {
        return shiftEach<T, Shift::rightArithmetic>(v, k, CountBits<T>{});
    }
}

// Arithmetic for signed T, logical for unsigned T.
template <class T>
__m128i shiftRightEach(__m128i v, __m128i k) noexcept {
    if constexpr (std::is_signed_v<T>) {
        return shiftRightArithmeticEach<T>(v, k);
    } else {
        return shiftRightLogicalEach<T>(v, k);
    }
}

// Each lane shifted left by its count k and, apart, right by width - k
// (arithmetically for signed T, logically for unsigned T), every count in
// [0, width): a right shift by the whole width leaves the lane's sign fill.
struct ShiftedBothWays {
    __m128i left;
    __m128i right;
};
template <class T>
ShiftedBothWays shiftBothWaysEach(__m128i v, __m128i k) noexcept {
    if constexpr (sizeof(T) == 1) {
        // One product per byte gives both: the byte extended as T to 16 bits
        // times 2^k has the byte shifted left by k in its low half and
        // shifted right by 8 - k in its high half. Even bytes are multiplied
        // in the low halves of the 16-bit lanes, odd ones in the high halves.
        using namespace each_detail;
        const __m128i one = _mm_set1_epi8(1);
        __m128i power = _mm_sub_epi8(one, whereBitSet<T, 0>(k));
        power = select(whereBitSet<T, 1>(k), _mm_slli_epi16(power, 2), power);  // at most 8
        power = select(whereBitSet<T, 2>(k), _mm_slli_epi16(power, 4), power);
        const __m128i low = _mm_set1_epi16(0x00FF);
        const __m128i even =
            std::is_signed_v<T> ? _mm_srai_epi16(_mm_slli_epi16(v, 8), 8) : _mm_and_si128(v, low);
        const __m128i odd = std::is_signed_v<T> ? _mm_srai_epi16(v, 8) : _mm_srli_epi16(v, 8);
        const __m128i evenProduct = _mm_mullo_epi16(even, _mm_and_si128(power, low));
        const __m128i oddProduct = _mm_mullo_epi16(odd, _mm_srli_epi16(power, 8));
        return {_mm_or_si128(_mm_and_si128(evenProduct, low), _mm_slli_epi16(oddProduct, 8)),
                _mm_or_si128(_mm_srli_epi16(evenProduct, 8), _mm_andnot_si128(low, oddProduct))};
    } else {
        // By width - k as by 1, then by width - 1 - k, which is k's low bits
        // inverted.
        const __m128i fromTop = _mm_xor_si128(k, repeat<T>(bitsOf<T> - 1));
        return {shiftLeftEach<T>(v, k),
                shiftRightEach<T>(shiftRight<T>(v, countRegister(1)), fromTop)};
    }
}

}  // namespace bitfcns::lanes
