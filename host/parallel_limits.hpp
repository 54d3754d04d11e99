// Where the host's element loops go parallel: below these sizes a loop runs
// on the calling thread, from them on it is split over TBB workers.
#pragma once

#include <cstddef>

namespace host {

// AND, OR, XOR and the integer complement, in bytes of result. One pass
// reads at most two bytes and writes one per result byte, some 30 us for
// 256 KiB at memory speed, against a few microseconds to start a
// parallel_for on two workers.
inline constexpr std::size_t parallelResultBytes = std::size_t{256} << 10;

// Conversion between classes, in elements. A conversion takes about a
// nanosecond per element, so 64 Ki elements take some 50 us alone, well
// above the cost of starting a parallel_for.
inline constexpr std::size_t parallelConversionElements = std::size_t{1} << 16;

}  // namespace host
