// Loading a generated Yosys-style JSON netlist of 1,000,000 cells (LUT4 and flip-flop pairs),
// then writing and reading it as a native design file. Reports time, peak memory and memory
// per database object. LUN_BENCH_CELLS overrides the cell count; LUN_BENCH_COMPACT=1 writes the
// netlist without line breaks and indentation (half the size, like the netlists of other tools).
#include <benchmark/benchmark.h>
#include <malloc.h>
#include <unistd.h>

#include <chrono>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <memory>
#include <string>

#include "host/design/native_format.h"
#include "cpu_time.h"
#include "yosys_netlist_gen.h"
#include "host/design/yosys_reader.h"

namespace {

// LUN_BENCH_MODULES: a hierarchical netlist of that many submodules (default: flat).
int Modules() {
    const char* env = std::getenv("LUN_BENCH_MODULES");
    return env ? std::atoi(env) : 0;
}

int64_t CellCount() {
    const char* env = std::getenv("LUN_BENCH_CELLS");
    int64_t n = env ? std::atoll(env) : 1000000;
    return n < 2 ? 2 : n;
}

// Kilobytes of a /proc/self/status field (VmRSS, VmHWM).
int64_t StatusKb(const char* field) {
    FILE* f = std::fopen("/proc/self/status", "r");
    if (!f) return 0;
    char line[256];
    int64_t kb = 0;
    size_t len = std::strlen(field);
    while (std::fgets(line, sizeof line, f))
        if (std::strncmp(line, field, len) == 0 && line[len] == ':') kb = std::atoll(line + len + 1);
    std::fclose(f);
    return kb;
}

// Bytes the heap has handed out and not taken back (the design's own memory, unlike the
// resident size, which keeps pages the allocator holds for reuse).
int64_t HeapInUse() {
    struct mallinfo2 info = mallinfo2();
    return static_cast<int64_t>(info.uordblks + info.hblkhd);
}

// Restarts the peak resident size count (VmHWM) from the current size, after handing freed
// heap memory back so that it does not count.
void ResetPeak() {
    malloc_trim(0);
    if (FILE* f = std::fopen("/proc/self/clear_refs", "w")) {
        std::fputs("5", f);
        std::fclose(f);
    }
}

std::string TempPath(const char* suffix) {
    return (std::filesystem::temp_directory_path() /
            ("lun_netlist_bench_" + std::to_string(::getpid()) + suffix))
        .string();
}

// What one load cost: processor seconds and peak resident megabytes.
struct Cost {
    double cpu = 0, peak_mb = 0;
};

struct Shared {
    Cost netlist_load;
    uint64_t netlist_bytes = 0;
    std::unique_ptr<NetlistFile> netlist;
    std::unique_ptr<Ndm_Design> design;
    std::string native = TempPath(".lun");
    ~Shared() { std::filesystem::remove(native); }
};

Shared& State() {
    static Shared shared;
    return shared;
}

size_t Objects(const Ndm_Design& design) {
    Ndm_Design::Stats s = design.GetStats();
    return s.blocks + s.signals + s.pins + s.networks;
}

// Load time, heap held by the design per object, and the peak resident size while loading.
Cost Report(benchmark::State& state, const char* what, const Ndm_Design& design, int64_t heap_before,
            double seconds, double cpu) {
    int64_t heap = HeapInUse() - heap_before;
    int64_t peak = StatusKb("VmHWM");
    Ndm_Design::Stats s = design.GetStats();
    size_t objects = Objects(design);
    double per_object = objects ? static_cast<double>(heap) / static_cast<double>(objects) : 0;
    double names = static_cast<double>(s.name_bytes);
    state.counters["objects"] = static_cast<double>(objects);
    state.counters["bytes_per_object"] = per_object;
    state.counters["bytes_per_object_without_names"] = objects ? (static_cast<double>(heap) - names) / objects : 0;
    state.counters["peak_MB"] = static_cast<double>(peak) / 1024.0;
    state.counters["design_MB"] = static_cast<double>(heap) / (1 << 20);
    std::printf("%s: %.2f s (%.2f s CPU); %zu blocks, %zu signals, %zu pins, %zu networks; design %.0f MB "
                "(%.0f bytes per object, %.0f without the %.0f MB of names); peak resident %.0f MB\n",
                what, seconds, cpu, s.blocks, s.signals, s.pins, s.networks, static_cast<double>(heap) / (1 << 20),
                per_object, objects ? (static_cast<double>(heap) - names) / objects : 0, names / (1 << 20),
                static_cast<double>(peak) / 1024.0);
    return {cpu, static_cast<double>(peak) / 1024.0};
}

double Seconds(const std::chrono::steady_clock::time_point& start) {
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

void BM_LoadYosysJson(benchmark::State& state) {
    Shared& shared = State();
    if (!shared.netlist) {
        const char* compact = std::getenv("LUN_BENCH_COMPACT");
        shared.netlist = std::make_unique<NetlistFile>(CellCount(), Modules(), TempPath(".json"),
                                                       compact && std::strcmp(compact, "1") == 0);
        std::printf("netlist: %lld cells, %.0f MB of JSON in %s\n", static_cast<long long>(shared.netlist->cells()),
                    static_cast<double>(shared.netlist->bytes()) / (1 << 20), shared.netlist->path());
    }
    for (auto _ : state) {
        state.PauseTiming();
        shared.design.reset();
        int64_t heap_before = HeapInUse();
        ResetPeak();
        auto start = std::chrono::steady_clock::now();
        const double cpu = CpuSeconds();
        state.ResumeTiming();
        shared.design = Ndm_ReadYosysJson(shared.netlist->path(), nullptr);
        state.PauseTiming();
        if (!shared.design) {
            state.SkipWithError("the netlist did not load");
            break;
        }
        shared.netlist_load =
            Report(state, "Yosys JSON load", *shared.design, heap_before, Seconds(start), CpuSeconds() - cpu);
        shared.netlist_bytes = shared.netlist->bytes();
        std::printf("  targets for 1,000,000 cells: <= 1.0 s CPU, <= 450 MB peak\n");
        state.ResumeTiming();
    }
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * shared.netlist->bytes()));
}
BENCHMARK(BM_LoadYosysJson)->Iterations(1)->Unit(benchmark::kMillisecond)->UseRealTime();

void BM_WriteNative(benchmark::State& state) {
    Shared& shared = State();
    if (!shared.design) {
        state.SkipWithError("no design loaded");
        return;
    }
    for (auto _ : state) {
        if (!Ndm_WriteNative(*shared.design, shared.native.c_str())) state.SkipWithError("write failed");
    }
    uint64_t bytes = std::filesystem::file_size(shared.native);
    state.counters["file_MB"] = static_cast<double>(bytes) / (1 << 20);
    std::printf("native file: %.0f MB against the netlist's %.0f MB (target: not larger)\n",
                static_cast<double>(bytes) / (1 << 20), static_cast<double>(shared.netlist_bytes) / (1 << 20));
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations() * bytes));
}
BENCHMARK(BM_WriteNative)->Iterations(1)->Unit(benchmark::kMillisecond)->UseRealTime();

void BM_ReadNative(benchmark::State& state) {
    Shared& shared = State();
    if (!std::filesystem::exists(shared.native)) {
        state.SkipWithError("no native file written");
        return;
    }
    // The netlist is not needed any more; its design is dropped so the peak is the reader's.
    shared.netlist.reset();
    shared.design.reset();
    for (auto _ : state) {
        state.PauseTiming();
        int64_t heap_before = HeapInUse();
        ResetPeak();
        auto start = std::chrono::steady_clock::now();
        const double cpu = CpuSeconds();
        state.ResumeTiming();
        auto design = Ndm_ReadNative(shared.native.c_str());
        state.PauseTiming();
        if (!design) {
            state.SkipWithError("the native file did not load");
            break;
        }
        const Cost read = Report(state, "native read", *design, heap_before, Seconds(start), CpuSeconds() - cpu);
        std::printf("  against the netlist load: %.2f of its CPU time, %.2f of its peak (targets: <= 1)\n",
                    read.cpu / shared.netlist_load.cpu, read.peak_mb / shared.netlist_load.peak_mb);
        design.reset();
        state.ResumeTiming();
    }
}
BENCHMARK(BM_ReadNative)->Iterations(1)->Unit(benchmark::kMillisecond)->UseRealTime();

}  // namespace

BENCHMARK_MAIN();
