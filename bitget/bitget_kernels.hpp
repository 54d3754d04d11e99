// The typed kernels of bitget, one set per class T of the value operand.
// Only declared here: bitget_kernels.cpp defines them and instantiates them
// for one class in each of its eight compilations.
#pragma once

#include "frame/array.hpp"

namespace bitfcns {

// The double path for values taken for integers of class T: writes bit p - 1
// of each value into `result` as 0.0 or 1.0, and refuses a bad value before a
// bad position. In place nothing is written before every value and position
// has passed; a fresh result with one position is tested and written in one
// pass. A scalar operand is read for every element of the result.
template <class T>
void bitgetDoubleDriver(const zqArray_tag* values, const zqArray_tag* positions,
                        zqArray_tag* result, bool valuesScalar, bool positionsScalar);

// The integer path for values of class T: by the class of `positions`, tests
// the positions and writes bit p - 1 of each value into `out`. The strides are
// 0 for a scalar operand and 1 for an array; n is the element count of the
// result.
template <class T>
void bitgetPositionDispatch(T* out, const T* in, const zqArray_tag* positions,
                            unsigned long valueStride, unsigned long positionStride,
                            unsigned long n);

}  // namespace bitfcns
