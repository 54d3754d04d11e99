// Software prefetch of the elements that a streaming loop reads next. On the
// machines this library runs on the hardware prefetchers don't keep a single
// core's loads ahead of memory, so loops that stream from memory ask for the
// data a couple of kilobytes ahead themselves.
#pragma once

#include <xmmintrin.h>

#include <cstdint>

namespace bitfcns {

// How far ahead of the element being read the prefetch reaches.
inline constexpr std::uintptr_t prefetchDistanceBytes = 2048;

// Asks for the cache line `prefetchDistanceBytes` past `p`. Only a hint: it
// never faults, also past the end of an array, and reads nothing.
inline void prefetchAhead(const void* p) noexcept {
    const std::uintptr_t ahead = reinterpret_cast<std::uintptr_t>(p) + prefetchDistanceBytes;
    _mm_prefetch(reinterpret_cast<const char*>(ahead), _MM_HINT_T0);
}

}  // namespace bitfcns
