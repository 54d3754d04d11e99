// Golden case files.
#include "calc/golden_check.hpp"

#include "calc/display.hpp"
#include "calc/evaluator.hpp"
#include "calc/text_join.hpp"

#include <ostream>
#include <sstream>
#include <string>
#include <vector>

namespace bitcalc {

namespace {

struct GoldenCase {
    std::size_t line = 0;
    std::string statements;
    std::vector<std::string> expected;
};

std::vector<std::string> splitLines(std::string_view text) {
    std::vector<std::string> lines;
    std::size_t start = 0;
    while (start < text.size()) {
        std::size_t end = text.find('\n', start);
        if (end == std::string_view::npos) end = text.size();
        std::string line(text.substr(start, end - start));
        if (!line.empty() && line.back() == '\r') line.pop_back();
        lines.push_back(std::move(line));
        start = end + 1;
    }
    return lines;
}

// The case lines of a Markdown file: those of the fenced blocks whose first
// line begins with ">>". Every other line is left blank, so that a report's
// line numbers are the file's own.
std::string casesOfMarkdown(std::string_view content) {
    std::string cases;
    bool inBlock = false, atBlockStart = false, caseBlock = false;
    for (const std::string& line : splitLines(content)) {
        if (line.starts_with("```")) {
            inBlock = !inBlock;
            atBlockStart = inBlock;
            caseBlock = false;
        } else if (inBlock) {
            if (atBlockStart) caseBlock = line.starts_with(">>");
            atBlockStart = false;
            if (caseBlock) cases += line;
        }
        cases += '\n';
    }
    return cases;
}

std::vector<GoldenCase> parseCases(std::string_view content) {
    std::vector<GoldenCase> cases;
    const std::vector<std::string> lines = splitLines(content);
    bool continuing = false;
    for (std::size_t i = 0; i < lines.size(); ++i) {
        const std::string& line = lines[i];
        if (line.starts_with(">>")) {
            cases.push_back({i + 1, line.substr(line.starts_with(">> ") ? 3 : 2), {}});
            continuing = true;
        } else if (continuing && line.starts_with("..")) {
            cases.back().statements += '\n';
            cases.back().statements += line.substr(line.starts_with(".. ") ? 3 : 2);
        } else {
            continuing = false;
            if (line.find_first_not_of(" \t") == std::string::npos || line.starts_with("%"))
                continue;
            if (cases.empty()) {
                cases.push_back({i + 1, "", {}});  // output with no statement fails the check
            }
            cases.back().expected.push_back(line);
        }
    }
    return cases;
}

}  // namespace

GoldenResult checkGoldenCases(std::string_view content, std::string_view fileName,
                              std::ostream& report) {
    GoldenResult result;
    std::ostringstream output;
    const auto display = makeCanonicalDisplay(output);
    Evaluator evaluator(*display);
    const std::vector<GoldenCase> cases =
        fileName.ends_with(".md") ? parseCases(casesOfMarkdown(content)) : parseCases(content);
    for (const GoldenCase& goldenCase : cases) {
        ++result.cases;
        output.str("");
        evaluator.run(goldenCase.statements, true);
        const std::vector<std::string> actual = splitLines(output.str());
        if (actual == goldenCase.expected) continue;
        ++result.failures;
        report << fileName << ":" << goldenCase.line << ": >> " << goldenCase.statements << "\n";
        for (const std::string& line : goldenCase.expected)
            report << "  expected: " << line << "\n";
        for (const std::string& line : actual) report << "  actual:   " << line << "\n";
    }
    return result;
}

}  // namespace bitcalc
