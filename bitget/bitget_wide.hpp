// The double path of bitget at one position on AVX-512 registers, defined in
// bitget_wide.cpp (compiled for them); call only where laneWidth() is avx512.
#pragma once

namespace bitfcns {

// runCheckedLanes with BitgetLanes<T>(index), eight elements at a time.
template <class T>
bool getBitWide(const double* in, unsigned index, double* out, unsigned long n);

}  // namespace bitfcns
