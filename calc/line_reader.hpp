// Reading statements at a terminal, with line editing and history.
#pragma once

#include <optional>
#include <string>

namespace bitcalc {

// One line typed at the terminal after `prompt`, without its line break, or
// nothing at the end of input. Lines are edited with libedit, and each
// non-blank one is added to the session's history.
std::optional<std::string> readTerminalLine(const char* prompt);

}  // namespace bitcalc
