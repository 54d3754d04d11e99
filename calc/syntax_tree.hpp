// The syntax tree of bitcalc: expressions and the three kinds of statement.
#pragma once

#include "calc/lexer.hpp"

#include <memory>
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

// [a b; c d] or {a, b}: rows of elements.
struct ArrayLiteral {
    bool cell = false;
    std::vector<std::vector<ExprPtr>> rows;
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
