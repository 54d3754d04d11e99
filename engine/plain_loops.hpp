// The element loop of the plain operator records: out[i] = ftor(inputs at
// i...) over a subrange, one functor call per element. Pointers, strides and
// the functor arrive by value, so they live in registers: a store to out[i]
// (a char store may alias anything in memory) can't make the compiler read
// them again. A run whose inputs are all contiguous takes a loop with the
// unit stride known at compile time; any other mix, broadcasts included,
// steps each input by its own stride. Software prefetch is issued once per
// cache line of each contiguous input, not per element.
#pragma once

#include "engine/prefetch.hpp"

#include <algorithm>
#include <type_traits>

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

// out[i] = ftor(inputs at i...) for i in [begin, end).
template <class Out, class Ftor, class... T>
void runElements(Out* out, unsigned long begin, unsigned long end, Ftor ftor,
                 Input<T>... inputs) noexcept {
    const bool allContiguous = (true && ... && (inputs.stride == 1));
    if (allContiguous)
        elementLoop(out, begin, end, ftor, ContiguousInput<T>{inputs.p, {}}...);
    else
        elementLoop(out, begin, end, ftor, inputs...);
}

}  // namespace bitfcns::plain_detail
