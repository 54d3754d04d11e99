// The element loop of the plain operator records: out[i] = ftor(inputs at
// i...) over a subrange, one functor call per element. Pointers, strides and
// the functor arrive by value, so they live in registers: a store to out[i]
// (a char store may alias anything in memory) can't make the compiler read
// them again. A run whose inputs are all contiguous takes a loop with the
// unit stride known at compile time; any other mix, broadcasts included,
// steps each input by its own stride. Software prefetch is issued once per
// cache line of each contiguous input, not per element.
//
// A functor may also offer a vector form, `lanes(__m128i, __m128i[, __m128i])`,
// that computes in every lane of a register what operator() computes for
// one element, with `secondOperand` (and `thirdOperand`), the way its other
// operands are read into the lanes. A contiguous run whose first input and
// result are of one integer class of 8, 16 or 32 bits then goes a register
// of the first input a step through it, the other operands of any class
// read into lanes of the same width, and finishes with operator() on the
// tail.
#pragma once

#include "engine/lane_operands.hpp"
#include "engine/prefetch.hpp"
#include "engine/sse2_lanes.hpp"

#include <emmintrin.h>

#include <algorithm>
#include <concepts>
#include <cstddef>
#include <type_traits>
#include <utility>

namespace bitfcns::plain_detail {

inline constexpr unsigned long cacheLineBytes = 64;

// One input with its stride: a run-time value (0 for a broadcast) or, in
// the contiguous loop, the compile-time 1.
template <class T, class Stride = unsigned long>
struct Input {
    using Element = T;
    const T* p;
    Stride stride;

    T at(unsigned long i) const noexcept { return p[i * stride]; }

    // Prefetches the lines that `elements` elements from i on will take,
    // prefetchDistanceBytes ahead; a broadcast asks for nothing.
    void prefetchBlock(unsigned long i, unsigned long elements) const noexcept {
        if (stride == 0) return;
        const T* first = p + i * stride;
        const unsigned long bytes = elements * stride * sizeof(T);
        for (unsigned long offset = 0; offset < bytes; offset += cacheLineBytes)
            prefetchAhead(reinterpret_cast<const char*>(first) + offset);
    }
};

template <class T>
using ContiguousInput = Input<T, std::integral_constant<unsigned long, 1>>;

// The loop proper, in blocks that span one cache line of the narrowest
// input, with the prefetches of every input at the start of each block.
template <class Out, class Ftor, class... Inputs>
void elementLoop(Out* out, unsigned long begin, unsigned long end, Ftor ftor,
                 Inputs... inputs) noexcept {
    constexpr unsigned long block =
        cacheLineBytes / std::min({sizeof(typename Inputs::Element)...});
    unsigned long i = begin;
    // Blocks.
    for (unsigned long blocks = (end - begin) / block; blocks != 0; --blocks) {
        (inputs.prefetchBlock(i, block), ...);
        for (unsigned long k = 0; k != block; ++k, ++i) out[i] = ftor(inputs.at(i)...);
    }
    // Tail.
    for (; i < end; ++i) out[i] = ftor(inputs.at(i)...);
}

// A functor with a vector form of two or three inputs, the first of Out, the
// result's class. (The register type carries an attribute that a template
// argument would drop, so the form's result is checked where it is stored.)
template <class Ftor, class Out, class In1>
concept VectorFormFor = std::is_same_v<Out, In1> && lanes::RegisterLanes<Out>;
template <class Ftor>
concept TwoInputVectorForm = requires(const Ftor& ftor, __m128i a, __m128i* to) {
    { Ftor::secondOperand } -> std::convertible_to<lanes::Reading>;
    _mm_storeu_si128(to, ftor.lanes(a, a));
};
template <class Ftor>
concept ThreeInputVectorForm = requires(const Ftor& ftor, __m128i a, __m128i* to) {
    { Ftor::secondOperand } -> std::convertible_to<lanes::Reading>;
    { Ftor::thirdOperand } -> std::convertible_to<lanes::Reading>;
    _mm_storeu_si128(to, ftor.lanes(a, a, a));
};
template <class Ftor, class Out, class... In>
inline constexpr bool hasVectorForm = false;
template <class Ftor, class Out, class In1, class In2>
requires VectorFormFor<Ftor, Out, In1> && TwoInputVectorForm<Ftor>
inline constexpr bool hasVectorForm<Ftor, Out, In1, In2> = true;
template <class Ftor, class Out, class In1, class In2, class In3>
requires VectorFormFor<Ftor, Out, In1> && ThreeInputVectorForm<Ftor>
inline constexpr bool hasVectorForm<Ftor, Out, In1, In2, In3> = true;

// How the functor reads the input after the first one `k` places on.
template <class Ftor, std::size_t k>
constexpr lanes::Reading readingOf() noexcept {
    if constexpr (k == 0) {
        return Ftor::secondOperand;
    } else {
        return Ftor::thirdOperand;
    }
}

// Prefetches the lines that `elements` elements from p on take.
template <class T>
void prefetchElements(const T* p, unsigned long elements) noexcept {
    for (unsigned long line = 0; line < elements * sizeof(T); line += cacheLineBytes)
        prefetchAhead(reinterpret_cast<const char*>(p) + line);
}

// The contiguous loop of a functor with a vector form: a register of the
// first input a step, and the other inputs' elements for it read into lanes
// of the same width, in blocks of one cache line of the first input with the
// prefetches of every input at the start of each block, then the elements
// of the tail one by one. Loads and stores are unaligned; an in-place result
// reads each register before it writes it.
template <class Out, class Ftor, class In1, class... More>
void vectorLoop(Out* out, unsigned long begin, unsigned long end, Ftor ftor, const In1* in1,
                const More*... more) noexcept {
    constexpr unsigned long perRegister = 16 / sizeof(Out);
    constexpr unsigned long block = cacheLineBytes / sizeof(Out);
    const auto step = [&]<std::size_t... k>(unsigned long i, std::index_sequence<k...>) noexcept {
        const __m128i a = _mm_loadu_si128(reinterpret_cast<const __m128i*>(in1 + i));
        _mm_storeu_si128(reinterpret_cast<__m128i*>(out + i),
                         ftor.lanes(a, lanes::readLanesOf<Out, readingOf<Ftor, k>()>(more + i)...));
    };
    constexpr auto others = std::index_sequence_for<More...>{};
    unsigned long i = begin;
    // Blocks.
    for (; end - i >= block; i += block) {
        prefetchAhead(in1 + i);
        (prefetchElements(more + i, block), ...);
        for (unsigned long k = 0; k != block; k += perRegister) step(i + k, others);
    }
    // Single registers.
    for (; end - i >= perRegister; i += perRegister) step(i, others);
    // Tail.
    for (; i < end; ++i) out[i] = ftor(in1[i], more[i]...);
}

// out[i] = ftor(inputs at i...) for i in [begin, end).
template <class Out, class Ftor, class... T>
void runElements(Out* out, unsigned long begin, unsigned long end, Ftor ftor,
                 Input<T>... inputs) noexcept {
    const bool allContiguous = (true && ... && (inputs.stride == 1));
    if (!allContiguous) {
        elementLoop(out, begin, end, ftor, inputs...);
    } else if constexpr (hasVectorForm<Ftor, Out, T...>) {
        vectorLoop(out, begin, end, ftor, inputs.p...);
    } else {
        elementLoop(out, begin, end, ftor, ContiguousInput<T>{inputs.p, {}}...);
    }
}

}  // namespace bitfcns::plain_detail
