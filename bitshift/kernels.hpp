// The typed kernels of bitshift on integer values, bitshiftCaseKernel<T, U>
// for each value class T and count class U, and bitshiftClassDispatch<T>,
// which picks the kernel by the class of the count. An array of counts runs
// the shift rule per element (a register at a time for values of up to 32
// bits); a scalar count is decided once for the whole array, in the
// cheapest form that gives the same elements.
//
// Included by bitshift_instances.cpp only, which instantiates the dispatch
// for one class of the value per translation unit.
#pragma once

#include "bitshift/class_dispatch.hpp"
#include "bitshift/count_validation.hpp"
#include "bitshift/shift_rule.hpp"
#include "engine/operator_families.hpp"
#include "engine/parallel_driver.hpp"
#include "engine/parallel_limits.hpp"
#include "engine/vector_ops.hpp"
#include "frame/array.hpp"
#include "frame/class_types.hpp"
#include "frame/exception.hpp"
#include "frame/message_tags.hpp"

#include <cstdint>
#include <cstring>
#include <type_traits>

namespace bitfcns {

// What one count does to every element of T.
struct ScalarShift {
    enum Kind { zeroFill, left, signFill, right } kind;
    std::uint32_t amount;  // below the width, for `left` and `right`
};

// The shift rule, for one count c: at or beyond the width to the left, 0;
// at or beyond it to the right, the sign of each element (0 for unsigned T).
// Floating counts are compared in their own class, integer counts as long
// or unsigned long, which holds any of them.
template <class T, class U>
ScalarShift scalarShiftFor(U c) noexcept {
    using Compared =
        std::conditional_t<std::is_floating_point_v<U>, U,
                           std::conditional_t<std::is_signed_v<U>, long, unsigned long>>;
    const Compared v = c;
    const auto width = static_cast<Compared>(bitWidth<T>);
    if (v > 0) {
        if (v >= width) return {ScalarShift::zeroFill, 0};
        return {ScalarShift::left, static_cast<std::uint32_t>(v)};
    }
    if constexpr (std::is_signed_v<Compared>) {
        if (v <= -width)
            return {std::is_signed_v<T> ? ScalarShift::signFill : ScalarShift::zeroFill, 0};
        return {ScalarShift::right, static_cast<std::uint32_t>(-v)};
    } else {
        return {ScalarShift::right, 0};
    }
}

// Every element of `in` shifted as `shift` says, into `out`. The SIMD shifts
// go parallel from their limits; the fills and the signed 64-bit right
// shift, which SSE2 can't do in registers, always run on the calling thread.
// `valueStride` is 0 only when n is 1, so the serial loops read `in` with
// unit stride.
template <class T>
void shiftByOneCount(T* out, const T* in, unsigned long valueStride, unsigned long n,
                     ScalarShift shift) {
    switch (shift.kind) {
        case ScalarShift::zeroFill: std::memset(out, 0, n * sizeof(T)); return;
        case ScalarShift::left: LeftShift::run(out, in, valueStride, n, shift.amount); return;
        case ScalarShift::signFill:
            for (unsigned long i = 0; i < n; ++i) out[i] = shiftRightWithin(in[i], bitWidth<T> - 1);
            return;
        case ScalarShift::right:
            if constexpr (std::is_same_v<T, long>) {
                const int k = static_cast<int>(shift.amount);
                for (unsigned long i = 0; i < n; ++i) out[i] = shiftRightWithin(in[i], k);
            } else {
                RightShift::run(out, in, valueStride, n, shift.amount);
            }
            return;
    }
}

// Shifts the values of class T by counts of class U, by the shift rule.
// Floating counts are all tested before anything is written; a scalar one
// also when there are no values.
template <class T, class U>
void bitshiftCaseKernel(T* out, const T* in, const U* count, unsigned long /*outStride*/,
                        unsigned long valueStride, unsigned long countStride, unsigned long n) {
    if constexpr (std::is_floating_point_v<U>) {
        if (countStride != 0 && n == 0) return;
        if (!allWholeCounts(count, countStride != 0 ? n : 1,
                            {limits::bitshiftCountArray, &runInRanges}))
            raiseError<VESPRA::bitshift::inputsMustBeIntegers>();
    }
    if (n == 0) return;
    if (countStride != 0) {
        runVectorOp(bitfcnsTwoInputVectorOp<T, U, bitshiftVVFtor<T, U>>{
            in, count, out, valueStride, countStride, n, {bitWidth<T>}});
        return;
    }
    shiftByOneCount(out, in, valueStride, n, scalarShiftFor<T>(count[0]));
}

// Any class of the count that isn't one of the nine others is double; the
// caller has refused everything that isn't numeric.
template <class T>
void bitshiftClassDispatch(T* out, const T* in, const zqArray_tag* count, unsigned long outStride,
                           unsigned long valueStride, unsigned long countStride, unsigned long n) {
    visitClass<OrElse<NumericClasses, DoubleTag>>(classOf(count), [&]<class Tag>(Tag) {
        using U = typename Tag::type;
        bitshiftCaseKernel<T, U>(out, in, dataOf<const U>(count), outStride, valueStride,
                                 countStride, n);
    });
}

}  // namespace bitfcns
