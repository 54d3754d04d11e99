// The operand that gives a bitset result its sizes.
#include "bitset/result_shape.hpp"

namespace bitfcns {

const zqArray_tag* resultShapeSource(const zqArray_tag* a, bool scalarA, const zqArray_tag* bit,
                                     bool scalarBit, const zqArray_tag* value, bool scalarValue) {
    const bool valueArray = value != nullptr && !scalarValue;
    if (scalarA) {
        if (scalarBit) return value != nullptr ? value : bit;
        if (valueArray && !sameDimensions(bit, value)) return nullptr;
        return bit;
    }
    if (!scalarBit && !sameDimensions(a, bit)) return nullptr;
    if (valueArray && !sameDimensions(a, value)) return nullptr;
    return a;
}

}  // namespace bitfcns
