// The parser of bitcalc: recursive descent over the lexer's tokens.
//
// Precedence, from loosest to tightest: the range colon; + and -; * and /;
// unary + and -; ^ and the transposes. Binary operators group to the left,
// so 2^3^2 is 64 and -2^2 is -4.
#include "calc/parser.hpp"
#include "calc/text_join.hpp"

#include <algorithm>
#include <string>
#include <utility>

namespace bitcalc {

namespace {

int height(const ExprPtr& expr) { return expr ? expr->depth : 0; }

int heightBelow(const NumberLiteral&) { return 0; }
int heightBelow(const NameRef&) { return 0; }
int heightBelow(const CharLiteral&) { return 0; }
int heightBelow(const StringLiteral&) { return 0; }
int heightBelow(const UnaryOp& node) { return height(node.operand); }
int heightBelow(const BinaryOp& node) { return std::max(height(node.left), height(node.right)); }
int heightBelow(const RangeExpr& node) {
    return std::max({height(node.first), height(node.step), height(node.last)});
}
int heightBelow(const CallExpr& node) {
    int most = 0;
    for (const ExprPtr& argument : node.arguments) most = std::max(most, height(argument));
    return most;
}
int heightBelow(const ArrayLiteral& node) {
    int most = 0;
    for (const auto& row : node.rows) {
        for (const ExprPtr& element : row) most = std::max(most, height(element));
    }
    return most;
}

bool endsStatement(TokenKind kind) {
    return kind == TokenKind::Comma || kind == TokenKind::Semicolon || kind == TokenKind::Newline ||
           kind == TokenKind::End;
}

}  // namespace

Parser::Parser(std::string_view source) : lexer_(source) {}

Parser::NestingGuard::NestingGuard(Parser& owner, const Token& at) : parser(owner) {
    if (++parser.nesting_ > maxNesting) {
        --parser.nesting_;
        throw SyntaxError{at.pos, "expression nested too deeply", false};
    }
}

Parser::NestingGuard::~NestingGuard() { --parser.nesting_; }

const Token& Parser::peek(std::size_t ahead) {
    while (lookahead_.size() <= ahead) lookahead_.push_back(lexer_.next());
    return lookahead_[ahead];
}

Token Parser::take() {
    peek();
    Token token = std::move(lookahead_.front());
    lookahead_.pop_front();
    return token;
}

bool Parser::at(TokenKind kind) { return peek().kind == kind; }

void Parser::fail(const Token& found, std::string_view expected) {
    throw SyntaxError{found.pos, joinText("expected ", expected, ", found ", describe(found)),
                      found.kind == TokenKind::End};
}

Token Parser::expect(TokenKind kind, std::string_view what) {
    if (!at(kind)) fail(peek(), what);
    return take();
}

template <class Node>
ExprPtr Parser::makeExpr(const SourcePos& pos, Node node) {
    auto expr = std::make_unique<Expr>();
    expr->pos = pos;
    expr->depth = 1 + heightBelow(node);
    expr->node = std::move(node);
    if (expr->depth > maxTreeDepth) throw SyntaxError{pos, "expression nested too deeply", false};
    return expr;
}

std::optional<ParsedItem> Parser::next() {
    try {
        std::optional<Statement> statement = parseStatement();
        if (!statement) return std::nullopt;
        return ParsedItem(std::move(*statement));
    } catch (const SyntaxError& error) {
        lookahead_.clear();
        nesting_ = 0;
        lexer_.restartAfterLine(error.pos);
        return ParsedItem(error);
    }
}

std::optional<Statement> Parser::parseStatement() {
    while (at(TokenKind::Newline) || at(TokenKind::Semicolon) || at(TokenKind::Comma)) take();
    if (at(TokenKind::End)) return std::nullopt;

    Statement statement;
    statement.pos = peek().pos;
    if (at(TokenKind::Identifier) && peek(1).kind == TokenKind::Assign) {
        statement.kind = Statement::Kind::Assignment;
        statement.targets.push_back(take().text);
        take();
        statement.value = parseExpression();
    } else if (at(TokenKind::LeftBracket) && startsMultipleAssignment()) {
        statement.kind = Statement::Kind::MultipleAssignment;
        take();
        while (!at(TokenKind::RightBracket)) {
            statement.targets.push_back(expect(TokenKind::Identifier, "a variable name").text);
            if (at(TokenKind::Comma)) {
                take();
            } else if (!at(TokenKind::RightBracket)) {
                fail(peek(), "',' or ']' in the list of outputs");
            }
        }
        take();
        if (statement.targets.empty()) fail(peek(), "a variable name in the list of outputs");
        expect(TokenKind::Assign, "'='");
        const Token& call = peek();
        const bool isCall = call.kind == TokenKind::Identifier &&
                            (endsStatement(peek(1).kind) || peek(1).kind == TokenKind::LeftParen);
        if (!isCall) fail(call, "a function call on the right of a multiple assignment");
        statement.value = parsePostfix();
        if (!std::holds_alternative<CallExpr>(statement.value->node) &&
            !std::holds_alternative<NameRef>(statement.value->node)) {
            fail(call, "a function call on the right of a multiple assignment");
        }
    } else {
        statement.value = parseExpression();
    }

    const Token& end = peek();
    if (!endsStatement(end.kind)) fail(end, "an operator or the end of the statement");
    statement.displayed = end.kind != TokenKind::Semicolon;
    if (end.kind != TokenKind::End) take();
    return statement;
}

// "[a, b] = f(x)" rather than an array: the bracket closes and '=' follows.
bool Parser::startsMultipleAssignment() {
    int depth = 0;
    for (std::size_t i = 0;; ++i) {
        switch (peek(i).kind) {
            case TokenKind::LeftBracket:
            case TokenKind::LeftParen:
            case TokenKind::LeftBrace: ++depth; break;
            case TokenKind::RightBracket:
            case TokenKind::RightParen:
            case TokenKind::RightBrace:
                if (--depth == 0) return peek(i + 1).kind == TokenKind::Assign;
                break;
            case TokenKind::Newline:
            case TokenKind::End: return false;
            default: break;
        }
    }
}

ExprPtr Parser::parseExpression() {
    const SourcePos pos = peek().pos;
    ExprPtr first = parseAdditive();
    if (!at(TokenKind::Colon)) return first;
    take();
    ExprPtr second = parseAdditive();
    if (!at(TokenKind::Colon))
        return makeExpr(pos, RangeExpr{std::move(first), nullptr, std::move(second)});
    take();
    ExprPtr third = parseAdditive();
    return makeExpr(pos, RangeExpr{std::move(first), std::move(second), std::move(third)});
}

ExprPtr Parser::parseAdditive() {
    ExprPtr left = parseMultiplicative();
    while (at(TokenKind::Plus) || at(TokenKind::Minus)) {
        const Token op = take();
        const BinaryOperator binary =
            op.kind == TokenKind::Plus ? BinaryOperator::Add : BinaryOperator::Subtract;
        ExprPtr right = parseMultiplicative();
        left = makeExpr(op.pos, BinaryOp{binary, std::move(left), std::move(right)});
    }
    return left;
}

ExprPtr Parser::parseMultiplicative() {
    ExprPtr left = parseUnary();
    for (;;) {
        const TokenKind kind = peek().kind;
        BinaryOperator binary;
        if (kind == TokenKind::Star || kind == TokenKind::DotStar) {
            binary = BinaryOperator::Multiply;
        } else if (kind == TokenKind::Slash || kind == TokenKind::DotSlash) {
            binary = BinaryOperator::Divide;
        } else {
            return left;
        }
        const Token op = take();
        ExprPtr right = parseUnary();
        left = makeExpr(op.pos, BinaryOp{binary, std::move(left), std::move(right)});
    }
}

ExprPtr Parser::parseUnary() {
    if (!at(TokenKind::Minus) && !at(TokenKind::Plus)) return parsePowerChain();
    const Token op = take();
    NestingGuard guard(*this, op);
    ExprPtr operand = parseUnary();
    const UnaryOperator unary =
        op.kind == TokenKind::Minus ? UnaryOperator::Negate : UnaryOperator::Plus;
    return makeExpr(op.pos, UnaryOp{unary, std::move(operand)});
}

ExprPtr Parser::parsePowerChain() {
    ExprPtr base = parsePostfix();
    while (at(TokenKind::Caret) || at(TokenKind::DotCaret)) {
        const Token op = take();
        ExprPtr exponent = parsePowerOperand();
        base =
            makeExpr(op.pos, BinaryOp{BinaryOperator::Power, std::move(base), std::move(exponent)});
    }
    return base;
}

// The right operand of ^ may carry signs of its own: 2^-1.
ExprPtr Parser::parsePowerOperand() {
    if (!at(TokenKind::Minus) && !at(TokenKind::Plus)) return parsePostfix();
    const Token op = take();
    NestingGuard guard(*this, op);
    ExprPtr operand = parsePowerOperand();
    const UnaryOperator unary =
        op.kind == TokenKind::Minus ? UnaryOperator::Negate : UnaryOperator::Plus;
    return makeExpr(op.pos, UnaryOp{unary, std::move(operand)});
}

ExprPtr Parser::parsePostfix() {
    ExprPtr operand = parsePrimary();
    while (at(TokenKind::Transpose) || at(TokenKind::DotTranspose)) {
        const Token op = take();
        const UnaryOperator unary = op.kind == TokenKind::Transpose ? UnaryOperator::Transpose
                                                                    : UnaryOperator::DotTranspose;
        operand = makeExpr(op.pos, UnaryOp{unary, std::move(operand)});
    }
    return operand;
}

ExprPtr Parser::parsePrimary() {
    const Token& token = peek();
    switch (token.kind) {
        case TokenKind::Number: {
            const Token number = take();
            return makeExpr(number.pos, NumberLiteral{number.number});
        }
        case TokenKind::Identifier: {
            const Token name = take();
            if (at(TokenKind::LeftParen)) return parseCall(name);
            return makeExpr(name.pos, NameRef{name.text});
        }
        case TokenKind::CharText: {
            Token text = take();
            return makeExpr(text.pos, CharLiteral{std::move(text.units)});
        }
        case TokenKind::StringText: {
            Token text = take();
            return makeExpr(text.pos, StringLiteral{std::move(text.units)});
        }
        case TokenKind::LeftParen: {
            const Token open = take();
            NestingGuard guard(*this, open);
            ExprPtr inner = parseExpression();
            expect(TokenKind::RightParen, "')'");
            return inner;
        }
        case TokenKind::LeftBracket:
        case TokenKind::LeftBrace: {
            const Token open = take();
            return parseArrayLiteral(open);
        }
        default: fail(token, "a value");
    }
}

ExprPtr Parser::parseArrayLiteral(const Token& opening) {
    NestingGuard guard(*this, opening);
    const bool cell = opening.kind == TokenKind::LeftBrace;
    const TokenKind closer = cell ? TokenKind::RightBrace : TokenKind::RightBracket;
    const std::string_view expectedAfterElement = cell ? "',', ';' or '}'" : "',', ';' or ']'";
    ArrayLiteral literal{cell, {}};
    std::vector<ExprPtr> row;
    for (;;) {
        const TokenKind kind = peek().kind;
        if (kind == closer) {
            take();
            break;
        }
        if (kind == TokenKind::Comma) {
            take();
        } else if (kind == TokenKind::Semicolon) {
            take();
            if (!row.empty()) literal.rows.push_back(std::move(row));
            row.clear();
        } else {
            row.push_back(parseExpression());
            const TokenKind after = peek().kind;
            if (after != closer && after != TokenKind::Comma && after != TokenKind::Semicolon) {
                fail(peek(), expectedAfterElement);
            }
        }
    }
    if (!row.empty()) literal.rows.push_back(std::move(row));
    return makeExpr(opening.pos, std::move(literal));
}

ExprPtr Parser::parseCall(const Token& name) {
    const Token open = take();
    NestingGuard guard(*this, open);
    CallExpr call{name.text, {}};
    if (at(TokenKind::RightParen)) {
        take();
        return makeExpr(name.pos, std::move(call));
    }
    for (;;) {
        call.arguments.push_back(parseExpression());
        if (at(TokenKind::Comma)) {
            take();
            continue;
        }
        expect(TokenKind::RightParen, "',' or ')' after an argument");
        return makeExpr(name.pos, std::move(call));
    }
}

bool needsMoreInput(std::string_view source) {
    Parser parser(source);
    while (std::optional<ParsedItem> item = parser.next()) {
        if (const auto* error = std::get_if<SyntaxError>(&*item); error && error->atEnd)
            return true;
    }
    return false;
}

}  // namespace bitcalc
