// bitset on A and BIT of class double, taken for integers of the assumed
// class (uint64 unless the call names one): the call forms, the order of
// refusals, the result, and the drivers that validate A and BIT and run
// BitsetFtor<T>.
#include "bitset/bit_checks.hpp"
#include "bitset/bitset_functors.hpp"
#include "bitset/bitset_paths.hpp"
#include "bitset/result_shape.hpp"
#include "engine/parallel_driver.hpp"
#include "engine/vector_ops.hpp"
#include "frame/array.hpp"
#include "frame/assumed_type.hpp"
#include "frame/checked_lanes.hpp"
#include "frame/class_types.hpp"
#include "frame/element_scan.hpp"
#include "frame/exception.hpp"
#include "frame/message_tags.hpp"
#include "frame/scalar_text.hpp"

namespace bitfcns {
namespace {

using errors = VESPRA::bitset;

// A with one valid position set or cleared as one V says, in the checked
// loop. False when some element of A is refused (or the position is), the
// refusal then left to the caller's tests; a fresh result is partly written
// by then.
template <class T>
bool setAtOnePosition(const double* values, double position, bool value, double* out,
                      unsigned long n) {
    if (!bitIsValid(position, bitWidth<T>)) return false;
    const std::uint32_t index = bitIndexOf(position);
    if (value)
        return runCheckedLanes(BitsetLanes<T, true>(index), values, nullptr, out, n, &runInRanges);
    return runCheckedLanes(BitsetLanes<T, false>(index), values, nullptr, out, n, &runInRanges);
}

// The same with an array of positions, one for each element of A.
template <class T>
bool setAtPositions(const double* values, const double* positions, bool value, double* out,
                    unsigned long n) {
    if (value)
        return runCheckedLanes(BitsetPositionsLanes<T, true>{}, values, positions, out, n,
                               &runInRanges);
    return runCheckedLanes(BitsetPositionsLanes<T, false>{}, values, positions, out, n,
                           &runInRanges);
}

// The same with one position and an array of V, one for each element of A.
template <class T>
bool setAtOnePositionByValues(const double* values, double position, const bool* valueData,
                              double* out, unsigned long n) {
    if (!bitIsValid(position, bitWidth<T>)) return false;
    return runCheckedLanes(BitsetValuesLanes<T>(bitIndexOf(position)), values, valueData, out, n,
                           &runInRanges);
}

// Validates all of A, then all of BIT, for class T, and fills the result,
// which exists already. A scalar operand is validated even when the result
// is empty. In place nothing is written before both have passed, so a
// refusal leaves A untouched; a fresh result with one position or one V (or
// both) is tested and written in one pass. V needs no test: it is logical.
template <class T>
void bitsetDoubleDriver(const zqArray_tag* a, const zqArray_tag* bit, const bool* valueData,
                        zqArray_tag* result, bool scalarA, bool scalarBit, bool scalarValue) {
    const unsigned long n = numberOfElements(result);
    const double* values = dataOf<double>(a);
    const double* positions = dataOf<double>(bit);
    double* out = dataOf<double>(result);
    if (scalarBit && scalarValue && setAtOnePosition<T>(values, *positions, *valueData, out, n))
        return;
    if (!scalarA && !scalarBit && scalarValue &&
        setAtPositions<T>(values, positions, *valueData, out, n))
        return;
    if (!scalarA && scalarBit && !scalarValue &&
        setAtOnePositionByValues<T>(values, *positions, valueData, out, n))
        return;
    constexpr unsigned long limit = limits::bitsetOnDouble;
    if (!allFitInteger<T>(values, scalarA ? 1 : n, {limit, &runInRanges}))
        raiseError<errors::outOfRange>();
    checkPositions(positions, scalarBit ? 1 : n, bitWidth<T>, limit);
    runVectorOp(
        bitfcnsThreeInputVectorOp<double, double, bool, BitsetFtor<T>>{values,
                                                                       positions,
                                                                       valueData,
                                                                       out,
                                                                       strideOf(scalarA),
                                                                       strideOf(scalarBit),
                                                                       strideOf(scalarValue),
                                                                       n,
                                                                       {}});
}

}  // namespace

void bitsetOnDouble(int, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs) {
    const zqArray_tag* a = prhs[0];
    const zqArray_tag* bit = prhs[1];
    // The same test as the entry point's tells a third operand's role.
    const bool withValue = nrhs == 4 || (nrhs == 3 && !isScalarText(prhs[2]));

    // V as logical, or a single true value when the call has none.
    static constexpr bool missingValue = true;
    boost::intrusive_ptr<zqArray_tag> logicalValue;
    const bool* valueData = &missingValue;
    bool scalarValue = true;
    if (withValue) {
        const zqArray_tag* value = prhs[2];
        if (isSparse(a) || isSparse(bit) || isSparse(value)) raiseError<errors::sparseArgs>();
        if (classOf(value) == zqSingleClass) raiseError<errors::invalidV>();
        if (isComplex(a) || isComplex(bit) || isComplex(value)) raiseError<errors::complexArgs>();
        if (classOf(bit) == zqSingleClass) raiseError<VESPRA::bitSetGet::firstArgNotInt>();
        if (classOf(value) != zqLogicalClass && !isNumeric(value)) raiseError<errors::invalidV>();
        logicalValue = matrix::convert_if_needed(value, zqLogicalClass);
        valueData = matrix::detail::noninlined::zq_array_api::zqGetLogicals(logicalValue.get());
        scalarValue = isScalar(logicalValue.get());
    } else {
        if (isSparse(a) || isSparse(bit)) raiseError<errors::sparseArgs>();
        if (isComplex(a) || isComplex(bit)) raiseError<errors::complexArgs>();
    }
    const bool scalarA = isScalar(a);
    const bool scalarBit = isScalar(bit);
    const zqArray_tag* shape =
        resultShapeSource(a, scalarA, bit, scalarBit, logicalValue.get(), scalarValue);
    if (shape == nullptr) raiseError<errors::sizeMismatch>();
    // The type comes last of the operands when the call has one. Whether it
    // names a class is tested only once the result exists.
    const bool namesType = nrhs == 4 || (nrhs == 3 && !withValue);
    const zqClassID assumed = namesType ? parseAssumedType(prhs[nrhs - 1]) : zqUInt64Class;

    plhs[0] = !scalarA && wantsSharedResult(a)
                  ? shareResult(a)
                  : createResult(numberOfDimensions(shape), dimensionsOf(shape), zqDoubleClass);
    visitClass<IntegerClasses>(
        assumed,
        [&]<class Tag>(Tag) {
            bitsetDoubleDriver<typename Tag::type>(a, bit, valueData, plhs[0].get(), scalarA,
                                                   scalarBit, scalarValue);
        },
        [] { raiseError<errors::unknownTypeString>(); });
}

}  // namespace bitfcns
