// Errors of the evaluator itself, and the report (identifier and sentence)
// that the displays show for any error, the library's and the host's included.
#pragma once

#include <stdexcept>
#include <string>

namespace bitcalc {

// Identifiers of the evaluator's own errors.
namespace errorid {
inline constexpr const char* syntax = "bitcalc:syntax";
inline constexpr const char* undefinedFunction = "bitcalc:undefinedFunction";
inline constexpr const char* undefinedName = "bitcalc:undefinedName";
inline constexpr const char* invalidArgument = "bitcalc:invalidArgument";
inline constexpr const char* sizeMismatch = "bitcalc:sizeMismatch";
inline constexpr const char* classMismatch = "bitcalc:classMismatch";
inline constexpr const char* unsupported = "bitcalc:unsupported";
inline constexpr const char* tooLarge = "bitcalc:tooLarge";
inline constexpr const char* noOutput = "bitcalc:noOutput";
}  // namespace errorid

// An error of the evaluator: a bad statement, a name it doesn't know, a
// wrong argument to one of its own builtins.
class CalcError : public std::runtime_error {
public:
    CalcError(std::string identifier, const std::string& message)
        : std::runtime_error(message), identifier_(std::move(identifier)) {}

    const std::string& identifier() const noexcept { return identifier_; }

private:
    std::string identifier_;
};

// What the displays show of an error: its identifier, empty when it has
// none, and a sentence.
struct ErrorReport {
    std::string identifier;
    std::string message;
};

// The report for the exception being handled; call only inside a catch block.
ErrorReport reportCurrentException();

// Raises the host's own error for too many outputs, too many inputs or too
// few inputs, as the host does for its builtins.
[[noreturn]] void raiseTooManyOutputs();
[[noreturn]] void raiseTooManyInputs();
[[noreturn]] void raiseTooFewInputs();

}  // namespace bitcalc
