// Benchmarks of the SIMD families of the vector engine on raw buffers, run
// through runVectorOp as the typed kernels run them: each family on 8-bit
// elements and on its widest elements, at the counts around its parallel
// limit, writing into a fresh output that the host allocates per call, or
// over its data operand.
// Also memcpy itself, which checks the vs_memcpy counter (it should read 1).
#include "bench_support.hpp"
#include "engine/parallel_limits.hpp"
#include "engine/simd_functors.hpp"
#include "engine/vector_ops.hpp"

#include <cstdint>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

namespace bitfcns::bench {
namespace {

// Each family: its record as its callers fill it, with the data operand,
// the broadcast constant or the new bit values, and a shift count or bit
// index; and the bytes read plus written per element.
struct SetOneBit {
    static constexpr const char* name = "setOneBit";
    static constexpr std::size_t elementsMoved = 2;
    template <class T>
    static constexpr unsigned long limit = limits::setOneBit<T>;
    template <class T>
    static auto record(T* out, const T* data, const T*, const T* mask, unsigned long n,
                       std::uint32_t) {
        return bitfcnsBinarySIMDVectorOp<T, mu::IntBitorSSE2Ftor<T>, mu::IntBitorFtor<T>>{
            mask, data, out, 0, 1, n, {}, {}};
    }
};
struct ClearOneBit {
    static constexpr const char* name = "clearOneBit";
    static constexpr std::size_t elementsMoved = 2;
    template <class T>
    static constexpr unsigned long limit = limits::clearOneBit<T>;
    template <class T>
    static auto record(T* out, const T* data, const T*, const T* mask, unsigned long n,
                       std::uint32_t) {
        return bitfcnsBinarySIMDVectorOp<T, mu::IntBitandSSE2Ftor<T>, mu::IntBitandFtor<T>>{
            mask, data, out, 0, 1, n, {}, {}};
    }
};
struct GetOneBit {
    static constexpr const char* name = "getOneBit";
    static constexpr std::size_t elementsMoved = 2;
    template <class T>
    static constexpr unsigned long limit = limits::getOneBit<T>;
    template <class T>
    static auto record(T* out, const T* data, const T*, const T* one, unsigned long n,
                       std::uint32_t p) {
        return bitfcnsBinarySIMDVectorOp<T, IntRightShiftAndSSE2Ftor, IntRightShiftAndFtor<T>>{
            data, one, out, 1, 0, n, IntRightShiftAndSSE2Ftor(p), IntRightShiftAndFtor<T>(p)};
    }
};
struct SetBitFromValues {
    static constexpr const char* name = "setBitFromValues";
    static constexpr std::size_t elementsMoved = 3;
    template <class T>
    static constexpr unsigned long limit = limits::setBitFromValues<T>;
    template <class T>
    static auto record(T* out, const T* data, const T* values, const T*, unsigned long n,
                       std::uint32_t p) {
        return bitfcnsBinarySIMDVectorOp<T, IntBitsetSSE2Ftor, IntBitsetFtor<T, T>>{
            data, values, out, 1, 1, n, IntBitsetSSE2Ftor(p), IntBitsetFtor<T, T>(p)};
    }
};
struct LeftShift {
    static constexpr const char* name = "leftShift";
    static constexpr std::size_t elementsMoved = 2;
    template <class T>
    static constexpr unsigned long limit = limits::leftShift<T>;
    template <class T>
    static auto record(T* out, const T* data, const T*, const T*, unsigned long n,
                       std::uint32_t p) {
        return bitfcnsUnarySIMDVectorOp<T, IntLeftShiftSSE2Ftor, IntLeftShiftFtor<T>>{
            data, out, 1, n, IntLeftShiftSSE2Ftor(p), IntLeftShiftFtor<T>(p)};
    }
};
struct RightShift {
    static constexpr const char* name = "rightShift";
    static constexpr std::size_t elementsMoved = 2;
    template <class T>
    static constexpr unsigned long limit = limits::rightShift<T>;
    template <class T>
    static auto record(T* out, const T* data, const T*, const T*, unsigned long n,
                       std::uint32_t p) {
        return bitfcnsUnarySIMDVectorOp<T, IntRightShiftSSE2Ftor, IntRightShiftFtor<T>>{
            data, out, 1, n, IntRightShiftSSE2Ftor(p), IntRightShiftFtor<T>(p)};
    }
};

enum class Output { fresh, inPlace };

template <class Family, class T, Output output>
void familyCase(benchmark::State& state) {
    const auto n = static_cast<unsigned long>(state.range(0));
    std::vector<T> data(n, T(0x5A));
    std::vector<T> values(Family::elementsMoved == 3 ? n : 0, T(1));
    const T constant = T(1);
    const std::uint32_t parameter = 3;
    const auto call = [&] {
        // A fresh output is made per call by the host, as every result is.
        const zqArraySlot fresh = output == Output::fresh ? hostResult(classIdOf<T>(), n) : nullptr;
        T* out = output == Output::fresh ? static_cast<T*>(fresh->data) : data.data();
        runVectorOp(Family::record(out, data.data(), values.data(), &constant, n, parameter),
                    Family::template limit<T>);
        benchmark::DoNotOptimize(out);
        benchmark::ClobberMemory();
    };
    call();  // untimed: the steady state of repeated calls, not the first touch of memory
    for (auto _ : state) call();
    reportBytes(state, Family::elementsMoved * sizeof(T) * n);
}

template <class Family, class T>
void registerFamily() {
    const std::string name = std::string("engine/") + Family::name + "/" + className<T>();
    const auto counts = countsAroundLimit(Family::template limit<T>);
    registerCounts(name + "/fresh", &familyCase<Family, T, Output::fresh>, counts);
    registerCounts(name + "/inplace", &familyCase<Family, T, Output::inPlace>, counts);
}

void memcpyCase(benchmark::State& state) {
    const auto bytes = static_cast<std::size_t>(state.range(0));
    std::vector<unsigned char> source(bytes / 2, 0x5A), target(bytes / 2);
    for (auto _ : state) {
        std::memcpy(target.data(), source.data(), bytes / 2);
        benchmark::ClobberMemory();
    }
    reportBytes(state, bytes);
}

[[maybe_unused]] const bool registered = [] {
    registerCounts("memcpy/bytes", &memcpyCase, {2000, 200000, 10000000, 100000000, 800000000})
        ->ArgName("bytes");
    registerFamily<SetOneBit, unsigned char>();
    registerFamily<SetOneBit, unsigned long>();
    registerFamily<ClearOneBit, unsigned char>();
    registerFamily<ClearOneBit, unsigned long>();
    registerFamily<GetOneBit, unsigned char>();
    registerFamily<GetOneBit, unsigned long>();
    registerFamily<SetBitFromValues, unsigned char>();
    registerFamily<SetBitFromValues, unsigned int>();
    registerFamily<LeftShift, unsigned char>();
    registerFamily<LeftShift, unsigned long>();
    registerFamily<RightShift, unsigned char>();
    registerFamily<RightShift, unsigned long>();
    return true;
}();

}  // namespace
}  // namespace bitfcns::bench
