// Text of single elements for the displays: numbers (complex ones as
// "re+imi") and quoted text.
#pragma once

#include "host/zq_array.hpp"

#include <cstddef>
#include <string>
#include <string_view>

namespace bitcalc {

enum class NumberStyle {
    Canonical,  // exact: whole floating values as their full decimal integer
    Human,      // whole values up to 2^64 as integers, others as shortest text
};

// Element `index` of a numeric or logical array.
std::string numberText(const zqArray_tag& array, std::size_t index, NumberStyle style);

// Text between quotes (`quote` doubled inside), in plain ASCII: printable
// characters as they are, a backslash as \\ and any other code unit as
// \uXXXX.
std::string canonicalQuoted(std::u16string_view units, char quote);

// Text between quotes (`quote` doubled inside), as UTF-8.
std::string humanQuoted(std::u16string_view units, char quote);

}  // namespace bitcalc
