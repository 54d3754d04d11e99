// The evaluator's own functions: conversions (int8 ... uint64, single,
// double, logical), intmax and intmin, zeros, ones, true, false, Inf, NaN,
// reshape, sparse, complex, string and missing.
#pragma once

#include "calc/value.hpp"

#include <span>
#include <string_view>

namespace bitcalc {

struct Builtin;
using BuiltinBody = zqArraySlot (*)(const Builtin& self, std::span<Value> arguments);

struct Builtin {
    std::string_view name;
    BuiltinBody body;
    zqClassID cls = zqNoClass;  // the class that a conversion or a filler makes
    double fill = 0;            // the value that a filler writes
};

// The builtin of that name, or null.
const Builtin* findBuiltin(std::string_view name);

// Calls a builtin; its arguments' arrays are only read.
zqArraySlot callBuiltin(const Builtin& builtin, std::span<Value> arguments);

}  // namespace bitcalc
