// The constraint repository on generated designs: load and resolve a 10,000-statement file,
// commit it, restore it, and the memory a constraint costs. Printed next to their targets:
// load + resolve + commit <= 1 s on a 1,000,000-cell design, the same cost per exact-name
// constraint on both design sizes, a restore <= 1/4 of a fresh load (and, beside it, the design
// lookups a restore leaves to the first use of the objects), <= 200 bytes per constraint plus
// its texts.
#include <benchmark/benchmark.h>
#include <malloc.h>

#include <chrono>
#include <cstdio>
#include <fstream>
#include <string>

#include "bench_designs.h"
#include "host/port/msgman.h"
#include "host/repository/cs_mgr.h"

namespace {

double Seconds(std::chrono::steady_clock::time_point since) {
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - since).count();
}

void BM_Repository(benchmark::State& state) {
    const int cells = static_cast<int>(state.range(0));
    auto design = MakeFlatDesign(cells);
    design->SetSourceStamp("generated");  // restores trust what the file resolved
    std::string file = WriteExactStatements(cells, "/tmp/lun_repository_bench_" + std::to_string(cells) + ".ucf");
    std::string db = file + ".qbcd";
    Port_MsgCapture quiet;
    // The name indexes of the design are built by the first lookup that needs them, once per
    // design: build them before timing, as the annotator benchmark does.
    {
        std::string warm = file + ".warm";
        std::ofstream(warm) << "INST cell_0 LOC = SITE_X0Y0;\nNET n_0 IOSTANDARD = LVCMOS33;\n";
        Cs_ConstraintMgr mgr;
        mgr.SetDesign(design.get());
        mgr.LoadConstraints(warm.c_str(), Cs_ConstraintSyntax::UCF);
        std::remove(warm.c_str());
    }
    double load = 0, commit = 0, restore = 0, first_use = 0, per_constraint = 0, bytes = 0, texts = 0;
    size_t count = 0;
    for (auto _ : state) {
        const size_t heap_before = mallinfo2().uordblks;
        auto start = std::chrono::steady_clock::now();
        Cs_ConstraintMgr mgr;
        mgr.SetDesign(design.get());
        mgr.LoadConstraints(file.c_str(), Cs_ConstraintSyntax::UCF);
        load = Seconds(start);
        count = mgr.GetNumConstraints();
        bytes = static_cast<double>(mallinfo2().uordblks - heap_before) / static_cast<double>(count);
        texts = static_cast<double>(mgr.GetTextBytes()) / static_cast<double>(count);
        start = std::chrono::steady_clock::now();
        mgr.Commit(db.c_str());
        commit = Seconds(start);
        start = std::chrono::steady_clock::now();
        Cs_ConstraintMgr back;
        back.SetDesign(design.get());
        back.Restore(db.c_str());
        restore = Seconds(start);
        // Restore leaves the design's objects to be looked up when first asked for.
        start = std::chrono::steady_clock::now();
        size_t objects = 0;
        for (const Cs_Constraint* c : back.GetConstraints(Cs_ConstraintMgr::ALL))
            objects += c->GetAssociatedDesignObjs().size();
        first_use = Seconds(start);
        benchmark::DoNotOptimize(objects);
        per_constraint = load / static_cast<double>(count) * 1e9;
    }
    state.counters["constraints"] = static_cast<double>(count);
    state.counters["load_resolve_s"] = load;
    state.counters["commit_s"] = commit;
    state.counters["load_resolve_commit_s"] = load + commit;
    state.counters["ns_per_constraint"] = per_constraint;
    state.counters["restore_over_load"] = restore / load;
    state.counters["first_use_over_load"] = first_use / load;
    state.counters["heap_bytes_per_constraint"] = bytes;
    state.counters["text_bytes_per_constraint"] = texts;
    std::printf("%d cells: load+resolve+commit %.3f s (target <= 1 s), %.0f ns per constraint, restore %.2f of a "
                "load (target <= 0.25; the objects' lookups it defers to their first use: %.2f more), %.0f heap "
                "bytes per constraint with its share of texts and lookups, %.0f without the texts (target <= 200 "
                "plus texts)\n",
                cells, load + commit, per_constraint, restore / load, first_use / load, bytes, bytes - texts);
    std::remove(file.c_str());
    std::remove(db.c_str());
}

}  // namespace

BENCHMARK(BM_Repository)->Arg(100000)->Arg(1000000)->Unit(benchmark::kMillisecond)->Iterations(1);
BENCHMARK_MAIN();
