// The choice of registers for the double paths, made once per process.
#include "frame/lane_width.hpp"

#include <cstdlib>
#include <cstring>

namespace bitfcns {

LaneWidth laneWidth() noexcept {
    static const LaneWidth chosen = [] {
        const char* asked = std::getenv("BITFCNS_LANES");
        if (asked != nullptr && std::strcmp(asked, "sse2") == 0) return LaneWidth::sse2;
        __builtin_cpu_init();
        const bool wide = __builtin_cpu_supports("avx512f") && __builtin_cpu_supports("avx512dq");
        return wide ? LaneWidth::avx512 : LaneWidth::sse2;
    }();
    return chosen;
}

const char* laneWidthName(LaneWidth width) noexcept {
    return width == LaneWidth::avx512 ? "avx512" : "sse2";
}

}  // namespace bitfcns
