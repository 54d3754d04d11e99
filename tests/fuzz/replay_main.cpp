// Replays committed fuzz inputs through the checks of the fuzz targets, so that
// builds without libFuzzer run the seed corpora too.
// Usage: fuzz_replay CORPUS_DIR, holding one folder of inputs per function.
#include "tests/fuzz/entry_harness.hpp"

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <vector>

int main(int argc, char** argv) {
    if (argc != 2) {
        std::fprintf(stderr, "usage: %s CORPUS_DIR\n", argv[0]);
        return 2;
    }
    std::size_t inputs = 0;
    for (const auto& folder : std::filesystem::directory_iterator(argv[1])) {
        const auto function = fuzzing::functionNamed(folder.path().filename().string());
        if (!function) continue;
        for (const auto& file : std::filesystem::directory_iterator(folder.path())) {
            std::ifstream stream(file.path(), std::ios::binary);
            const std::vector<unsigned char> bytes{std::istreambuf_iterator<char>(stream), {}};
            fuzzing::checkCall(*function, bytes.data(), bytes.size());
            ++inputs;
        }
    }
    std::printf("%zu inputs replayed\n", inputs);
    return inputs ? 0 : 1;
}
