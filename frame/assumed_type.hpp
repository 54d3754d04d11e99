// The assumed-type operand: a text naming one of the eight integer classes,
// turned into its class id. Cut spellings of the two-digit names ("int1",
// "uint3", "int6", ...) are accepted as synonyms of the full ones.
#pragma once

#include "host/zq_array.hpp"

#include <cstddef>
#include <cstdint>

namespace bitfcns {

// A borrowed run of 16-bit code units, valid while the array it points into
// lives; no terminator.
struct TextView {
    const char16_t* data;
    std::uint64_t length;
};

// The class id of the integer class that `operand` names, or 0 when it is no
// scalar text or names no class. Throws the invalid-character error when a
// compare reaches a code unit outside ASCII, and the "VESPRA:string" errors
// when scalar text can't be read.
zqClassID parseAssumedType(const zqArray_tag* operand);

// The text of a char row vector (or 0-by-0 char array) or of a string scalar.
// With `rowOnly` false any char array is text.
TextView getScalarText(const zqArray_tag* operand, bool rowOnly);

// Case-insensitive match of `text` against `reference` over a compare length
// that reaches at least min(reference length, bound): a bound short of the
// reference length also accepts the reference cut to the bound. Throws the
// invalid-character error on a compared code unit outside ASCII.
bool equalsBounded(TextView text, TextView reference, std::size_t bound);

}  // namespace bitfcns
