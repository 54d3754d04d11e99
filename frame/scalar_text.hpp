// Whether an operand is scalar text: a char row vector (or 0-by-0 char
// array) or a string scalar. It is the test by which a function that takes
// an optional text operand among others tells that text from a value
// operand, and it is the host's string helper, reached through the frame.
#pragma once

#include "host/string_helpers.hpp"

namespace bitfcns {

inline bool isScalarText(const zqArray_tag* operand) {
    return Kestrelon::String::isScalarText(operand, false, true);
}

}  // namespace bitfcns
