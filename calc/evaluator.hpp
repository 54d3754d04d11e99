// The evaluator: runs statements against the stand-in host and the library,
// keeps the variables, and hands values and errors to a display.
#pragma once

#include "calc/display.hpp"
#include "calc/library_functions.hpp"
#include "calc/syntax_tree.hpp"
#include "calc/value.hpp"

#include <functional>
#include <map>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace bitcalc {

class Evaluator {
public:
    // `functions` are the library's functions that calls reach; the default
    // is the entry points of the loaded libbitfcns.so.
    explicit Evaluator(Display& display,
                       std::span<const LibraryFunction> functions = loadedLibraryFunctions());

    // Parses and runs `source` statement by statement. An error is shown and
    // ends the run, or with `keepGoing` the run goes on with the next
    // statement (after a syntax error, with the next line). Returns true
    // when no error occurred.
    bool run(std::string_view source, bool keepGoing);

    // A variable's array, or null when there is none of that name.
    const zqArray_tag* variable(std::string_view name) const;

private:
    void execute(const Statement& statement);
    Value evaluate(const Expr& expr);
    Value evaluateArrayLiteral(const ArrayLiteral& literal);
    Value evaluateRange(const RangeExpr& range);

    // Whether `expr` is a call: name(...) or a bare name that isn't a variable.
    bool isCall(const Expr& expr) const;
    // Makes the call that `expr` is, asking for `nlhs` outputs; the slots
    // hold what the function gave (at least one slot, maybe empty).
    std::vector<zqArraySlot> call(const Expr& expr, int nlhs);
    std::vector<zqArraySlot> call(const std::string& name, std::span<const ExprPtr> arguments,
                                  bool withParentheses, int nlhs);

    void assign(const std::string& name, zqArraySlot array);
    void show(const std::string& name);

    Display& display_;
    std::span<const LibraryFunction> functions_;
    std::map<std::string, zqArraySlot, std::less<>> variables_;
};

}  // namespace bitcalc
