// Loading a generated Yosys-style JSON netlist of 1,000,000 cells (LUT4 and flip-flop pairs),
// then writing and reading it as a native design file. Reports time, peak memory and memory
// per database object. LUN_BENCH_CELLS overrides the cell count.
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
#include "host/design/yosys_reader.h"

namespace {

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

// Writes the netlist the way `yosys write_json` lays it out. Cells come in pairs: a LUT4 whose
// output drives the D input of a flip-flop; LUT inputs come from flip-flop outputs and the
// primary inputs. Flip-flop outputs form 32-bit public buses r<k>, LUT outputs have hidden
// generated names.
class NetlistFile {
public:
    explicit NetlistFile(int64_t cells) : path_(TempPath(".json")), pairs_(cells / 2) {
        FILE* f = std::fopen(path_.c_str(), "wb");
        if (!f) return;
        out_ = f;
        buf_.reserve(1 << 20);
        Write();
        Flush();
        std::fclose(f);
        bytes_ = std::filesystem::file_size(path_);
    }
    ~NetlistFile() { std::filesystem::remove(path_); }
    const char* path() const { return path_.c_str(); }
    uint64_t bytes() const { return bytes_; }
    int64_t cells() const { return pairs_ * 2; }

private:
    static constexpr int kInputs = 64;
    static constexpr int kOutputs = 64;
    // Bit numbers: 2 clk, 3 rst, inputs, then per pair the LUT output and the flip-flop output.
    int64_t InputBit(int64_t i) const { return 4 + i; }
    int64_t LutBit(int64_t p) const { return 4 + kInputs + 2 * p; }
    int64_t FfBit(int64_t p) const { return 5 + kInputs + 2 * p; }
    int64_t OutputBit(int64_t i) const { return FfBit(pairs_ - 1 - (i % pairs_)); }

    uint64_t Next() {
        rng_ ^= rng_ << 13;
        rng_ ^= rng_ >> 7;
        rng_ ^= rng_ << 17;
        return rng_;
    }
    int64_t LutInput() {
        uint64_t r = Next();
        if (r % 16 == 0) return InputBit(static_cast<int64_t>((r >> 8) % kInputs));
        return FfBit(static_cast<int64_t>((r >> 8) % static_cast<uint64_t>(pairs_)));
    }

    void Put(const char* text) {
        buf_ += text;
        if (buf_.size() > (1 << 20) - 4096) Flush();
    }
    void Put(int64_t n) { buf_ += std::to_string(n); }
    void Flush() {
        std::fwrite(buf_.data(), 1, buf_.size(), out_);
        buf_.clear();
    }
    void Bits(int64_t first, int64_t count, int64_t step) {
        Put("[ ");
        for (int64_t i = 0; i < count; ++i) {
            if (i) Put(", ");
            Put(first + i * step);
        }
        Put(" ]");
    }

    void Write() {
        Put("{\n  \"creator\": \"Yosys-style generator\",\n  \"modules\": {\n    \"top\": {\n"
            "      \"attributes\": {\n        \"top\": \"00000000000000000000000000000001\",\n"
            "        \"src\": \"gen.v:1.1-9.10\"\n      },\n      \"ports\": {\n");
        Put("        \"clk\": {\n          \"direction\": \"input\",\n          \"bits\": [ 2 ]\n        },\n");
        Put("        \"rst\": {\n          \"direction\": \"input\",\n          \"bits\": [ 3 ]\n        },\n");
        Put("        \"in\": {\n          \"direction\": \"input\",\n          \"bits\": ");
        Bits(InputBit(0), kInputs, 1);
        Put("\n        },\n        \"out\": {\n          \"direction\": \"output\",\n          \"bits\": [ ");
        for (int i = 0; i < kOutputs; ++i) {
            if (i) Put(", ");
            Put(OutputBit(i));
        }
        Put(" ]\n        }\n      },\n      \"cells\": {\n");
        for (int64_t p = 0; p < pairs_; ++p) {
            Put(p ? ",\n" : "");
            Put("        \"$abc$7$auto$lut");
            Put(p);
            Put("\": {\n          \"hide_name\": 1,\n          \"type\": \"LUT4\",\n          \"parameters\": {\n"
                "            \"INIT\": \"0110100110010110\"\n          },\n          \"attributes\": {\n"
                "          },\n          \"port_directions\": {\n            \"I0\": \"input\",\n"
                "            \"I1\": \"input\",\n            \"I2\": \"input\",\n            \"I3\": \"input\",\n"
                "            \"O\": \"output\"\n          },\n          \"connections\": {\n");
            const char* lut_pins[] = {"I0", "I1", "I2", "I3"};
            for (const char* pin : lut_pins) {
                Put("            \"");
                Put(pin);
                Put("\": [ ");
                Put(LutInput());
                Put(" ],\n");
            }
            Put("            \"O\": [ ");
            Put(LutBit(p));
            Put(" ]\n          }\n        },\n");
            Put("        \"r");
            Put(p / 32);
            Put("_reg[");
            Put(p % 32);
            Put("]\": {\n          \"hide_name\": 0,\n          \"type\": \"FDRE\",\n          \"parameters\": {\n"
                "            \"INIT\": \"0\"\n          },\n          \"attributes\": {\n"
                "            \"src\": \"gen.v:5.3-5.40\"\n          },\n          \"port_directions\": {\n"
                "            \"C\": \"input\",\n            \"CE\": \"input\",\n            \"D\": \"input\",\n"
                "            \"Q\": \"output\",\n            \"R\": \"input\"\n          },\n"
                "          \"connections\": {\n            \"C\": [ 2 ],\n            \"CE\": [ \"1\" ],\n"
                "            \"D\": [ ");
            Put(LutBit(p));
            Put(" ],\n            \"Q\": [ ");
            Put(FfBit(p));
            Put(" ],\n            \"R\": [ 3 ]\n          }\n        }");
        }
        Put("\n      },\n      \"netnames\": {\n");
        Put("        \"clk\": {\n          \"hide_name\": 0,\n          \"bits\": [ 2 ]\n        },\n");
        Put("        \"rst\": {\n          \"hide_name\": 0,\n          \"bits\": [ 3 ]\n        },\n");
        Put("        \"in\": {\n          \"hide_name\": 0,\n          \"bits\": ");
        Bits(InputBit(0), kInputs, 1);
        Put("\n        },\n        \"out\": {\n          \"hide_name\": 0,\n          \"bits\": [ ");
        for (int i = 0; i < kOutputs; ++i) {
            if (i) Put(", ");
            Put(OutputBit(i));
        }
        Put(" ]\n        }");
        for (int64_t p = 0; p < pairs_; ++p) {
            Put(",\n        \"$abc$7$n");
            Put(LutBit(p));
            Put("\": {\n          \"hide_name\": 1,\n          \"bits\": [ ");
            Put(LutBit(p));
            Put(" ]\n        }");
        }
        for (int64_t p = 0; p < pairs_; p += 32) {
            int64_t width = pairs_ - p < 32 ? pairs_ - p : 32;
            Put(",\n        \"r");
            Put(p / 32);
            Put("\": {\n          \"hide_name\": 0,\n          \"bits\": ");
            Bits(FfBit(p), width, 2);
            Put(",\n          \"attributes\": {\n            \"src\": \"gen.v:3.14-3.15\"\n          }\n        }");
        }
        Put("\n      }\n    }\n  }\n}\n");
    }

    std::string path_;
    int64_t pairs_;
    FILE* out_ = nullptr;
    std::string buf_;
    uint64_t rng_ = 0x9E3779B97F4A7C15ull;
    uint64_t bytes_ = 0;
};

struct Shared {
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
void Report(benchmark::State& state, const char* what, const Ndm_Design& design, int64_t heap_before,
            double seconds) {
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
    std::printf("%s: %.2f s; %zu blocks, %zu signals, %zu pins, %zu networks; design %.0f MB "
                "(%.0f bytes per object, %.0f without the %.0f MB of names); peak resident %.0f MB\n",
                what, seconds, s.blocks, s.signals, s.pins, s.networks, static_cast<double>(heap) / (1 << 20),
                per_object, objects ? (static_cast<double>(heap) - names) / objects : 0, names / (1 << 20),
                static_cast<double>(peak) / 1024.0);
}

double Seconds(const std::chrono::steady_clock::time_point& start) {
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
}

void BM_LoadYosysJson(benchmark::State& state) {
    Shared& shared = State();
    if (!shared.netlist) {
        shared.netlist = std::make_unique<NetlistFile>(CellCount());
        std::printf("netlist: %lld cells, %.0f MB of JSON in %s\n", static_cast<long long>(shared.netlist->cells()),
                    static_cast<double>(shared.netlist->bytes()) / (1 << 20), shared.netlist->path());
    }
    for (auto _ : state) {
        state.PauseTiming();
        shared.design.reset();
        int64_t heap_before = HeapInUse();
        ResetPeak();
        auto start = std::chrono::steady_clock::now();
        state.ResumeTiming();
        shared.design = Ndm_ReadYosysJson(shared.netlist->path(), nullptr);
        state.PauseTiming();
        if (!shared.design) {
            state.SkipWithError("the netlist did not load");
            break;
        }
        Report(state, "Yosys JSON load", *shared.design, heap_before, Seconds(start));
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
        state.ResumeTiming();
        auto design = Ndm_ReadNative(shared.native.c_str());
        state.PauseTiming();
        if (!design) {
            state.SkipWithError("the native file did not load");
            break;
        }
        Report(state, "native read", *design, heap_before, Seconds(start));
        design.reset();
        state.ResumeTiming();
    }
}
BENCHMARK(BM_ReadNative)->Iterations(1)->Unit(benchmark::kMillisecond)->UseRealTime();

}  // namespace

BENCHMARK_MAIN();
