// BitcmpFtor<T>: the complement of a double taken for an integer of class T,
// given back as a double, with the exact conversions of the 64-bit unsigned
// class.
#pragma once

#include "engine/parallel_limits.hpp"
#include "frame/integer_conversion.hpp"

namespace bitfcns {

// x, a whole number that class T holds (tested before), complemented in T:
// minus x minus 1 for signed T, the largest value of T minus x for unsigned
// T. With the 64-bit classes the complement is rounded to the nearest double.
template <class T>
struct BitcmpFtor {
    static constexpr unsigned long parallelLimit = limits::bitcmpOnDouble;

    double operator()(double x) const noexcept {
        return integerToDouble(static_cast<T>(~wholeDoubleTo<T>(x)));
    }
};

}  // namespace bitfcns
