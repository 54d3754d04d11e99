// mu::IntVectorBitcmp: the integer complement loop of the math utility
// library, instantiated here for the eight integer element types. Contiguous
// runs are complemented byte-wise as XOR with all ones (SSE2), large ones in
// parallel; strided ones element by element.
#include "host/bitwise_kernels.hpp"
#include "host/element_types.hpp"
#include "host/math_utils.hpp"
#include "host/parallel_limits.hpp"

#include <tbb/blocked_range.h>
#include <tbb/parallel_for.h>

#include <cstddef>
#include <cstdint>
#include <tuple>

namespace host {
namespace {

constexpr std::size_t kComplementGrainBytes = std::size_t{64} << 10;

// Results from this size on, with their input, fill the last-level cache
// (32 MiB on the machines this runs on) or more: ordinary stores would read
// every line of such a result in before overwriting it.
constexpr std::size_t kStreamingResultBytes = std::size_t{16} << 20;

template <ChunkStores stores>
void complementSerial(std::byte* out, const std::byte* in, std::size_t count) {
    combineBytesWithPattern<BitxorBytes, stores>(out, in, _mm_set1_epi32(-1), count);
}

// Streaming stores for a large result on a 16-byte boundary that shares no
// byte with its input; every subrange then starts on a boundary too.
bool streamsResult(const std::byte* out, const std::byte* in, std::size_t count) {
    const auto to = reinterpret_cast<std::uintptr_t>(out);
    const auto from = reinterpret_cast<std::uintptr_t>(in);
    const bool disjoint = to + count <= from || from + count <= to;
    return count >= kStreamingResultBytes && disjoint && to % 16 == 0;
}

// Complements `count` contiguous bytes, split over workers in chunks of 16.
template <ChunkStores stores>
void complementInParallel(std::byte* out, const std::byte* in, std::size_t count) {
    const std::size_t chunks = count / 16;
    tbb::parallel_for(tbb::blocked_range<std::size_t>(0, chunks, kComplementGrainBytes / 16),
                      [=](const tbb::blocked_range<std::size_t>& range) {
                          const std::size_t begin = range.begin() * 16;
                          // The last subrange also takes the bytes past the last full chunk.
                          const std::size_t end = range.end() == chunks ? count : range.end() * 16;
                          complementSerial<stores>(out + begin, in + begin, end - begin);
                      });
}

// Complements `count` contiguous bytes; `out` may equal `in`.
void complementBytes(std::byte* out, const std::byte* in, std::size_t count) {
    if (count < parallelResultBytes) {
        complementSerial<ChunkStores::cached>(out, in, count);
    } else if (streamsResult(out, in, count)) {
        complementInParallel<ChunkStores::streamed>(out, in, count);
    } else {
        complementInParallel<ChunkStores::cached>(out, in, count);
    }
}

}  // namespace
}  // namespace host

namespace mu {

template <class T>
void IntVectorBitcmp(T* out, T* in, unsigned long outStride, unsigned long inStride,
                     unsigned long count) {
    if (outStride != 1 || inStride != 1) {
        for (unsigned long i = 0; i < count; ++i) {
            out[i * outStride] = static_cast<T>(~in[i * inStride]);
        }
        return;
    }
    host::complementBytes(reinterpret_cast<std::byte*>(out), reinterpret_cast<const std::byte*>(in),
                          count * sizeof(T));
}

}  // namespace mu

namespace host {

// Explicitly instantiating this class for the integer element types takes
// the address of each IntVectorBitcmp instance, so that every one of them is
// emitted and exported.
template <class List>
struct BitcmpInstances;
template <class... Tags>
struct BitcmpInstances<TagList<Tags...>> {
    static auto table() { return std::tuple{&mu::IntVectorBitcmp<typename Tags::type>...}; }
};

template struct BitcmpInstances<IntegerElements>;

}  // namespace host
