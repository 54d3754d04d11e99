// The lexer and parser: how text becomes trees and statements, syntax errors
// with their positions, recovery after an error, and inputs made at random.
#include "calc/parser.hpp"
#include "calc/text_join.hpp"
#include "calc/unicode_text.hpp"

#include <gtest/gtest.h>

#include <random>
#include <string>
#include <vector>

namespace bitcalc {
namespace {

// A tree as a prefix expression: "(+ 1 (- 2))", "[1 2; 3]", "bitand(x 'a')".
std::string treeText(const Expr& expr);

std::string listText(const std::vector<ExprPtr>& exprs) {
    std::string text;
    for (const ExprPtr& expr : exprs) text += joinText(text.empty() ? "" : " ", treeText(*expr));
    return text;
}

std::string treeText(const Expr& expr) {
    struct Printer {
        std::string operator()(const NumberLiteral& n) const {
            std::string text = std::to_string(n.value);
            text.erase(text.find_last_not_of('0') + 1);
            if (text.back() == '.') text.pop_back();
            return text;
        }
        std::string operator()(const NameRef& n) const { return n.name; }
        std::string operator()(const CharLiteral& t) const {
            return joinText("'", toUtf8(t.units), "'");
        }
        std::string operator()(const StringLiteral& t) const {
            return joinText("\"", toUtf8(t.units), "\"");
        }
        std::string operator()(const ArrayLiteral& a) const {
            std::string text = a.cell ? "{" : "[";
            for (std::size_t r = 0; r < a.rows.size(); ++r)
                text += joinText(r ? "; " : "", listText(a.rows[r]));
            return joinText(text, a.cell ? "}" : "]");
        }
        std::string operator()(const UnaryOp& u) const {
            static const char* names[] = {"neg", "plus", "ctranspose", "transpose"};
            return joinText("(", names[static_cast<int>(u.op)], " ", treeText(*u.operand), ")");
        }
        std::string operator()(const BinaryOp& b) const {
            static const char* names[] = {"+", "-", "*", "/", "^"};
            return joinText("(", names[static_cast<int>(b.op)], " ", treeText(*b.left), " ",
                            treeText(*b.right), ")");
        }
        std::string operator()(const RangeExpr& r) const {
            return joinText("(: ", treeText(*r.first),
                            r.step ? joinText(" ", treeText(*r.step)) : "", " ", treeText(*r.last),
                            ")");
        }
        std::string operator()(const CallExpr& c) const {
            return joinText(c.name, "(", listText(c.arguments), ")");
        }
    };
    return std::visit(Printer{}, expr.node);
}

std::vector<ParsedItem> parseAll(std::string_view source) {
    Parser parser(source);
    std::vector<ParsedItem> items;
    while (auto item = parser.next()) items.push_back(std::move(*item));
    return items;
}

// The one statement of `source` as a tree, or the syntax error's message.
std::string parsedText(std::string_view source) {
    const std::vector<ParsedItem> items = parseAll(source);
    if (items.size() != 1) return joinText("items: ", std::to_string(items.size()));
    if (const auto* error = std::get_if<SyntaxError>(&items.front()))
        return joinText("error ", error->message());
    return treeText(*std::get<Statement>(items.front()).value);
}

struct TreeCase {
    const char* source;
    const char* tree;
};

class ExpressionTree : public testing::TestWithParam<TreeCase> {};

TEST_P(ExpressionTree, Parses) {
    EXPECT_EQ(parsedText(GetParam().source), GetParam().tree) << GetParam().source;
}

INSTANTIATE_TEST_SUITE_P(
    Language, ExpressionTree,
    testing::Values(
        // Precedence and grouping.
        TreeCase{"1 + 2 * 3", "(+ 1 (* 2 3))"}, TreeCase{"-2^2", "(neg (^ 2 2))"},
        TreeCase{"2^3^2", "(^ (^ 2 3) 2)"}, TreeCase{"2^-1", "(^ 2 (neg 1))"},
        TreeCase{"1 - -1", "(- 1 (neg 1))"}, TreeCase{"(1 + 2) * 3", "(* (+ 1 2) 3)"},
        TreeCase{"1:2:10", "(: 1 2 10)"}, TreeCase{"1+1:5", "(: (+ 1 1) 5)"},
        TreeCase{"a .* b ./ c", "(/ (* a b) c)"}, TreeCase{"x.^2'", "(^ x (ctranspose 2))"},
        // Numbers.
        TreeCase{".5 + 1e3 + 1.5E-1", "(+ (+ 0.5 1000) 0.15)"}, TreeCase{"1.'", "(transpose 1)"},
        // Brackets: a blank separates elements unless an operator is binary.
        TreeCase{"[1 -2]", "[1 (neg 2)]"}, TreeCase{"[1 - 2]", "[(- 1 2)]"},
        TreeCase{"[1 -2 + 3]", "[1 (+ (neg 2) 3)]"}, TreeCase{"[a (1)]", "[a 1]"},
        TreeCase{"[f(1) 2]", "[f(1) 2]"}, TreeCase{"[a' b']", "[(ctranspose a) (ctranspose b)]"},
        TreeCase{"['a' 'b']", "['a' 'b']"}, TreeCase{"[1, 2; 3 4]", "[1 2; 3 4]"},
        TreeCase{"[1 2\n3 4]", "[1 2; 3 4]"}, TreeCase{"[1 2 % note\n 3]", "[1 2; 3]"},
        TreeCase{"[1 ...\n 2]", "[1 2]"}, TreeCase{"[]", "[]"}, TreeCase{"[;;]", "[]"},
        TreeCase{"{1, 'a'; \"s\" {}}", "{1 'a'; \"s\" {}}"},
        // Text.
        TreeCase{"'it''s'", "'it's'"}, TreeCase{"\"say \"\"hi\"\"\"", "\"say \"hi\"\""},
        TreeCase{"''", "''"}, TreeCase{"'caf\xC3\xA9'", "'caf\xC3\xA9'"},
        // Calls.
        TreeCase{"bitget(5, 9, 'uint8')", "bitget(5 9 'uint8')"},
        TreeCase{"bitset(uint8(0), 8)", "bitset(uint8(0) 8)"}, TreeCase{"f()", "f()"},
        TreeCase{"f (1)", "f(1)"}));

struct ErrorCase {
    const char* source;
    const char* message;
};

class SyntaxErrors : public testing::TestWithParam<ErrorCase> {};

TEST_P(SyntaxErrors, NamePositionAndExpectation) {
    EXPECT_EQ(parsedText(GetParam().source), GetParam().message);
}

INSTANTIATE_TEST_SUITE_P(
    Positions, SyntaxErrors,
    testing::Values(
        ErrorCase{"1 +", "error 1:4: expected a value, found end of input"},
        ErrorCase{"x = 5 6",
                  "error 1:7: expected an operator or the end of the statement, found number 6"},
        ErrorCase{"bitand(1, 2",
                  "error 1:12: expected ',' or ')' after an argument, found end of input"},
        ErrorCase{"bitand(1\n",
                  "error 1:9: expected ',' or ')' after an argument, found end of line"},
        ErrorCase{"y = 'abc",
                  "error 1:5: unterminated text: expected a closing ' before the end of the line"},
        ErrorCase{"a = 1 $ 2", "error 1:7: unexpected character '$'"},
        ErrorCase{"a = 1 \xC3\xA9", "error 1:7: unexpected character U+00E9"},
        ErrorCase{"'\xFF'", "error 1:1: text is not valid UTF-8"},
        ErrorCase{"5x",
                  "error 1:2: expected an operator or a separator after the number 5, found 'x'"},
        ErrorCase{"x = [1 2\n 3 +]", "error 2:5: expected a value, found ']'"},
        ErrorCase{"[1 2", "error 1:5: expected ',', ';' or ']', found end of input"},
        ErrorCase{"{1 2)", "error 1:5: expected ',', ';' or '}', found ')'"},
        ErrorCase{"[a, b] = 5",
                  "error 1:10: expected a function call on the right of a multiple assignment, "
                  "found number 5"},
        ErrorCase{"[a, 1] = f(x)", "error 1:5: expected a variable name, found number 1"},
        ErrorCase{"x == 1", "error 1:4: expected a value, found '='"},
        ErrorCase{"1 . 2", "error 1:3: unexpected '.'"}));

TEST(Statements, KindsTargetsAndDisplay) {
    const std::vector<ParsedItem> items =
        parseAll("a = 1, b = 2; c\n[p, q] = bitand(1, 2);  % comment\nbitcmp");
    ASSERT_EQ(items.size(), 5u);
    const auto& a = std::get<Statement>(items[0]);
    EXPECT_EQ(a.kind, Statement::Kind::Assignment);
    EXPECT_EQ(a.targets, std::vector<std::string>{"a"});
    EXPECT_TRUE(a.displayed);
    EXPECT_FALSE(std::get<Statement>(items[1]).displayed);
    EXPECT_EQ(std::get<Statement>(items[2]).kind, Statement::Kind::Expression);
    const auto& multiple = std::get<Statement>(items[3]);
    EXPECT_EQ(multiple.kind, Statement::Kind::MultipleAssignment);
    EXPECT_EQ(multiple.targets, (std::vector<std::string>{"p", "q"}));
    EXPECT_FALSE(multiple.displayed);
    EXPECT_EQ(std::get<Statement>(items[4]).pos.line, 3);
}

TEST(Statements, ArraysThatLookLikeOutputListsStayArrays) {
    EXPECT_EQ(parsedText("[a, b]"), "[a b]");
    EXPECT_EQ(parsedText("[a b] + 1"), "(+ [a b] 1)");
}

TEST(Recovery, GoesOnWithTheNextLine) {
    const std::vector<ParsedItem> items = parseAll("x = (1\ny = 2; z = [1 $\nw = 3");
    ASSERT_EQ(items.size(), 4u);
    EXPECT_TRUE(std::holds_alternative<SyntaxError>(items[0]));
    EXPECT_EQ(std::get<Statement>(items[1]).targets.front(), "y");
    EXPECT_EQ(std::get<SyntaxError>(items[2]).pos.line, 2);
    EXPECT_EQ(std::get<Statement>(items[3]).targets.front(), "w");
}

TEST(Limits, DeepNestingIsAnErrorNotACrash) {
    const std::string parentheses = joinText(std::string(300, '('), "1", std::string(300, ')'));
    EXPECT_EQ(parsedText(parentheses), "error 1:201: expression nested too deeply");
    std::string chain = "1";
    for (int i = 0; i < 3000; ++i) chain += "+1";
    EXPECT_NE(parsedText(chain).find("nested too deeply"), std::string::npos);
    EXPECT_NE(parsedText(joinText(std::string(5000, '-'), "1")).find("nested too deeply"),
              std::string::npos);
}

TEST(Continuation, OnlyAnOpenBracketAsksForMoreLines) {
    EXPECT_TRUE(needsMoreInput("x = [1 2\n"));
    EXPECT_TRUE(needsMoreInput("c = {1, 'a'\n"));
    EXPECT_FALSE(needsMoreInput("x = [1 2]\n"));
    EXPECT_FALSE(needsMoreInput("bitand(1,\n"));
    EXPECT_FALSE(needsMoreInput("1 +\n"));
}

// Random bytes, and random edits of statements in the language, never crash
// or hang the lexer and parser.
TEST(Fuzz, RandomAndMutatedInputsParse) {
    const std::vector<std::string> seeds = {
        "x = uint8([1 2 255]); bitshift(x, 1)", "[a, b] = bitget(5, 9, 'uint8')",
        "c = {1, \"s\"; 'x' []}", "y = -2^-2 .* (1:0.5:3)' % note", "z = [1 -2\n 3 ...\n 4]"};
    const std::string alphabet = "01.5e+-*/^'\"()[]{},;=:% \n\txyab~@\\";
    std::mt19937 random(12345);
    for (int round = 0; round < 20000; ++round) {
        std::string input;
        if (round % 2 == 0) {
            const std::size_t length = random() % 40;
            for (std::size_t i = 0; i < length; ++i) {
                input += round % 4 == 0 ? static_cast<char>(random() % 256)
                                        : alphabet[random() % alphabet.size()];
            }
        } else {
            input = seeds[random() % seeds.size()];
            for (int edit = 0, edits = 1 + static_cast<int>(random() % 4);
                 edit < edits && !input.empty(); ++edit) {
                const std::size_t at = random() % input.size();
                switch (random() % 3) {
                    case 0: input.erase(at, 1); break;
                    case 1: input.insert(at, 1, alphabet[random() % alphabet.size()]); break;
                    default: input[at] = alphabet[random() % alphabet.size()]; break;
                }
            }
        }
        std::size_t items = 0;
        Parser parser(input);
        while (parser.next()) ASSERT_LT(++items, 1000u) << input;
        (void)needsMoreInput(input);
    }
}

}  // namespace
}  // namespace bitcalc
