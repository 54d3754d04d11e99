// The lexer of bitcalc: turns statement text into tokens on demand, with the
// array syntax's rules for whitespace inside brackets (a space separates
// elements) and for the quote (text or transpose).
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace bitcalc {

// A place in the source; line and column count from 1, columns in characters.
struct SourcePos {
    int line = 1;
    int column = 1;
    std::size_t offset = 0;
};

enum class TokenKind {
    Number,
    Identifier,
    CharText,    // 'text'
    StringText,  // "text"
    Plus,
    Minus,
    Star,
    Slash,
    Caret,
    DotStar,
    DotSlash,
    DotCaret,
    Transpose,     // '
    DotTranspose,  // .'
    LeftParen,
    RightParen,
    LeftBracket,
    RightBracket,
    LeftBrace,
    RightBrace,
    Comma,      // also made for the space between two elements in brackets
    Semicolon,  // also made for a line break in brackets
    Assign,
    Colon,
    Newline,
    End,
};

struct Token {
    TokenKind kind = TokenKind::End;
    SourcePos pos;
    std::string text;      // identifier, or the source spelling of a number
    std::u16string units;  // contents of a text literal
    double number = 0;
};

// A description of a token for error messages: "')'", "name 'x'", "end of input".
std::string describe(const Token& token);

// Raised for text that forms no token, and by the parser for a statement that
// doesn't parse. `atEnd` tells that the input ended too early, so that more
// lines could complete it.
struct SyntaxError {
    SourcePos pos;
    std::string expected;  // "expected ')' after the arguments, found ';'"
    bool atEnd = false;

    std::string message() const;  // "3:7: expected ..."
};

class Lexer {
public:
    explicit Lexer(std::string_view source);

    // The next token; throws SyntaxError for text that forms none.
    Token next();

    // Skips the rest of the line that holds `pos` and forgets every open
    // bracket, so that lexing can go on with the next line after an error.
    void restartAfterLine(const SourcePos& pos);

private:
    enum class Bracket { Paren, Square, Brace };

    char peekChar(std::size_t ahead = 0) const;
    void advance();
    bool skipBlanks();  // true when any blank, comment or continuation was skipped
    bool insideArrayBrackets() const;
    bool startsElementAfterBlank() const;
    Token make(TokenKind kind, const SourcePos& pos) const;
    Token lexNumber();
    Token lexIdentifier();
    Token lexText(char quote);
    Token lexOperator();
    [[noreturn]] void fail(const SourcePos& pos, std::string expected) const;

    std::string_view source_;
    SourcePos here_;
    std::vector<Bracket> brackets_;
    TokenKind previous_ = TokenKind::Newline;
};

}  // namespace bitcalc
