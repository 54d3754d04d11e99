// bitshift: the entry point, the double path (values taken for integers of
// an assumed class and shifted by BitshiftFtor<T>) and the integer path,
// which settles the classes of both operands and hands the typed work to
// bitshiftClassDispatch<T>.
#include "bitfcns/entry_points.hpp"
#include "bitshift/class_dispatch.hpp"
#include "bitshift/count_validation.hpp"
#include "bitshift/shift_rule.hpp"
#include "engine/parallel_driver.hpp"
#include "engine/vector_ops.hpp"
#include "frame/array.hpp"
#include "frame/assumed_type.hpp"
#include "frame/checked_lanes.hpp"
#include "frame/class_types.hpp"
#include "frame/element_scan.hpp"
#include "frame/exception.hpp"
#include "frame/message_tags.hpp"

#include <cmath>

namespace bitfcns {
namespace {

using errors = VESPRA::bitshift;

void checkArgumentCounts(int nlhs, int nrhs) {
    if (nlhs > 1) matrix::detail::error_maxlhs();
    if (nrhs > 3) matrix::detail::error_maxrhs();
    if (nrhs < 2) matrix::detail::error_minrhs();
}

// The two main operands and whether each is a scalar, which broadcasts.
struct Operands {
    const zqArray_tag* values;
    const zqArray_tag* counts;
    bool valuesAreScalar;
    bool countsAreScalar;

    Operands(const zqArray_tag* first, const zqArray_tag* second)
        : values(first),
          counts(second),
          valuesAreScalar(isScalar(first)),
          countsAreScalar(isScalar(second)) {}

    unsigned long valueStride() const { return valuesAreScalar ? 0 : 1; }
    unsigned long countStride() const { return countsAreScalar ? 0 : 1; }

    // The operand whose sizes the result takes: the values unless they are
    // a scalar. Two arrays must have the same sizes: there is no implicit
    // expansion.
    const zqArray_tag* shapeOfResult() const {
        if (valuesAreScalar) return counts;
        if (!countsAreScalar && !sameDimensions(values, counts)) raiseError<errors::sizeMismatch>();
        return values;
    }

    // The values' own storage when the host allows it (never for a scalar,
    // whose result may be larger), otherwise a new real array of class `cls`.
    zqArraySlot makeResult(const zqArray_tag* shape, zqClassID cls) const {
        if (!valuesAreScalar && wantsSharedResult(values)) return shareResult(values);
        return createResult(numberOfDimensions(shape), dimensionsOf(shape), cls);
    }
};

// Values shifted by one whole count in the checked loop. False when some
// value is refused, the refusal then left to the caller's tests; a fresh
// result is partly written by then.
template <class T>
bool shiftByOneCount(const double* values, double count, double* out, unsigned long n) {
    if (!isWholeNumber(count)) return false;
    const auto run = [&](auto kernel) {
        return runCheckedLanes(kernel, values, nullptr, out, n, &runInRanges);
    };
    constexpr double width = bitWidth<T>;
    if (!(std::fabs(count) < width)) return run(BitshiftLanes<T, DoubleShift::out>(count));
    if (count > 0) return run(BitshiftLanes<T, DoubleShift::left>(count));
    return run(BitshiftLanes<T, DoubleShift::right>(count));
}

// Validates the values for class T and the counts, then shifts into
// `result`, refusing a bad value before a bad count. In place every element
// is tested before any is written, so a refused call leaves values whose
// storage the result shares untouched; a fresh result by one count or by
// an array of counts is tested and written in one pass. A scalar operand is
// tested even when the other is empty.
template <class T>
void bitshiftDoubleDriver(const zqArray_tag* first, const zqArray_tag* second, zqArray_tag* result,
                          bool firstIsScalar, bool secondIsScalar) {
    const unsigned long n = numberOfElements(result);
    const double* values = dataOf<const double>(first);
    const double* counts = dataOf<const double>(second);
    double* out = dataOf<double>(result);
    if (secondIsScalar && shiftByOneCount<T>(values, *counts, out, n)) return;
    if (!firstIsScalar && !secondIsScalar &&
        runCheckedLanes(BitshiftCountsLanes<T>{}, values, counts, out, n, &runInRanges))
        return;
    const ScanRunner runner{limits::bitshiftOnDouble, &runInRanges};
    if (!allFitInteger<T>(values, firstIsScalar ? 1 : n, runner)) raiseError<errors::outOfRange>();
    if (!allWholeCounts(counts, secondIsScalar ? 1 : n, runner))
        raiseError<errors::inputsMustBeIntegers>();
    if (n == 0) return;
    runVectorOp(bitfcnsTwoInputVectorOp<double, double, BitshiftFtor<T>>{
        values, counts, out, firstIsScalar ? 0ul : 1ul, secondIsScalar ? 0ul : 1ul, n, {}});
}

// Both operands double (or the counts converted to double): the values are
// integers of the assumed class, uint64 unless a third operand names one.
// The assumed class is tested after the result exists; the result is then
// left in plhs[0] for its owner.
void bitshiftOnDouble(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs) {
    checkArgumentCounts(nlhs, nrhs);
    const zqArray_tag* first = prhs[0];
    const zqArray_tag* second = prhs[1];
    if (isSparse(first) || isSparse(second)) raiseError<errors::sparseArgs>();
    if (isComplex(first) || isComplex(second)) raiseError<errors::complexArgs>();
    const Operands operands(first, second);
    const zqArray_tag* shape = operands.shapeOfResult();
    const zqClassID assumed = nrhs == 3 ? parseAssumedType(prhs[2]) : zqUInt64Class;
    plhs[0] = operands.makeResult(shape, zqDoubleClass);
    visitClass<IntegerClasses>(
        assumed,
        [&]<class Tag>(Tag) {
            bitshiftDoubleDriver<typename Tag::type>(
                first, second, plhs[0].get(), operands.valuesAreScalar, operands.countsAreScalar);
        },
        [] { raiseError<errors::unknownTypeString>(); });
}

// Double values with integer counts: the counts go to double and the call
// to the double path, where the third operand may name any class.
void shiftDoublesByConvertedCounts(zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs) {
    if (classOf(prhs[1]) == zqSingleClass) raiseError<errors::firstArgNotInt>();
    const auto counts = matrix::convert_if_needed(prhs[1], zqDoubleClass);
    const zqArray_tag* inputs[3] = {prhs[0], counts.get(), nrhs == 3 ? prhs[2] : nullptr};
    bitshiftOnDouble(1, plhs, nrhs, inputs);
}

// Values of integer class T, shifted in T by counts of any numeric class.
// A third operand can only confirm T.
template <class Tag>
void shiftIntegerValues(zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs) {
    using T = typename Tag::type;
    const zqArray_tag* first = prhs[0];
    const zqArray_tag* second = prhs[1];
    if (isComplex(first) || isComplex(second)) raiseError<errors::complexArgs>();
    const Operands operands(first, second);
    const zqArray_tag* shape = operands.shapeOfResult();
    if (nrhs > 2) {
        const zqClassID named = parseAssumedType(prhs[2]);
        if (named == zqNoClass) raiseError<errors::unknownTypeString>();
        if (named != Tag::id) raiseError<errors::invalidTypeString>();
    }
    plhs[0] = operands.makeResult(shape, Tag::id);
    bitshiftClassDispatch<T>(dataOf<T>(plhs[0].get()), dataOf<const T>(first), second, 1,
                             operands.valueStride(), operands.countStride(),
                             numberOfElements(shape));
}

// Every pairing but two doubles: integer values with counts of any numeric
// class, or double values with integer counts.
void bitshiftOnInteger(int, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs) {
    const zqArray_tag* first = prhs[0];
    const zqArray_tag* second = prhs[1];
    if (isSparse(first) || isSparse(second)) raiseError<errors::sparseArgs>();
    if (!isNumeric(first) || !isNumeric(second)) raiseError<errors::numericArg>();
    const zqClassID cls = classOf(first);
    if (cls == zqDoubleClass) {
        shiftDoublesByConvertedCounts(plhs, nrhs, prhs);
        return;
    }
    visitClass<IntegerClasses>(
        cls, [&]<class Tag>(Tag) { shiftIntegerValues<Tag>(plhs, nrhs, prhs); },
        [] { raiseError<errors::firstArgNotInt>(); });
}

}  // namespace
}  // namespace bitfcns

void ondelBitShiftFcn(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs) {
    using namespace bitfcns;
    checkArgumentCounts(nlhs, nrhs);
    // The stored ids, unresolved: an opaque id takes the integer path, which
    // resolves it.
    if (prhs[0]->classId == zqDoubleClass && prhs[1]->classId == zqDoubleClass) {
        bitshiftOnDouble(nlhs, plhs, nrhs, prhs);
    } else {
        bitshiftOnInteger(nlhs, plhs, nrhs, prhs);
    }
}
