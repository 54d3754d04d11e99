// The seven entry points, referenced weakly: a function that libbitfcns.so
// doesn't define yet resolves to null, and the evaluator answers "undefined
// function" for it. The executable is linked so that it loads the library
// whatever it references, and picks a function up once the library has it.
#include "calc/library_functions.hpp"

#include "bitfcns/entry_points.hpp"

#include <array>

__attribute__((weak)) void ondelBitAndFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitOrFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitXorFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitCmpFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitGetFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitSetFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitShiftFcn(int, zqArraySlot*, int, const zqArray_tag**);

namespace bitcalc {

std::span<const LibraryFunction> loadedLibraryFunctions() {
    static const std::array<LibraryFunction, 7> functions{{
        {"bitand", &ondelBitAndFcn},
        {"bitor", &ondelBitOrFcn},
        {"bitxor", &ondelBitXorFcn},
        {"bitcmp", &ondelBitCmpFcn},
        {"bitget", &ondelBitGetFcn},
        {"bitset", &ondelBitSetFcn},
        {"bitshift", &ondelBitShiftFcn},
    }};
    return functions;
}

const LibraryFunction* findLibraryFunction(std::span<const LibraryFunction> functions,
                                           std::string_view name) {
    for (const LibraryFunction& function : functions) {
        if (function.name == name) return &function;
    }
    return nullptr;
}

}  // namespace bitcalc
