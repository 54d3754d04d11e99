// The check of BIT elements on both paths of bitset: every element must be
// a whole number from 1 to the width of the working class, and the first
// one that isn't ends the call with "VESPRA:bitSetGet:BITOutOfRange" before
// any element of the result is written.
#pragma once

#include "bitset/bitset_functors.hpp"
#include "frame/bit_positions.hpp"

#include <cstdint>

namespace bitfcns {

// Raises "VESPRA:bitSetGet:BITOutOfRange". One copy for every kernel.
[[noreturn]] void raiseBitOutOfRange();

// The zero-based index of the one position b, which must be valid.
template <class U>
std::uint32_t checkedBitIndex(U b, int width) {
    if (!bitIsValid(b, width)) raiseBitOutOfRange();
    return bitIndexOf(b);
}

// All n positions must be valid; checked on threads from `limit`, that of
// the loop that follows. Defined in bit_checks.cpp, once for each numeric
// class of BIT, which every kernel calls whatever its classes of A and V.
template <class U>
void checkPositions(const U* positions, unsigned long n, int width, unsigned long limit);

}  // namespace bitfcns
