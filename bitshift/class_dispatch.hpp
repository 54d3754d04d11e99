// The typed entry of bitshift on integer values: bitshiftClassDispatch<T>
// reads the class of the count once and runs the kernel for that pair. Only
// declared here: its eight instances are made in bitshift_instances.cpp, one
// translation unit per class of the value.
#pragma once

#include "frame/array.hpp"

namespace bitfcns {

// Shifts the n elements of `in` (stride `valueStride`: 0 for a scalar value)
// by the counts of `count`, an array of any numeric class (stride
// `countStride`) into `out`, which may be `in`. `outStride` is always 1.
// Refuses a floating count that isn't whole and finite before writing
// anything.
template <class T>
void bitshiftClassDispatch(T* out, const T* in, const zqArray_tag* count, unsigned long outStride,
                           unsigned long valueStride, unsigned long countStride, unsigned long n);

}  // namespace bitfcns
