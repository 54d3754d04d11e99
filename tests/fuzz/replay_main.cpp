// Replays committed fuzz inputs through the checks of the fuzz targets, so that
// builds without libFuzzer run the seeds too.
// Usage: fuzz_replay TARGET=FOLDER...   (TARGET: a function's name, or bitcalc)
#include "tests/fuzz/entry_harness.hpp"

#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

// bitcalc's target, from calc_fuzz.cpp.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

int main(int argc, char** argv) {
    std::size_t inputs = 0;
    for (int i = 1; i < argc; ++i) {
        const std::string argument = argv[i];
        const std::string target = argument.substr(0, argument.find('='));
        const auto function = fuzzing::functionNamed(target);
        if (argument.find('=') == std::string::npos || (!function && target != "bitcalc")) {
            std::fprintf(stderr, "usage: %s TARGET=FOLDER...\n", argv[0]);
            return 2;
        }
        const std::filesystem::path folder = argument.substr(target.size() + 1);
        for (const auto& file : std::filesystem::directory_iterator(folder)) {
            std::ifstream stream(file.path(), std::ios::binary);
            const std::vector<std::uint8_t> bytes{std::istreambuf_iterator<char>(stream), {}};
            if (function) {
                fuzzing::checkCall(*function, bytes.data(), bytes.size());
            } else {
                LLVMFuzzerTestOneInput(bytes.data(), bytes.size());
            }
            ++inputs;
        }
    }
    std::printf("%zu inputs replayed\n", inputs);
    return inputs ? 0 : 1;
}
