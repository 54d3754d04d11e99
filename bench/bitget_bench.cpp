// Benchmarks of bitget through its entry point on host arrays: double values
// (assumed uint64: the checked loop, which tests values and positions and
// reads the bit in one pass; in place a test pass comes first) and integer
// values, each with one double position (for integers the SIMD family) or
// with an array of positions (of the values' class), with a result the host
// allocates per call or one that takes over the values' storage (the operand
// flagged 0x200).
#include "bench_support.hpp"
#include "bitfcns/entry_points.hpp"
#include "host/array_factory.hpp"

#include <span>
#include <string>
#include <vector>

namespace bitfcns::bench {
namespace {

enum class Output { fresh, inPlace };
enum class Positions { scalar, array };

template <class T, Positions positions, Output output>
void bitgetCase(benchmark::State& state) {
    const auto n = static_cast<unsigned long>(state.range(0));
    constexpr unsigned width = sizeof(T) == 8 || std::is_same_v<T, double> ? 64 : sizeof(T) * 8;
    std::vector<T> values(n), positionValues(n);
    for (unsigned long i = 0; i < n; ++i) {
        values[i] = static_cast<T>(i * 2654435761u % 251);
        positionValues[i] = static_cast<T>(i * 7 % width + 1);
    }
    const zqArraySlot a = host::makeArray(classIdOf<T>(), {1, n}, std::span<const T>(values));
    host::setWantsSharedResult(*a, output == Output::inPlace);
    const zqArraySlot p =
        positions == Positions::scalar
            ? host::makeDoubleScalar(3)
            : host::makeArray(classIdOf<T>(), {1, n}, std::span<const T>(positionValues));
    const zqArray_tag* inputs[] = {a.get(), p.get()};
    const auto call = [&] {
        zqArraySlot result;
        ondelBitGetFcn(1, &result, 2, inputs);
        benchmark::DoNotOptimize(result->data);
        benchmark::ClobberMemory();
    };
    call();  // untimed: the steady state of repeated calls, not the first touch of memory
    for (auto _ : state) call();
    // The values read and the result written, and an array of positions read.
    reportBytes(state, (positions == Positions::array ? 3 : 2) * sizeof(T) * n);
}

template <class T>
void registerBitget(const char* path) {
    const std::vector<long> counts{1000, 100000, 5000000, 50000000};
    const std::string name = std::string("bitget/") + path + "/" + className<T>();
    registerCounts(name + "/scalarPosition/fresh", &bitgetCase<T, Positions::scalar, Output::fresh>,
                   counts);
    registerCounts(name + "/scalarPosition/inplace",
                   &bitgetCase<T, Positions::scalar, Output::inPlace>, counts);
    registerCounts(name + "/positionArray/fresh", &bitgetCase<T, Positions::array, Output::fresh>,
                   counts);
    registerCounts(name + "/positionArray/inplace",
                   &bitgetCase<T, Positions::array, Output::inPlace>, counts);
}

[[maybe_unused]] const bool registered = [] {
    registerBitget<double>("onDouble");
    registerBitget<unsigned char>("onInteger");
    registerBitget<unsigned long>("onInteger");
    return true;
}();

}  // namespace
}  // namespace bitfcns::bench
