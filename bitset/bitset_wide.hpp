// The double path of bitset with one position and one V on AVX-512
// registers, defined in bitset_wide.cpp (compiled for them); call only where
// laneWidth() is avx512.
#pragma once

namespace bitfcns {

// BitsetLanes<T, set>(index), eight elements at a time.
template <class T>
bool setBitWide(const double* in, unsigned index, bool set, double* out, unsigned long n);

// The same with an array of n positions (whole numbers from 1 to T's width
// for every element to be accepted).
template <class T>
bool setBitsWide(const double* in, const double* positions, bool set, double* out, unsigned long n);

}  // namespace bitfcns
