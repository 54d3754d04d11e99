// What every benchmark case of the program shares: the sizes of a case
// family, class names for benchmark names, and the report of bytes processed
// with the ratio to memcpy of the same number of bytes, measured in the same
// run (the user counter vs_memcpy).
//
// Bytes processed are bytes read plus bytes written. The memcpy baseline
// copies half that many bytes, so that it too reads and writes the case's
// byte count; it runs on one thread into memory that is already mapped.
//
// All cases use real time: Google Benchmark divides rate counters
// (bytes_per_second and vs_memcpy) by real time only when the case uses real
// time, and by the calling thread's CPU time otherwise, which would overstate
// every parallel run.
#pragma once

#include "host/element_types.hpp"
#include "host/zq_array.hpp"

#include <benchmark/benchmark.h>

#include <cstddef>
#include <string>
#include <vector>

namespace bitfcns::bench {

// Bytes per second (read plus written) of a single-threaded memcpy that
// reads and writes `bytesProcessed` bytes; measured on first use for each
// count and remembered.
double memcpyBytesPerSecond(std::size_t bytesProcessed);

// Sets the case's bytes processed to `bytesPerIteration` times the
// iterations, and vs_memcpy to its bytes per second over memcpy's.
void reportBytes(benchmark::State& state, std::size_t bytesPerIteration);

// The counts of a case family around a parallel limit: 1e3, 1e5, the limit
// less one, the limit, 5e6, 5e7.
std::vector<long> countsAroundLimit(unsigned long limit);

// Registers `fn` as a real-time case for each count, named
// "<name>/n:<count>".
benchmark::internal::Benchmark* registerCounts(const std::string& name,
                                               void (*fn)(benchmark::State&),
                                               const std::vector<long>& counts);

// The host class of an element type, and its name: "uint8", "double".
template <class T>
zqClassID classIdOf() {
    return host::elementClassOf<T>;
}
template <class T>
const char* className() {
    constexpr const char* names[] = {"double", "single", "int8",   "uint8", "int16",
                                     "uint16", "int32",  "uint32", "int64", "uint64"};
    return names[classIdOf<T>() - zqDoubleClass];
}

// A new host array of n elements of class `cls` in one row, with undefined
// contents, made the way a result is made.
zqArraySlot hostResult(zqClassID cls, unsigned long n);

}  // namespace bitfcns::bench
