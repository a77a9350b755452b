// The repository road as quillmap annotate --project drives it, on a generated 1,000,000-cell
// design with 10,000 statements: the first run (read, resolve, check, commit, write back) and
// the second, which restores the repository instead of reading the file. Each run starts from
// a fresh copy of the design, as a new process loading the netlist would.
#include <benchmark/benchmark.h>

#include <chrono>
#include <cstdio>
#include <string>

#include "bench_designs.h"
#include "bridge/luncshelper.h"
#include "host/port/msgman.h"

namespace {

double Seconds(std::chrono::steady_clock::time_point since) {
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - since).count();
}

// One run of the road; restored tells whether the repository file was used.
double Run(Ndm_Design* design, const std::string& project, const std::string& ucf, bool& restored) {
    auto start = std::chrono::steady_clock::now();
    Ta_LunCSHelper bridge(project.c_str(), "ovi");
    bridge.Init(design);
    Cs_ConstraintMgr& mgr = *bridge.GetConstraintsMgr();
    restored = mgr.GetConstraintSources().size() == 1;
    Util_FNameGroup files;
    if (!restored) files.add_fname(ucf.c_str());
    bridge.Annotate(&files, files.num_fnames(), true);
    Ta_LunCSHelper::AssociationDrc(mgr.GetResolutionFindings(), false, false);
    bridge.ReportConflicts();
    bridge.Commit();
    bridge.WriteConstraintsToNgd(true);
    return Seconds(start);
}

void BM_RepositoryRoad(benchmark::State& state) {
    const int cells = static_cast<int>(state.range(0));
    const std::string base = "/tmp/lun_road_bench_" + std::to_string(cells);
    const std::string ucf = WriteExactStatements(cells, base + ".ucf");
    const std::string project = base + ".qpf";
    Port_MsgCapture quiet;
    double first = 0, second = 0;
    bool first_restored = true, second_restored = false;
    for (auto _ : state) {
        std::remove(Ta_LunCSHelper::RepositoryPath(project.c_str()).c_str());
        {
            auto design = MakeFlatDesign(cells);
            design->SetSourceStamp("generated");  // the same netlist in both runs
            first = Run(design.get(), project, ucf, first_restored);
        }
        auto design = MakeFlatDesign(cells);
        design->SetSourceStamp("generated");
        second = Run(design.get(), project, ucf, second_restored);
    }
    state.counters["first_run_s"] = first;
    state.counters["restored_run_s"] = second;
    std::printf("%d cells, 10,000 statements: first run %.3f s, restored run %.3f s (%s)\n", cells, first, second,
                !first_restored && second_restored ? "restored as expected" : "NOT RESTORED AS EXPECTED");
    std::remove(ucf.c_str());
    std::remove(Ta_LunCSHelper::RepositoryPath(project.c_str()).c_str());
    std::remove((base + "_qdb").c_str());
}

}  // namespace

BENCHMARK(BM_RepositoryRoad)->Arg(1000000)->Unit(benchmark::kMillisecond)->Iterations(1);
BENCHMARK_MAIN();
