// The memcpy baseline and the byte report of the benchmark cases.
#include "bench_support.hpp"

#include <algorithm>
#include <chrono>
#include <cstring>
#include <map>
#include <memory>
#include <new>

namespace bitfcns::bench {

double memcpyBytesPerSecond(std::size_t bytesProcessed) {
    static std::map<std::size_t, double> measured;
    if (const auto known = measured.find(bytesProcessed); known != measured.end())
        return known->second;

    const std::size_t copied = bytesProcessed / 2 == 0 ? 1 : bytesProcessed / 2;
    const auto source = std::make_unique<unsigned char[]>(copied);  // zeroed: mapped and touched
    const auto target = std::make_unique<unsigned char[]>(copied);
    std::memset(source.get(), 0x5A, copied);
    std::memcpy(target.get(), source.get(), copied);  // warm caches and page tables

    // Batches of copies, doubled until one takes 20 ms so that reading the
    // clock costs nothing next to the copies; then five batches of that size,
    // of which the fastest counts: other processes only ever slow it down.
    using Clock = std::chrono::steady_clock;
    const auto batchSeconds = [&](std::size_t copies) {
        const auto start = Clock::now();
        for (std::size_t i = 0; i < copies; ++i) {
            std::memcpy(target.get(), source.get(), copied);
            benchmark::ClobberMemory();
        }
        return std::chrono::duration<double>(Clock::now() - start).count();
    };
    std::size_t copies = 1;
    while (batchSeconds(copies) < 0.02) copies *= 2;
    double fastest = batchSeconds(copies);
    for (int batch = 1; batch < 5; ++batch) fastest = std::min(fastest, batchSeconds(copies));
    const double rate = static_cast<double>(2 * copied * copies) / fastest;
    measured.emplace(bytesProcessed, rate);
    return rate;
}

void reportBytes(benchmark::State& state, std::size_t bytesPerIteration) {
    const double bytes =
        static_cast<double>(bytesPerIteration) * static_cast<double>(state.iterations());
    state.SetBytesProcessed(static_cast<std::int64_t>(bytes));
    // A rate counter, which the framework divides by the case's real time:
    // bytes per second over memcpy's bytes per second.
    state.counters["vs_memcpy"] = benchmark::Counter(
        bytes / memcpyBytesPerSecond(bytesPerIteration), benchmark::Counter::kIsRate);
}

std::vector<long> countsAroundLimit(unsigned long limit) {
    const long atLimit = static_cast<long>(limit);
    return {1000, 100000, atLimit - 1, atLimit, 5000000, 50000000};
}

benchmark::internal::Benchmark* registerCounts(const std::string& name,
                                               void (*fn)(benchmark::State&),
                                               const std::vector<long>& counts) {
    auto* bench = benchmark::RegisterBenchmark(name.c_str(), fn);
    bench->ArgName("n")->UseRealTime();
    for (long n : counts) bench->Arg(n);
    return bench;
}

zqArraySlot hostResult(zqClassID cls, unsigned long n) {
    const unsigned long dims[] = {1, n};
    zqArraySlot result(matrix::detail::create_uninitnumeric(2, dims, cls, zqReal, 0, nullptr));
    if (!result) throw std::bad_alloc();
    return result;
}

}  // namespace bitfcns::bench
