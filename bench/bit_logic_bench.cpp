// Benchmarks of bitand, bitor and bitxor through their entry points, with a
// result the host allocates per call: two uint8 or two uint64 arrays (the
// integer path), two double arrays (the default path: the checked loop,
// which tests both operands and writes the double result in one pass), and
// a uint8 array with a double scalar.
#include "bench_support.hpp"
#include "bitfcns/entry_points.hpp"
#include "host/array_factory.hpp"

#include <span>
#include <string>
#include <vector>

namespace bitfcns::bench {
namespace {

using EntryPoint = void (*)(int, zqArraySlot*, int, const zqArray_tag**);

template <class T>
zqArraySlot operandOf(unsigned long n, unsigned seed) {
    std::vector<T> values(n);
    for (unsigned long i = 0; i < n; ++i)
        values[i] = static_cast<T>((i * 2654435761u + seed) % 251);
    return host::makeArray(classIdOf<T>(), {1, n}, std::span<const T>(values));
}

// Bytes read plus written: both operands (a scalar counts nothing) and the
// result, in the classes the caller sees.
template <EntryPoint entry, class First, class Second>
void logicCase(benchmark::State& state) {
    const auto n = static_cast<unsigned long>(state.range(0));
    const bool scalarSecond = !std::is_same_v<First, Second>;
    const zqArraySlot first = operandOf<First>(n, 1);
    const zqArraySlot second = scalarSecond ? host::makeDoubleScalar(3) : operandOf<Second>(n, 7);
    const zqArray_tag* inputs[] = {first.get(), second.get()};
    const auto call = [&] {
        zqArraySlot result;
        entry(1, &result, 2, inputs);
        benchmark::DoNotOptimize(result->data);
        benchmark::ClobberMemory();
    };
    call();  // untimed: the steady state of repeated calls
    for (auto _ : state) call();
    reportBytes(state, (2 * sizeof(First) + (scalarSecond ? 0 : sizeof(Second))) * n);
}

template <EntryPoint entry>
void registerFunction(const std::string& function) {
    const std::vector<long> counts{1000, 100000, 5000000, 50000000};
    registerCounts(function + "/onInteger/uint8/fresh",
                   &logicCase<entry, unsigned char, unsigned char>, counts);
    registerCounts(function + "/onInteger/uint64/fresh",
                   &logicCase<entry, unsigned long, unsigned long>, counts);
    registerCounts(function + "/onDouble/double/fresh", &logicCase<entry, double, double>, counts);
    registerCounts(function + "/onInteger/uint8-doubleScalar/fresh",
                   &logicCase<entry, unsigned char, double>, counts);
}

[[maybe_unused]] const bool registered = [] {
    registerFunction<ondelBitAndFcn>("bitand");
    registerFunction<ondelBitOrFcn>("bitor");
    registerFunction<ondelBitXorFcn>("bitxor");
    return true;
}();

}  // namespace
}  // namespace bitfcns::bench
