// The two strided loops that divide a run of elements between an SSE2 functor
// and its scalar twin: unarySIMDApply and binarySIMDApply. The twin does the
// head before alignment, the tail that doesn't fill a register and every run
// too short for one; the vector functor does the aligned body. No vector
// access is ever unaligned. The body writes with ordinary stores or, when
// the caller asks for it, with streaming stores, which send each line of
// the result to memory without first reading it into the cache.
#pragma once

#include "engine/prefetch.hpp"
#include "engine/sse2_lanes.hpp"

#include <emmintrin.h>

#include <algorithm>
#include <cstdint>
#include <initializer_list>

namespace bitfcns {

// Elements of T in one 16-byte register.
template <class T>
inline constexpr unsigned long lanesOf = lanes::count<T>;

// How the aligned body writes its registers: `cached`, ordinary stores
// that keep the result in the cache; `streamed`, non-temporal stores,
// fenced before the loop returns, for a result too large to stay in the
// cache that no input of the run overlaps.
enum class ResultStores { cached, streamed };

namespace simd_detail {

inline constexpr std::uintptr_t registerAlignment = 16;

// Registers in one 64-byte cache line: the body's step, and the distance
// between two prefetches of one input.
inline constexpr unsigned long registersPerLine = 4;

inline std::uintptr_t addressOf(const void* p) noexcept {
    return reinterpret_cast<std::uintptr_t>(p);
}

// How many leading elements the twin must take before all `pointers` are
// 16-byte aligned at one and the same element: `n` when that never happens,
// because they differ in their position modulo 16.
template <class T>
unsigned long headLength(unsigned long n, std::initializer_list<const T*> pointers) noexcept {
    const std::uintptr_t position = addressOf(*pointers.begin()) % registerAlignment;
    for (const T* p : pointers)
        if (addressOf(p) % registerAlignment != position) return n;
    if (position % sizeof(T) != 0) return n;
    const unsigned long toBoundary = (registerAlignment - position) % registerAlignment / sizeof(T);
    return std::min(n, toBoundary);
}

// The count of a scalar loop, made opaque to the optimiser at each step. A
// loop whose trip count can't be computed is left alone by the
// auto-vectorizer, which would otherwise turn the twin's loops into
// unaligned vector loads and stores, which the engine never makes.
inline void keepScalar(unsigned long& n) noexcept { asm("" : "+r"(n)); }

// The scalar twin over `n` elements, each pointer stepping by its stride and
// left past the run.
template <class T, class ScalarFtor>
void scalarRun(T*& out, const T*& in, unsigned long outStride, unsigned long stride,
               unsigned long n, ScalarFtor scalarFtor) noexcept {
    for (; n != 0; --n, out += outStride, in += stride) {
        keepScalar(n);
        *out = scalarFtor(*in);
    }
}
template <class T, class ScalarFtor>
void scalarRun(T*& out, const T*& in1, const T*& in2, unsigned long outStride,
               unsigned long stride1, unsigned long stride2, unsigned long n,
               ScalarFtor scalarFtor) noexcept {
    for (; n != 0; --n, out += outStride, in1 += stride1, in2 += stride2) {
        keepScalar(n);
        *out = scalarFtor(*in1, *in2);
    }
}

// An input read straight from memory, one aligned register per step.
template <class T>
class StreamedInput {
public:
    explicit StreamedInput(const T* p) noexcept : p_(p) {}
    // Once per cache line read.
    void prefetch() const noexcept { prefetchAhead(p_); }
    __m128i next() noexcept {
        const __m128i v = _mm_load_si128(reinterpret_cast<const __m128i*>(p_));
        p_ += lanesOf<T>;
        return v;
    }

private:
    const T* p_;
};

// A broadcast input (stride 0): an aligned buffer of L copies of its one
// element, filled and loaded once before the body; the register stays
// loop-invariant.
template <class T>
class BroadcastInput {
public:
    explicit BroadcastInput(const T* p) noexcept {
        alignas(16) T buffer[lanesOf<T>];
        std::fill_n(buffer, lanesOf<T>, *p);
        register_ = _mm_load_si128(reinterpret_cast<const __m128i*>(buffer));
    }
    void prefetch() const noexcept {}
    __m128i next() const noexcept { return register_; }

private:
    __m128i register_;
};

template <ResultStores stores>
void storeRegister(void* p, __m128i v) noexcept {
    if constexpr (stores == ResultStores::streamed)
        _mm_stream_si128(static_cast<__m128i*>(p), v);
    else
        _mm_store_si128(static_cast<__m128i*>(p), v);
}

// The body: `blocks` registers, each with aligned loads of the inputs, the
// vector operation, and an aligned store; a cache line's worth of registers
// per step, then the registers left over. With streaming stores each step
// also prefetches every input once: the inputs are then all that the cache
// holds of the run. With ordinary stores, in place above all, the hardware
// prefetchers keep up alone, and the software prefetch only slowed the run
// (up to a third in place, on 4 KiB pages).
template <ResultStores stores, class T, class VectorOp, class... Inputs>
void alignedBody(T* out, unsigned long blocks, VectorOp op, Inputs... inputs) noexcept {
    for (; blocks >= registersPerLine; blocks -= registersPerLine) {
        if constexpr (stores == ResultStores::streamed) (inputs.prefetch(), ...);
        for (unsigned long r = 0; r != registersPerLine; ++r, out += lanesOf<T>)
            storeRegister<stores>(out, op(inputs.next()...));
    }
    for (; blocks != 0; --blocks, out += lanesOf<T>)
        storeRegister<stores>(out, op(inputs.next()...));
    // Streaming stores are weakly ordered: they must reach memory before the
    // subrange reports that it is done.
    if constexpr (stores == ResultStores::streamed) _mm_sfence();
}

// alignedBody with the kind of stores chosen at run time.
template <class T, class VectorOp, class... Inputs>
void alignedBody(ResultStores stores, T* out, unsigned long blocks, VectorOp op,
                 Inputs... inputs) noexcept {
    if (stores == ResultStores::streamed)
        alignedBody<ResultStores::streamed>(out, blocks, op, inputs...);
    else
        alignedBody<ResultStores::cached>(out, blocks, op, inputs...);
}

}  // namespace simd_detail

// out[i * outStride] = scalarFtor(in[i * stride]) for i below n, computed in
// registers where `in` and `out` are both contiguous. The loop for other
// strides isn't built (the library never passes them): the twin does those
// runs alone.
template <class T, class SimdFtor, class ScalarFtor>
void unarySIMDApply(T* out, const T* in, unsigned long outStride, unsigned long stride,
                    unsigned long n, SimdFtor simdFtor, ScalarFtor scalarFtor,
                    ResultStores stores = ResultStores::cached) noexcept {
    constexpr unsigned long laneCount = lanesOf<T>;
    if (n == 0) return;
    if (n < laneCount || stride != 1 || outStride != 1) {
        simd_detail::scalarRun(out, in, outStride, stride, n, scalarFtor);
        return;
    }

    // Head: the twin until `in` and `out` are aligned at the same element.
    const unsigned long head = simd_detail::headLength<T>(n, {out, in});
    simd_detail::scalarRun(out, in, 1, 1, head, scalarFtor);
    n -= head;

    // Body.
    const unsigned long blocks = n / laneCount;
    simd_detail::alignedBody(stores, out, blocks, simdFtor.template prepare<T>(),
                             simd_detail::StreamedInput<T>(in));
    out += blocks * laneCount;
    in += blocks * laneCount;

    // Tail.
    simd_detail::scalarRun(out, in, 1, 1, n % laneCount, scalarFtor);
}

// out[i * outStride] = scalarFtor(in1[i * stride1], in2[i * stride2]) for i
// below n. With a unit output, three loops use registers: both inputs
// contiguous (the unit loop), `in1` contiguous and `in2` broadcast (the
// first-unit loop), `in1` broadcast and `in2` contiguous (the second-unit
// loop). The loops for other strides aren't built (the library never passes
// them): the twin does those runs alone.
template <class T, class SimdFtor, class ScalarFtor>
void binarySIMDApply(T* out, const T* in1, const T* in2, unsigned long outStride,
                     unsigned long stride1, unsigned long stride2, unsigned long n,
                     SimdFtor simdFtor, ScalarFtor scalarFtor,
                     ResultStores stores = ResultStores::cached) noexcept {
    using simd_detail::BroadcastInput;
    using simd_detail::StreamedInput;
    constexpr unsigned long laneCount = lanesOf<T>;
    if (n == 0) return;
    const bool unitLoop = stride1 == 1 && stride2 == 1;
    const bool firstUnitLoop = stride1 == 1 && stride2 == 0;
    const bool secondUnitLoop = stride1 == 0 && stride2 == 1;
    if (n < laneCount || outStride != 1 || !(unitLoop || firstUnitLoop || secondUnitLoop)) {
        simd_detail::scalarRun(out, in1, in2, outStride, stride1, stride2, n, scalarFtor);
        return;
    }

    // Head: the twin until `out` and the contiguous inputs are aligned at the
    // same element; a broadcast input steps by 0 meanwhile.
    const unsigned long head =
        unitLoop ? simd_detail::headLength<T>(n, {out, in1, in2})
                 : simd_detail::headLength<T>(n, {out, firstUnitLoop ? in1 : in2});
    simd_detail::scalarRun(out, in1, in2, 1, stride1, stride2, head, scalarFtor);
    n -= head;

    // Body.
    const unsigned long blocks = n / laneCount;
    const auto op = simdFtor.template prepare<T>();
    if (unitLoop)
        simd_detail::alignedBody(stores, out, blocks, op, StreamedInput<T>(in1),
                                 StreamedInput<T>(in2));
    else if (firstUnitLoop)
        simd_detail::alignedBody(stores, out, blocks, op, StreamedInput<T>(in1),
                                 BroadcastInput<T>(in2));
    else
        simd_detail::alignedBody(stores, out, blocks, op, BroadcastInput<T>(in1),
                                 StreamedInput<T>(in2));
    out += blocks * laneCount;
    in1 += blocks * laneCount * stride1;
    in2 += blocks * laneCount * stride2;

    // Tail.
    simd_detail::scalarRun(out, in1, in2, 1, stride1, stride2, n % laneCount, scalarFtor);
}

}  // namespace bitfcns
