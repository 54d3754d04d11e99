// The host's math utility library: element-wise AND, OR and XOR with implicit
// expansion, and the integer complement loop.
#pragma once

#include "zq_array.hpp"

// Element-wise AND, OR, XOR under implicit expansion: the result's size in
// each dimension is that of the operand whose size there isn't 1, a missing
// dimension counting as 1. Accepted operands: two arrays of one integer class
// (result of that class); an integer array with a double scalar holding an
// integer that the class holds, in either order (result of the integer
// class); two logical arrays (logical result). Anything else, and sizes that
// don't agree, raise the host's "VESPRA:bsxfun:badOperands". Raises the
// host's allocation failure when the result can't be made.
zqArraySlot bitandBsxfunHelper(const zqArray_tag* first, const zqArray_tag* second);
zqArraySlot bitorBsxfunHelper(const zqArray_tag* first, const zqArray_tag* second);
zqArraySlot bitxorBsxfunHelper(const zqArray_tag* first, const zqArray_tag* second);

namespace mu {
// out[i * outStride] = ~in[i * inStride] for i below count; `out` may equal
// `in`. The host instantiates it for the eight integer element types.
template <class T>
void IntVectorBitcmp(T* out, T* in, unsigned long outStride, unsigned long inStride,
                     unsigned long count);
}  // namespace mu
