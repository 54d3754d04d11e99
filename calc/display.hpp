// What the evaluator shows: values with their names, and errors. Two forms:
// the canonical one, exact and one line per value, and the human one, laid
// out by rows and columns.
#pragma once

#include "calc/errors.hpp"
#include "host/zq_array.hpp"

#include <iosfwd>
#include <memory>
#include <string>
#include <string_view>

namespace bitcalc {

class Display {
public:
    virtual ~Display() = default;
    virtual void showValue(std::string_view name, const zqArray_tag& array) = 0;
    virtual void showError(const ErrorReport& error) = 0;
};

// "NAME = CLASS DIMS [e1 e2 ...]" per value and "error: IDENTIFIER" (or
// "error: TEXT" without one) per error, all on `out`.
std::unique_ptr<Display> makeCanonicalDisplay(std::ostream& out);

// Values on `out`, errors on `errors`.
std::unique_ptr<Display> makeHumanDisplay(std::ostream& out, std::ostream& errors);

// The canonical text of an array: "CLASS DIMS [sparse] [complex] [e1 e2 ...]".
std::string canonicalValueText(const zqArray_tag& array);

// The canonical line of an error, without a line break.
std::string canonicalErrorLine(const ErrorReport& error);

}  // namespace bitcalc
