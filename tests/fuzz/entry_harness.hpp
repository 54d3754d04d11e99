// Fuzzing of the exported entry points: the fuzz bytes become one call, with
// operands of every kind and now and then a failing allocation, and the call
// is checked against the reference model and for what it leaves behind.
#pragma once

#include "tests/reference/reference_model.hpp"

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>

namespace fuzzing {

// Runs the call that `data` describes and checks it; on any fault it prints
// the call and both outcomes and aborts.
void checkCall(reference::Function function, const std::uint8_t* data, std::size_t size);

// "bitand" ... "bitshift".
std::optional<reference::Function> functionNamed(std::string_view name);

}  // namespace fuzzing
