// libFuzzer target over one entry point; the build names the function.
#include "tests/fuzz/entry_harness.hpp"

#include <cstddef>
#include <cstdint>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    static const reference::Function function = *fuzzing::functionNamed(FUZZED_FUNCTION);
    fuzzing::checkCall(function, data, size);
    return 0;
}
