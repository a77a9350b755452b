// Replays the seed corpus and every input that once failed through the fuzz entries, so that
// each build runs them without libFuzzer.
#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <iterator>
#include <fstream>
#include <ostream>
#include <string>
#include <vector>

#include "fuzz/fuzz_support.h"

namespace {

struct Target {
    const char* name;
    int (*entry)(const uint8_t*, size_t);
};

const Target kTargets[] = {{"annotate", LunFuzzAnnotate}, {"yosys", LunFuzzYosys},
                           {"native", LunFuzzNative},     {"filter", LunFuzzFilter},
                           {"repository", LunFuzzRepository}, {"extract", LunFuzzExtract}};

void PrintTo(const Target& target, std::ostream* out) { *out << target.name; }

class Replay : public ::testing::TestWithParam<Target> {};

TEST_P(Replay, CorpusAndRegressions) {
    size_t inputs = 0;
    for (const char* folder : {"corpus", "regressions"}) {
        const std::filesystem::path dir = std::filesystem::path(LUN_SOURCE_DIR) / "fuzz" / folder / GetParam().name;
        if (!std::filesystem::is_directory(dir)) continue;
        std::vector<std::filesystem::path> files;
        for (const auto& entry : std::filesystem::directory_iterator(dir))
            if (entry.is_regular_file()) files.push_back(entry.path());
        std::sort(files.begin(), files.end());
        for (const auto& file : files) {
            SCOPED_TRACE(file.string());
            std::ifstream in(file, std::ios::binary);
            const std::string bytes((std::istreambuf_iterator<char>(in)), std::istreambuf_iterator<char>());
            EXPECT_EQ(GetParam().entry(reinterpret_cast<const uint8_t*>(bytes.data()), bytes.size()), 0);
            ++inputs;
        }
    }
    EXPECT_GT(inputs, 0u);
}

INSTANTIATE_TEST_SUITE_P(Fuzz, Replay, ::testing::ValuesIn(kTargets),
                         [](const auto& info) { return std::string(info.param.name); });

}  // namespace
