// Constraint-file parser throughput on a generated file of 1,000,000 mixed statements.
#include <benchmark/benchmark.h>
#include <unistd.h>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <string>

#include "host/parser/pr_logical.h"

namespace {

constexpr int kStatements = 1000000;

// A parser whose callbacks are the base class's do-nothing ones.
class QuietParser : public Pr_Logical_Parser {
  public:
    using Pr_Logical_Parser::Pr_Logical_Parser;
};

// Writes the statements once per process; removed at exit.
class GeneratedFile {
  public:
    GeneratedFile() {
        path_ = (std::filesystem::temp_directory_path() /
                 ("lun_parser_bench_" + std::to_string(::getpid()) + ".ucf"))
                    .string();
        std::ofstream out(path_, std::ios::binary);
        std::string s;
        for (int i = 0; i < kStatements; ++i) {
            const std::string n = std::to_string(i);
            switch (i % 10) {
                case 0:
                    s = "NET \"data<" + n + ">\" LOC = P" + n + " | IOSTANDARD = LVCMOS33;\n";
                    break;
                case 1:
                    s = "INST \"core/u" + n + "/reg*\" TNM = FFS:grp_" + n + ";\n";
                    break;
                case 2:
                    s = "TIMESPEC TS_" + n + " = PERIOD grp_" + n + " 10 ns HIGH 50%;\n";
                    break;
                case 3:
                    s = "NET clk_" + n + " TNM_NET = clk_grp | PERIOD = 100 MHz LOW 40%;\n";
                    break;
                case 4:
                    s = "TIMESPEC TS_p" + n + " = FROM grpA TO grpB 5 ns DATAPATHONLY;\n";
                    break;
                case 5:
                    s = "NET din" + n + " OFFSET = IN 2 ns VALID 4 ns BEFORE clk;\n";
                    break;
                case 6:
                    s = "# block " + n + "\n";
                    break;
                case 7:
                    s = "TIMEGRP tg" + n + " = RISING ffs FFS(u1/*) EXCEPT slow;\n";
                    break;
                case 8:
                    s = "INST mem" + n + " INIT_00..03 = 0F0F | LOC = RAMB_X0Y" + n + ";\n";
                    break;
                default:
                    s = "NET bus" + n + " MAXDELAY = 1.5 ns | SLEW = FAST | DRIVE = 8;\n";
                    break;
            }
            out << s;
        }
    }
    ~GeneratedFile() { std::filesystem::remove(path_); }
    const char* path() const { return path_.c_str(); }

  private:
    std::string path_;
};

void BM_ParseMillionStatements(benchmark::State& state) {
    static GeneratedFile file;
    QuietParser parser(file.path());
    for (auto _ : state) {
        const bool ok = parser.parse();
        benchmark::DoNotOptimize(ok);
        if (!ok) state.SkipWithError("parse failed");
    }
    state.counters["statements/s"] = benchmark::Counter(
        static_cast<double>(kStatements) * static_cast<double>(state.iterations()),
        benchmark::Counter::kIsRate);
    state.SetBytesProcessed(static_cast<int64_t>(state.iterations()) *
                            static_cast<int64_t>(std::filesystem::file_size(file.path())));
}
BENCHMARK(BM_ParseMillionStatements)->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
