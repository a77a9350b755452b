// The board check against annotation, on a flat design of 1,000,000 cells and a file of 10,000
// exact-name statements (WriteExactStatements). annotate: the annotator over the file. check:
// the file read into a repository bound to the design and resolved, then the board check; the
// design has a clock input reaching pin C of every cell, so the clock walk visits every cell.
// report: the HTML page of that check. Printed with the ratio check / annotate (target: the
// same order, below 10).
#include <benchmark/benchmark.h>

#include <chrono>
#include <cstdio>
#include <string>

#include "bench_designs.h"
#include "check/ck_board_check.h"
#include "check/ck_html.h"
#include "host/port/msgman.h"
#include "host/repository/cs_mgr.h"
#include "manager/lunmgr.h"

namespace {

double Seconds(std::chrono::steady_clock::time_point since) {
    return std::chrono::duration<double>(std::chrono::steady_clock::now() - since).count();
}

// A top-level input "clk" whose net reaches pin C of every cell.
void AddClock(Ndm_Design& design) {
    Ndm_View* view = design.GetWorkView();
    Ndm_Block* top = view->GetBlock();
    Ndm_Signal* clk = top->CreateSignal("clk");
    view->CreateNetwork()->AddSignal(clk);
    top->CreatePin("clk", Ndm_Dir::Input)->SetSignal(clk);
    for (Ndm_Block* cell : top->GetBlockItr()) cell->GetPinByName("C")->SetSignal(clk);
}

void BM_CheckAgainstAnnotate(benchmark::State& state) {
    const int cells = static_cast<int>(state.range(0));
    auto design = MakeFlatDesign(cells);
    AddClock(*design);
    const std::string file = WriteExactStatements(cells, "/tmp/lun_check_bench_" + std::to_string(cells) + ".ucf");
    Port_MsgCapture quiet;
    // The name indexes are built by the first lookup, once per design.
    {
        Ta_LunMgr warm(file.c_str(), CP_UCF, nullptr);
        warm.annotate(design->GetWorkView());
    }
    double annotate = 0, check = 0, report = 0;
    size_t findings = 0, bytes = 0;
    for (auto _ : state) {
        auto start = std::chrono::steady_clock::now();
        {
            Ta_LunMgr mgr(file.c_str(), CP_UCF, nullptr);
            mgr.annotate(design->GetWorkView());
        }
        annotate = Seconds(start);
        start = std::chrono::steady_clock::now();
        Cs_ConstraintMgr mgr;
        mgr.SetDesign(design.get());
        mgr.LoadConstraints(file.c_str(), Cs_ConstraintSyntax::UCF);
        Ck_BoardCheck board(mgr, Ck_KindSet());
        board.Run();
        check = Seconds(start);
        findings = board.findings().size();
        start = std::chrono::steady_clock::now();
        bytes = Ck_HtmlReport(board, "bench").size();
        report = Seconds(start);
    }
    state.counters["annotate_s"] = annotate;
    state.counters["check_s"] = check;
    state.counters["check_over_annotate"] = check / annotate;
    state.counters["report_s"] = report;
    std::printf("%d cells, 10,000 statements: annotate %.3f s, check %.3f s (%.1f times annotate, target < 10), "
                "%zu findings; HTML report %.3f s, %.1f MB\n",
                cells, annotate, check, check / annotate, findings, report, static_cast<double>(bytes) / 1e6);
    std::remove(file.c_str());
}

}  // namespace

BENCHMARK(BM_CheckAgainstAnnotate)->Arg(100000)->Arg(1000000)->Unit(benchmark::kMillisecond)->Iterations(1);
BENCHMARK_MAIN();
