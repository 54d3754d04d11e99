// The typed kernels of bitget for the class of the value operand given by
// BITFCNS_FIRST_CLASS: the double driver of that assumed class, and the
// dispatcher on the class of the positions with its eight integer drivers.
// Every position is tested before the first element is written.
#include "bitget/bitget_kernels.hpp"

#include "bitget/bitget_ftors.hpp"
#include "engine/operator_families.hpp"
#include "engine/parallel_driver.hpp"
#include "engine/vector_ops.hpp"
#include "frame/array.hpp"
#include "frame/checked_lanes.hpp"
#include "frame/class_types.hpp"
#include "frame/element_scan.hpp"
#include "frame/exception.hpp"
#include "frame/message_tags.hpp"
#include "frame/position_scan.hpp"

#include <cstdint>
#include <type_traits>

namespace bitfcns {
namespace {

// Raises the bit position error unless each of the `count` positions is a
// whole number from 1 to T's width; checked on threads from `limit`, that of
// the loop that follows.
template <class T, class U>
void requireValidPositions(const U* positions, unsigned long count, unsigned long limit) {
    if (!allPositionsValid(positions, count, bitWidth<T>, {limit, &runInRanges}))
        raiseError<VESPRA::bitSetGet::BITOutOfRange>();
}

// Bit p - 1 of each value, p read from an array of positions.
template <class T, class U>
void getBitsAtPositions(T* out, const T* in, const U* positions, unsigned long valueStride,
                        unsigned long n) {
    runVectorOp(bitfcnsTwoInputVectorOp<T, U, bitgetVVFtor<T, U>>{
        in, positions, out, valueStride, 1, n, {}});
}

// The driver for positions of an integer class U.
template <class T, class U>
requires std::is_integral_v<U>
void bitgetIntegerDriver(T* out, const T* in, const U* positions, unsigned long valueStride,
                         unsigned long positionStride, unsigned long n) {
    if (positionStride != 0) {
        if (n == 0) return;
        requireValidPositions<T>(positions, n, limits::bitgetPositionArray);
        getBitsAtPositions(out, in, positions, valueStride, n);
        return;
    }
    // One position, tested even when there are no values; p - 1 in U's width.
    requireValidPositions<T>(positions, 1, limits::bitgetPositionArray);
    const auto bitIndex = static_cast<std::make_unsigned_t<U>>(positions[0]) - 1u;
    GetOneBit::run(out, in, valueStride, n, static_cast<std::uint32_t>(bitIndex));
}

// The same for single and double positions, which are truncated to an
// integer once tested.
template <class T, class U>
requires std::is_floating_point_v<U>
void bitgetFloatingPositions(T* out, const T* in, const U* positions, unsigned long valueStride,
                             unsigned long positionStride, unsigned long n) {
    if (positionStride != 0 && n == 0) return;
    requireValidPositions<T>(positions, positionStride == 0 ? 1 : n, limits::bitgetPositionArray);
    if (positionStride == 0) {
        const auto bitIndex = static_cast<std::int32_t>(positions[0]) - 1;
        GetOneBit::run(out, in, valueStride, n, static_cast<std::uint32_t>(bitIndex));
    } else {
        getBitsAtPositions(out, in, positions, valueStride, n);
    }
}

// An array of values with one valid position: tested and computed by the
// checked loop. False when some value is refused, the refusal then left to
// the caller's tests; a fresh result is partly written by then.
template <class T>
bool getBitsAtOnePosition(const double* x, double p, double* out, unsigned long n) {
    if (!bitIsValid(p, bitWidth<T>)) return false;
    const BitgetLanes<T> kernel(static_cast<unsigned>(static_cast<int>(p) - 1));
    return runCheckedLanes(kernel, x, nullptr, out, n, &runInRanges);
}

}  // namespace

template <class T>
void bitgetDoubleDriver(const zqArray_tag* values, const zqArray_tag* positions,
                        zqArray_tag* result, bool valuesScalar, bool positionsScalar) {
    const unsigned long n = numberOfElements(result);
    const double* x = dataOf<double>(values);
    const double* p = dataOf<double>(positions);
    double* out = dataOf<double>(result);
    if (positionsScalar && getBitsAtOnePosition<T>(x, *p, out, n)) return;
    if (!valuesScalar && !positionsScalar &&
        runCheckedLanes(BitgetPositionsLanes<T>{}, x, p, out, n, &runInRanges))
        return;
    // All values before any position, so a bad value hides a bad position.
    if (valuesScalar || n != 0) {
        if (!allFitInteger<T>(x, valuesScalar ? 1 : n, {limits::bitgetOnDouble, &runInRanges}))
            raiseError<VESPRA::bitget::outOfRange>();
    }
    if (positionsScalar || n != 0)
        requireValidPositions<T>(p, positionsScalar ? 1 : n, limits::bitgetOnDouble);
    runVectorOp(bitfcnsTwoInputVectorOp<double, double, BitgetFtor<T>>{
        x, p, out, valuesScalar ? 0ul : 1ul, positionsScalar ? 0ul : 1ul, n, {}});
}

template <class T>
void bitgetPositionDispatch(T* out, const T* in, const zqArray_tag* positions,
                            unsigned long valueStride, unsigned long positionStride,
                            unsigned long n) {
    visitClass<NumericClasses>(
        classOf(positions),
        [&]<class Tag>(Tag) {
            using U = typename Tag::type;
            const U* p = dataOf<U>(positions);
            if constexpr (std::is_integral_v<U>) {
                bitgetIntegerDriver(out, in, p, valueStride, positionStride, n);
            } else {
                bitgetFloatingPositions(out, in, p, valueStride, positionStride, n);
            }
        },
        // The caller let only numeric positions through; a class that holds
        // no numbers can't be read as positions.
        [] { raiseError<VESPRA::bitget::numericArg>(); });
}

using FirstClass = TagOf<static_cast<zqClassID>(BITFCNS_FIRST_CLASS), IntegerClasses>::type;
template void bitgetDoubleDriver<FirstClass>(const zqArray_tag*, const zqArray_tag*, zqArray_tag*,
                                             bool, bool);
template void bitgetPositionDispatch<FirstClass>(FirstClass*, const FirstClass*, const zqArray_tag*,
                                                 unsigned long, unsigned long, unsigned long);

}  // namespace bitfcns
