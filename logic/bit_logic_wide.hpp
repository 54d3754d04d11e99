// bitand, bitor and bitxor on doubles taken for integers of class T, on
// AVX-512 registers, defined in bit_logic_wide.cpp (compiled for them); call
// only where laneWidth() is avx512. Also the size from which these loops go
// parallel, shared with the SSE2 ones.
#pragma once

#include "frame/math_routines.hpp"

namespace bitfcns {

enum class BitOp { bitAnd, bitOr, bitXor };

// Where the host's element loop for AND, OR and XOR goes parallel, in
// doubles of result.
inline constexpr unsigned long bitLogicOnDouble = host::parallelResultBytes / sizeof(double);

// Every element of `array` tested for T and combined with the element of
// `partner` at the same index, or with its only element when
// `partnerIsScalar` (which must have been accepted already). Whether every
// element was accepted.
template <class T>
bool combineWide(BitOp op, const double* array, const double* partner, bool partnerIsScalar,
                 double* out, unsigned long n);

}  // namespace bitfcns
