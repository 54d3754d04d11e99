// Storage of host arrays against the memory system: a fresh 100 MB host array
// written once, memcpy of 100 MB between ready buffers, malloc + write + free
// of 100 MB, and small arrays made and destroyed; then the host's own work on
// the path of bitand on doubles (conversion both ways) and on small integers.
// Names as everywhere in the program: host/<what>/<class>/<output>/n:N, or
// bytes:B where only bytes matter.
#include "bench_support.hpp"
#include "host/array_factory.hpp"
#include "host/math_utils.hpp"
#include "host/zq_array.hpp"

#include <benchmark/benchmark.h>

#include <cstdlib>
#include <cstring>
#include <vector>

namespace bitfcns::bench {
namespace {

void freshWrite(benchmark::State& state) {
    const auto bytes = static_cast<unsigned long>(state.range(0));
    for (auto _ : state) {
        zqArraySlot array = hostResult(zqUInt8Class, bytes);
        std::memset(array->data, 1, bytes);
        benchmark::DoNotOptimize(array->data);
        benchmark::ClobberMemory();
    }
    reportBytes(state, bytes);
}

void memcpyReadyBuffers(benchmark::State& state) {
    const auto bytes = static_cast<unsigned long>(state.range(0));
    std::vector<char> from(bytes, 1), to(bytes, 2);
    for (auto _ : state) {
        std::memcpy(to.data(), from.data(), bytes);
        benchmark::DoNotOptimize(to.data());
        benchmark::ClobberMemory();
    }
    reportBytes(state, 2 * bytes);
}

void mallocWriteFree(benchmark::State& state) {
    const auto bytes = static_cast<unsigned long>(state.range(0));
    for (auto _ : state) {
        void* block = std::malloc(bytes);
        std::memset(block, 1, bytes);
        benchmark::DoNotOptimize(block);
        benchmark::ClobberMemory();
        std::free(block);
    }
    reportBytes(state, bytes);
}

// A record and the storage of n uint8 elements, made and destroyed.
void createDestroy(benchmark::State& state) {
    const auto n = static_cast<unsigned long>(state.range(0));
    for (auto _ : state) {
        zqArraySlot array = hostResult(zqUInt8Class, n);
        benchmark::DoNotOptimize(array->data);
    }
}

// The host's element routine of bitand on two arrays of T, result included.
template <class T>
void bitandHelper(benchmark::State& state) {
    const auto n = static_cast<unsigned long>(state.range(0));
    const zqArraySlot a = host::makeArray(classIdOf<T>(), {1, n});
    const zqArraySlot b = host::makeArray(classIdOf<T>(), {1, n});
    for (auto _ : state) {
        zqArraySlot result = bitandBsxfunHelper(a.get(), b.get());
        benchmark::DoNotOptimize(result->data);
    }
    reportBytes(state, 3 * sizeof(T) * n);
}

// Doubles holding integers, converted to uint64 and back.
void convertRoundTrip(benchmark::State& state) {
    const auto count = static_cast<unsigned long>(state.range(0));
    zqArraySlot doubles = hostResult(zqDoubleClass, count);
    auto* values = static_cast<double*>(doubles->data);
    for (unsigned long i = 0; i < count; ++i)
        values[i] = static_cast<double>(i * 2654435761UL % (1UL << 52));
    for (auto _ : state) {
        auto integers = matrix::convert_if_needed(doubles.get(), zqUInt64Class);
        auto back = matrix::convert_if_needed(integers.get(), zqDoubleClass);
        benchmark::DoNotOptimize(back->data);
    }
    reportBytes(state, count * 2 * sizeof(double));
}

[[maybe_unused]] const bool registered = [] {
    constexpr long largeBytes = 100'000'000;
    registerCounts("host/freshWrite", &freshWrite, {largeBytes})->ArgName("bytes");
    registerCounts("host/memcpyReadyBuffers", &memcpyReadyBuffers, {largeBytes})->ArgName("bytes");
    registerCounts("host/mallocWriteFree", &mallocWriteFree, {largeBytes})->ArgName("bytes");
    registerCounts("host/createDestroy/uint8", &createDestroy, {1000});
    registerCounts("host/bitandHelper/uint8/fresh", &bitandHelper<unsigned char>, {1000});
    registerCounts("host/bitandHelper/uint64/fresh", &bitandHelper<unsigned long>, {5'000'000});
    registerCounts("host/convertRoundTrip/double-uint64", &convertRoundTrip, {5'000'000});
    return true;
}();

}  // namespace
}  // namespace bitfcns::bench
