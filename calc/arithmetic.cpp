// Element-wise arithmetic of the evaluator.
//
// Values are read into the computation type, combined, and stored with the
// host's rule for the result class. The computation type is double for
// double and single results, so that those follow IEEE double arithmetic
// (a single result is the rounding of the double one), and long double for
// integer results, which holds every 64-bit integer exactly.
#include "calc/arithmetic.hpp"

#include "calc/element_cast.hpp"
#include "calc/errors.hpp"
#include "calc/text_join.hpp"
#include "host/element_types.hpp"

#include <cmath>
#include <string>

namespace bitcalc {

namespace {

std::string_view symbolOf(BinaryOperator op) {
    switch (op) {
        case BinaryOperator::Add: return "+";
        case BinaryOperator::Subtract: return "-";
        case BinaryOperator::Multiply: return "*";
        case BinaryOperator::Divide: return "/";
        case BinaryOperator::Power: return "^";
    }
    return "?";
}

template <class C>
C combine(BinaryOperator op, C left, C right) {
    switch (op) {
        case BinaryOperator::Add: return left + right;
        case BinaryOperator::Subtract: return left - right;
        case BinaryOperator::Multiply: return left * right;
        case BinaryOperator::Divide: return left / right;
        case BinaryOperator::Power: return std::pow(left, right);
    }
    return left;
}

// Reads element i of an operand's data in the computation type.
template <class C>
using Reader = C (*)(const void* data, std::size_t index);

template <class C, class T>
C readAs(const void* data, std::size_t index) {
    return static_cast<C>(static_cast<const T*>(data)[index]);
}

template <class C>
Reader<C> readerFor(zqClassID cls) {
    return host::visitElementClass<host::StoredElements>(
        cls, []<class Tag>(Tag) -> Reader<C> { return &readAs<C, typename Tag::type>; },
        []() -> Reader<C> { return nullptr; });
}

void requireArithmeticOperand(const zqArray_tag& operand, std::string_view symbol) {
    const zqClassID cls = host::classOf(operand);
    if (!holdsElements(cls)) {
        throw CalcError(errorid::unsupported,
                        joinText("Operator '", symbol, "' isn't defined for operands of class ",
                                 className(cls), "."));
    }
    if (host::isComplex(operand)) {
        throw CalcError(errorid::unsupported,
                        joinText("Operator '", symbol, "' isn't defined for complex operands."));
    }
}

// out[i] = combine(left[i * leftStride], right[i * rightStride]); a scalar
// operand has the stride 0.
template <class Tag>
void combineInto(zqArray_tag& result, BinaryOperator op, const zqArray_tag& left,
                 const zqArray_tag& right) {
    using T = typename Tag::type;
    using C = std::conditional_t<host::isIntegerElement<Tag>, long double, double>;
    const Reader<C> readLeft = readerFor<C>(host::classOf(left));
    const Reader<C> readRight = readerFor<C>(host::classOf(right));
    const std::size_t leftStride = isScalar(left) ? 0 : 1;
    const std::size_t rightStride = isScalar(right) ? 0 : 1;
    T* out = mutableElementsOf<T>(result);
    const std::size_t count = host::elementCount(result);
    for (std::size_t i = 0; i < count; ++i) {
        out[i] = castElement<T>(combine<C>(op, readLeft(left.data, i * leftStride),
                                           readRight(right.data, i * rightStride)));
    }
}

}  // namespace

zqClassID resultClassOf(zqClassID left, zqClassID right) {
    if (host::isIntegerClass(left) && host::isIntegerClass(right) && left != right) {
        throw CalcError(errorid::classMismatch,
                        joinText("Integers of different classes can't be combined: ",
                                 className(left), " with ", className(right), "."));
    }
    if (host::isIntegerClass(left)) return left;
    if (host::isIntegerClass(right)) return right;
    if (left == zqSingleClass || right == zqSingleClass) return zqSingleClass;
    return zqDoubleClass;
}

zqArraySlot applyBinary(BinaryOperator op, const zqArray_tag& left, const zqArray_tag& right) {
    requireArithmeticOperand(left, symbolOf(op));
    requireArithmeticOperand(right, symbolOf(op));
    const zqClassID cls = resultClassOf(host::classOf(left), host::classOf(right));

    const Dims leftDims = host::dimensions(left);
    const Dims rightDims = host::dimensions(right);
    Dims dims;
    if (isScalar(right)) {
        dims = leftDims;
    } else if (isScalar(left) || leftDims == rightDims) {
        dims = rightDims;
    } else {
        throw CalcError(
            errorid::sizeMismatch,
            joinText("Operator '", symbolOf(op), "' needs operands of one size or a scalar, not ",
                     dimsText(leftDims), " and ", dimsText(rightDims), "."));
    }

    zqArraySlot result = host::makeArray(cls, dims);
    host::visitElementClass<host::NumericElements>(
        cls, [&]<class Tag>(Tag) { combineInto<Tag>(*result, op, left, right); }, [] {});
    return result;
}

zqArraySlot applySign(UnaryOperator op, const zqArray_tag& operand) {
    const std::string_view symbol = op == UnaryOperator::Negate ? "-" : "+";
    requireArithmeticOperand(operand, symbol);
    const zqClassID from = host::classOf(operand);
    const zqClassID cls = host::isNumericClass(from) ? from : zqDoubleClass;
    const double factor = op == UnaryOperator::Negate ? -1 : 1;
    zqArraySlot sign = host::makeDoubleScalar(factor);
    // -x is computed as x * -1 in the class of x, which saturates integers
    // and keeps the sign of zero right for floating values.
    zqArraySlot result = host::makeArray(cls, host::dimensions(operand));
    host::visitElementClass<host::NumericElements>(
        cls,
        [&]<class Tag>(Tag) {
            combineInto<Tag>(*result, BinaryOperator::Multiply, operand, *sign);
        },
        [] {});
    return result;
}

}  // namespace bitcalc
