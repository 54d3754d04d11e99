// The floating tests of the frame: floor by bit pattern against the library
// floor, and the element test scanning an array of valid doubles (the
// validation every double path runs before its loop). Names:
// frame/<test>/<variant>/<class>/n:N (class: scanned-tested).
#include "bench_support.hpp"
#include "frame/floating.hpp"

#include <benchmark/benchmark.h>

#include <algorithm>
#include <cmath>
#include <random>
#include <vector>

namespace bitfcns::bench {
namespace {

// Whole and fractional values spread over the three ranges of floorDouble.
std::vector<double> mixedValues(std::size_t count) {
    std::mt19937_64 random(1);
    std::uniform_real_distribution<double> exponent(-4.0, 56.0);
    std::vector<double> values(count);
    for (double& x : values) x = (random() % 2 ? 1 : -1) * std::exp2(exponent(random));
    return values;
}

template <double (*Floor)(double)>
void floorOverArray(benchmark::State& state) {
    const std::vector<double> values = mixedValues(state.range(0));
    for (auto _ : state) {
        double sum = 0;
        for (double x : values) sum += Floor(x);
        benchmark::DoNotOptimize(sum);
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
}

double libraryFloor(double x) { return std::floor(x); }

// Every element passes, so the scan runs to the end.
template <class T>
void elementTestScan(benchmark::State& state) {
    std::vector<double> values(state.range(0));
    std::mt19937_64 random(2);
    std::uniform_int_distribution<int> small(0, 100);
    for (double& x : values) x = small(random);
    for (auto _ : state) {
        const bool allFit =
            std::all_of(values.begin(), values.end(), [](double x) { return fitsInteger<T>(x); });
        benchmark::DoNotOptimize(allFit);
    }
    state.SetItemsProcessed(state.iterations() * state.range(0));
}

[[maybe_unused]] const bool registered = [] {
    registerCounts("frame/floor/bitPattern/double", &floorOverArray<floorDouble>, {1 << 16});
    registerCounts("frame/floor/stdFloor/double", &floorOverArray<libraryFloor>, {1 << 16});
    registerCounts("frame/fitsIntegerScan/double-uint8", &elementTestScan<unsigned char>,
                   {1 << 20});
    registerCounts("frame/fitsIntegerScan/double-uint64", &elementTestScan<unsigned long>,
                   {1 << 20});
    return true;
}();

}  // namespace
}  // namespace bitfcns::bench
