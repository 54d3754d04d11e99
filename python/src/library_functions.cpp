// The entry points are weak references: a function that the loaded
// libbitfcns.so doesn't define yet resolves to null, and the module raises
// NotImplementedError for it. The module is linked so that it loads the
// library whatever it references, and picks a function up as soon as the
// library has it, without being rebuilt.
#include "library_functions.hpp"

#include "bitfcns/entry_points.hpp"

__attribute__((weak)) void ondelBitAndFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitOrFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitXorFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitCmpFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitGetFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitSetFcn(int, zqArraySlot*, int, const zqArray_tag**);
__attribute__((weak)) void ondelBitShiftFcn(int, zqArraySlot*, int, const zqArray_tag**);

namespace bitfcns::python {

const std::array<LibraryFunction, kFunctionCount>& libraryFunctions() {
    static const std::array<LibraryFunction, kFunctionCount> functions{{
        {"bitand", &ondelBitAndFcn, 2, 3},
        {"bitor", &ondelBitOrFcn, 2, 3},
        {"bitxor", &ondelBitXorFcn, 2, 3},
        {"bitcmp", &ondelBitCmpFcn, 1, 2},
        {"bitget", &ondelBitGetFcn, 2, 3},
        {"bitset", &ondelBitSetFcn, 2, 4},
        {"bitshift", &ondelBitShiftFcn, 2, 3},
    }};
    return functions;
}

}  // namespace bitfcns::python
