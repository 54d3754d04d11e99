// The seven SIMD functor pairs: each SSE2 functor, which treats one 16-byte
// register of elements, next to its scalar twin, which treats one element.
// A twin computes exactly what its vector functor computes in each lane, for
// every argument the pair can be given.
//
// A vector functor is used in two steps: `prepare<T>()` sets up the constant
// registers of a run (the shift count, the repeated mask) and returns the
// operation on registers of T; the strided loops call it once before their
// body. The instructions by width come from sse2_lanes.hpp.
//
// Each vector functor also names the parallel limit of the one operator
// family it serves, `parallelLimit<T>`, so that a record carrying it can only
// run with that limit. Shift counts and bit indexes must be below the width
// of T (a scalar shift by the width is undefined); debug builds assert it.
#pragma once

#include "engine/lane_operands.hpp"
#include "engine/parallel_limits.hpp"
#include "engine/sse2_lanes.hpp"

#include <emmintrin.h>

#include <cassert>
#include <cstdint>
#include <type_traits>

namespace bitfcns {

// The width the scalar twins compute in: elements up to 32 bits widened to
// 32 bits (sign-extended when signed, zero-extended when unsigned), 64-bit
// elements as they are.
template <class T>
using Widened =
    std::conditional_t<(sizeof(T) < 8), std::conditional_t<std::is_signed_v<T>, int, unsigned>, T>;

// The same width, unsigned: what a logical shift works on.
template <class T>
using WidenedBits = std::make_unsigned_t<Widened<T>>;

template <class T>
constexpr bool belowWidth(std::uint32_t count) {
    return count < lanes::bitsOf<T>;
}

}  // namespace bitfcns

namespace mu {

// in1 AND in2. Clears one bit in all elements, in1 being a broadcast
// inverted mask.
template <class T>
struct IntBitandSSE2Ftor {
    template <class U>
    static constexpr unsigned long parallelLimit = bitfcns::limits::clearOneBit<U>;

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

// in1 OR in2. Sets one bit in all elements, in1 being a broadcast mask.
template <class T>
struct IntBitorSSE2Ftor {
    template <class U>
    static constexpr unsigned long parallelLimit = bitfcns::limits::setOneBit<U>;

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

// Each lane of a with the bits of `mask` set where v's lane is not zero and
// cleared where it is, without a branch. 8, 16 and 32-bit lanes.
template <class T>
__m128i setWhereNonZero(__m128i a, __m128i v, __m128i mask) noexcept {
    const __m128i isZero = lanes::isZero<T>(v);
    return _mm_or_si128(_mm_andnot_si128(mask, a), _mm_andnot_si128(isZero, mask));
}

// in1 with bit `bitIndex` set where in2 is not zero and cleared where it is
// zero. 8, 16 and 32-bit elements.
class IntBitsetSSE2Ftor {
public:
    template <class T>
    static constexpr unsigned long parallelLimit = limits::setBitFromValues<T>;

    explicit IntBitsetSSE2Ftor(std::uint32_t bitIndex) noexcept : bitIndex_(bitIndex) {}

    template <class T>
    auto prepare() const noexcept {
        assert(belowWidth<T>(bitIndex_));
        const __m128i mask = lanes::repeat<T>(1u << bitIndex_);
        return [mask](__m128i in1, __m128i in2) noexcept {
            return setWhereNonZero<T>(in1, in2, mask);
        };
    }

private:
    std::uint32_t bitIndex_;
};
// a with bit `bitIndex` set if v is not zero (in W's own type), cleared if it
// is. W is T in the vector pair; bitset also uses it with other value types,
// and for 64-bit T, in the plain two-input operator with this limit. For T
// of up to 32 bits lanes() does the same to a register of T, with the truth
// of the values in its lanes.
template <class T, class W>
class IntBitsetFtor {
public:
    static constexpr unsigned long parallelLimit = limits::bitsetScalarPosition;
    static constexpr lanes::Reading secondOperand = lanes::Reading::truth;

    explicit IntBitsetFtor(std::uint32_t bitIndex) noexcept : bitIndex_(bitIndex) {
        assert(belowWidth<T>(bitIndex));
    }

    T operator()(T a, W v) const noexcept {
        using Mask = std::conditional_t<(sizeof(T) == 8), std::uint64_t, std::uint32_t>;
        const Mask mask = Mask{1} << bitIndex_;
        const Mask bits = static_cast<Mask>(a);
        return static_cast<T>(v != W{} ? (bits | mask) : (bits & ~mask));
    }

    __m128i lanes(__m128i a, __m128i v) const noexcept requires lanes::RegisterLanes<T> {
        return setWhereNonZero<T>(a, v, lanes::repeat<T>(1u << bitIndex_));
    }

private:
    std::uint32_t bitIndex_;
};

// in shifted left by the count, truncated to T. Signed and unsigned alike.
class IntLeftShiftSSE2Ftor {
public:
    template <class T>
    static constexpr unsigned long parallelLimit = limits::leftShift<T>;

    explicit IntLeftShiftSSE2Ftor(std::uint32_t count) noexcept : count_(count) {}

    template <class T>
    auto prepare() const noexcept {
        assert(belowWidth<T>(count_));
        const __m128i count = lanes::leftShiftCount<T>(count_);
        return [count](__m128i v) noexcept { return lanes::shiftLeft<T>(v, count); };
    }

private:
    std::uint32_t count_;
};
template <class T>
class IntLeftShiftFtor {
public:
    explicit IntLeftShiftFtor(std::uint32_t count) noexcept : count_(count) {
        assert(belowWidth<T>(count));
    }

    T operator()(T x) const noexcept {
        return static_cast<T>(static_cast<WidenedBits<T>>(static_cast<Widened<T>>(x)) << count_);
    }

private:
    std::uint32_t count_;
};

// in shifted right by the count: logically for unsigned T, arithmetically for
// signed T. There is no vector form for signed 64-bit elements.
class IntRightShiftSSE2Ftor {
public:
    template <class T>
    static constexpr unsigned long parallelLimit = limits::rightShift<T>;

    explicit IntRightShiftSSE2Ftor(std::uint32_t count) noexcept : count_(count) {}

    template <class T>
    auto prepare() const noexcept {
        assert(belowWidth<T>(count_));
        const __m128i count = lanes::countRegister(count_);
        return [count](__m128i v) noexcept { return lanes::shiftRight<T>(v, count); };
    }

private:
    std::uint32_t count_;
};
template <class T>
class IntRightShiftFtor {
public:
    explicit IntRightShiftFtor(std::uint32_t count) noexcept : count_(count) {
        assert(belowWidth<T>(count));
    }

    T operator()(T x) const noexcept {
        return static_cast<T>(static_cast<Widened<T>>(x) >> count_);
    }

private:
    std::uint32_t count_;
};

// (in1 shifted right logically by the count) AND in2, for signed T as well.
// Reads one bit of each element, in2 being a broadcast 1.
class IntRightShiftAndSSE2Ftor {
public:
    template <class T>
    static constexpr unsigned long parallelLimit = limits::getOneBit<T>;

    explicit IntRightShiftAndSSE2Ftor(std::uint32_t count) noexcept : count_(count) {}

    template <class T>
    auto prepare() const noexcept {
        assert(belowWidth<T>(count_));
        const __m128i count = lanes::countRegister(count_);
        return [count](__m128i in1, __m128i in2) noexcept {
            return _mm_and_si128(lanes::shiftRightLogical<T>(in1, count), in2);
        };
    }

private:
    std::uint32_t count_;
};
template <class T>
class IntRightShiftAndFtor {
public:
    explicit IntRightShiftAndFtor(std::uint32_t count) noexcept : count_(count) {
        assert(belowWidth<T>(count));
    }

    T operator()(T in1, T in2) const noexcept {
        using Bits = std::make_unsigned_t<T>;
        return static_cast<T>(static_cast<Bits>(static_cast<Bits>(in1) >> count_) &
                              static_cast<Bits>(in2));
    }

private:
    std::uint32_t count_;
};

}  // namespace bitfcns
