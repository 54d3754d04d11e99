// How the frame's loops are spread over threads: a range runner, which the
// caller passes in (the engine's parallel driver; the frame can't name it),
// and the scans of whole arrays through one.
#pragma once

#include <atomic>

namespace bitfcns {

// Treats [begin, end) of the run whose state `context` points to.
using LaneRangeBody = void (*)(const void* context, unsigned long begin,
                               unsigned long end) noexcept;
// Runs `body` over [0, n): on the calling thread below `limit`, spread over
// threads from it.
using RangeRunner = void (*)(unsigned long n, unsigned long limit, LaneRangeBody body,
                             const void* context);

// A scan's way through an array: the runner, and the element count from
// which it spreads the scan over threads (that of the loop the scan
// precedes).
struct ScanRunner {
    unsigned long limit;
    RangeRunner runRanges;
};

// Whether `passes(begin, end)` holds for every subrange of [0, n) that the
// runner hands out. Subranges that start after one has failed are passed
// over.
template <class RangeTest>
bool everyRangePasses(unsigned long n, ScanRunner runner, const RangeTest& passes) {
    struct Scan {
        const RangeTest* passes;
        std::atomic<bool>* refused;
    };
    std::atomic<bool> refused{false};
    const Scan scan{&passes, &refused};
    runner.runRanges(
        n, runner.limit,
        [](const void* context, unsigned long begin, unsigned long end) noexcept {
            const Scan& s = *static_cast<const Scan*>(context);
            if (!s.refused->load(std::memory_order_relaxed) && !(*s.passes)(begin, end))
                s.refused->store(true, std::memory_order_relaxed);
        },
        &scan);
    return !refused.load(std::memory_order_relaxed);
}

}  // namespace bitfcns
