// Element-wise arithmetic of the evaluator: + - * / ^ and the signs, with a
// scalar operand broadcast over the other.
#pragma once

#include "calc/array_access.hpp"
#include "calc/syntax_tree.hpp"

namespace bitcalc {

// The class of a result follows the host: an integer operand makes an
// integer result (two integers must be of one class), otherwise a single
// operand makes a single result, otherwise the result is double; logical and
// char operands count as double. An integer result is computed exactly and
// rounded half away from zero with saturation; ^ is element-wise too.
zqArraySlot applyBinary(BinaryOperator op, const zqArray_tag& left, const zqArray_tag& right);

// The class of the result of an operation on operands of these classes, by
// the rule above; raises the evaluator's class mismatch for two integer
// classes.
zqClassID resultClassOf(zqClassID left, zqClassID right);

// Unary minus or plus; logical and char operands become double.
zqArraySlot applySign(UnaryOperator op, const zqArray_tag& operand);

}  // namespace bitcalc
