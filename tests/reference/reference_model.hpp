// A plain reference model of the seven bit functions, for fuzzing and tests.
// It works on descriptions of operands, element by element, with no SIMD, no
// threads and nothing taken from the library, and says for any call either
// the exact result or the identifier of the refusal.
#pragma once

#include "host/zq_array.hpp"

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

namespace reference {

enum class Function { bitand_, bitor_, bitxor_, bitcmp, bitget, bitset, bitshift };

// One operand as the caller builds it. The numeric flag follows the class, as
// the host sets it.
struct Operand {
    zqClassID cls = zqDoubleClass;  // the true class
    bool opaque = false;            // stored under an id above 16
    bool sparse = false;
    bool complex = false;  // flag 0x800; an imaginary part for numeric classes
    bool wantsShared = false;
    bool noStoredSizes = false;                          // a record without sizes: one element
    std::vector<unsigned long> dims;                     // ignored with noStoredSizes
    std::vector<unsigned char> bytes;                    // real elements, column-major
    std::vector<std::optional<std::u16string>> strings;  // a string array's elements
};

// Identifiers of the refusals that carry none.
inline const std::string kOutOfMemory = "out of memory";
inline const std::string kInvalidCharacter = "Invalid character error.";

struct Outcome {
    std::string error;  // empty when the call is accepted
    zqClassID cls = zqNoClass;
    std::vector<unsigned long> dims;  // as the host shows them
    std::vector<unsigned char> bytes;
    bool sharesFirst = false;  // the result takes over the first operand's storage
    bool slotFilled = false;   // refused after the result went into plhs[0]
};

// The host's sizes as it shows them: at least two, no trailing 1 beyond the second.
std::vector<unsigned long> normalised(std::vector<unsigned long> dims);
std::size_t elementSize(zqClassID cls);

// `failingAllocation`: the index (from 0) of the host allocation that fails.
Outcome call(Function function, int nlhs, const std::vector<Operand>& inputs,
             std::optional<std::size_t> failingAllocation = std::nullopt);

}  // namespace reference
