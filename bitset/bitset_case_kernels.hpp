// The kernels of the integer path, from the dispatcher on A's class down to
// the element loops: bitsetClassDispatch<T> (one switch on the classes of
// BIT and V), bitsetCaseKernel<T, U, W> for each of the 8 x 10 x 11 class
// combinations, and the loops it picks by the shapes of BIT and V.
//
// A case kernel only picks: everything that depends on fewer of its three
// types (the check of BIT, the loops of a scalar BIT or of a single V) is a
// function of those types alone, so the 880 kernels share it instead of each
// carrying a copy. What each combination has of its own is the one loop
// over arrays of BIT and V, with the loads of its three types. The shared
// parts are kept out of line, so the optimiser doesn't copy them back into
// every kernel.
#pragma once

#include "bitset/bit_checks.hpp"
#include "bitset/bitset_functors.hpp"
#include "bitset/bitset_kernels.hpp"
#include "engine/operator_families.hpp"
#include "engine/parallel_limits.hpp"
#include "engine/vector_ops.hpp"
#include "frame/class_types.hpp"

#include <cstdint>
#include <type_traits>

namespace bitfcns {

// One bit, at `bitIndex`, set in every element of A where `set` holds and
// cleared otherwise: an OR or an AND with a constant, in registers.
template <class T>
[[gnu::noinline]] void bitsetAllElements(T* out, const T* a, unsigned long strideA, unsigned long n,
                                         std::uint32_t bitIndex, bool set) {
    if (set) {
        SetOneBit::run(out, a, strideA, n, bitIndex);
    } else {
        ClearOneBit::run(out, a, strideA, n, bitIndex);
    }
}

// A scalar BIT with an array of V: the bit at `bitIndex` (validated) set or
// cleared by each element of V. The SIMD pair when V has A's class, up to
// 32 bits; otherwise the plain loop, a register at a time for A of up to 32
// bits.
template <class T, class W>
[[gnu::noinline]] void bitsetScalarBitKernel(T* out, const T* a, const W* value,
                                             unsigned long strideA, unsigned long strideValue,
                                             unsigned long n, std::uint32_t bitIndex) {
    if constexpr (std::is_same_v<W, T> && sizeof(T) < 8) {
        SetBitFromValues::run(out, a, strideA, value, strideValue, n, bitIndex);
    } else {
        runVectorOp(bitfcnsTwoInputVectorOp<T, W, IntBitsetFtor<T, W>>{
            a, value, out, strideA, strideValue, n, IntBitsetFtor<T, W>(bitIndex)});
    }
}

// An array of BIT (validated) with a single V, whose truth is read once.
template <class T, class U>
[[gnu::noinline]] void bitsetPositionArrayKernel(T* out, const T* a, const U* bit,
                                                 unsigned long strideA, unsigned long strideBit,
                                                 unsigned long n, bool set) {
    if (set) {
        runVectorOp(bitfcnsTwoInputVectorOp<T, U, bitsetVVTFtor<T, U>>{
            a, bit, out, strideA, strideBit, n, {}});
    } else {
        runVectorOp(bitfcnsTwoInputVectorOp<T, U, bitsetVVFFtor<T, U>>{
            a, bit, out, strideA, strideBit, n, {}});
    }
}

// A scalar BIT, at `bitIndex` (validated), with V: an array of V sets or
// clears the bit element by element, a single V (or none) in all elements.
template <class T, class W>
[[gnu::noinline]] void bitsetScalarBitCases(T* out, const T* a, const W* value,
                                            unsigned long strideA, unsigned long strideValue,
                                            unsigned long n, std::uint32_t bitIndex) {
    if (strideValue != 0) {
        bitsetScalarBitKernel(out, a, value, strideA, strideValue, n, bitIndex);
    } else {
        bitsetAllElements(out, a, strideA, n, bitIndex, isTrue(value[0]));
    }
}

// One combination of A's class (T), BIT's (U) and V's (W): checks BIT, then
// picks the loop by the shapes of BIT and V. A scalar BIT is checked even
// when there is nothing to set. The result is written with unit stride.
template <class T, class U, class W>
[[gnu::noinline]] void bitsetCaseKernel(T* out, const T* a, const U* bit, const W* value,
                                        [[maybe_unused]] unsigned long outStride,
                                        unsigned long strideA, unsigned long strideBit,
                                        unsigned long strideValue, unsigned long n) {
    constexpr int width = bitWidth<T>;
    if (strideBit == 0) {
        bitsetScalarBitCases(out, a, value, strideA, strideValue, n,
                             checkedBitIndex(bit[0], width));
        return;
    }
    checkPositions(
        bit, n, width,
        strideValue == 0 ? limits::bitsetPositionArrayTrue : limits::bitsetPositionValueArrays);
    if (strideValue == 0) {
        bitsetPositionArrayKernel(out, a, bit, strideA, strideBit, n, isTrue(value[0]));
    } else if (n != 0) {
        runVectorOp(bitfcnsThreeInputVectorOp<T, U, W, bitsetVVVFtor<T, W>>{
            a, bit, value, out, strideA, strideBit, strideValue, n, {}});
    }
}

// BIT's class picks U: single or an integer class, and double for any other
// (only double gets here). V's class picks W: its numeric class, and bool
// for any other (only logical gets here); a missing V is a true bool.
template <class T>
void bitsetClassDispatch(T* out, const T* a, const zqArray_tag* bit, const zqArray_tag* value,
                         unsigned long outStride, unsigned long strideA, unsigned long strideBit,
                         unsigned long strideValue, unsigned long n) {
    using PositionClasses = OrElse<Append<IntegerClasses, SingleTag>::type, DoubleTag>;
    using NewBitClasses = OrElse<NumericClasses, LogicalTag>;
    static constexpr bool missingValue = true;
    visitClasses<PositionClasses, NewBitClasses>(
        [&]<class PositionTag, class NewBitTag>(PositionTag, NewBitTag) {
            using U = typename PositionTag::type;
            using W = typename NewBitTag::type;
            const W* values;
            if constexpr (std::is_same_v<W, bool>) {
                values = value != nullptr
                             ? matrix::detail::noninlined::zq_array_api::zqGetLogicals(value)
                             : &missingValue;
            } else {
                values = dataOf<W>(value);
            }
            bitsetCaseKernel<T, U, W>(out, a, dataOf<U>(bit), values, outStride, strideA, strideBit,
                                      strideValue, n);
        },
        [] {}, classOf(bit), value != nullptr ? classOf(value) : zqLogicalClass);
}

}  // namespace bitfcns
