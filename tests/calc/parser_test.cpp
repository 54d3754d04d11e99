// The lexer and parser where the golden cases can't look: syntax errors with
// their positions, literals kept as values, recovery after an error, limits
// and how much the parser reads.
#include "calc/parser.hpp"
#include "calc/text_join.hpp"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace bitcalc {
namespace {

std::vector<ParsedItem> parseAll(std::string_view source) {
    Parser parser(source);
    std::vector<ParsedItem> items;
    while (auto item = parser.next()) items.push_back(std::move(*item));
    return items;
}

// The syntax error of a one-statement `source`, or what was found instead.
std::string errorOf(std::string_view source) {
    const std::vector<ParsedItem> items = parseAll(source);
    if (items.size() != 1) return joinText("items: ", std::to_string(items.size()));
    if (const auto* error = std::get_if<SyntaxError>(&items.front())) return error->message();
    return "no error";
}

struct ErrorCase {
    const char* source;
    const char* message;
};

class SyntaxErrors : public testing::TestWithParam<ErrorCase> {};

TEST_P(SyntaxErrors, NamePositionAndExpectation) {
    EXPECT_EQ(errorOf(GetParam().source), GetParam().message);
}

INSTANTIATE_TEST_SUITE_P(
    Positions, SyntaxErrors,
    testing::Values(
        ErrorCase{"1 +", "1:4: expected a value, found end of input"},
        ErrorCase{"bitand(1\n", "1:9: expected ',' or ')' after an argument, found end of line"},
        ErrorCase{"y = 'abc",
                  "1:5: unterminated text: expected a closing ' before the end of the line"},
        ErrorCase{"a = 1 \xC3\xA9", "1:7: unexpected character U+00E9"},
        ErrorCase{"'\xFF'", "1:1: text is not valid UTF-8"},
        ErrorCase{"5x", "1:2: expected an operator or a separator after the number 5, found 'x'"},
        ErrorCase{"x = [1 2\n 3 +]", "2:5: expected a value, found ']'"},
        ErrorCase{"[a, b] = 5",
                  "1:10: expected a function call on the right of a multiple assignment, "
                  "found number 5"},
        ErrorCase{"[a] = f(1)'",
                  "1:7: expected a function call on the right of a multiple assignment, "
                  "found name 'f'"},
        ErrorCase{"[a, 1] = f(x)",
                  "1:1: expected variable names in one row, such as [a, b], before '='"},
        ErrorCase{"[a b] + 1 = f(x)",
                  "1:11: expected an operator or the end of the statement, found '='"}));

// Numbers in brackets are kept as values, not as a tree each: a literal of
// a million numbers mustn't cost a million trees.
TEST(Statements, ArrayLiteralsKeepNumbersAsValues) {
    const std::vector<ParsedItem> items = parseAll("[1 -2 x; 3, 4 5\n]");
    ASSERT_EQ(items.size(), 1u);
    const auto& literal = std::get<ArrayLiteral>(std::get<Statement>(items[0]).value->node);
    EXPECT_EQ(literal.rowLengths, (std::vector<std::size_t>{3, 3}));
    EXPECT_EQ(literal.numbers, (std::vector<double>{1, -2, 3, 4, 5}));
    EXPECT_EQ(literal.trees.size(), 1u);
}

TEST(Recovery, GoesOnAfterTheLineOfTheError) {
    const std::vector<ParsedItem> items =
        parseAll("x = (1\ny = 2; z = [1 $\nw = 3\n[a\n 1] = f\nv = 4");
    ASSERT_EQ(items.size(), 6u);
    EXPECT_TRUE(std::holds_alternative<SyntaxError>(items[0]));
    EXPECT_EQ(std::get<Statement>(items[1]).targets.front(), "y");
    EXPECT_EQ(std::get<SyntaxError>(items[2]).pos.line, 2);
    EXPECT_EQ(std::get<Statement>(items[3]).targets.front(), "w");
    // An error found once a bracket over two lines has closed: parsing goes
    // on after the second line, not inside the bracket.
    EXPECT_EQ(std::get<SyntaxError>(items[4]).pos.line, 4);
    EXPECT_EQ(std::get<Statement>(items[5]).targets.front(), "v");
}

// Each line opens a bracket that never closes: after each error the parser
// must not read on to the end of the input and back again.
TEST(Recovery, ReadsEachTokenABoundedNumberOfTimes) {
    std::string source;
    for (int line = 0; line < 500; ++line) source += "[1 +* 2\n";
    Parser parser(source);
    std::size_t errors = 0;
    while (auto item = parser.next()) errors += std::holds_alternative<SyntaxError>(*item);
    EXPECT_EQ(errors, 500u);
    EXPECT_LE(parser.tokensRead(), 2 * 6 * 500u);  // 6 tokens a line
}

TEST(Limits, DeepNestingIsAnErrorNotACrash) {
    const std::string parentheses = joinText(std::string(300, '('), "1", std::string(300, ')'));
    EXPECT_EQ(errorOf(parentheses), "1:201: expression nested too deeply");
    std::string chain = "1";
    for (int i = 0; i < 3000; ++i) chain += "+1";
    EXPECT_NE(errorOf(chain).find("nested too deeply"), std::string::npos);
}

TEST(Continuation, OnlyAnOpenBracketAsksForMoreLines) {
    EXPECT_TRUE(needsMoreInput("x = [1 2\n"));
    EXPECT_FALSE(needsMoreInput("x = [1 2]\n"));
    EXPECT_FALSE(needsMoreInput("bitand(1,\n"));
}

}  // namespace
}  // namespace bitcalc
