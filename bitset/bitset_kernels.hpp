// The typed part of the integer path: bitsetClassDispatch<T> reads the
// classes of BIT and V and runs the kernel of that combination. Its
// definition and the kernels are in bitset_case_kernels.hpp; each integer
// class of A instantiates them in a translation unit of its own
// (bitset_instances.cpp).
#pragma once

#include "frame/array.hpp"

namespace bitfcns {

// Validates BIT (any numeric class) and fills out[0, n) from A (class T),
// BIT and V (any numeric class or logical; null for none, which counts as a
// single true value). A stride is 0 for a broadcast scalar and 1 for an
// array; the result is written with unit stride, which outStride names.
// Raises "VESPRA:bitSetGet:BITOutOfRange" before the first write.
template <class T>
void bitsetClassDispatch(T* out, const T* a, const zqArray_tag* bit, const zqArray_tag* value,
                         unsigned long outStride, unsigned long strideA, unsigned long strideBit,
                         unsigned long strideValue, unsigned long n);

}  // namespace bitfcns
