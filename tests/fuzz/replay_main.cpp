// Replays committed fuzz inputs through the checks of the fuzz targets, so that
// builds without libFuzzer run the seeds too, and as many calls again made of
// random bytes (a fixed sequence) for each function named.
// Usage: fuzz_replay [random=COUNT] TARGET=FOLDER...   (TARGET: a function, or bitcalc)
#include "tests/fuzz/entry_harness.hpp"

#include <cstdint>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>
#include <string>
#include <vector>

// bitcalc's target, from calc_fuzz.cpp.
extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

int main(int argc, char** argv) {
    std::size_t inputs = 0, randomCalls = 0;
    for (int i = 1; i < argc; ++i) {
        const std::string argument = argv[i];
        if (argument.starts_with("random=")) {
            randomCalls = std::stoul(argument.substr(7));
            continue;
        }
        const std::string target = argument.substr(0, argument.find('='));
        const auto function = fuzzing::functionNamed(target);
        if (argument.find('=') == std::string::npos || (!function && target != "bitcalc")) {
            std::fprintf(stderr, "usage: %s [random=COUNT] TARGET=FOLDER...\n", argv[0]);
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
        std::vector<std::uint8_t> bytes(256);
        std::mt19937_64 random(target.size());
        for (std::size_t call = 0; function && call < randomCalls; ++call, ++inputs) {
            for (auto& byte : bytes) byte = static_cast<std::uint8_t>(random());
            fuzzing::checkCall(*function, bytes.data(), random() % bytes.size());
        }
    }
    std::printf("%zu inputs replayed\n", inputs);
    return inputs ? 0 : 1;
}
