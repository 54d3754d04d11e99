// The host's string helpers: whether an array is scalar text, whether it is a
// string array, and the string array's own view of its elements.
#pragma once

#include "zq_array.hpp"

#include <cstdint>

namespace Kestrelon::String {

// One text element of a string array.
struct TextRecord {
    const char16_t* units;
    std::uint64_t length;
};

// A string array as its elements' reader sees it. An element slot is null
// for the missing value.
struct StringArray {
    std::uint64_t ndims;
    const std::uint64_t* dims;
    const TextRecord* const* elements;
};

// With the flags false, true: true for a char array of two dimensions whose
// first size is 1 or whose both sizes are 0, and for a 1-by-1 string array,
// also one holding the missing value; false for everything else. With the
// second flag false string arrays are refused; the first flag changes nothing.
bool isScalarText(const zqArray_tag* array, bool, bool);

// True for a string array of any size.
bool isString(const zqArray_tag* array);

// The string array that `array` holds; `array` must be one (isString).
const StringArray* getString(const zqArray_tag* array);

}  // namespace Kestrelon::String
