// The six SIMD functor pairs: each SSE2 functor, which treats one 16-byte
// register of elements, next to its scalar twin, which treats one element.
//
// A vector functor is used in two steps: `prepare<T>()` sets up the constant
// registers of a run (the shift count, the zero register, the repeated mask)
// and returns the operation on registers of T; the strided loops call it once
// before their body. The choice of instructions by element width lives in
// `prepare` alone. The twins are class templates on T and give the same bits
// for the values that the callers pass.
#pragma once

#include <emmintrin.h>

#include <cstdint>
#include <type_traits>

namespace bitfcns {

// The width the scalar twins compute in: elements up to 32 bits widened to
// 32 bits (sign-extended when signed, zero-extended when unsigned), 64-bit
// elements as they are.
template <class T>
using Widened =
    std::conditional_t<(sizeof(T) < 8), std::conditional_t<std::is_signed_v<T>, int, unsigned>, T>;

// A shift count loaded into the low part of a register, as the SSE2 shifts by
// register read it: all lanes move by the same count.
inline __m128i shiftCountRegister(std::uint32_t count) noexcept {
    return _mm_cvtsi32_si128(static_cast<int>(count));
}

// Each lane of T shifted right logically; 8-bit lanes go through 16-bit lanes,
// zero-extended, and are packed back without saturating.
template <class T>
__m128i logicalRightShift(__m128i v, __m128i count, __m128i zero) noexcept {
    if constexpr (sizeof(T) == 1) {
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

// All ones in each lane of T that is zero, for 8, 16 and 32-bit lanes.
template <class T>
__m128i laneIsZero(__m128i v, __m128i zero) noexcept {
    if constexpr (sizeof(T) == 1) {
        return _mm_cmpeq_epi8(v, zero);
    } else if constexpr (sizeof(T) == 2) {
        return _mm_cmpeq_epi16(v, zero);
    } else {
        static_assert(sizeof(T) == 4);
        return _mm_cmpeq_epi32(v, zero);
    }
}

}  // namespace bitfcns

namespace mu {

// in1 AND in2.
template <class T>
struct IntBitandSSE2Ftor {
    template <class U>
    requires std::is_same_v<U, T>
    auto prepare() const noexcept {
        return [](__m128i a, __m128i b) noexcept { return _mm_and_si128(a, b); };
    }
};
template <class T>
struct IntBitandFtor {
    T operator()(T a, T b) const noexcept { return static_cast<T>(a & b); }
};

// in1 OR in2.
template <class T>
struct IntBitorSSE2Ftor {
    template <class U>
    requires std::is_same_v<U, T>
    auto prepare() const noexcept {
        return [](__m128i a, __m128i b) noexcept { return _mm_or_si128(a, b); };
    }
};
template <class T>
struct IntBitorFtor {
    T operator()(T a, T b) const noexcept { return static_cast<T>(a | b); }
};

}  // namespace mu

namespace bitfcns {

// in1 with bit `bitIndex` set where in2 is not zero and cleared where it is
// zero, without a branch. 8, 16 and 32-bit elements.
class IntBitsetSSE2Ftor {
public:
    explicit IntBitsetSSE2Ftor(std::uint32_t bitIndex) noexcept : bitIndex_(bitIndex) {}

    template <class T>
    auto prepare() const noexcept {
        static_assert(sizeof(T) <= 4, "no vector bitset for 64-bit elements");
        // The mask, computed in 32 bits and repeated into every lane.
        __m128i mask = _mm_cvtsi32_si128(static_cast<int>(1u << bitIndex_));
        if constexpr (sizeof(T) == 1) mask = _mm_unpacklo_epi8(mask, mask);
        if constexpr (sizeof(T) <= 2) mask = _mm_unpacklo_epi16(mask, mask);
        mask = _mm_shuffle_epi32(mask, 0);
        const __m128i zero = _mm_setzero_si128();
        return [mask, zero](__m128i in1, __m128i in2) noexcept {
            const __m128i isZero = laneIsZero<T>(in2, zero);
            // NOT(z AND mask) AND ((NOT z AND mask) OR in1)
            const __m128i clearBits = _mm_and_si128(isZero, mask);
            const __m128i setBits = _mm_andnot_si128(isZero, mask);
            return _mm_andnot_si128(clearBits, _mm_or_si128(setBits, in1));
        };
    }

private:
    std::uint32_t bitIndex_;
};
// a with bit `bitIndex` set if v is not zero (in W's own type), cleared if it
// is. W is T in the vector pair; bitset also uses it with other value types.
template <class T, class W>
class IntBitsetFtor {
public:
    explicit IntBitsetFtor(std::uint32_t bitIndex) noexcept : bitIndex_(bitIndex) {}

    T operator()(T a, W v) const noexcept {
        using Mask = std::conditional_t<(sizeof(T) == 8), std::uint64_t, std::uint32_t>;
        const Mask mask = Mask{1} << bitIndex_;
        const Mask bits = static_cast<Mask>(a);
        return static_cast<T>(v != W{} ? (bits | mask) : (bits & ~mask));
    }

private:
    std::uint32_t bitIndex_;
};

// in shifted left by the count, truncated to T. Signed and unsigned alike.
class IntLeftShiftSSE2Ftor {
public:
    explicit IntLeftShiftSSE2Ftor(std::uint32_t count) noexcept : count_(count) {}

    template <class T>
    auto prepare() const noexcept {
        if constexpr (sizeof(T) == 1) {
            // Through 16-bit lanes: the extra 8 pushes the bits that leave the
            // element out of the lane, the shift right by 8 brings it back.
            const __m128i widenedCount = shiftCountRegister(count_ + 8);
            const __m128i zero = _mm_setzero_si128();
            return [widenedCount, zero](__m128i v) noexcept {
                const __m128i low =
                    _mm_srli_epi16(_mm_sll_epi16(_mm_unpacklo_epi8(v, zero), widenedCount), 8);
                const __m128i high =
                    _mm_srli_epi16(_mm_sll_epi16(_mm_unpackhi_epi8(v, zero), widenedCount), 8);
                return _mm_packus_epi16(low, high);
            };
        } else {
            const __m128i count = shiftCountRegister(count_);
            return [count](__m128i v) noexcept {
                if constexpr (sizeof(T) == 2) {
                    return _mm_sll_epi16(v, count);
                } else if constexpr (sizeof(T) == 4) {
                    return _mm_sll_epi32(v, count);
                } else {
                    return _mm_sll_epi64(v, count);
                }
            };
        }
    }

private:
    std::uint32_t count_;
};
template <class T>
class IntLeftShiftFtor {
public:
    explicit IntLeftShiftFtor(std::uint32_t count) noexcept : count_(count) {}

    T operator()(T x) const noexcept {
        using Bits = std::make_unsigned_t<Widened<T>>;
        return static_cast<T>(static_cast<Bits>(static_cast<Widened<T>>(x)) << count_);
    }

private:
    std::uint32_t count_;
};

// in shifted right by the count: logically for unsigned T, arithmetically for
// signed T. There is no vector form for signed 64-bit elements.
class IntRightShiftSSE2Ftor {
public:
    explicit IntRightShiftSSE2Ftor(std::uint32_t count) noexcept : count_(count) {}

    template <class T>
    auto prepare() const noexcept {
        static_assert(!(std::is_signed_v<T> && sizeof(T) == 8),
                      "no vector arithmetic shift of 64-bit elements");
        const __m128i count = shiftCountRegister(count_);
        const __m128i zero = _mm_setzero_si128();
        return [count, zero](__m128i v) noexcept {
            if constexpr (sizeof(T) == 1 && std::is_signed_v<T>) {
                // Sign-extended into 16-bit lanes by unpacking against the sign mask.
                const __m128i sign = _mm_cmpgt_epi8(zero, v);
                const __m128i low = _mm_sra_epi16(_mm_unpacklo_epi8(v, sign), count);
                const __m128i high = _mm_sra_epi16(_mm_unpackhi_epi8(v, sign), count);
                return _mm_packs_epi16(low, high);
            } else if constexpr (sizeof(T) == 2 && std::is_signed_v<T>) {
                return _mm_sra_epi16(v, count);
            } else if constexpr (sizeof(T) == 4 && std::is_signed_v<T>) {
                return _mm_sra_epi32(v, count);
            } else {
                return logicalRightShift<T>(v, count, zero);
            }
        };
    }

private:
    std::uint32_t count_;
};
template <class T>
class IntRightShiftFtor {
public:
    explicit IntRightShiftFtor(std::uint32_t count) noexcept : count_(count) {}

    T operator()(T x) const noexcept {
        return static_cast<T>(static_cast<Widened<T>>(x) >> count_);
    }

private:
    std::uint32_t count_;
};

// (in1 shifted right by the count) AND in2. The vector functor shifts
// logically for every T and the twin arithmetically for signed T; they agree
// for the one use there is, in2 equal to 1 and a count below the width of T.
class IntRightShiftAndSSE2Ftor {
public:
    explicit IntRightShiftAndSSE2Ftor(std::uint32_t count) noexcept : count_(count) {}

    template <class T>
    auto prepare() const noexcept {
        const __m128i count = shiftCountRegister(count_);
        const __m128i zero = _mm_setzero_si128();
        return [count, zero](__m128i in1, __m128i in2) noexcept {
            return _mm_and_si128(logicalRightShift<T>(in1, count, zero), in2);
        };
    }

private:
    std::uint32_t count_;
};
template <class T>
class IntRightShiftAndFtor {
public:
    explicit IntRightShiftAndFtor(std::uint32_t count) noexcept : count_(count) {}

    T operator()(T in1, T in2) const noexcept {
        return static_cast<T>((static_cast<Widened<T>>(in1) >> count_) &
                              static_cast<Widened<T>>(in2));
    }

private:
    std::uint32_t count_;
};

}  // namespace bitfcns
