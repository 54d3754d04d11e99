// The one parallel driver of the library: runs a range body over [0, n),
// straight through on the calling thread below a limit and under
// tbb::parallel_for from it. It is compiled once, in parallel_driver.cpp, and
// shared by every operator record, which reaches it as a function pointer and
// a context; so a record type costs one small function, not a parallel_for
// of its own.
#pragma once

namespace bitfcns {

// Treats the indices [begin, end) of the run whose state `context` points to.
// Must not throw: it runs on scheduler workers.
using RangeBody = void (*)(const void* context, unsigned long begin, unsigned long end) noexcept;

// Below `limit` one call `body(context, 0, n)` on the calling thread, with no
// task, context or heap block made. From `limit` on, tbb::parallel_for over
// blocked_range(0, n) with grain size 1 and the auto partitioner, which
// decides every split; the calling thread joins the workers and the call
// returns when every subrange is done. `context` is shared by all subranges
// and only read. Throws only what the scheduler throws when it can't start.
void runInRanges(unsigned long n, unsigned long limit, RangeBody body, const void* context);

}  // namespace bitfcns
