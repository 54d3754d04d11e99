// The five operator records of the vector engine and runVectorOp, which runs
// a filled record on the calling thread below the limit of its family and
// under tbb::parallel_for from the limit on. A record is a trivially copyable
// structure of raw non-owning pointers, element strides (0 for a broadcast
// scalar, 1 for an array), a count and functors; its call operator treats one
// subrange [begin, end) and keeps no running state, so subranges may run
// concurrently. The result is always written with unit stride.
#pragma once

#include "engine/prefetch.hpp"
#include "engine/simd_loops.hpp"

#include <tbb/blocked_range.h>
#include <tbb/parallel_for.h>
#include <tbb/partitioner.h>

#include <type_traits>

namespace bitfcns {

using VectorRange = tbb::blocked_range<unsigned long>;

// out[i] = ftor(in[i * stride]).
template <class In, class Ftor>
struct bitfcnsOneInputVectorOp {
    const In* in;
    In* out;
    unsigned long stride;
    unsigned long n;
    Ftor ftor;

    void operator()(const VectorRange& range) const noexcept {
        for (unsigned long i = range.begin(); i != range.end(); ++i) {
            prefetchAhead(in + i * stride);
            out[i] = ftor(in[i * stride]);
        }
    }
};

// out[i] = ftor(in1[i * stride1], in2[i * stride2]).
template <class In1, class In2, class Ftor>
struct bitfcnsTwoInputVectorOp {
    const In1* in1;
    const In2* in2;
    In1* out;
    unsigned long stride1;
    unsigned long stride2;
    unsigned long n;
    Ftor ftor;

    void operator()(const VectorRange& range) const noexcept {
        for (unsigned long i = range.begin(); i != range.end(); ++i) {
            prefetchAhead(in1 + i * stride1);
            prefetchAhead(in2 + i * stride2);
            out[i] = ftor(in1[i * stride1], in2[i * stride2]);
        }
    }
};

// out[i] = ftor(in1[i * stride1], in2[i * stride2], in3[i * stride3]).
template <class In1, class In2, class In3, class Ftor>
struct bitfcnsThreeInputVectorOp {
    const In1* in1;
    const In2* in2;
    const In3* in3;
    In1* out;
    unsigned long stride1;
    unsigned long stride2;
    unsigned long stride3;
    unsigned long n;
    Ftor ftor;

    void operator()(const VectorRange& range) const noexcept {
        for (unsigned long i = range.begin(); i != range.end(); ++i) {
            prefetchAhead(in1 + i * stride1);
            prefetchAhead(in2 + i * stride2);
            prefetchAhead(in3 + i * stride3);
            out[i] = ftor(in1[i * stride1], in2[i * stride2], in3[i * stride3]);
        }
    }
};

// out[i] = scalarFtor(in[i * stride]), in registers by unarySIMDApply; each
// subrange does its own alignment peel and tail.
template <class T, class SimdFtor, class ScalarFtor>
struct bitfcnsUnarySIMDVectorOp {
    const T* in;
    T* out;
    unsigned long stride;
    unsigned long n;
    SimdFtor simdFtor;
    ScalarFtor scalarFtor;

    void operator()(const VectorRange& range) const noexcept {
        unarySIMDApply(out + range.begin(), in + range.begin() * stride, 1, stride, range.size(),
                       simdFtor, scalarFtor);
    }
};

// out[i] = scalarFtor(in1[i * stride1], in2[i * stride2]), in registers by
// binarySIMDApply; each subrange does its own alignment peel and tail.
template <class T, class SimdFtor, class ScalarFtor>
struct bitfcnsBinarySIMDVectorOp {
    const T* in1;
    const T* in2;
    T* out;
    unsigned long stride1;
    unsigned long stride2;
    unsigned long n;
    SimdFtor simdFtor;
    ScalarFtor scalarFtor;

    void operator()(const VectorRange& range) const noexcept {
        binarySIMDApply(out + range.begin(), in1 + range.begin() * stride1,
                        in2 + range.begin() * stride2, 1, stride1, stride2, range.size(), simdFtor,
                        scalarFtor);
    }
};

// Runs a filled record over [0, n): one call on the calling thread when n is
// below `limit`, which creates no task and allocates nothing; otherwise
// tbb::parallel_for with the record as body, copied by value into its tasks,
// and the splitting left to the auto partitioner. Throws only what the
// scheduler throws when it can't create its root task.
template <class VectorOp>
void runVectorOp(const VectorOp& op, unsigned long limit) {
    static_assert(std::is_trivially_copyable_v<VectorOp>, "a record is copied into tasks by value");
    const VectorRange whole(0, op.n);
    if (op.n < limit) {
        op(whole);
        return;
    }
    const tbb::auto_partitioner partitioner;
    tbb::parallel_for(whole, op, partitioner);
}

}  // namespace bitfcns
