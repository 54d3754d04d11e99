// Golden case files: statements with the exact canonical output expected of
// them, checked by running them through the evaluator.
//
// Format: a line ">> STATEMENTS" holds the statements of one case; lines
// ".. MORE" right after it continue them on a new line; the lines that
// follow, up to the next case, are the expected canonical output, one line
// each. Blank lines and lines starting with '%' are passed over. All cases
// of a file run in one session, so variables carry over, and an error
// doesn't stop the cases after it. In a Markdown file (a name ending in
// ".md") only the fenced blocks whose first line begins with ">>" are read.
#pragma once

#include <cstddef>
#include <iosfwd>
#include <string_view>

namespace bitcalc {

struct GoldenResult {
    std::size_t cases = 0;
    std::size_t failures = 0;
};

// Runs the cases of `content` and reports each mismatch on `report` as
// "FILE:LINE: ..." with the expected and the actual lines.
GoldenResult checkGoldenCases(std::string_view content, std::string_view fileName,
                              std::ostream& report);

}  // namespace bitcalc
