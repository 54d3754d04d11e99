// The double path of bitcmp on AVX-512 registers, defined in bitcmp_wide.cpp
// (compiled for them); call only where laneWidth() is avx512.
#pragma once

namespace bitfcns {

// runCheckedLanes with BitcmpLanes<T>, eight elements at a time: whether
// every element of `in` was accepted, and their complements in `out`.
template <class T>
bool complementWide(const double* in, double* out, unsigned long n);

}  // namespace bitfcns
