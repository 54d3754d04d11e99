// Benchmarks of bitshift through its entry point on host arrays: double
// values (under an assumed class: the checked loop, which tests and shifts
// in one pass) and integer values of every class, each by one scalar count (the
// SIMD shifts; the plain serial loop for int64 to the right) or by an array
// of counts of class int8 (the shift rule per element), left by 3 or right by
// 3, with a result the host allocates per call or one that takes over the
// values' storage (flagged 0x200).
#include "bench_support.hpp"
#include "bitfcns/entry_points.hpp"
#include "host/array_factory.hpp"

#include <span>
#include <string>
#include <vector>

namespace bitfcns::bench {
namespace {

enum class Counts { scalar, array };
enum class Output { fresh, inPlace };

// Whole values below 2^53 for doubles, which stay valid for every assumed
// class as they shift in place; any bits for integers.
template <class T>
std::vector<T> valuesOf(unsigned long n, double limit) {
    std::vector<T> values(n);
    for (unsigned long i = 0; i < n; ++i) {
        const unsigned long bits = i * 2654435761u;
        if constexpr (std::is_same_v<T, double>)
            values[i] = static_cast<double>(bits % static_cast<unsigned long>(limit));
        else
            values[i] = static_cast<T>(bits);
    }
    return values;
}

// One case: `assumed` names the class the double values are taken for
// (nullptr: the default, uint64, or integer values).
struct Shape {
    const char16_t* assumed;
    double valueLimit;
    int count;
    Counts counts;
    Output output;
};

template <class T>
void bitshiftCase(benchmark::State& state, Shape shape) {
    const auto n = static_cast<unsigned long>(state.range(0));
    const std::vector<T> values = valuesOf<T>(n, shape.valueLimit);
    const zqArraySlot operand = host::makeArray(classIdOf<T>(), {1, n}, std::span<const T>(values));
    host::setWantsSharedResult(*operand, shape.output == Output::inPlace);
    using Count = std::conditional_t<std::is_same_v<T, double>, double, signed char>;
    const std::vector<Count> counts(shape.counts == Counts::array ? n : 1,
                                    static_cast<Count>(shape.count));
    const zqArraySlot countArray =
        host::makeArray(classIdOf<Count>(), {1, counts.size()}, std::span<const Count>(counts));
    const zqArraySlot assumed = shape.assumed ? host::makeCharArray(shape.assumed) : nullptr;
    const zqArray_tag* inputs[] = {operand.get(), countArray.get(), assumed.get()};
    const int nrhs = shape.assumed ? 3 : 2;
    const auto call = [&] {
        zqArraySlot result;
        ondelBitShiftFcn(1, &result, nrhs, inputs);
        benchmark::DoNotOptimize(result->data);
        benchmark::ClobberMemory();
    };
    call();  // untimed: the steady state of repeated calls, not the first touch of memory
    for (auto _ : state) call();
    const std::size_t countBytes = shape.counts == Counts::array ? sizeof(Count) * n : 0;
    reportBytes(state, 2 * sizeof(T) * n + countBytes);
}

// The eight cases of one class: scalar count or array of counts, left or
// right, fresh or in place.
template <class T>
void registerClass(const std::string& path, const char16_t* assumed = nullptr,
                   double valueLimit = 9007199254740992.0) {
    for (auto [counts, form] :
         {std::pair{Counts::scalar, "scalarCount"}, {Counts::array, "countArray"}})
        for (auto [count, direction] : {std::pair{3, "left"}, {-3, "right"}})
            for (auto [output, outputName] :
                 {std::pair{Output::fresh, "fresh"}, {Output::inPlace, "inplace"}}) {
                const std::string name =
                    "bitshift/" + path + "/" + form + "/" + direction + "/" + outputName;
                const Shape shape{assumed, valueLimit, count, counts, output};
                auto* bench = benchmark::RegisterBenchmark(
                    name.c_str(),
                    [shape](benchmark::State& state) { bitshiftCase<T>(state, shape); });
                bench->ArgName("n")->UseRealTime();
                for (long n : {1000l, 100000l, 5000000l, 50000000l}) bench->Arg(n);
            }
}

template <class... T>
void registerIntegerClasses() {
    (registerClass<T>(std::string("onInteger/") + className<T>()), ...);
}

[[maybe_unused]] const bool registered = [] {
    registerClass<double>("onDouble/uint64");
    registerClass<double>("onDouble/int16", u"int16", 32768.0);
    registerIntegerClasses<signed char, unsigned char, short, unsigned short, int, unsigned int,
                           long, unsigned long>();
    return true;
}();

}  // namespace
}  // namespace bitfcns::bench
