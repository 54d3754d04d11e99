// What one count does to every double of bitshift's double path, and that
// path on AVX-512 registers, defined in bitshift_wide.cpp (compiled for
// them); call it only where laneWidth() is avx512.
#pragma once

namespace bitfcns {

// Shift left within the width, shift right, or shift everything out (a
// count at or beyond the width).
enum class DoubleShift { left, right, out };

// BitshiftLanes<T, kind> eight elements at a time. `amount` is the shift for
// left and right (below T's width), and for out negative exactly when the
// count was.
template <class T>
bool shiftWide(const double* in, DoubleShift kind, int amount, double* out, unsigned long n);

// BitshiftFtor<T> with an array of n counts (whole and finite for every
// element to be accepted), eight elements at a time.
template <class T>
bool shiftByCountsWide(const double* in, const double* counts, double* out, unsigned long n);

}  // namespace bitfcns
