// bitset on every pairing of A and BIT but double with double: the refusals
// of classes, the bridge that takes a double A with an integer BIT to the
// double path, and for an A of an integer class the result in A's class,
// filled by the kernels of that class.
#include "bitset/bitset_kernels.hpp"
#include "bitset/bitset_paths.hpp"
#include "bitset/result_shape.hpp"
#include "frame/array.hpp"
#include "frame/assumed_type.hpp"
#include "frame/class_types.hpp"
#include "frame/exception.hpp"
#include "frame/message_tags.hpp"

namespace bitfcns {
namespace {

using errors = VESPRA::bitset;

// A double A with a BIT of an integer class: BIT as double and V as logical,
// then the double path, to which the type is an assumed type as usual.
zqArraySlot bitsetWithDoubleValues(const zqArray_tag* a, const zqArray_tag* bit,
                                   const zqArray_tag* value, const zqArray_tag* assumedType) {
    if (classOf(bit) == zqSingleClass) raiseError<VESPRA::bitSetGet::firstArgNotInt>();
    const boost::intrusive_ptr<zqArray_tag> doubleBit =
        matrix::convert_if_needed(bit, zqDoubleClass);
    boost::intrusive_ptr<zqArray_tag> logicalValue;
    if (value != nullptr) logicalValue = matrix::convert_if_needed(value, zqLogicalClass);

    const zqArray_tag* inputs[4] = {a, doubleBit.get()};
    int count = 2;
    if (value != nullptr) inputs[count++] = logicalValue.get();
    if (assumedType != nullptr) inputs[count++] = assumedType;
    zqArraySlot result;
    bitsetOnDouble(1, &result, count, inputs);
    return result;
}

}  // namespace

zqArraySlot bitsetOnInteger(const zqArray_tag* a, const zqArray_tag* bit, const zqArray_tag* value,
                            const zqArray_tag* assumedType) {
    const bool hasValue = value != nullptr;
    if (isSparse(a) || isSparse(bit) || (hasValue && isSparse(value)))
        raiseError<errors::sparseArgs>();
    // BIT may not be logical; V may.
    if (!isNumeric(a) || !isNumeric(bit)) raiseError<errors::numericArg>();
    if (hasValue && !isNumeric(value) && classOf(value) != zqLogicalClass)
        raiseError<errors::numericArg>();
    const zqClassID cls = classOf(a);
    if (cls == zqDoubleClass) return bitsetWithDoubleValues(a, bit, value, assumedType);
    if (!isIntegerClass(cls)) raiseError<VESPRA::bitSetGet::firstArgNotInt>();
    if (isComplex(a) || isComplex(bit) || (hasValue && isComplex(value)))
        raiseError<errors::complexArgs>();

    const bool scalarA = isScalar(a);
    const bool scalarBit = isScalar(bit);
    const bool scalarValue = !hasValue || isScalar(value);
    const zqArray_tag* shape = resultShapeSource(a, scalarA, bit, scalarBit, value, scalarValue);
    if (shape == nullptr) {
        // Without V the only size test is that of A against BIT, reported in
        // the group bitset shares with bitget.
        if (hasValue) raiseError<errors::sizeMismatch>();
        raiseError<VESPRA::bitSetGet::sizeMismatch>();
    }
    // The type adds nothing here: it may only repeat A's class.
    if (assumedType != nullptr) {
        const zqClassID named = parseAssumedType(assumedType);
        if (named == zqNoClass) raiseError<errors::unknownTypeString>();
        if (named != cls) raiseError<errors::invalidTypeString>();
    }

    zqArraySlot result = !scalarA && wantsSharedResult(a)
                             ? shareResult(a)
                             : createResult(numberOfDimensions(shape), dimensionsOf(shape), cls);
    const unsigned long n = numberOfElements(shape);
    visitClass<IntegerClasses>(
        cls,
        [&]<class Tag>(Tag) {
            using T = typename Tag::type;
            bitsetClassDispatch<T>(dataOf<T>(result.get()), dataOf<T>(a), bit, value, 1,
                                   strideOf(scalarA), strideOf(scalarBit), strideOf(scalarValue),
                                   n);
        },
        [] {});
    return result;
}

}  // namespace bitfcns
