// The seven functions of libbitfcns.so as the evaluator sees them: a name
// and an entry point, which is null while the library doesn't define it.
#pragma once

#include "host/zq_array.hpp"

#include <span>
#include <string_view>

namespace bitcalc {

using EntryPoint = void (*)(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs);

struct LibraryFunction {
    std::string_view name;
    EntryPoint entry;  // null when the loaded library doesn't define it
};

// The seven functions with the entry points of the loaded libbitfcns.so.
std::span<const LibraryFunction> loadedLibraryFunctions();

// The function of that name in `functions`, or null.
const LibraryFunction* findLibraryFunction(std::span<const LibraryFunction> functions,
                                           std::string_view name);

}  // namespace bitcalc
