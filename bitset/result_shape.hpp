// The sizes of a bitset result: those of A, BIT or V, chosen by which of
// them are scalar. There is no implicit expansion: operands that aren't
// scalar must have the same sizes.
#pragma once

#include "frame/array.hpp"

namespace bitfcns {

// The operand whose number of dimensions and sizes the result takes, or null
// when two operands that aren't scalar differ in size (each path reports
// that with its own identifier). `value` is null when the call has no V.
//
//   A       BIT     V                   sizes from   compared
//   scalar  scalar  absent              BIT          -
//   scalar  scalar  present             V            -
//   scalar  array   absent or scalar    BIT          -
//   scalar  array   array               BIT          BIT, V
//   array   scalar  absent or scalar    A            -
//   array   scalar  array               A            A, V
//   array   array   absent or scalar    A            A, BIT
//   array   array   array               A            A, BIT, then A, V
const zqArray_tag* resultShapeSource(const zqArray_tag* a, bool scalarA, const zqArray_tag* bit,
                                     bool scalarBit, const zqArray_tag* value, bool scalarValue);

}  // namespace bitfcns
