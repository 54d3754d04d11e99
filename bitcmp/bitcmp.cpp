// bitcmp: the entry point, the integer path (the host's complement loop)
// and the double path (the complement of each element taken for the assumed
// class, tested in the same pass).
#include "bitcmp/bitcmp_ftor.hpp"
#include "bitfcns/entry_points.hpp"
#include "engine/parallel_driver.hpp"
#include "frame/array.hpp"
#include "frame/assumed_type.hpp"
#include "frame/checked_lanes.hpp"
#include "frame/class_types.hpp"
#include "frame/exception.hpp"
#include "frame/math_routines.hpp"
#include "frame/message_tags.hpp"

namespace bitfcns {
namespace {

using errors = VESPRA::bitcmp;

// The result: the operand's own storage where the host allows it, otherwise
// a new real array of the operand's sizes and class `cls`.
zqArraySlot makeResult(const zqArray_tag* operand, zqClassID cls) {
    if (wantsSharedResult(operand)) return shareResult(operand);
    return createResult(numberOfDimensions(operand), dimensionsOf(operand), cls);
}

void bitcmpIntegerOperand(int, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs) {
    const zqArray_tag* operand = prhs[0];
    if (isComplex(operand)) raiseError<errors::complexOperands>();
    const unsigned long n = numberOfElements(operand);
    const zqClassID cls = classOf(operand);
    if (nrhs == 2) {
        const zqClassID named = parseAssumedType(prhs[1]);
        if (named == zqNoClass) raiseError<errors::unknownTypeString>();
        if (named != cls) raiseError<errors::invalidTypeString>();
    }
    zqArraySlot result = makeResult(operand, cls);
    visitClass<IntegerClasses>(
        cls,
        [&]<class Tag>(Tag) {
            using T = typename Tag::type;
            mu::IntVectorBitcmp<T>(dataOf<T>(result.get()), dataOf<T>(operand), 1, 1, n);
        },
        [] { raiseError<errors::firstArgNotInt>(); });
    plhs[0] = std::move(result);
}

// In place every element is tested before any is written, so a refused call
// leaves the operand whose storage the result shares untouched; a fresh
// result is tested and written in one pass, and a refusal destroys it.
template <class T>
void bitcmpDoubleDriver(const zqArray_tag* operand, zqArray_tag* result) {
    if (!runCheckedLanes(BitcmpLanes<T>{}, dataOf<double>(operand), nullptr, dataOf<double>(result),
                         numberOfElements(result), &runInRanges))
        raiseError<errors::outOfRange>();
}

void bitcmpDoubleOperand(int, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs) {
    const zqArray_tag* operand = prhs[0];
    if (isSparse(operand)) raiseError<errors::sparseArgs>();
    if (isComplex(operand)) raiseError<errors::complexOperands>();
    const zqClassID assumed = nrhs == 2 ? parseAssumedType(prhs[1]) : zqUInt64Class;
    // The assumed class is tested after the result exists, which the
    // exception then destroys.
    zqArraySlot result = makeResult(operand, zqDoubleClass);
    visitClass<IntegerClasses>(
        assumed,
        [&]<class Tag>(Tag) { bitcmpDoubleDriver<typename Tag::type>(operand, result.get()); },
        [] { raiseError<errors::unknownTypeString>(); });
    plhs[0] = std::move(result);
}

}  // namespace
}  // namespace bitfcns

void ondelBitCmpFcn(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs) {
    using namespace bitfcns;
    if (nlhs > 1) matrix::detail::error_maxlhs();
    if (nrhs > 2) matrix::detail::error_maxrhs();
    if (nrhs < 1) matrix::detail::error_minrhs();
    // The stored id, unresolved: an opaque id is refused like any other class.
    const zqClassID stored = prhs[0]->classId;
    if (stored == zqDoubleClass) {
        bitcmpDoubleOperand(nlhs, plhs, nrhs, prhs);
    } else if (stored >= zqInt8Class && stored <= zqUInt64Class) {
        bitcmpIntegerOperand(nlhs, plhs, nrhs, prhs);
    } else {
        raiseError<VESPRA::bitcmp::firstArgNotInt>();
    }
}
