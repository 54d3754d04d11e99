// The parser of bitcalc: statements one at a time, each either a syntax tree
// or the syntax error that stopped it.
#pragma once

#include "calc/lexer.hpp"
#include "calc/syntax_tree.hpp"

#include <cstddef>
#include <deque>
#include <optional>
#include <string_view>
#include <variant>

namespace bitcalc {

using ParsedItem = std::variant<Statement, SyntaxError>;

// Limits that keep the recursive parser and evaluator within the stack
// whatever the input: brackets, parentheses and signs nested inside each
// other, and the height of an expression tree (long operator chains).
inline constexpr int maxNesting = 200;
inline constexpr int maxTreeDepth = 2000;

class Parser {
public:
    // `source` must outlive the parser.
    explicit Parser(std::string_view source);

    // The next statement, or the syntax error met instead of it; nothing at
    // the end of the input. After an error parsing goes on with the next line.
    std::optional<ParsedItem> next();

    // Tokens read from the lexer so far, those read again after an error
    // included; linear in the input whatever it holds.
    std::size_t tokensRead() const { return tokensRead_; }

private:
    const Token& peek(std::size_t ahead = 0);
    Token take();
    bool at(TokenKind kind);
    Token expect(TokenKind kind, std::string_view what);
    [[noreturn]] void fail(const Token& found, std::string_view expected);

    std::optional<Statement> parseStatement();
    void parseMultipleAssignment(Statement& statement);
    ExprPtr parseExpression();
    ExprPtr parseAdditive();
    ExprPtr parseMultiplicative();
    ExprPtr parseUnary();
    ExprPtr parsePowerChain();
    ExprPtr parsePowerOperand();
    ExprPtr parsePostfix();
    ExprPtr parsePrimary();
    ExprPtr parseArrayLiteral(const Token& opening);
    ExprPtr parseCall(const Token& name);

    template <class Node>
    ExprPtr makeExpr(const SourcePos& pos, Node node);

    struct NestingGuard {
        NestingGuard(Parser& parser, const Token& at);
        ~NestingGuard();
        NestingGuard(const NestingGuard&) = delete;
        NestingGuard& operator=(const NestingGuard&) = delete;
        Parser& parser;
    };

    Lexer lexer_;
    std::deque<Token> lookahead_;
    SourcePos lastTaken_;  // of the last token taken, where recovery starts at the latest
    std::size_t tokensRead_ = 0;
    int nesting_ = 0;
};

// Whether `source` ends inside an open bracket, so that more lines could
// complete it: "[1 2" does, "[1 2]" and "f(1," (a line break inside
// parentheses is an error) don't.
bool needsMoreInput(std::string_view source);

}  // namespace bitcalc
