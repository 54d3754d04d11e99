// The parallel driver: the library's only tbb::parallel_for.
#include "engine/parallel_driver.hpp"

#include <tbb/blocked_range.h>
#include <tbb/parallel_for.h>
#include <tbb/partitioner.h>

namespace bitfcns {

void runInRanges(unsigned long n, unsigned long limit, RangeBody body, const void* context) {
    if (n < limit) {
        body(context, 0, n);
        return;
    }
    const tbb::auto_partitioner partitioner;
    tbb::parallel_for(
        tbb::blocked_range<unsigned long>(0, n),
        [body, context](const tbb::blocked_range<unsigned long>& range) {
            body(context, range.begin(), range.end());
        },
        partitioner);
}

}  // namespace bitfcns
