// The five operator records of the vector engine and runVectorOp. A record
// is a trivially copyable structure of raw non-owning pointers, element
// strides (0 for a broadcast scalar, 1 for an array), a count and functors;
// its call operator treats one subrange [begin, end) and keeps no running
// state, so subranges may run concurrently. The result is always written with
// unit stride.
//
// Every record knows its parallel limit from its functor: a plain functor
// names it as `parallelLimit`, a vector functor as `parallelLimit<T>`. So a
// record runs with the limit of its own family and no other.
//
// A SIMD record writes a large result that overlaps none of its inputs (a
// result the host has just allocated) with streaming stores, and any other
// with ordinary ones; it tells the two apart from the addresses alone, so
// no caller has to say which it passes.
#pragma once

#include "engine/parallel_driver.hpp"
#include "engine/plain_loops.hpp"
#include "engine/simd_loops.hpp"

#include <tbb/blocked_range.h>

#include <cstdint>
#include <initializer_list>
#include <type_traits>

namespace bitfcns {

using VectorRange = tbb::blocked_range<unsigned long>;

// Results of this many bytes and more go through streaming stores when no
// input overlaps them. With its inputs such a result fills the last-level
// cache of the machines this library runs on (32 MiB) or more, so ordinary
// stores would only read every line of it in before overwriting it, and
// evict the inputs' lines to make room.
inline constexpr unsigned long streamingResultBytes = 16ul << 20;

namespace record_detail {

// The bytes [first, last) that an operand of n elements spans with its
// stride: a broadcast takes one element.
struct ByteSpan {
    std::uintptr_t first;
    std::uintptr_t last;
};
template <class T>
ByteSpan spanOf(const T* p, unsigned long stride, unsigned long n) noexcept {
    const auto first = reinterpret_cast<std::uintptr_t>(p);
    return {first, first + ((n - 1) * stride + 1) * sizeof(T)};
}

// Streaming stores for a result of n elements of T at `out` when it is
// large and overlaps none of `inputs`, ordinary stores otherwise.
template <class T>
ResultStores resultStoresFor(const T* out, unsigned long n,
                             std::initializer_list<ByteSpan> inputs) noexcept {
    if (n < streamingResultBytes / sizeof(T)) return ResultStores::cached;
    const ByteSpan result = spanOf(out, 1, n);
    for (const ByteSpan& input : inputs)
        if (input.first < result.last && result.first < input.last) return ResultStores::cached;
    return ResultStores::streamed;
}

}  // namespace record_detail

// out[i] = ftor(in[i * stride]).
template <class In, class Ftor>
struct bitfcnsOneInputVectorOp {
    static constexpr unsigned long parallelLimit = Ftor::parallelLimit;

    const In* in;
    In* out;
    unsigned long stride;
    unsigned long n;
    Ftor ftor;

    void operator()(const VectorRange& range) const noexcept {
        plain_detail::runElements(out, range.begin(), range.end(), ftor,
                                  plain_detail::Input<In>{in, stride});
    }
};

// out[i] = ftor(in1[i * stride1], in2[i * stride2]).
template <class In1, class In2, class Ftor>
struct bitfcnsTwoInputVectorOp {
    static constexpr unsigned long parallelLimit = Ftor::parallelLimit;

    const In1* in1;
    const In2* in2;
    In1* out;
    unsigned long stride1;
    unsigned long stride2;
    unsigned long n;
    Ftor ftor;

    void operator()(const VectorRange& range) const noexcept {
        plain_detail::runElements(out, range.begin(), range.end(), ftor,
                                  plain_detail::Input<In1>{in1, stride1},
                                  plain_detail::Input<In2>{in2, stride2});
    }
};

// out[i] = ftor(in1[i * stride1], in2[i * stride2], in3[i * stride3]).
template <class In1, class In2, class In3, class Ftor>
struct bitfcnsThreeInputVectorOp {
    static constexpr unsigned long parallelLimit = Ftor::parallelLimit;

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
        plain_detail::runElements(
            out, range.begin(), range.end(), ftor, plain_detail::Input<In1>{in1, stride1},
            plain_detail::Input<In2>{in2, stride2}, plain_detail::Input<In3>{in3, stride3});
    }
};

// out[i] = scalarFtor(in[i * stride]), in registers by unarySIMDApply; each
// subrange does its own alignment peel and tail.
template <class T, class SimdFtor, class ScalarFtor>
struct bitfcnsUnarySIMDVectorOp {
    static constexpr unsigned long parallelLimit = SimdFtor::template parallelLimit<T>;

    const T* in;
    T* out;
    unsigned long stride;
    unsigned long n;
    SimdFtor simdFtor;
    ScalarFtor scalarFtor;

    void operator()(const VectorRange& range) const noexcept {
        const ResultStores stores =
            record_detail::resultStoresFor(out, n, {record_detail::spanOf(in, stride, n)});
        unarySIMDApply(out + range.begin(), in + range.begin() * stride, 1, stride, range.size(),
                       simdFtor, scalarFtor, stores);
    }
};

// out[i] = scalarFtor(in1[i * stride1], in2[i * stride2]), in registers by
// binarySIMDApply; each subrange does its own alignment peel and tail.
template <class T, class SimdFtor, class ScalarFtor>
struct bitfcnsBinarySIMDVectorOp {
    static constexpr unsigned long parallelLimit = SimdFtor::template parallelLimit<T>;

    const T* in1;
    const T* in2;
    T* out;
    unsigned long stride1;
    unsigned long stride2;
    unsigned long n;
    SimdFtor simdFtor;
    ScalarFtor scalarFtor;

    void operator()(const VectorRange& range) const noexcept {
        const ResultStores stores = record_detail::resultStoresFor(
            out, n,
            {record_detail::spanOf(in1, stride1, n), record_detail::spanOf(in2, stride2, n)});
        binarySIMDApply(out + range.begin(), in1 + range.begin() * stride1,
                        in2 + range.begin() * stride2, 1, stride1, stride2, range.size(), simdFtor,
                        scalarFtor, stores);
    }
};

// The range body of a record type: the record's call operator on
// [begin, end).
template <class VectorOp>
void runRecordRange(const void* record, unsigned long begin, unsigned long end) noexcept {
    (*static_cast<const VectorOp*>(record))(VectorRange(begin, end));
}

// Runs a filled record over [0, n) through the parallel driver, with the
// limit of its family: serially on the calling thread below it, under
// tbb::parallel_for from it. The record stays on the caller's stack for the
// whole run, and every subrange reads it there.
template <class VectorOp>
void runVectorOp(const VectorOp& op) {
    static_assert(std::is_trivially_copyable_v<VectorOp>, "a record holds no owning member");
    runInRanges(op.n, VectorOp::parallelLimit, &runRecordRange<VectorOp>, &op);
}

}  // namespace bitfcns
