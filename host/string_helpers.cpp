// The host's string helpers: scalar text, string arrays and their view.
#include "host/string_helpers.hpp"

#include "host/array_body.hpp"

namespace Kestrelon::String {

// The first flag is an option this stand-in doesn't have; the second admits
// string scalars.
bool isScalarText(const zqArray_tag* array, bool, bool admitStringScalars) {
    if (!array) return false;
    host::completeDimensions(*array);
    const host::DimsView dims = host::trueDimensions(*array);
    switch (host::trueClassOf(*array)) {
        case zqCharClass:
            return dims.count == 2 && (dims[0] == 1 || (dims[0] == 0 && dims[1] == 0));
        case zqStringClass: return admitStringScalars && host::trueElementCount(*array) == 1;
        default: return false;
    }
}

bool isString(const zqArray_tag* array) {
    return array && host::trueClassOf(*array) == zqStringClass;
}

const StringArray* getString(const zqArray_tag* array) {
    const auto& strings = array->body->strings;
    return strings ? &strings->view : nullptr;
}

}  // namespace Kestrelon::String
