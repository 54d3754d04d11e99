// The SIMD operator families, each one thing: its functor pair (which
// carries the family's parallel limit), the order in which its callers hand
// it the operands, and its run. The typed kernels, the tests and the
// benchmarks all go through these.
//
// `record` fills a family's record without running it; a constant operand
// is read through the reference given, which must outlive the run. `run`
// fills and runs it.
#pragma once

#include "engine/simd_functors.hpp"
#include "engine/vector_ops.hpp"

#include <cstdint>

namespace bitfcns {

// The value of T with only bit `bitIndex` set.
template <class T>
T singleBitMask(std::uint32_t bitIndex) noexcept {
    assert(belowWidth<T>(bitIndex));
    return static_cast<T>(std::uint64_t{1} << bitIndex);
}

// bitset: bit `bitIndex` set in every element. out[i] = mask OR data[i]; the
// mask comes first, broadcast.
struct SetOneBit {
    template <class T>
    using Record = bitfcnsBinarySIMDVectorOp<T, mu::IntBitorSSE2Ftor<T>, mu::IntBitorFtor<T>>;

    template <class T>
    static Record<T> record(T* out, const T* data, unsigned long dataStride, unsigned long n,
                            const T& mask) noexcept {
        return {&mask, data, out, 0, dataStride, n, {}, {}};
    }
    template <class T>
    static void run(T* out, const T* data, unsigned long dataStride, unsigned long n,
                    std::uint32_t bitIndex) {
        const T mask = singleBitMask<T>(bitIndex);
        runVectorOp(record(out, data, dataStride, n, mask));
    }
};

// bitset: bit `bitIndex` cleared in every element. out[i] = inverted mask
// AND data[i]; the inverted mask comes first, broadcast.
struct ClearOneBit {
    template <class T>
    using Record = bitfcnsBinarySIMDVectorOp<T, mu::IntBitandSSE2Ftor<T>, mu::IntBitandFtor<T>>;

    template <class T>
    static Record<T> record(T* out, const T* data, unsigned long dataStride, unsigned long n,
                            const T& invertedMask) noexcept {
        return {&invertedMask, data, out, 0, dataStride, n, {}, {}};
    }
    template <class T>
    static void run(T* out, const T* data, unsigned long dataStride, unsigned long n,
                    std::uint32_t bitIndex) {
        const T invertedMask = static_cast<T>(~singleBitMask<T>(bitIndex));
        runVectorOp(record(out, data, dataStride, n, invertedMask));
    }
};

// bitget: bit `bitIndex` of every element, as 0 or 1 of T. out[i] =
// (data[i] >> bitIndex) AND 1; the data comes first, the 1 second, broadcast.
struct GetOneBit {
    template <class T>
    using Record = bitfcnsBinarySIMDVectorOp<T, IntRightShiftAndSSE2Ftor, IntRightShiftAndFtor<T>>;

    template <class T>
    static Record<T> record(T* out, const T* data, unsigned long dataStride, unsigned long n,
                            const T& one, std::uint32_t bitIndex) noexcept {
        return {data,
                &one,
                out,
                dataStride,
                0,
                n,
                IntRightShiftAndSSE2Ftor(bitIndex),
                IntRightShiftAndFtor<T>(bitIndex)};
    }
    template <class T>
    static void run(T* out, const T* data, unsigned long dataStride, unsigned long n,
                    std::uint32_t bitIndex) {
        const T one = 1;
        runVectorOp(record(out, data, dataStride, n, one, bitIndex));
    }
};

// bitset: bit `bitIndex` of each element set where its new value is not
// zero and cleared where it is. The data comes first, the values (of the
// data's own type) second. 8, 16 and 32-bit elements.
struct SetBitFromValues {
    template <class T>
    using Record = bitfcnsBinarySIMDVectorOp<T, IntBitsetSSE2Ftor, IntBitsetFtor<T, T>>;

    template <class T>
    static Record<T> record(T* out, const T* data, unsigned long dataStride, const T* values,
                            unsigned long valueStride, unsigned long n,
                            std::uint32_t bitIndex) noexcept {
        return {data,
                values,
                out,
                dataStride,
                valueStride,
                n,
                IntBitsetSSE2Ftor(bitIndex),
                IntBitsetFtor<T, T>(bitIndex)};
    }
    template <class T>
    static void run(T* out, const T* data, unsigned long dataStride, const T* values,
                    unsigned long valueStride, unsigned long n, std::uint32_t bitIndex) {
        runVectorOp(record(out, data, dataStride, values, valueStride, n, bitIndex));
    }
};

// bitshift: every element shifted left by one count below the width.
struct LeftShift {
    template <class T>
    using Record = bitfcnsUnarySIMDVectorOp<T, IntLeftShiftSSE2Ftor, IntLeftShiftFtor<T>>;

    template <class T>
    static Record<T> record(T* out, const T* data, unsigned long dataStride, unsigned long n,
                            std::uint32_t count) noexcept {
        return {data, out, dataStride, n, IntLeftShiftSSE2Ftor(count), IntLeftShiftFtor<T>(count)};
    }
    template <class T>
    static void run(T* out, const T* data, unsigned long dataStride, unsigned long n,
                    std::uint32_t count) {
        runVectorOp(record(out, data, dataStride, n, count));
    }
};

// bitshift: every element shifted right by one count below the width,
// arithmetically for signed T. No signed 64-bit elements: SSE2 has no
// arithmetic shift of them.
struct RightShift {
    template <class T>
    using Record = bitfcnsUnarySIMDVectorOp<T, IntRightShiftSSE2Ftor, IntRightShiftFtor<T>>;

    template <class T>
    static Record<T> record(T* out, const T* data, unsigned long dataStride, unsigned long n,
                            std::uint32_t count) noexcept {
        return {
            data, out, dataStride, n, IntRightShiftSSE2Ftor(count), IntRightShiftFtor<T>(count)};
    }
    template <class T>
    static void run(T* out, const T* data, unsigned long dataStride, unsigned long n,
                    std::uint32_t count) {
        runVectorOp(record(out, data, dataStride, n, count));
    }
};

}  // namespace bitfcns
