// bitget: the entry point, the double path (values taken for integers of an
// assumed class, result in double) and the integer path (values of an integer
// class, positions of any numeric class, result in the values' class).
#include "bitfcns/entry_points.hpp"
#include "bitget/bitget_kernels.hpp"
#include "frame/array.hpp"
#include "frame/assumed_type.hpp"
#include "frame/class_types.hpp"
#include "frame/exception.hpp"
#include "frame/message_tags.hpp"

#include <boost/intrusive_ptr.hpp>

namespace bitfcns {
namespace {

using errors = VESPRA::bitget;
using sharedErrors = VESPRA::bitSetGet;

// The operand whose sizes the result takes: the array one when the other is
// scalar, either when both have the same sizes. `refuse` raises otherwise.
template <class Refuse>
const zqArray_tag* sizeGiver(const zqArray_tag* values, bool valuesScalar,
                             const zqArray_tag* positions, bool positionsScalar, Refuse refuse) {
    if (valuesScalar) return positions;
    if (!positionsScalar && !sameDimensions(values, positions)) refuse();
    return values;
}

// The result: the values' own storage where the host allows it and they are
// no scalar, otherwise a new real array of class `cls` with the sizes of
// `shape`.
zqArraySlot makeResult(const zqArray_tag* values, bool valuesScalar, const zqArray_tag* shape,
                       zqClassID cls) {
    if (!valuesScalar && wantsSharedResult(values)) return shareResult(values);
    return createResult(numberOfDimensions(shape), dimensionsOf(shape), cls);
}

// Both operands double, or a double value with positions converted to
// double. The result goes into `slot` as soon as it exists; the assumed class
// and the elements are tested after that.
void bitgetDoubleOperands(zqArraySlot& slot, const zqArray_tag* values,
                          const zqArray_tag* positions, const zqArray_tag* assumedType) {
    if (isSparse(values) || isSparse(positions)) raiseError<errors::sparseArgs>();
    if (isComplex(values) || isComplex(positions)) raiseError<errors::complexArgs>();
    const bool valuesScalar = isScalar(values);
    const bool positionsScalar = isScalar(positions);
    const zqArray_tag* shape = sizeGiver(values, valuesScalar, positions, positionsScalar,
                                         [] { raiseError<errors::sizeMismatch>(); });
    const zqClassID assumed = assumedType ? parseAssumedType(assumedType) : zqUInt64Class;
    slot = makeResult(values, valuesScalar, shape, zqDoubleClass);
    visitClass<IntegerClasses>(
        assumed,
        [&]<class Tag>(Tag) {
            bitgetDoubleDriver<typename Tag::type>(values, positions, slot.get(), valuesScalar,
                                                   positionsScalar);
        },
        [] { raiseError<errors::unknownTypeString>(); });
}

// Every pair of operands but double with double. A double value goes back to
// the double path with its positions converted to double.
zqArraySlot bitgetIntegerOperands(const zqArray_tag* values, const zqArray_tag* positions,
                                  const zqArray_tag* assumedType) {
    if (isSparse(values) || isSparse(positions)) raiseError<errors::sparseArgs>();
    if (!isNumeric(values) || !isNumeric(positions)) raiseError<errors::numericArg>();
    const zqClassID cls = classOf(values);
    if (cls == zqDoubleClass) {
        if (classOf(positions) == zqSingleClass) raiseError<sharedErrors::firstArgNotInt>();
        const boost::intrusive_ptr<zqArray_tag> converted =
            matrix::convert_if_needed(positions, zqDoubleClass);
        zqArraySlot result;
        bitgetDoubleOperands(result, values, converted.get(), assumedType);
        return result;
    }
    if (!isIntegerClass(cls)) raiseError<sharedErrors::firstArgNotInt>();
    if (isComplex(values) || isComplex(positions)) raiseError<errors::complexArgs>();

    const bool valuesScalar = isScalar(values);
    const bool positionsScalar = isScalar(positions);
    const zqArray_tag* shape = sizeGiver(values, valuesScalar, positions, positionsScalar,
                                         [] { raiseError<sharedErrors::sizeMismatch>(); });
    if (assumedType) {
        const zqClassID named = parseAssumedType(assumedType);
        if (named == zqNoClass) raiseError<errors::unknownTypeString>();
        if (named != cls) raiseError<errors::invalidTypeString>();
    }
    zqArraySlot result = makeResult(values, valuesScalar, shape, cls);
    const unsigned long n = numberOfElements(shape);
    visitClass<IntegerClasses>(
        cls,
        [&]<class Tag>(Tag) {
            using T = typename Tag::type;
            bitgetPositionDispatch<T>(dataOf<T>(result.get()), dataOf<T>(values), positions,
                                      valuesScalar ? 0ul : 1ul, positionsScalar ? 0ul : 1ul, n);
        },
        [] { raiseError<sharedErrors::firstArgNotInt>(); });
    return result;
}

}  // namespace
}  // namespace bitfcns

void ondelBitGetFcn(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs) {
    using namespace bitfcns;
    if (nlhs > 1) matrix::detail::error_maxlhs();
    if (nrhs > 3) matrix::detail::error_maxrhs();
    if (nrhs < 2) matrix::detail::error_minrhs();
    const zqArray_tag* assumedType = nrhs == 3 ? prhs[2] : nullptr;
    // The stored ids, unresolved: an opaque id takes the integer path, which
    // resolves it.
    if (prhs[0]->classId == zqDoubleClass && prhs[1]->classId == zqDoubleClass) {
        bitgetDoubleOperands(plhs[0], prhs[0], prhs[1], assumedType);
    } else {
        plhs[0] = bitgetIntegerOperands(prhs[0], prhs[1], assumedType);
    }
}
