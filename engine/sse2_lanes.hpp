// The SSE2 instructions by element width: every operation on a register of
// T's lanes that depends on the width (or signedness) of T is chosen here,
// and only here. The functors are written against these.
#pragma once

#include <emmintrin.h>

#include <cstdint>
#include <type_traits>

namespace bitfcns::lanes {

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

}  // namespace bitfcns::lanes
