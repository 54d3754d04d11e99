// Byte-wise AND, OR and XOR loops of the math utility library. AND, OR and
// XOR act on each bit alone, so an array of any element type is combined as a
// run of bytes: SSE2 on 16-byte chunks, 8-byte words and single bytes for the
// tail. A scalar partner becomes a 16-byte pattern of its element repeated.
// Private to the host.
#pragma once

#include <emmintrin.h>

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace host {

// Each operation: its SSE2 body next to its scalar twin.
struct BitandBytes {
    static __m128i vector(__m128i a, __m128i b) { return _mm_and_si128(a, b); }
    template <class W>
    static W scalar(W a, W b) {
        return static_cast<W>(a & b);
    }
};
struct BitorBytes {
    static __m128i vector(__m128i a, __m128i b) { return _mm_or_si128(a, b); }
    template <class W>
    static W scalar(W a, W b) {
        return static_cast<W>(a | b);
    }
};
struct BitxorBytes {
    static __m128i vector(__m128i a, __m128i b) { return _mm_xor_si128(a, b); }
    template <class W>
    static W scalar(W a, W b) {
        return static_cast<W>(a ^ b);
    }
};

namespace bytes {
inline __m128i load(const std::byte* p) {
    return _mm_loadu_si128(reinterpret_cast<const __m128i*>(p));
}
inline void store(std::byte* p, __m128i v) { _mm_storeu_si128(reinterpret_cast<__m128i*>(p), v); }
// A store that bypasses the caches; `p` is 16-byte aligned.
inline void stream(std::byte* p, __m128i v) { _mm_stream_si128(reinterpret_cast<__m128i*>(p), v); }
inline std::uint64_t loadWord(const std::byte* p) {
    std::uint64_t word;
    std::memcpy(&word, p, sizeof word);
    return word;
}
inline void storeWord(std::byte* p, std::uint64_t word) { std::memcpy(p, &word, sizeof word); }
}  // namespace bytes

// The 16-byte pattern of one element of `elementBytes` (1, 2, 4 or 8) bytes.
inline __m128i repeatElement(const void* element, std::size_t elementBytes) {
    std::uint64_t value = 0;
    std::memcpy(&value, element, elementBytes);
    switch (elementBytes) {
        case 1: return _mm_set1_epi8(static_cast<char>(value));
        case 2: return _mm_set1_epi16(static_cast<short>(value));
        case 4: return _mm_set1_epi32(static_cast<int>(value));
        default: return _mm_set1_epi64x(static_cast<long long>(value));
    }
}

// out[i] = a[i] op b[i] for the `count` bytes. `out` may equal `a` or `b`.
template <class Op>
void combineBytes(std::byte* out, const std::byte* a, const std::byte* b, std::size_t count) {
    std::size_t i = 0;
    // Vector body: two chunks per step, then one.
    for (; i + 32 <= count; i += 32) {
        const __m128i low = Op::vector(bytes::load(a + i), bytes::load(b + i));
        const __m128i high = Op::vector(bytes::load(a + i + 16), bytes::load(b + i + 16));
        bytes::store(out + i, low);
        bytes::store(out + i + 16, high);
    }
    for (; i + 16 <= count; i += 16)
        bytes::store(out + i, Op::vector(bytes::load(a + i), bytes::load(b + i)));
    // Scalar tail: a word, then single bytes.
    if (i + 8 <= count) {
        bytes::storeWord(out + i, Op::scalar(bytes::loadWord(a + i), bytes::loadWord(b + i)));
        i += 8;
    }
    for (; i < count; ++i) {
        out[i] = std::byte{
            Op::scalar(std::to_integer<unsigned char>(a[i]), std::to_integer<unsigned char>(b[i]))};
    }
}

// How the vector body writes its chunks: through the caches, or around them
// (16-byte aligned `out` only), for a result too large to stay in cache
// that no input shares, so that no line of it is read in before it is
// overwritten.
enum class ChunkStores { cached, streamed };

// out[i] = a[i] op pattern[i % 16] for the `count` bytes, where `a` starts on
// an element boundary and the pattern repeats one element. `out` may equal `a`
// (with cached stores).
template <class Op, ChunkStores stores = ChunkStores::cached>
void combineBytesWithPattern(std::byte* out, const std::byte* a, __m128i pattern,
                             std::size_t count) {
    const auto store = [](std::byte* p, __m128i v) {
        if constexpr (stores == ChunkStores::streamed) {
            bytes::stream(p, v);
        } else {
            bytes::store(p, v);
        }
    };
    std::size_t i = 0;
    // Vector body: two chunks per step, then one.
    for (; i + 32 <= count; i += 32) {
        const __m128i low = Op::vector(bytes::load(a + i), pattern);
        const __m128i high = Op::vector(bytes::load(a + i + 16), pattern);
        store(out + i, low);
        store(out + i + 16, high);
    }
    for (; i + 16 <= count; i += 16) store(out + i, Op::vector(bytes::load(a + i), pattern));
    // Streamed chunks are ordered before anything the caller does next.
    if constexpr (stores == ChunkStores::streamed) _mm_sfence();
    // Scalar tail: it starts on a multiple of 16, so its byte j meets pattern byte j.
    alignas(16) std::byte tailPattern[16];
    bytes::store(tailPattern, pattern);
    std::size_t j = 0;
    if (i + 8 <= count) {
        bytes::storeWord(out + i, Op::scalar(bytes::loadWord(a + i), bytes::loadWord(tailPattern)));
        i += 8;
        j = 8;
    }
    for (; i < count; ++i, ++j) {
        out[i] = std::byte{Op::scalar(std::to_integer<unsigned char>(a[i]),
                                      std::to_integer<unsigned char>(tailPattern[j]))};
    }
}

}  // namespace host
