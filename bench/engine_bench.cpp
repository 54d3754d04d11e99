// Benchmarks of the SIMD families of the vector engine on raw buffers, run
// through runVectorOp as the typed kernels run them: each family on 8-bit
// elements and on its widest elements, at the counts around its parallel
// limit, writing into a fresh output that the host allocates per call, or
// over its data operand.
// Also memcpy itself, which checks the vs_memcpy counter (it should read 1).
#include "bench_support.hpp"
#include "engine/operator_families.hpp"

#include <cstdint>
#include <cstring>
#include <memory>
#include <string>
#include <vector>

namespace bitfcns::bench {
namespace {

// Each engine family as the typed kernels call it, its name in the report,
// and the elements read plus written per element of the result.
struct SetOneBitCase {
    static constexpr const char* name = "setOneBit";
    static constexpr std::size_t elementsMoved = 2;
    using Family = SetOneBit;
    template <class T>
    static void run(T* out, const T* data, const T*, unsigned long n, std::uint32_t p) {
        SetOneBit::run(out, data, 1, n, p);
    }
};
struct ClearOneBitCase {
    static constexpr const char* name = "clearOneBit";
    static constexpr std::size_t elementsMoved = 2;
    using Family = ClearOneBit;
    template <class T>
    static void run(T* out, const T* data, const T*, unsigned long n, std::uint32_t p) {
        ClearOneBit::run(out, data, 1, n, p);
    }
};
struct GetOneBitCase {
    static constexpr const char* name = "getOneBit";
    static constexpr std::size_t elementsMoved = 2;
    using Family = GetOneBit;
    template <class T>
    static void run(T* out, const T* data, const T*, unsigned long n, std::uint32_t p) {
        GetOneBit::run(out, data, 1, n, p);
    }
};
struct SetBitFromValuesCase {
    static constexpr const char* name = "setBitFromValues";
    static constexpr std::size_t elementsMoved = 3;
    using Family = SetBitFromValues;
    template <class T>
    static void run(T* out, const T* data, const T* values, unsigned long n, std::uint32_t p) {
        SetBitFromValues::run(out, data, 1, values, 1, n, p);
    }
};
struct LeftShiftCase {
    static constexpr const char* name = "leftShift";
    static constexpr std::size_t elementsMoved = 2;
    using Family = LeftShift;
    template <class T>
    static void run(T* out, const T* data, const T*, unsigned long n, std::uint32_t p) {
        LeftShift::run(out, data, 1, n, p);
    }
};
struct RightShiftCase {
    static constexpr const char* name = "rightShift";
    static constexpr std::size_t elementsMoved = 2;
    using Family = RightShift;
    template <class T>
    static void run(T* out, const T* data, const T*, unsigned long n, std::uint32_t p) {
        RightShift::run(out, data, 1, n, p);
    }
};

enum class Output { fresh, inPlace };

template <class Case, class T, Output output>
void familyCase(benchmark::State& state) {
    const auto n = static_cast<unsigned long>(state.range(0));
    std::vector<T> data(n, T(0x5A));
    std::vector<T> values(Case::elementsMoved == 3 ? n : 0, T(1));
    const std::uint32_t parameter = 3;
    const auto call = [&] {
        // A fresh output is made per call by the host, as every result is.
        const zqArraySlot fresh = output == Output::fresh ? hostResult(classIdOf<T>(), n) : nullptr;
        T* out = output == Output::fresh ? static_cast<T*>(fresh->data) : data.data();
        Case::run(out, data.data(), values.data(), n, parameter);
        benchmark::DoNotOptimize(out);
        benchmark::ClobberMemory();
    };
    call();  // untimed: the steady state of repeated calls, not the first touch of memory
    for (auto _ : state) call();
    reportBytes(state, Case::elementsMoved * sizeof(T) * n);
}

template <class Case, class T>
void registerFamily() {
    const std::string name = std::string("engine/") + Case::name + "/" + className<T>();
    const auto counts = countsAroundLimit(Case::Family::template Record<T>::parallelLimit);
    registerCounts(name + "/fresh", &familyCase<Case, T, Output::fresh>, counts);
    registerCounts(name + "/inplace", &familyCase<Case, T, Output::inPlace>, counts);
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
    registerFamily<SetOneBitCase, unsigned char>();
    registerFamily<SetOneBitCase, unsigned long>();
    registerFamily<ClearOneBitCase, unsigned char>();
    registerFamily<ClearOneBitCase, unsigned long>();
    registerFamily<GetOneBitCase, unsigned char>();
    registerFamily<GetOneBitCase, unsigned long>();
    registerFamily<SetBitFromValuesCase, unsigned char>();
    registerFamily<SetBitFromValuesCase, unsigned int>();
    registerFamily<LeftShiftCase, unsigned char>();
    registerFamily<LeftShiftCase, unsigned long>();
    registerFamily<RightShiftCase, unsigned char>();
    registerFamily<RightShiftCase, unsigned long>();
    return true;
}();

}  // namespace
}  // namespace bitfcns::bench
