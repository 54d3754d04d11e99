// Helpers of the engine tests: the element type lists, 16-byte aligned
// buffers with sentinels around the data, deterministic test data that
// includes each type's extremes, and the seven functor pairs with plain scalar
// references, written in 64-bit arithmetic independently of the twins.
#pragma once

#include "engine/simd_functors.hpp"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstdint>
#include <cstring>
#include <limits>
#include <new>
#include <random>
#include <type_traits>
#include <vector>

namespace bitfcns::test {

using AllIntegers = ::testing::Types<signed char, unsigned char, short, unsigned short, int,
                                     unsigned int, long, unsigned long>;
// The right shift has no vector form for signed 64-bit elements.
using RightShiftIntegers = ::testing::Types<signed char, unsigned char, short, unsigned short, int,
                                            unsigned int, unsigned long>;
// The vector bitset exists for 8, 16 and 32-bit elements.
using BitsetIntegers =
    ::testing::Types<signed char, unsigned char, short, unsigned short, int, unsigned int>;

template <class T>
inline constexpr std::uint32_t bitsOf = sizeof(T) * 8;

// A 16-byte aligned block of `size` elements, every byte first set to a
// sentinel so that writes outside the expected part can be found.
template <class T>
class AlignedBuffer {
public:
    static constexpr unsigned char sentinel = 0xA5;

    explicit AlignedBuffer(std::size_t size)
        : size_(size),
          data_(static_cast<T*>(::operator new[](size * sizeof(T) + 16, std::align_val_t{16}))) {
        reset();
    }
    ~AlignedBuffer() { ::operator delete[](data_, std::align_val_t{16}); }
    AlignedBuffer(const AlignedBuffer&) = delete;
    AlignedBuffer& operator=(const AlignedBuffer&) = delete;

    // Every byte back to the sentinel.
    void reset() { std::memset(static_cast<void*>(data_), sentinel, size_ * sizeof(T) + 16); }

    T* data() { return data_; }
    std::size_t size() const { return size_; }

    // True when no byte outside [first, first + count) elements has changed.
    bool untouchedOutside(std::size_t first, std::size_t count) const {
        const auto* bytes = reinterpret_cast<const unsigned char*>(data_);
        const std::size_t total = size_ * sizeof(T) + 16;
        for (std::size_t i = 0; i < total; ++i) {
            const bool inside = i >= first * sizeof(T) && i < (first + count) * sizeof(T);
            if (!inside && bytes[i] != sentinel) return false;
        }
        return true;
    }

private:
    std::size_t size_;
    T* data_;
};

// `count` values of T: the extremes, 0, 1 and -1 first, then random ones.
template <class T>
std::vector<T> testValues(std::size_t count, std::uint32_t seed) {
    std::vector<T> values{std::numeric_limits<T>::min(),
                          std::numeric_limits<T>::max(),
                          T(0),
                          T(1),
                          T(-1),
                          T(std::numeric_limits<T>::min() + 1),
                          T(std::numeric_limits<T>::max() - 1)};
    std::mt19937_64 random(seed);
    while (values.size() < count) values.push_back(static_cast<T>(random()));
    values.resize(count);
    return values;
}

// New bit values: zero about half the time, otherwise any non-zero value.
template <class T>
std::vector<T> newBitValues(std::size_t count, std::uint32_t seed) {
    std::vector<T> values = testValues<T>(count, seed);
    std::mt19937 random(seed + 1);
    for (T& v : values)
        if (random() % 2 == 0) v = T(0);
    return values;
}

template <class T>
std::uint64_t bitPattern(T x) {
    return static_cast<std::uint64_t>(static_cast<std::make_unsigned_t<T>>(x));
}

// The seven pairs: how to build the two functors from a run's parameter (shift
// count or bit index), a plain scalar reference, and the second operand the
// pair is used with.
struct BitandPair {
    template <class T>
    static auto vector(std::uint32_t) {
        return mu::IntBitandSSE2Ftor<T>{};
    }
    template <class T>
    static auto scalar(std::uint32_t) {
        return mu::IntBitandFtor<T>{};
    }
    template <class T>
    static T expected(T a, T b, std::uint32_t) {
        return T(bitPattern(a) & bitPattern(b));
    }
    template <class T>
    static std::vector<T> secondValues(std::size_t n) {
        return testValues<T>(n, 2);
    }
};
struct BitorPair {
    template <class T>
    static auto vector(std::uint32_t) {
        return mu::IntBitorSSE2Ftor<T>{};
    }
    template <class T>
    static auto scalar(std::uint32_t) {
        return mu::IntBitorFtor<T>{};
    }
    template <class T>
    static T expected(T a, T b, std::uint32_t) {
        return T(bitPattern(a) | bitPattern(b));
    }
    template <class T>
    static std::vector<T> secondValues(std::size_t n) {
        return testValues<T>(n, 2);
    }
};
struct BitsetPair {
    template <class T>
    static auto vector(std::uint32_t p) {
        return IntBitsetSSE2Ftor(p);
    }
    template <class T>
    static auto scalar(std::uint32_t p) {
        return IntBitsetFtor<T, T>(p);
    }
    template <class T>
    static T expected(T a, T v, std::uint32_t index) {
        const std::uint64_t mask = std::uint64_t{1} << index;
        return T(v != 0 ? bitPattern(a) | mask : bitPattern(a) & ~mask);
    }
    template <class T>
    static std::vector<T> secondValues(std::size_t n) {
        return newBitValues<T>(n, 2);
    }
};
struct RightShiftAndPair {
    template <class T>
    static auto vector(std::uint32_t p) {
        return IntRightShiftAndSSE2Ftor(p);
    }
    template <class T>
    static auto scalar(std::uint32_t p) {
        return IntRightShiftAndFtor<T>(p);
    }
    template <class T>
    static T expected(T a, T b, std::uint32_t count) {
        return T((bitPattern(a) >> count) & bitPattern(b));
    }
    template <class T>
    static std::vector<T> secondValues(std::size_t n) {
        return testValues<T>(n, 2);
    }
};
struct LeftShiftPair {
    template <class T>
    static auto vector(std::uint32_t p) {
        return IntLeftShiftSSE2Ftor(p);
    }
    template <class T>
    static auto scalar(std::uint32_t p) {
        return IntLeftShiftFtor<T>(p);
    }
    template <class T>
    static T expected(T a, std::uint32_t count) {
        return T(bitPattern(a) << count);
    }
};
struct ComplementPair {
    template <class T>
    static auto vector(std::uint32_t) {
        return IntComplementSSE2Ftor{};
    }
    template <class T>
    static auto scalar(std::uint32_t) {
        return IntComplementFtor<T>{};
    }
    template <class T>
    static T expected(T a, std::uint32_t) {
        return T(~bitPattern(a));
    }
};
struct RightShiftPair {
    template <class T>
    static auto vector(std::uint32_t p) {
        return IntRightShiftSSE2Ftor(p);
    }
    template <class T>
    static auto scalar(std::uint32_t p) {
        return IntRightShiftFtor<T>(p);
    }
    template <class T>
    static T expected(T a, std::uint32_t count) {
        if constexpr (std::is_signed_v<T>)
            return T(static_cast<std::int64_t>(a) >> count);
        else
            return T(bitPattern(a) >> count);
    }
};

}  // namespace bitfcns::test
