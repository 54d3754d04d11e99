// The lexer of bitcalc.
#include "calc/lexer.hpp"

#include "calc/text_join.hpp"
#include "calc/unicode_text.hpp"

#include <cstdlib>
#include <string>

namespace bitcalc {

namespace {

bool isDigit(char c) { return c >= '0' && c <= '9'; }
bool isLetter(char c) { return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z'); }
bool isNameChar(char c) { return isLetter(c) || isDigit(c) || c == '_'; }
bool isBlank(char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\f' || c == '\v'; }

// Tokens after which a quote is a transpose and a blank in brackets may end
// an element.
bool endsValue(TokenKind kind) {
    switch (kind) {
        case TokenKind::Number:
        case TokenKind::Identifier:
        case TokenKind::CharText:
        case TokenKind::StringText:
        case TokenKind::RightParen:
        case TokenKind::RightBracket:
        case TokenKind::RightBrace:
        case TokenKind::Transpose:
        case TokenKind::DotTranspose: return true;
        default: return false;
    }
}

std::string_view symbolOf(TokenKind kind) {
    switch (kind) {
        case TokenKind::Plus: return "+";
        case TokenKind::Minus: return "-";
        case TokenKind::Star: return "*";
        case TokenKind::Slash: return "/";
        case TokenKind::Caret: return "^";
        case TokenKind::DotStar: return ".*";
        case TokenKind::DotSlash: return "./";
        case TokenKind::DotCaret: return ".^";
        case TokenKind::Transpose: return "'";
        case TokenKind::DotTranspose: return ".'";
        case TokenKind::LeftParen: return "(";
        case TokenKind::RightParen: return ")";
        case TokenKind::LeftBracket: return "[";
        case TokenKind::RightBracket: return "]";
        case TokenKind::LeftBrace: return "{";
        case TokenKind::RightBrace: return "}";
        case TokenKind::Comma: return ",";
        case TokenKind::Semicolon: return ";";
        case TokenKind::Assign: return "=";
        case TokenKind::Colon: return ":";
        default: return "";
    }
}

}  // namespace

std::string describe(const Token& token) {
    switch (token.kind) {
        case TokenKind::Number: return joinText("number ", token.text);
        case TokenKind::Identifier: return joinText("name '", token.text, "'");
        case TokenKind::CharText: return joinText("text '", toUtf8(token.units), "'");
        case TokenKind::StringText: return joinText("string \"", toUtf8(token.units), "\"");
        case TokenKind::Newline: return "end of line";
        case TokenKind::End: return "end of input";
        default: return joinText("'", symbolOf(token.kind), "'");
    }
}

std::string SyntaxError::message() const {
    return joinText(std::to_string(pos.line), ":", std::to_string(pos.column), ": ", expected);
}

Lexer::Lexer(std::string_view source) : source_(source) {}

char Lexer::peekChar(std::size_t ahead) const {
    const std::size_t at = here_.offset + ahead;
    return at < source_.size() ? source_[at] : '\0';
}

void Lexer::advance() {
    const char c = source_[here_.offset++];
    if (c == '\n') {
        ++here_.line;
        here_.column = 1;
    } else if ((static_cast<unsigned char>(c) & 0xC0) != 0x80) {
        ++here_.column;  // one column per character, not per UTF-8 byte
    }
}

bool Lexer::skipBlanks() {
    bool skipped = false;
    while (here_.offset < source_.size()) {
        const char c = peekChar();
        if (isBlank(c)) {
            advance();
        } else if (c == '%') {
            while (here_.offset < source_.size() && peekChar() != '\n') advance();
        } else if (c == '.' && peekChar(1) == '.' && peekChar(2) == '.') {
            // Continuation: the rest of the line and its break count as a blank.
            while (here_.offset < source_.size() && peekChar() != '\n') advance();
            if (here_.offset < source_.size()) advance();
        } else {
            break;
        }
        skipped = true;
    }
    return skipped;
}

bool Lexer::insideArrayBrackets() const {
    return !brackets_.empty() && brackets_.back() != Bracket::Paren;
}

// Whether the character after a blank in brackets starts a new element:
// "[1 -2]" holds two elements, "[1 - 2]" one, "[a (1)]" two.
bool Lexer::startsElementAfterBlank() const {
    const char c = peekChar();
    if (c == '+' || c == '-') {
        const char after = peekChar(1);
        return !(isBlank(after) || after == '\n' || after == '\0');
    }
    return isDigit(c) || isLetter(c) || (c == '.' && isDigit(peekChar(1))) || c == '\'' ||
           c == '"' || c == '(' || c == '[' || c == '{';
}

Token Lexer::make(TokenKind kind, const SourcePos& pos) const {
    Token token;
    token.kind = kind;
    token.pos = pos;
    return token;
}

void Lexer::fail(const SourcePos& pos, std::string expected) const {
    throw SyntaxError{pos, std::move(expected), false};
}

Token Lexer::next() {
    const bool blank = skipBlanks();
    const SourcePos start = here_;
    Token token;
    if (here_.offset >= source_.size()) {
        token = make(TokenKind::End, start);
    } else if (blank && insideArrayBrackets() && endsValue(previous_) &&
               startsElementAfterBlank()) {
        token = make(TokenKind::Comma, start);
    } else {
        const char c = peekChar();
        if (c == '\n') {
            advance();
            token = make(insideArrayBrackets() ? TokenKind::Semicolon : TokenKind::Newline, start);
        } else if (isDigit(c) || (c == '.' && isDigit(peekChar(1)))) {
            token = lexNumber();
        } else if (isLetter(c)) {
            token = lexIdentifier();
        } else if (c == '\'' && endsValue(previous_) && !(blank && insideArrayBrackets())) {
            advance();
            token = make(TokenKind::Transpose, start);
        } else if (c == '\'' || c == '"') {
            token = lexText(c);
        } else {
            token = lexOperator();
        }
    }
    previous_ = token.kind;
    return token;
}

Token Lexer::lexNumber() {
    const SourcePos start = here_;
    while (isDigit(peekChar())) advance();
    // A dot belongs to the number unless it starts ".*", "./", ".^", ".'" or "...".
    if (peekChar() == '.') {
        const char after = peekChar(1);
        const bool operatorDot = after == '*' || after == '/' || after == '^' || after == '\'' ||
                                 (after == '.' && peekChar(2) == '.');
        if (!operatorDot) {
            advance();
            while (isDigit(peekChar())) advance();
        }
    }
    if (peekChar() == 'e' || peekChar() == 'E') {
        const char after = peekChar(1);
        const bool signedExponent = (after == '+' || after == '-') && isDigit(peekChar(2));
        if (isDigit(after) || signedExponent) {
            advance();
            if (signedExponent) advance();
            while (isDigit(peekChar())) advance();
        }
    }
    Token token = make(TokenKind::Number, start);
    token.text = std::string(source_.substr(start.offset, here_.offset - start.offset));
    if (isNameChar(peekChar())) {
        fail(here_, joinText("expected an operator or a separator after the number ", token.text,
                             ", found ", describeCharacterAt(source_, here_.offset)));
    }
    // strtod reads the decimal form exactly, overflowing to Inf and
    // underflowing through the subnormals to 0.
    token.number = std::strtod(token.text.c_str(), nullptr);
    return token;
}

Token Lexer::lexIdentifier() {
    const SourcePos start = here_;
    while (isNameChar(peekChar())) advance();
    Token token = make(TokenKind::Identifier, start);
    token.text = std::string(source_.substr(start.offset, here_.offset - start.offset));
    return token;
}

Token Lexer::lexText(char quote) {
    const SourcePos start = here_;
    advance();
    std::string utf8;
    for (;;) {
        const char c = peekChar();
        if (here_.offset >= source_.size() || c == '\n') {
            fail(start, std::string("unterminated text: expected a closing ") + quote +
                            " before the end of the line");
        }
        if (c == quote) {
            advance();
            if (peekChar() != quote) break;
            utf8.push_back(quote);  // a doubled quote stands for one
            advance();
            continue;
        }
        utf8.push_back(c);
        advance();
    }
    Token token = make(quote == '"' ? TokenKind::StringText : TokenKind::CharText, start);
    const auto units = utf8ToUtf16(utf8);
    if (!units) fail(start, "text is not valid UTF-8");
    token.units = *units;
    return token;
}

Token Lexer::lexOperator() {
    const SourcePos start = here_;
    const char c = peekChar();
    auto single = [&](TokenKind kind) {
        advance();
        return make(kind, start);
    };
    auto opening = [&](TokenKind kind, Bracket bracket) {
        brackets_.push_back(bracket);
        return single(kind);
    };
    auto closing = [&](TokenKind kind) {
        if (!brackets_.empty()) brackets_.pop_back();
        return single(kind);
    };
    switch (c) {
        case '+': return single(TokenKind::Plus);
        case '-': return single(TokenKind::Minus);
        case '*': return single(TokenKind::Star);
        case '/': return single(TokenKind::Slash);
        case '^': return single(TokenKind::Caret);
        case ':': return single(TokenKind::Colon);
        case ',': return single(TokenKind::Comma);
        case ';': return single(TokenKind::Semicolon);
        case '=': return single(TokenKind::Assign);
        case '(': return opening(TokenKind::LeftParen, Bracket::Paren);
        case '[': return opening(TokenKind::LeftBracket, Bracket::Square);
        case '{': return opening(TokenKind::LeftBrace, Bracket::Brace);
        case ')': return closing(TokenKind::RightParen);
        case ']': return closing(TokenKind::RightBracket);
        case '}': return closing(TokenKind::RightBrace);
        case '.': {
            const char after = peekChar(1);
            const TokenKind kind = after == '*'    ? TokenKind::DotStar
                                   : after == '/'  ? TokenKind::DotSlash
                                   : after == '^'  ? TokenKind::DotCaret
                                   : after == '\'' ? TokenKind::DotTranspose
                                                   : TokenKind::End;
            if (kind == TokenKind::End) fail(start, "unexpected '.'");
            advance();
            return single(kind);
        }
        default: break;
    }
    fail(start, joinText("unexpected character ", describeCharacterAt(source_, start.offset)));
}

void Lexer::restartAfterLine(const SourcePos& pos) {
    here_ = pos;
    while (here_.offset < source_.size() && peekChar() != '\n') advance();
    if (here_.offset < source_.size()) advance();
    brackets_.clear();
    previous_ = TokenKind::Newline;
}

}  // namespace bitcalc
