// Benchmarks of bitcmp through its entry point on host arrays: double
// operands (assumed uint64: the checked loop, which tests and complements in
// one pass; in place a test pass comes first) and integer operands (the
// host's complement loop), at the counts around the double path's parallel
// limit, with a result the host allocates per call or one that takes over
// the operand's storage (the operand flagged 0x200).
#include "bench_support.hpp"
#include "bitfcns/entry_points.hpp"
#include "engine/parallel_limits.hpp"
#include "host/array_factory.hpp"

#include <cstdint>
#include <span>
#include <string>
#include <vector>

namespace bitfcns::bench {
namespace {

enum class Output { fresh, inPlace };

// Operand values that stay valid under repeated complements in place: for
// doubles, multiples of 2^60 whose uint64 complements round to multiples of
// 2^60 again.
template <class T>
std::vector<T> operandValues(unsigned long n) {
    std::vector<T> values(n);
    for (unsigned long i = 0; i < n; ++i) {
        if constexpr (std::is_same_v<T, double>)
            values[i] = static_cast<double>(i % 15 + 1) * 1152921504606846976.0;
        else
            values[i] = static_cast<T>(i * 2654435761u);
    }
    return values;
}

template <class T, Output output>
void bitcmpCase(benchmark::State& state) {
    const auto n = static_cast<unsigned long>(state.range(0));
    const std::vector<T> values = operandValues<T>(n);
    const zqArraySlot operand = host::makeArray(classIdOf<T>(), {1, n}, std::span<const T>(values));
    host::setWantsSharedResult(*operand, output == Output::inPlace);
    const zqArray_tag* inputs[] = {operand.get()};
    const auto call = [&] {
        zqArraySlot result;
        ondelBitCmpFcn(1, &result, 1, inputs);
        benchmark::DoNotOptimize(result->data);
        benchmark::ClobberMemory();
    };
    call();  // untimed: the steady state of repeated calls, not the first touch of memory
    for (auto _ : state) call();
    reportBytes(state, 2 * sizeof(T) * n);
}

template <class T>
void registerBitcmp(const char* path) {
    const std::string name = std::string("bitcmp/") + path + "/" + className<T>();
    const auto counts = countsAroundLimit(limits::bitcmpOnDouble);
    registerCounts(name + "/fresh", &bitcmpCase<T, Output::fresh>, counts);
    registerCounts(name + "/inplace", &bitcmpCase<T, Output::inPlace>, counts);
}

[[maybe_unused]] const bool registered = [] {
    registerBitcmp<double>("onDouble");
    registerBitcmp<unsigned char>("onInteger");
    registerBitcmp<unsigned long>("onInteger");
    return true;
}();

}  // namespace
}  // namespace bitfcns::bench
