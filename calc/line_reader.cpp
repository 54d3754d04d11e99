// Reading statements at a terminal, with line editing and history.
#include "calc/line_reader.hpp"

#include <editline/readline.h>

#include <cstdlib>
#include <memory>

namespace bitcalc {

std::optional<std::string> readTerminalLine(const char* prompt) {
    const std::unique_ptr<char, decltype(&std::free)> line(readline(prompt), &std::free);
    if (!line) return std::nullopt;
    std::string text(line.get());
    if (text.find_first_not_of(" \t") != std::string::npos) add_history(line.get());
    return text;
}

}  // namespace bitcalc
