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
    for (const ExprPtr& element : node.trees) most = std::max(most, height(element));
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
    while (lookahead_.size() <= ahead) {
        lookahead_.push_back(lexer_.next());
        ++tokensRead_;
    }
    return lookahead_[ahead];
}

Token Parser::take() {
    peek();
    Token token = std::move(lookahead_.front());
    lookahead_.pop_front();
    lastTaken_ = token.pos;
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
        // Parsing goes on after the line of the error, or of the last token
        // taken when that lies further on (an error found once a bracket
        // spanning lines has closed), so that no line is parsed twice.
        const SourcePos& resume = error.pos.offset < lastTaken_.offset ? lastTaken_ : error.pos;
        lookahead_.clear();
        nesting_ = 0;
        lexer_.restartAfterLine(resume);
        return ParsedItem(error);
    }
}

// A reference from peek() is good until the next take(): none is held across
// a call that may take tokens.
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
    } else {
        const bool opensWithBracket = at(TokenKind::LeftBracket);
        statement.value = parseExpression();
        // "[a, b] = f(x)" is read as an array up to the '=', then as the
        // list of outputs it is: no lookahead over the brackets.
        const auto* literal = std::get_if<ArrayLiteral>(&statement.value->node);
        if (opensWithBracket && literal && !literal->cell && at(TokenKind::Assign))
            parseMultipleAssignment(statement);
    }

    const TokenKind endKind = peek().kind;
    if (!endsStatement(endKind)) fail(peek(), "an operator or the end of the statement");
    statement.displayed = endKind != TokenKind::Semicolon;
    if (endKind != TokenKind::End) take();
    return statement;
}

// Turns the array literal in `statement` into the list of outputs, then
// parses the '=' and the call after it.
void Parser::parseMultipleAssignment(Statement& statement) {
    const auto& outputs = std::get<ArrayLiteral>(statement.value->node);
    const bool namesOnly =
        outputs.rowLengths.size() == 1 && outputs.numbers.empty() &&
        std::all_of(outputs.trees.begin(), outputs.trees.end(), [](const ExprPtr& element) {
            return std::holds_alternative<NameRef>(element->node);
        });
    if (!namesOnly) {
        throw SyntaxError{statement.pos,
                          "expected variable names in one row, such as [a, b], before '='", false};
    }
    statement.kind = Statement::Kind::MultipleAssignment;
    for (const ExprPtr& element : outputs.trees)
        statement.targets.push_back(std::get<NameRef>(element->node).name);
    take();

    const Token call = peek();  // a copy: parsePostfix takes it
    const bool isCall = call.kind == TokenKind::Identifier &&
                        (endsStatement(peek(1).kind) || peek(1).kind == TokenKind::LeftParen);
    if (!isCall) fail(call, "a function call on the right of a multiple assignment");
    statement.value = parsePostfix();
    if (!std::holds_alternative<CallExpr>(statement.value->node) &&
        !std::holds_alternative<NameRef>(statement.value->node)) {
        fail(call, "a function call on the right of a multiple assignment");
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
    switch (peek().kind) {
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
        default: fail(peek(), "a value");
    }
}

ExprPtr Parser::parseArrayLiteral(const Token& opening) {
    NestingGuard guard(*this, opening);
    const bool cell = opening.kind == TokenKind::LeftBrace;
    const TokenKind closer = cell ? TokenKind::RightBrace : TokenKind::RightBracket;
    const std::string_view expectedAfterElement = cell ? "',', ';' or '}'" : "',', ';' or ']'";
    ArrayLiteral literal;
    literal.cell = cell;
    std::size_t rowLength = 0;
    auto endRow = [&] {
        if (rowLength != 0) literal.rowLengths.push_back(rowLength);
        rowLength = 0;
    };
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
            endRow();
        } else {
            literal.append(parseExpression());
            ++rowLength;
            const TokenKind after = peek().kind;
            if (after != closer && after != TokenKind::Comma && after != TokenKind::Semicolon) {
                fail(peek(), expectedAfterElement);
            }
        }
    }
    endRow();
    literal.numbers.shrink_to_fit();
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
