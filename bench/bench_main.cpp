// Entry of the benchmark program. The context shows the registers that the
// double paths use on this machine (BITFCNS_LANES=sse2 asks for the baseline).
#include "frame/lane_width.hpp"

#include <benchmark/benchmark.h>

int main(int argc, char** argv) {
    benchmark::AddCustomContext("double_lanes", bitfcns::laneWidthName(bitfcns::laneWidth()));
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    return 0;
}
