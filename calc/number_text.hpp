// Exact text of numbers: integers of every width, and floating values as the
// canonical display writes them.
#pragma once

#include <string>
#include <type_traits>

namespace bitcalc {

// The exact decimal integer of a whole, finite value: 1e300 gives all 301
// digits of the double nearest 10^300. "-0" for negative zero.
std::string exactIntegerText(double wholeValue);

// The shortest text that reads back to the same double (float), written in
// plain or exponent form, whichever is shorter ("0.5", "1e-300", "1.5e-7").
std::string shortestText(double value);
std::string shortestText(float value);

// Canonical text: "NaN", "Inf", "-Inf"; a whole number as its exact decimal
// integer ("-0" for negative zero); any other value as its shortest text,
// shortest for its own width (a single isn't widened first).
std::string canonicalText(double value);
std::string canonicalText(float value);

// Integers and logicals: their decimal value (a char-sized integer too).
template <class T>
requires std::is_integral_v<T> std::string canonicalText(T value) {
    if constexpr (std::is_same_v<T, bool>) {
        return value ? "1" : "0";
    } else if constexpr (std::is_signed_v<T>) {
        return std::to_string(static_cast<long long>(value));
    } else {
        return std::to_string(static_cast<unsigned long long>(value));
    }
}

}  // namespace bitcalc
