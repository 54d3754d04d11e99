// Storage of host arrays against the memory system: a fresh 100 MB host array
// written once, memcpy of 100 MB between ready buffers, malloc + write + free
// of 100 MB, and small arrays made and destroyed; then the host's own work on
// the path of bitand on doubles (conversion both ways) and on small integers.
#include "host/array_factory.hpp"
#include "host/math_utils.hpp"
#include "host/zq_array.hpp"

#include <benchmark/benchmark.h>

#include <cstdlib>
#include <cstring>
#include <vector>

namespace {

constexpr unsigned long kLargeBytes = 100'000'000;

zqArraySlot uninitialised(zqClassID cls, unsigned long count) {
    const unsigned long dims[] = {1, count};
    return zqArraySlot(matrix::detail::create_uninitnumeric(2, dims, cls, zqReal, 0, nullptr));
}

void BM_HostArrayFreshWrite100MB(benchmark::State& state) {
    for (auto _ : state) {
        zqArraySlot array = uninitialised(zqUInt8Class, kLargeBytes);
        std::memset(array->data, 1, kLargeBytes);
        benchmark::DoNotOptimize(array->data);
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(static_cast<long>(state.iterations() * kLargeBytes));
}
BENCHMARK(BM_HostArrayFreshWrite100MB)->Unit(benchmark::kMillisecond);

void BM_MemcpyReadyBuffers100MB(benchmark::State& state) {
    std::vector<char> from(kLargeBytes, 1), to(kLargeBytes, 2);
    for (auto _ : state) {
        std::memcpy(to.data(), from.data(), kLargeBytes);
        benchmark::DoNotOptimize(to.data());
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(static_cast<long>(state.iterations() * kLargeBytes));
}
BENCHMARK(BM_MemcpyReadyBuffers100MB)->Unit(benchmark::kMillisecond);

void BM_MallocWriteFree100MB(benchmark::State& state) {
    for (auto _ : state) {
        void* block = std::malloc(kLargeBytes);
        std::memset(block, 1, kLargeBytes);
        benchmark::DoNotOptimize(block);
        benchmark::ClobberMemory();
        std::free(block);
    }
    state.SetBytesProcessed(static_cast<long>(state.iterations() * kLargeBytes));
}
BENCHMARK(BM_MallocWriteFree100MB)->Unit(benchmark::kMillisecond);

// A record and the storage of 1000 uint8 elements, made and destroyed.
void BM_SmallArrayCreateDestroy(benchmark::State& state) {
    for (auto _ : state) {
        zqArraySlot array = uninitialised(zqUInt8Class, 1000);
        benchmark::DoNotOptimize(array->data);
    }
}
BENCHMARK(BM_SmallArrayCreateDestroy);

// The host's part of a bitand call on 1000 uint8 elements: result included.
void BM_SmallUInt8Bitand(benchmark::State& state) {
    const zqArraySlot a = host::makeArray(zqUInt8Class, {1, 1000});
    const zqArraySlot b = host::makeArray(zqUInt8Class, {1, 1000});
    for (auto _ : state) {
        zqArraySlot result = bitandBsxfunHelper(a.get(), b.get());
        benchmark::DoNotOptimize(result->data);
    }
}
BENCHMARK(BM_SmallUInt8Bitand);

// 5 million doubles holding integers, converted to uint64 and back.
void BM_ConvertDoubleToUInt64AndBack5M(benchmark::State& state) {
    constexpr unsigned long count = 5'000'000;
    zqArraySlot doubles = uninitialised(zqDoubleClass, count);
    auto* values = static_cast<double*>(doubles->data);
    for (unsigned long i = 0; i < count; ++i)
        values[i] = static_cast<double>(i * 2654435761UL % (1UL << 52));
    for (auto _ : state) {
        auto integers = matrix::convert_if_needed(doubles.get(), zqUInt64Class);
        auto back = matrix::convert_if_needed(integers.get(), zqDoubleClass);
        benchmark::DoNotOptimize(back->data);
    }
    state.SetBytesProcessed(static_cast<long>(state.iterations() * count * 2 * sizeof(double)));
}
BENCHMARK(BM_ConvertDoubleToUInt64AndBack5M)->Unit(benchmark::kMillisecond)->UseRealTime();

// The AND of two 5-million-element uint64 arrays, result included.
void BM_UInt64Bitand5M(benchmark::State& state) {
    constexpr unsigned long count = 5'000'000;
    const zqArraySlot a = host::makeArray(zqUInt64Class, {1, count});
    const zqArraySlot b = host::makeArray(zqUInt64Class, {1, count});
    for (auto _ : state) {
        zqArraySlot result = bitandBsxfunHelper(a.get(), b.get());
        benchmark::DoNotOptimize(result->data);
    }
    state.SetBytesProcessed(static_cast<long>(state.iterations() * count * sizeof(unsigned long)));
}
BENCHMARK(BM_UInt64Bitand5M)->Unit(benchmark::kMillisecond)->UseRealTime();

}  // namespace
