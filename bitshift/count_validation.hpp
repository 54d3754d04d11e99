// The test of shift counts given as floating numbers: each must be whole and
// finite. There is no bound on a whole count; a count beyond the width
// simply shifts everything out.
#pragma once

#include "frame/floating.hpp"

namespace bitfcns {

// True when each of the n counts is a finite whole number; stops at the
// first that isn't. NaN and the infinities fail.
template <class U>
bool allWholeCounts(const U* counts, unsigned long n) noexcept {
    for (unsigned long i = 0; i < n; ++i)
        if (!isWholeNumber(counts[i])) return false;
    return true;
}

}  // namespace bitfcns
