// libFuzzer target over bitcalc's statements: lexer, parser, evaluator and
// both displays, with host storage capped so that no statement can ask for
// more memory than the machine has.
#include "calc/display.hpp"
#include "calc/evaluator.hpp"
#include "host/array_factory.hpp"
#include "host/host_control.hpp"

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <sstream>
#include <string_view>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    host::limitStorageBytes(std::size_t{1} << 20);
    const std::string_view source(reinterpret_cast<const char*>(data), size);
    const std::size_t liveBefore = host::liveArrayCount();
    {
        std::ostringstream out, errors;
        const auto canonical = bitcalc::makeCanonicalDisplay(out);
        bitcalc::Evaluator(*canonical).run(source, true);
        const auto human = bitcalc::makeHumanDisplay(out, errors);
        bitcalc::Evaluator(*human).run(source, false);
    }
    host::limitStorageBytes(0);
    if (host::liveArrayCount() != liveBefore) {
        std::fprintf(stderr, "*** bitcalc: array records leaked\n");
        std::abort();
    }
    return 0;
}
