// The evaluator: statements, expressions, calls of the library's entry
// points and of the evaluator's builtins, variables.
#include "calc/evaluator.hpp"

#include "calc/arithmetic.hpp"
#include "calc/array_building.hpp"
#include "calc/builtins.hpp"
#include "calc/errors.hpp"
#include "calc/parser.hpp"
#include "calc/text_join.hpp"
#include "host/element_types.hpp"

#include <algorithm>
#include <string>
#include <type_traits>
#include <variant>

namespace bitcalc {

namespace {

template <class... Handlers>
struct Overloaded : Handlers... {
    using Handlers::operator()...;
};
template <class... Handlers>
Overloaded(Handlers...) -> Overloaded<Handlers...>;

// The arguments of a library call, evaluated. An argument that is an array
// just made (a call's result, a conversion, a literal) is flagged for the
// library as one whose storage it may take over; a variable never is.
struct CallArguments {
    std::vector<Value> values;
    std::vector<const zqArray_tag*> arrays;

    void flagTemporaries() {
        arrays.clear();
        for (Value& value : values) {
            if (zqArray_tag* fresh = value.freshArray()) host::setWantsSharedResult(*fresh, true);
            arrays.push_back(&value.array());
        }
    }
};

// The pieces joined along `dimension` (0 for rows, 1 for columns), as a new
// array; one piece alone needs no joining.
Value joined(std::size_t dimension, std::vector<Value> pieces) {
    if (pieces.size() == 1) return Value::fresh(std::move(pieces.front()).release());
    std::vector<const zqArray_tag*> arrays;
    for (const Value& piece : pieces) arrays.push_back(&piece.array());
    return Value::fresh(concatenate(dimension, arrays));
}

// The one operand of a range: a real scalar, or an empty array.
std::optional<long double> rangeOperand(const zqArray_tag& array) {
    const zqClassID cls = host::classOf(array);
    if (!holdsElements(cls) || host::isComplex(array)) {
        throw CalcError(
            errorid::invalidArgument,
            joinText("The operands of a range must be real numbers, not ", className(cls), "."));
    }
    if (isEmpty(array)) return std::nullopt;
    if (!isScalar(array))
        throw CalcError(errorid::invalidArgument, "The operands of a range must be scalars.");
    return elementValue(array, 0);
}

}  // namespace

Evaluator::Evaluator(Display& display, std::span<const LibraryFunction> functions)
    : display_(display), functions_(functions) {}

bool Evaluator::run(std::string_view source, bool keepGoing) {
    Parser parser(source);
    bool clean = true;
    while (std::optional<ParsedItem> item = parser.next()) {
        try {
            if (const auto* error = std::get_if<SyntaxError>(&*item)) {
                throw CalcError(errorid::syntax, error->message());
            }
            execute(std::get<Statement>(*item));
        } catch (...) {
            display_.showError(reportCurrentException());
            clean = false;
            if (!keepGoing) return false;
        }
    }
    return clean;
}

const zqArray_tag* Evaluator::variable(std::string_view name) const {
    const auto found = variables_.find(name);
    return found == variables_.end() ? nullptr : found->second.get();
}

void Evaluator::assign(const std::string& name, zqArraySlot array) {
    host::setWantsSharedResult(*array, false);
    variables_.insert_or_assign(name, std::move(array));
}

void Evaluator::show(const std::string& name) { display_.showValue(name, *variable(name)); }

void Evaluator::execute(const Statement& statement) {
    const Expr& expr = *statement.value;
    switch (statement.kind) {
        case Statement::Kind::Expression: {
            if (const auto* name = std::get_if<NameRef>(&expr.node); name && variable(name->name)) {
                if (statement.displayed) show(name->name);
                return;
            }
            zqArraySlot result;
            if (isCall(expr)) {
                // A call at top level asks for no output; the value, if the
                // function gives one, becomes ans.
                result = std::move(call(expr, 0).front());
                if (!result) return;
            } else {
                result = evaluate(expr).release();
            }
            assign("ans", std::move(result));
            if (statement.displayed) show("ans");
            return;
        }
        case Statement::Kind::Assignment:
            assign(statement.targets.front(), evaluate(expr).release());
            if (statement.displayed) show(statement.targets.front());
            return;
        case Statement::Kind::MultipleAssignment: {
            if (!isCall(expr)) {
                throw CalcError(errorid::unsupported,
                                "A multiple assignment needs a function call on the right.");
            }
            const int count = static_cast<int>(statement.targets.size());
            std::vector<zqArraySlot> outputs = call(expr, count);
            for (int i = 0; i < count; ++i) {
                if (!outputs[static_cast<std::size_t>(i)]) {
                    throw CalcError(
                        errorid::noOutput,
                        joinText("The call gave no value for output ", std::to_string(i + 1), ", ",
                                 statement.targets[static_cast<std::size_t>(i)], "."));
                }
            }
            for (int i = 0; i < count; ++i) {
                assign(statement.targets[static_cast<std::size_t>(i)],
                       std::move(outputs[static_cast<std::size_t>(i)]));
            }
            if (statement.displayed) {
                for (const std::string& target : statement.targets) show(target);
            }
            return;
        }
    }
}

bool Evaluator::isCall(const Expr& expr) const {
    if (std::holds_alternative<CallExpr>(expr.node)) return true;
    const auto* name = std::get_if<NameRef>(&expr.node);
    return name && !variable(name->name);
}

std::vector<zqArraySlot> Evaluator::call(const Expr& expr, int nlhs) {
    if (const auto* callExpr = std::get_if<CallExpr>(&expr.node)) {
        return call(callExpr->name, callExpr->arguments, true, nlhs);
    }
    return call(std::get<NameRef>(expr.node).name, {}, false, nlhs);
}

std::vector<zqArraySlot> Evaluator::call(const std::string& name,
                                         std::span<const ExprPtr> arguments, bool withParentheses,
                                         int nlhs) {
    if (withParentheses && variable(name)) {
        throw CalcError(errorid::unsupported,
                        joinText("'", name, "' is a variable, and indexing isn't supported."));
    }
    if (const LibraryFunction* function = findLibraryFunction(functions_, name)) {
        if (!function->entry) {
            throw CalcError(
                errorid::undefinedFunction,
                joinText("Undefined function '", name, "': libbitfcns.so doesn't define it yet."));
        }
        CallArguments inputs;
        for (const ExprPtr& argument : arguments) inputs.values.push_back(evaluate(*argument));
        inputs.flagTemporaries();
        std::vector<zqArraySlot> outputs(static_cast<std::size_t>(std::max(1, nlhs)));
        function->entry(nlhs, outputs.data(), static_cast<int>(inputs.arrays.size()),
                        inputs.arrays.data());
        for (zqArraySlot& output : outputs) {
            if (output) host::setWantsSharedResult(*output, false);
        }
        return outputs;
    }
    if (const Builtin* builtin = findBuiltin(name)) {
        if (nlhs > 1) raiseTooManyOutputs();
        std::vector<Value> values;
        for (const ExprPtr& argument : arguments) values.push_back(evaluate(*argument));
        std::vector<zqArraySlot> outputs;
        outputs.push_back(callBuiltin(*builtin, values));
        return outputs;
    }
    if (withParentheses)
        throw CalcError(errorid::undefinedFunction, joinText("Undefined function '", name, "'."));
    throw CalcError(errorid::undefinedName,
                    joinText("Undefined function or variable '", name, "'."));
}

Value Evaluator::evaluate(const Expr& expr) {
    return std::visit(
        Overloaded{
            [&](const NumberLiteral& number) {
                return Value::fresh(host::makeDoubleScalar(number.value));
            },
            [&](const NameRef& name) {
                if (const zqArray_tag* array = variable(name.name)) return Value::borrowed(*array);
                return Value::fresh(std::move(call(name.name, {}, false, 1).front()));
            },
            [&](const CharLiteral& text) {
                // '' alone is a 0-by-0 char array, any other text a row.
                return Value::fresh(text.units.empty() ? host::makeCharArray({0, 0}, u"")
                                                       : host::makeCharArray(text.units));
            },
            [&](const StringLiteral& text) { return Value::fresh(stringScalar(text.units)); },
            [&](const ArrayLiteral& literal) { return evaluateArrayLiteral(literal); },
            [&](const UnaryOp& unary) {
                const Value operand = evaluate(*unary.operand);
                switch (unary.op) {
                    case UnaryOperator::Transpose:
                        return Value::fresh(transposeArray(operand.array(), true));
                    case UnaryOperator::DotTranspose:
                        return Value::fresh(transposeArray(operand.array(), false));
                    default: return Value::fresh(applySign(unary.op, operand.array()));
                }
            },
            [&](const BinaryOp& binary) {
                const Value left = evaluate(*binary.left);
                const Value right = evaluate(*binary.right);
                return Value::fresh(applyBinary(binary.op, left.array(), right.array()));
            },
            [&](const RangeExpr& range) { return evaluateRange(range); },
            [&](const CallExpr& callExpr) {
                zqArraySlot result =
                    std::move(call(callExpr.name, callExpr.arguments, true, 1).front());
                if (!result) {
                    throw CalcError(errorid::noOutput,
                                    joinText("The call of ", callExpr.name, " gave no value."));
                }
                return Value::fresh(std::move(result));
            },
        },
        expr.node);
}

Value Evaluator::evaluateArrayLiteral(const ArrayLiteral& literal) {
    const std::size_t rowCount = literal.rowLengths.size();
    const bool rowsAgree =
        std::all_of(literal.rowLengths.begin(), literal.rowLengths.end(),
                    [&](std::size_t length) { return length == literal.rowLengths.front(); });
    ArrayLiteral::Cursor cursor(literal);
    if (literal.cell) {
        if (rowCount == 0) return Value::fresh(host::makeCellArray({0, 0}, {}));
        std::vector<Value> values;
        for (std::size_t i = 0; i < literal.isNumber.size(); ++i) {
            values.push_back(cursor.atNumber()
                                 ? Value::fresh(host::makeDoubleScalar(cursor.takeNumber()))
                                 : evaluate(cursor.takeTree()));
        }
        if (!rowsAgree) {
            throw CalcError(errorid::sizeMismatch,
                            "The rows of a cell array must have one number of elements.");
        }
        const std::size_t columns = literal.rowLengths.front();
        std::vector<const zqArray_tag*> elements(values.size());
        for (std::size_t r = 0; r < rowCount; ++r) {
            for (std::size_t c = 0; c < columns; ++c)
                elements[r + c * rowCount] = &values[r * columns + c].array();
        }
        return Value::fresh(makeCell({rowCount, columns}, elements));
    }

    if (rowCount == 0) return Value::fresh(filledArray(zqDoubleClass, {0, 0}, 0));
    if (literal.trees.empty() && rowsAgree) {
        // Numbers only: the matrix straight from them, column by column.
        const std::size_t columns = literal.rowLengths.front();
        zqArraySlot matrix = host::makeArray(zqDoubleClass, {rowCount, columns});
        double* out = mutableElementsOf<double>(*matrix);
        for (std::size_t r = 0; r < rowCount; ++r) {
            for (std::size_t c = 0; c < columns; ++c)
                out[r + c * rowCount] = literal.numbers[r * columns + c];
        }
        return Value::fresh(std::move(matrix));
    }

    // Each run of numbers in a row becomes one double row; the pieces of a
    // row are joined, then the rows.
    std::vector<Value> rows;
    for (const std::size_t length : literal.rowLengths) {
        std::vector<Value> pieces;
        std::vector<double> run;
        auto endRun = [&] {
            if (run.empty()) return;
            pieces.push_back(Value::fresh(
                host::makeArray(zqDoubleClass, {1, run.size()}, std::span<const double>(run))));
            run.clear();
        };
        for (std::size_t i = 0; i < length; ++i) {
            if (cursor.atNumber()) {
                run.push_back(cursor.takeNumber());
            } else {
                endRun();
                pieces.push_back(evaluate(cursor.takeTree()));
            }
        }
        endRun();
        rows.push_back(joined(1, std::move(pieces)));
    }
    return joined(0, std::move(rows));
}

Value Evaluator::evaluateRange(const RangeExpr& range) {
    const Value first = evaluate(*range.first);
    const std::optional<Value> step =
        range.step ? std::optional<Value>(evaluate(*range.step)) : std::nullopt;
    const Value last = evaluate(*range.last);
    const std::optional<long double> from = rangeOperand(first.array());
    const std::optional<long double> by = step ? rangeOperand(step->array()) : 1.0L;
    const std::optional<long double> to = rangeOperand(last.array());
    // A range takes its class as arithmetic does: an integer operand makes an
    // integer range, a single one a single range.
    zqClassID cls = resultClassOf(host::classOf(first.array()), host::classOf(last.array()));
    if (step) cls = resultClassOf(cls, host::classOf(step->array()));
    if (!from || !by || !to) return Value::fresh(filledArray(cls, {1, 0}, 0));
    return Value::fresh(rangeArray(cls, *from, *by, *to));
}

}  // namespace bitcalc
