// The two paths of bitset. The double path takes A and BIT of class double,
// taken for integers of an assumed class, and gives doubles; the integer
// path takes every other pairing, refuses what isn't allowed, and computes
// in A's integer class, or converts a double A's operands and hands them to
// the double path.
#pragma once

#include "frame/array.hpp"

namespace bitfcns {

// A and BIT of class double, then V and the assumed type as the call gives
// them: 2 to 4 inputs, the third taken for the type when it is scalar text.
// Puts the result into plhs[0] before the elements are validated.
void bitsetOnDouble(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs);

// Every other pairing of A and BIT. V and the assumed type are null when the
// call has none. Returns the result.
zqArraySlot bitsetOnInteger(const zqArray_tag* a, const zqArray_tag* bit, const zqArray_tag* value,
                            const zqArray_tag* assumedType);

// 0 for a scalar operand, which is broadcast, and 1 for an array.
inline unsigned long strideOf(bool scalar) { return scalar ? 0 : 1; }

}  // namespace bitfcns
