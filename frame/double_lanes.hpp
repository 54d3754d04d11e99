// SSE2 arithmetic on two doubles at a time that hold whole numbers of an
// integer class T: their two's complement bit patterns, floors, and doubles
// made back from patterns of T, and patterns shifted by a count of their own
// in each lane. Exact to the last bit; a 64-bit pattern goes back to the
// nearest double (ties to even), as integerToDouble does.
//
// Lanes that hold no whole number of T (refused by the caller's test) give
// meaningless bits and never undefined behaviour: everything here is
// floating arithmetic and bit operations on registers.
#pragma once

#include <emmintrin.h>

#include <cstdint>
#include <type_traits>

namespace bitfcns::lanes {

inline __m128d broadcast(double x) noexcept { return _mm_set1_pd(x); }
inline __m128i broadcast64(std::uint64_t bits) noexcept {
    return _mm_set1_epi64x(static_cast<long long>(bits));
}

// 1.5 * 2^52. A whole number x of magnitude below 2^51 plus this lands where
// doubles are one apart, and the low 32 bits of the sum's pattern are the
// low 32 bits of x's two's complement.
inline constexpr double lowWordMagic = 6755399441055744.0;
inline constexpr double twoTo32 = 4294967296.0;
inline constexpr double twoTo52 = 4503599627370496.0;

// The low 32 bits of each lane's two's complement, in the low half of its
// 64-bit lane (the high half holds exponent bits). Whole lanes below 2^51
// in magnitude.
inline __m128i lowWord(__m128d x) noexcept {
    return _mm_castpd_si128(_mm_add_pd(x, broadcast(lowWordMagic)));
}

// The floor of each lane of magnitude below 2^51: rounded to a whole number
// by the magic sum, then one less where that went up.
inline __m128d floorBelow2To51(__m128d y) noexcept {
    const __m128d magic = broadcast(lowWordMagic);
    const __m128d rounded = _mm_sub_pd(_mm_add_pd(y, magic), magic);
    return _mm_sub_pd(rounded, _mm_and_pd(_mm_cmpgt_pd(rounded, y), broadcast(1.0)));
}

// The floor of each finite lane. Below 2^52 in magnitude the sum with 2^52
// of the lane's sign lands where doubles are one apart; from 2^52 up a
// double is whole already.
inline __m128d floorFinite(__m128d y) noexcept {
    const __m128d signBit = broadcast(-0.0);
    const __m128d magic = _mm_or_pd(_mm_and_pd(signBit, y), broadcast(twoTo52));
    const __m128d rounded = _mm_sub_pd(_mm_add_pd(y, magic), magic);
    const __m128d floor = _mm_sub_pd(rounded, _mm_and_pd(_mm_cmpgt_pd(rounded, y), broadcast(1.0)));
    const __m128d small = _mm_cmplt_pd(_mm_andnot_pd(signBit, y), broadcast(twoTo52));
    return _mm_or_pd(_mm_and_pd(small, floor), _mm_andnot_pd(small, y));
}

// The 64-bit two's complement pattern of each lane, a whole number x from
// -2^63 to below 2^64, made in registers as hi * 2^32 + lo: hi, x / 2^32
// rounded to nearest by the magic sum, holds the high word and lo = x - hi *
// 2^32, exact and within +-2^31, the low one. The magic sum's pattern less
// that of the magic is lo sign-extended to 64 bits, and the sum of the two
// parts wraps modulo 2^64 as the pattern does (hi reaching 2^32 near 2^64
// included). A lane outside the range gives meaningless bits.
inline __m128i pattern64(__m128d x) noexcept {
    const __m128d magic = broadcast(lowWordMagic);
    const __m128d highSum = _mm_add_pd(_mm_mul_pd(x, broadcast(1.0 / twoTo32)), magic);
    const __m128d high = _mm_mul_pd(_mm_sub_pd(highSum, magic), broadcast(twoTo32));
    const __m128i low = _mm_sub_epi64(_mm_castpd_si128(_mm_add_pd(_mm_sub_pd(x, high), magic)),
                                      _mm_castpd_si128(magic));
    return _mm_add_epi64(_mm_slli_epi64(_mm_castpd_si128(highSum), 32), low);
}

// The pattern of each lane in T: all 64 bits for the 64-bit classes, the
// low 32 bits (enough for any narrower T) otherwise.
template <class T>
__m128i patternOf(__m128d x) noexcept {
    if constexpr (sizeof(T) == 8) {
        return pattern64(x);
    } else {
        return lowWord(x);
    }
}

// The value of T whose pattern is in the low bits of each 64-bit lane, as a
// double. Up to 32 bits: T's bits, offset by 2^(width - 1) when T is signed,
// under the exponent of 2^52, less 2^52 and the offset (exact). For 64 bits:
// the high word scaled by 2^32 under the exponent of 2^84 and the low word
// under that of 2^52, so that one addition rounds the sum once.
template <class T>
__m128d fromPattern(__m128i v) noexcept {
    constexpr std::uint64_t exponent52 = 0x4330000000000000u;
    if constexpr (sizeof(T) < 8) {
        constexpr int width = static_cast<int>(sizeof(T) * 8);
        constexpr std::uint64_t mask = (std::uint64_t{1} << width) - 1;
        constexpr std::uint64_t offset = std::is_signed_v<T> ? std::uint64_t{1} << (width - 1) : 0;
        const __m128i biased =
            _mm_xor_si128(_mm_and_si128(v, broadcast64(mask)), broadcast64(exponent52 | offset));
        return _mm_sub_pd(_mm_castsi128_pd(biased),
                          broadcast(twoTo52 + static_cast<double>(offset)));
    } else {
        constexpr std::uint64_t exponent84 = 0x4530000000000000u;
        constexpr std::uint64_t highOffset = std::is_signed_v<T> ? 0x80000000u : 0;
        constexpr double twoTo84 = 19342813113834066795298816.0;
        const __m128i high =
            _mm_xor_si128(_mm_srli_epi64(v, 32), broadcast64(exponent84 | highOffset));
        const __m128i low =
            _mm_or_si128(_mm_and_si128(v, broadcast64(0xFFFFFFFFu)), broadcast64(exponent52));
        const double highBias = twoTo84 + twoTo52 + static_cast<double>(highOffset) * twoTo32;
        return _mm_add_pd(_mm_sub_pd(_mm_castsi128_pd(high), broadcast(highBias)),
                          _mm_castsi128_pd(low));
    }
}

// Each lane y = x * 2^k, x a whole number of a 64-bit class T and 0 < k < 64,
// wrapped into T's range: the two's complement shift of x to the left, as a
// double, computed without leaving doubles. Everything is exact:
// - the magic sum rounds y to the nearest multiple n of 2^64, as the doubles
//   from 2^116 to 2^117 are 2^64 apart; y - n lies in [-2^63, 2^63], a
//   multiple of y's own spacing, so a double holds it;
// - the wrapped value keeps at most x's 53 significant bits, so a double
//   holds it too, and the last step to T's range (adding or taking 2^64)
//   lands on it exactly, and turns the -0 of a zero x into +0;
// - from 2^116 up, y is a multiple of 2^64 and every bit is shifted out.
template <class T>
__m128d wrapShiftedLeft64(__m128d y) noexcept {
    static_assert(sizeof(T) == 8);
    constexpr double twoTo63 = 9223372036854775808.0;
    constexpr double twoTo64 = 18446744073709551616.0;
    constexpr double twoTo116 = 83076749736557242056487941267521536.0;
    const __m128d signBit = broadcast(-0.0);
    const __m128d magic = std::is_signed_v<T>
                              ? _mm_or_pd(_mm_and_pd(signBit, y), broadcast(twoTo116))
                              : broadcast(twoTo116);
    const __m128d nearest = _mm_sub_pd(_mm_add_pd(y, magic), magic);
    const __m128d wrapped = _mm_sub_pd(y, nearest);
    const __m128d inRange =
        std::is_signed_v<T>
            ? _mm_add_pd(wrapped, _mm_and_pd(_mm_cmpge_pd(wrapped, broadcast(twoTo63)),
                                             broadcast(-twoTo64)))
            : _mm_add_pd(wrapped, _mm_and_pd(_mm_cmplt_pd(wrapped, _mm_setzero_pd()),
                                             broadcast(twoTo64)));
    const __m128d magnitude = std::is_signed_v<T> ? _mm_andnot_pd(signBit, y) : y;
    return _mm_and_pd(_mm_cmplt_pd(magnitude, broadcast(twoTo116)), inRange);
}

// Each lane, a whole number from -2^31 to below 2^31, as a 64-bit integer
// lane that holds it zero-extended from 32 bits: a count for the shifts
// below when it isn't negative, and one of 2^32 or more (which shifts
// everything out) when it is. Other lanes give some count, never undefined
// behaviour.
inline __m128i countLanes(__m128d x) noexcept {
    return _mm_unpacklo_epi32(_mm_cvttpd_epi32(x), _mm_setzero_si128());
}

// 2^k for each lane k, a whole number from -1022 to 1023: the exponent
// field made from k directly.
inline __m128d powerOfTwo(__m128d k) noexcept {
    const __m128i biased = _mm_add_epi32(_mm_cvttpd_epi32(k), _mm_set1_epi32(1023));
    return _mm_castsi128_pd(_mm_slli_epi64(_mm_unpacklo_epi32(biased, _mm_setzero_si128()), 52));
}

// Each 64-bit lane shifted by the count in its own lane of `counts` (from
// countLanes; 64 or more gives 0): SSE2 shifts a whole register by one
// count, so each lane's count shifts a copy and the lanes are put together.
inline __m128i shiftLeftEach64(__m128i v, __m128i counts) noexcept {
    const __m128i low = _mm_sll_epi64(v, counts);
    const __m128i high = _mm_sll_epi64(v, _mm_unpackhi_epi64(counts, counts));
    return _mm_castpd_si128(_mm_move_sd(_mm_castsi128_pd(high), _mm_castsi128_pd(low)));
}
inline __m128i shiftRightEach64(__m128i v, __m128i counts) noexcept {
    const __m128i low = _mm_srl_epi64(v, counts);
    const __m128i high = _mm_srl_epi64(v, _mm_unpackhi_epi64(counts, counts));
    return _mm_castpd_si128(_mm_move_sd(_mm_castsi128_pd(high), _mm_castsi128_pd(low)));
}

// All ones in each 64-bit lane of v whose lowest bit is set, zeros elsewhere:
// the bit that a pattern shifted right by an index brings down, as a mask.
inline __m128d lowBitMask(__m128i v) noexcept {
    return _mm_castsi128_pd(_mm_sub_epi64(_mm_setzero_si128(), _mm_and_si128(v, broadcast64(1))));
}

// a where `mask` is all ones, b where it is zero.
inline __m128d select(__m128d mask, __m128d a, __m128d b) noexcept {
    return _mm_or_pd(_mm_and_pd(mask, a), _mm_andnot_pd(mask, b));
}

}  // namespace bitfcns::lanes
