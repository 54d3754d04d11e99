// Conversion between classes with the host's rules, and the limits of the
// integer classes.
#pragma once

#include "calc/array_access.hpp"

namespace bitcalc {

// A new array of class `cls` (numeric or logical) holding the values of
// `source` (numeric, logical or char): integers round half away from zero
// and saturate, NaN giving 0; logical is true for anything non-zero. A
// complex source keeps its imaginary part, converted likewise; the sparse
// flag stays for double and logical results.
zqArraySlot convertArray(const zqArray_tag& source, zqClassID cls);

// The largest or the smallest value of an integer class, as a scalar of it.
zqArraySlot integerLimit(zqClassID cls, bool largest);

}  // namespace bitcalc
