// bitset: the entry point, which counts the operands, sends A and BIT of
// class double to the double path and settles V and the assumed type for
// the integer path.
#include "bitfcns/entry_points.hpp"
#include "bitset/bitset_paths.hpp"
#include "frame/exception.hpp"
#include "frame/message_tags.hpp"
#include "frame/scalar_text.hpp"

void ondelBitSetFcn(int nlhs, zqArraySlot* plhs, int nrhs, const zqArray_tag** prhs) {
    using namespace bitfcns;
    if (nlhs > 1) matrix::detail::error_maxlhs();
    if (nrhs > 4) matrix::detail::error_maxrhs();
    if (nrhs < 2) matrix::detail::error_minrhs();
    // The stored ids, unresolved: an opaque id goes the integer path's way.
    if (prhs[0]->classId == zqDoubleClass && prhs[1]->classId == zqDoubleClass) {
        bitsetOnDouble(nlhs, plhs, nrhs, prhs);
        return;
    }
    // Of three inputs, the third is the assumed type if it is scalar text and
    // V otherwise; of four, V and the type.
    const zqArray_tag* value = nullptr;
    const zqArray_tag* assumedType = nullptr;
    if (nrhs == 4) {
        value = prhs[2];
        assumedType = prhs[3];
    } else if (nrhs == 3) {
        (isScalarText(prhs[2]) ? assumedType : value) = prhs[2];
    }
    plhs[0] = bitsetOnInteger(prhs[0], prhs[1], value, assumedType);
}
