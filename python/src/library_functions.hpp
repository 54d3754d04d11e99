// The seven functions of libbitfcns.so as the Python module sees them: name,
// entry point (null while the loaded library doesn't define it) and the
// numbers of inputs each accepts.
#pragma once

#include "host/zq_array.hpp"

#include <array>
#include <cstddef>
#include <string_view>

namespace bitfcns::python {

using EntryPoint = void (*)(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs);

struct LibraryFunction {
    std::string_view name;
    EntryPoint entry;
    int fewestInputs;
    int mostInputs;
};

inline constexpr std::size_t kFunctionCount = 7;
inline constexpr int kMostInputs = 4;

// The seven, in the order bitand, bitor, bitxor, bitcmp, bitget, bitset,
// bitshift, with the entry points of the loaded library.
const std::array<LibraryFunction, kFunctionCount>& libraryFunctions();

}  // namespace bitfcns::python
