// The operands after the first of a plain loop's vector form, read into the
// lanes of a register of T (8, 16 or 32 bits wide) whatever their own class:
// as many elements of U as a register holds of T, each brought to T's lane
// width the way its functor reads it. U is any integer class, logical, single or
// double. Exactly the elements asked for are read, never a byte past them.
#pragma once

#include "engine/sse2_lanes.hpp"

#include <emmintrin.h>

#include <cstdint>
#include <cstring>
#include <type_traits>

namespace bitfcns::lanes {

// How the elements of such an operand reach the lanes.
enum class Reading {
    // Bit positions from 1 to 64, tested before the loop: their value.
    position,
    // Shift counts of any value: a count that the lane holds as it is, and
    // any other as one that still reaches beyond the width on its side.
    // Lanes of an unsigned U are read as unsigned, the others as signed.
    count,
    // Truth values: a lane is not zero exactly where the element is not zero
    // in its own type (a NaN is true, -0.0 false).
    truth,
};

namespace reading_detail {

// The width of the lanes that U's elements first land in: their own for
// the integer classes and logical, 32 bits for single and double, which
// convert to 32-bit integers.
template <class U>
inline constexpr int landingBits = std::is_floating_point_v<U> ? 32
                                                               : static_cast<int>(8 * sizeof(U));

// The low 32 bits of each 64-bit lane of a, then of b.
inline __m128i lowHalves(__m128i a, __m128i b) noexcept {
    return _mm_castps_si128(
        _mm_shuffle_ps(_mm_castsi128_ps(a), _mm_castsi128_ps(b), _MM_SHUFFLE(2, 0, 2, 0)));
}

// Four elements of single or double as 32-bit integer lanes: positions
// truncated, counts clamped to the 32-bit range first, truth as masks.
template <Reading reading>
__m128i landFloating(const double* p) noexcept {
    const __m128d a = _mm_loadu_pd(p), b = _mm_loadu_pd(p + 2);
    if constexpr (reading == Reading::truth) {
        const __m128d zero = _mm_setzero_pd();
        return lowHalves(_mm_castpd_si128(_mm_cmpneq_pd(a, zero)),
                         _mm_castpd_si128(_mm_cmpneq_pd(b, zero)));
    } else if constexpr (reading == Reading::count) {
        const __m128d lowest = _mm_set1_pd(-2147483648.0), highest = _mm_set1_pd(2147483647.0);
        const auto clamp = [&](__m128d x) { return _mm_min_pd(_mm_max_pd(x, lowest), highest); };
        return _mm_unpacklo_epi64(_mm_cvttpd_epi32(clamp(a)), _mm_cvttpd_epi32(clamp(b)));
    } else {
        return _mm_unpacklo_epi64(_mm_cvttpd_epi32(a), _mm_cvttpd_epi32(b));
    }
}
template <Reading reading>
__m128i landFloating(const float* p) noexcept {
    const __m128 a = _mm_loadu_ps(p);
    if constexpr (reading == Reading::truth) {
        return _mm_castps_si128(_mm_cmpneq_ps(a, _mm_setzero_ps()));
    } else if constexpr (reading == Reading::count) {
        // The largest single below 2^31.
        const __m128 clamped =
            _mm_min_ps(_mm_max_ps(a, _mm_set1_ps(-2147483648.0f)), _mm_set1_ps(2147483520.0f));
        return _mm_cvttps_epi32(clamped);
    } else {
        return _mm_cvttps_epi32(a);
    }
}

// Two registers of 64-bit lanes made one of 32-bit lanes. A count keeps its
// value where 32 bits hold it; otherwise a signed one becomes the bound on
// its side, an unsigned one all ones.
template <Reading reading, bool isSigned>
__m128i narrowFrom64(__m128i a, __m128i b) noexcept {
    const auto narrow = [](__m128i v) noexcept {
        if constexpr (reading == Reading::truth) {
            return _mm_or_si128(v, _mm_srli_epi64(v, 32));
        } else if constexpr (reading == Reading::count) {
            // The high half of each 64-bit lane, in both halves.
            const __m128i high = _mm_shuffle_epi32(v, _MM_SHUFFLE(3, 3, 1, 1));
            if constexpr (isSigned) {
                const __m128i lowSign =
                    _mm_shuffle_epi32(_mm_srai_epi32(v, 31), _MM_SHUFFLE(2, 2, 0, 0));
                const __m128i bound =
                    _mm_xor_si128(_mm_srai_epi32(high, 31), _mm_set1_epi32(0x7FFFFFFF));
                return select(_mm_cmpeq_epi32(high, lowSign), v, bound);
            } else {
                const __m128i highIsZero = _mm_cmpeq_epi32(high, _mm_setzero_si128());
                return _mm_or_si128(v, _mm_xor_si128(highIsZero, _mm_set1_epi32(-1)));
            }
        } else {
            return v;
        }
    };
    return lowHalves(narrow(a), narrow(b));
}

// The elements of U that fill `bits`-wide lanes, where U is narrower: the
// 4 or 8 bytes they take, extended lane by lane as U's signedness says.
template <int bits, class U>
__m128i widen(const U* p) noexcept {
    constexpr int from = static_cast<int>(8 * sizeof(U));
    constexpr std::size_t bytes = 16 * sizeof(U) / (bits / 8);
    __m128i v;
    if constexpr (bytes == 8) {
        v = _mm_loadl_epi64(reinterpret_cast<const __m128i*>(p));
    } else {
        std::int32_t word;
        std::memcpy(&word, p, sizeof word);
        v = _mm_cvtsi32_si128(word);
    }
    const __m128i zero = _mm_setzero_si128();
    if constexpr (from == 8) {
        v = _mm_unpacklo_epi8(v, std::is_signed_v<U> ? _mm_cmpgt_epi8(zero, v) : zero);
    }
    if constexpr (from <= 16 && bits == 32) {
        v = _mm_unpacklo_epi16(v, std::is_signed_v<U> ? _mm_srai_epi16(v, 15) : zero);
    }
    return v;
}

}  // namespace reading_detail

// count<T> elements of U from p as lanes of `bits` (8, 16 or 32) width.
template <int bits, Reading reading, class U>
__m128i readLanes(const U* p) noexcept {
    using namespace reading_detail;
    static_assert(bits == 8 || bits == 16 || bits == 32, "8, 16 and 32-bit lanes");
    constexpr int own = landingBits<U>;
    if constexpr (bits == own && std::is_floating_point_v<U>) {
        return landFloating<reading>(p);
    } else if constexpr (bits == own) {
        return _mm_loadu_si128(reinterpret_cast<const __m128i*>(p));
    } else if constexpr (bits > own) {
        return widen<bits, U>(p);
    } else if constexpr (own == 64 && bits == 32) {
        return narrowFrom64<reading, std::is_signed_v<U>>(
            _mm_loadu_si128(reinterpret_cast<const __m128i*>(p)),
            _mm_loadu_si128(reinterpret_cast<const __m128i*>(p + 2)));
    } else {
        // Twice the width, from two registers, one signed saturating pack:
        // it keeps a signed count's sign and a truth value's zero, and
        // leaves an unsigned count that doesn't fit the lane, read as
        // unsigned, at the lane's signed maximum or above.
        constexpr int elementsPerRegister = 64 / bits;
        const __m128i a = readLanes<2 * bits, reading>(p);
        const __m128i b = readLanes<2 * bits, reading>(p + elementsPerRegister);
        return bits == 16 ? _mm_packs_epi32(a, b) : _mm_packs_epi16(a, b);
    }
}

// The lanes of T that a register of T holds.
template <class T, Reading reading, class U>
__m128i readLanesOf(const U* p) noexcept {
    return readLanes<static_cast<int>(bitsOf<T>), reading>(p);
}

}  // namespace bitfcns::lanes
