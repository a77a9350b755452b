// Annotation speed: a flat design of N cells (each with four pins and one output net) and a
// constraint file of 10,000 exact-name statements and 1,000 wildcard statements. Exact-name
// statements should cost the same on 100,000 and 1,000,000 cells. Group offsets: the cost of a
// file of N "TIMEGRP gN OFFSET" statements must grow linearly with N.
#include <benchmark/benchmark.h>
#include <malloc.h>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <fstream>
#include <memory>
#include <random>
#include <string>

#include "bench_designs.h"
#include "host/design/ndm.h"
#include "host/port/msgman.h"
#include "manager/lunmgr.h"

namespace {

std::unique_ptr<Ndm_Design> MakeDesign(int cells) { return MakeFlatDesign(cells); }

// Writes the constraint file; returns its path.
std::string WriteConstraints(int cells, int exact, int wildcard) {
    std::string path = "/tmp/lun_annotate_bench_" + std::to_string(cells) + ".ucf";
    std::ofstream out(path);
    std::mt19937 rng(7);
    std::uniform_int_distribution<int> pick(0, cells - 1);
    for (int i = 0; i < exact; ++i) {
        int k = pick(rng);
        if (i % 2)
            out << "INST cell_" << k << " LOC = SITE_X" << (k % 97) << "Y" << (k % 89) << ";\n";
        else
            out << "NET n_" << k << " IOSTANDARD = LVCMOS33 | TNM_NET = grp" << (k % 13) << ";\n";
    }
    for (int i = 0; i < wildcard; ++i)
        out << "INST \"cell_" << (1000 + pick(rng) % 9000) << "*\" TNM = wgrp" << (i % 7) << ";\n";
    return path;
}

void Annotate(benchmark::State& state, bool wildcards) {
    const int cells = static_cast<int>(state.range(0));
    const int exact = wildcards ? 0 : 10000;
    const int wild = wildcards ? 1000 : 0;
    auto design = MakeDesign(cells);
    std::string file = WriteConstraints(cells, exact, wild);
    Port_MsgCapture quiet;
    // The name indexes of a block are built on its first lookup, once per design: time that
    // separately so the loop shows the cost per statement.
    auto start = std::chrono::steady_clock::now();
    {
        std::string warm = "/tmp/lun_annotate_bench_warm.ucf";
        std::ofstream(warm) << "INST cell_0 LOC = SITE_X0Y0;\nNET n_0 IOSTANDARD = LVCMOS33;\n";
        Ta_LunMgr mgr(warm.c_str(), CP_UCF, nullptr);
        mgr.annotate(design->GetViewByName("EXPANDED"));
        std::remove(warm.c_str());
    }
    state.counters["index_build_ms"] =
        std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now() - start).count();
    for (auto _ : state) {
        Ta_LunMgr mgr(file.c_str(), CP_UCF, nullptr);
        mgr.annotate(design->GetViewByName("EXPANDED"));
    }
    state.counters["statements_per_s"] =
        benchmark::Counter(static_cast<double>(exact + wild), benchmark::Counter::kIsIterationInvariantRate);
    std::remove(file.c_str());
}

// N group offsets, each a new timing entry whose name is tested against the entries before
// it: the test must use an index (target: 100,000 in well under a second).
void BM_GroupOffsets(benchmark::State& state) {
    const int count = static_cast<int>(state.range(0));
    std::string file = "/tmp/lun_annotate_bench_offsets.ucf";
    {
        std::ofstream out(file);
        for (int i = 0; i < count; ++i) out << "TIMEGRP g" << i << " OFFSET = IN 1 ns BEFORE clk;\n";
    }
    Port_MsgCapture quiet;
    for (auto _ : state) {
        state.PauseTiming();
        auto design = MakeDesign(1);
        state.ResumeTiming();
        Ta_LunMgr mgr(file.c_str(), CP_UCF, nullptr);
        mgr.annotate(design->GetViewByName("EXPANDED"));
        state.PauseTiming();
        design.reset();
        state.ResumeTiming();
    }
    state.counters["statements_per_s"] =
        benchmark::Counter(static_cast<double>(count), benchmark::Counter::kIsIterationInvariantRate);
    std::remove(file.c_str());
}

// One wildcard statement with one or two constraints matching every one of N instances: the
// cost of attaching the same constraint to many objects (target: <= 0.2 us and <= 24 heap bytes
// an object, names and equal values shared rather than copied).
void MassAttach(benchmark::State& state, int constraints) {
    const int cells = static_cast<int>(state.range(0));
    std::string file = "/tmp/lun_annotate_bench_mass.ucf";
    std::ofstream(file) << (constraints == 1 ? "INST \"cell_*\" TNM = all_cells;\n"
                                             : "INST \"cell_*\" TNM = all_cells | AREA_GROUP = ag_all;\n");
    Port_MsgCapture quiet;
    double seconds = 0, bytes = 0;
    for (auto _ : state) {
        state.PauseTiming();
        auto design = MakeDesign(cells);
        {  // the name indexes, built by the first lookups, are not what is measured
            std::string warm = "/tmp/lun_annotate_bench_warm.ucf";
            std::ofstream(warm) << "INST cell_0 LOC = SITE_X0Y0;\nINST \"cell_x*\" LOC = SITE_X0Y1;\n";
            Ta_LunMgr mgr(warm.c_str(), CP_UCF, nullptr);
            mgr.annotate(design->GetViewByName("EXPANDED"));
            std::remove(warm.c_str());
        }
        const size_t heap_before = mallinfo2().uordblks;
        state.ResumeTiming();
        auto start = std::chrono::steady_clock::now();
        {
            Ta_LunMgr mgr(file.c_str(), CP_UCF, nullptr);
            mgr.annotate(design->GetViewByName("EXPANDED"));
        }
        seconds = std::chrono::duration<double>(std::chrono::steady_clock::now() - start).count();
        state.PauseTiming();
        // The first run counts what later runs find free again: the handles of the objects.
        bytes = std::max(bytes, static_cast<double>(mallinfo2().uordblks - heap_before));
        design.reset();
        state.ResumeTiming();
    }
    const double per_object_ns = seconds / cells / constraints * 1e9, per_object_bytes = bytes / cells / constraints;
    state.counters["ns_per_object"] = per_object_ns;
    state.counters["bytes_per_object"] = per_object_bytes;
    std::printf("%d instances matched by one pattern of %d constraint%s: %.3f us (target <= 0.2) and %.1f heap bytes "
                "(target <= 24) for each constraint attached to an object\n",
                cells, constraints, constraints == 1 ? "" : "s", per_object_ns / 1000, per_object_bytes);
    std::remove(file.c_str());
}

void BM_MassAttach(benchmark::State& state) { MassAttach(state, 2); }
void BM_MassAttachOne(benchmark::State& state) { MassAttach(state, 1); }

void BM_ExactNames(benchmark::State& state) { Annotate(state, false); }
void BM_WildcardNames(benchmark::State& state) { Annotate(state, true); }

}  // namespace

BENCHMARK(BM_ExactNames)->Arg(100000)->Arg(1000000)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(BM_WildcardNames)->Arg(100000)->Arg(1000000)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(BM_MassAttachOne)->Arg(30000)->Arg(300000)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(BM_MassAttach)->Arg(30000)->Arg(300000)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK(BM_GroupOffsets)->Arg(20000)->Arg(100000)->Unit(benchmark::kMillisecond)->Iterations(3);
BENCHMARK_MAIN();
