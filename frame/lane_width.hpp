// The registers of the double paths' checked loop: AVX-512 where the
// processor has its F and DQ parts, SSE2 (the baseline) otherwise, or SSE2
// when the environment variable BITFCNS_LANES says "sse2", so that tests and
// comparisons can run the baseline on any machine.
#pragma once

namespace bitfcns {

enum class LaneWidth { sse2, avx512 };

// Decided on the first call, the same for the whole process afterwards.
LaneWidth laneWidth() noexcept;

// "sse2" or "avx512".
const char* laneWidthName(LaneWidth width) noexcept;

}  // namespace bitfcns
