// The double path of bitget at one position on AVX-512 registers, defined in
// bitget_wide.cpp (compiled for them); call only where laneWidth() is avx512.
#pragma once

namespace bitfcns {

// runCheckedLanes with BitgetLanes<T>(index), eight elements at a time.
template <class T>
bool getBitWide(const double* in, unsigned index, double* out, unsigned long n);

// The same with an array of n positions (whole numbers from 1 to T's width
// for every element to be accepted).
template <class T>
bool getBitsWide(const double* in, const double* positions, double* out, unsigned long n);

}  // namespace bitfcns
