// The syntax tree of bitcalc: expressions and the three kinds of statement.
#pragma once

#include "calc/lexer.hpp"

#include <cstddef>
#include <memory>
#include <optional>
#include <string>
#include <variant>
#include <vector>

namespace bitcalc {

struct Expr;
using ExprPtr = std::unique_ptr<Expr>;

struct NumberLiteral {
    double value;
};

// A name on its own: a variable, a constant (true, Inf, ...) or a function
// called with no arguments.
struct NameRef {
    std::string name;
};

struct CharLiteral {
    std::u16string units;
};

struct StringLiteral {
    std::u16string units;
};

// [a b; c d] or {a, b}: elements row by row. A number, or a negated one, is
// kept as a double rather than as a tree, so that a literal of a million
// numbers costs about as much memory as the array it makes.
struct ArrayLiteral {
    bool cell = false;
    std::vector<std::size_t> rowLengths;  // elements per row; empty rows are dropped
    std::vector<bool> isNumber;           // per element, row by row
    std::vector<double> numbers;          // the elements that are numbers, in order
    std::vector<ExprPtr> trees;           // the other elements, in order

    void append(ExprPtr element);

    // Reads the elements in order.
    class Cursor {
    public:
        explicit Cursor(const ArrayLiteral& literal) : literal_(literal) {}
        bool atNumber() const { return literal_.isNumber[element_]; }
        double takeNumber() { return ++element_, literal_.numbers[number_++]; }
        const Expr& takeTree() { return ++element_, *literal_.trees[tree_++]; }

    private:
        const ArrayLiteral& literal_;
        std::size_t element_ = 0, number_ = 0, tree_ = 0;
    };
};

enum class UnaryOperator { Negate, Plus, Transpose, DotTranspose };

struct UnaryOp {
    UnaryOperator op;
    ExprPtr operand;
};

enum class BinaryOperator { Add, Subtract, Multiply, Divide, Power };

struct BinaryOp {
    BinaryOperator op;
    ExprPtr left;
    ExprPtr right;
};

// first:last or first:step:last; `step` is null in the first form.
struct RangeExpr {
    ExprPtr first;
    ExprPtr step;
    ExprPtr last;
};

// name(arguments)
struct CallExpr {
    std::string name;
    std::vector<ExprPtr> arguments;
};

struct Expr {
    SourcePos pos;
    std::variant<NumberLiteral, NameRef, CharLiteral, StringLiteral, ArrayLiteral, UnaryOp,
                 BinaryOp, RangeExpr, CallExpr>
        node;
    int depth = 1;  // height of the tree below and including this node
};

inline void ArrayLiteral::append(ExprPtr element) {
    // A number, or a number under a minus sign: -x of a double is exact.
    std::optional<double> value;
    if (const auto* number = std::get_if<NumberLiteral>(&element->node)) {
        value = number->value;
    } else if (const auto* sign = std::get_if<UnaryOp>(&element->node);
               sign && sign->op == UnaryOperator::Negate) {
        if (const auto* negated = std::get_if<NumberLiteral>(&sign->operand->node))
            value = -negated->value;
    }
    isNumber.push_back(value.has_value());
    if (value) {
        numbers.push_back(*value);
    } else {
        trees.push_back(std::move(element));
    }
}

// EXPR, NAME = EXPR, or [N1, N2, ...] = CALL; `targets` is empty for the
// first kind and holds one name for the second.
struct Statement {
    enum class Kind { Expression, Assignment, MultipleAssignment };

    Kind kind = Kind::Expression;
    std::vector<std::string> targets;
    ExprPtr value;
    bool displayed = true;  // false when a ';' follows
    SourcePos pos;
};

}  // namespace bitcalc
