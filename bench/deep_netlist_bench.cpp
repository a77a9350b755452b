// A chain of nested modules 10,000 and 100,000 levels deep (each level a module instantiating
// the next): loading the netlist, then writing and reading it as a native design file. The
// cost per level must not grow with the depth: the time per level and the file bytes per level
// are printed for both depths.
#include <benchmark/benchmark.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <map>
#include <memory>
#include <string>

#include "host/design/native_format.h"
#include "host/design/yosys_reader.h"
#include "tests/support/chain_netlist.h"

namespace {

std::string TempPath(int levels, const char* suffix) {
    return (std::filesystem::temp_directory_path() /
            ("lun_deep_bench_" + std::to_string(::getpid()) + "_" + std::to_string(levels) + suffix))
        .string();
}

// The netlist and native file of one depth, made once and removed at exit.
struct Files {
    explicit Files(int levels) : netlist(TempPath(levels, ".json")), native(TempPath(levels, ".qdf")) {
        std::ofstream(netlist, std::ios::binary) << lun_test::ChainNetlist(levels);
    }
    ~Files() {
        std::filesystem::remove(netlist);
        std::filesystem::remove(native);
    }
    std::string netlist, native;
};

Files& FilesOf(int levels) {
    static std::map<int, std::unique_ptr<Files>> files;
    std::unique_ptr<Files>& slot = files[levels];
    if (!slot) slot = std::make_unique<Files>(levels);
    return *slot;
}

// Seconds per level (printed with an SI prefix: 5u is 5 microseconds).
void PerLevel(benchmark::State& state, int levels) {
    state.counters["s_per_level"] = benchmark::Counter(
        static_cast<double>(levels), benchmark::Counter::kIsIterationInvariantRate | benchmark::Counter::kInvert);
}

void BM_DeepLoad(benchmark::State& state) {
    const int levels = static_cast<int>(state.range(0));
    Files& files = FilesOf(levels);
    for (auto _ : state) {
        auto design = Ndm_ReadYosysJson(files.netlist.c_str(), nullptr);
        if (!design) state.SkipWithError("the netlist did not load");
    }
    PerLevel(state, levels);
}
BENCHMARK(BM_DeepLoad)->Arg(10000)->Arg(100000)->Unit(benchmark::kMillisecond)->UseRealTime();

void BM_DeepNativeRoundTrip(benchmark::State& state) {
    const int levels = static_cast<int>(state.range(0));
    Files& files = FilesOf(levels);
    auto design = Ndm_ReadYosysJson(files.netlist.c_str(), nullptr);
    if (!design) {
        state.SkipWithError("the netlist did not load");
        return;
    }
    for (auto _ : state) {
        if (!Ndm_WriteNative(*design, files.native.c_str()) || !Ndm_ReadNative(files.native.c_str()))
            state.SkipWithError("the round trip failed");
    }
    const double bytes = static_cast<double>(std::filesystem::file_size(files.native));
    state.counters["file_bytes_per_level"] = bytes / levels;
    PerLevel(state, levels);
}
BENCHMARK(BM_DeepNativeRoundTrip)->Arg(10000)->Arg(100000)->Unit(benchmark::kMillisecond)->UseRealTime();

}  // namespace

BENCHMARK_MAIN();
