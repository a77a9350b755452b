// Constraint files whose cost must stay linear in their size (tests/support/pathological.h):
// a 1,000,000-byte name, 100,000 "|"-joined constraints, many-star patterns against long
// names, 100,000 nested subscripts, 1,000,000 unmatched statements, a 200 MB file. Each is
// annotated from its file at a quarter of its size and at its size; the processor time (so that
// other jobs on the machine matter less) and the peak memory the annotation adds (measured in
// a child process) are printed for both, with their ratios, which stay near 4 while the cost
// is linear. Messages go to /dev/null as text.
#include <benchmark/benchmark.h>
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <ctime>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <map>
#include <memory>
#include <string>

#include "host/port/msgman.h"
#include "manager/lunmgr.h"
#include "tests/support/pathological.h"

namespace {

using lun_test::PathologicalInput;
using lun_test::PathologicalInputs;

struct Figure {
    double seconds = 0, peak_mb = 0;
};
std::map<std::pair<size_t, size_t>, Figure> g_figures;  // by input and size

std::string WriteInput(const PathologicalInput& input, size_t n) {
    const std::string path = (std::filesystem::temp_directory_path() /
                              ("lun_pathological_bench_" + std::to_string(::getpid()) + ".ucf"))
                                 .string();
    std::ofstream(path, std::ios::binary) << input.text(n);
    return path;
}

double CpuSeconds() {
    timespec now{};
    ::clock_gettime(CLOCK_PROCESS_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) * 1e-9;
}

long MaxRssKb() {
    rusage usage{};
    ::getrusage(RUSAGE_SELF, &usage);
    return usage.ru_maxrss;
}

// Resident kilobytes now.
long RssKb() {
    long pages = 0, resident = 0;
    if (FILE* f = std::fopen("/proc/self/statm", "r")) {
        if (std::fscanf(f, "%ld %ld", &pages, &resident) != 2) resident = 0;
        std::fclose(f);
    }
    return resident * (::sysconf(_SC_PAGESIZE) / 1024);
}

// Megabytes the annotation adds to the peak, in a child process of its own.
double PeakMb(const PathologicalInput& input, size_t n, const std::string& path) {
    int pipe_fds[2];
    if (::pipe(pipe_fds) != 0) return -1;
    const pid_t child = ::fork();
    if (child == 0) {
        auto design = input.design(n);
        const long before = std::max(RssKb(), 0L);
        Ta_LunMgr mgr(path.c_str(), CP_UCF, nullptr);
        mgr.annotate(design->GetWorkView());
        const double mb = static_cast<double>(MaxRssKb() - before) / 1024;
        if (::write(pipe_fds[1], &mb, sizeof mb) != sizeof mb) ::_exit(1);
        ::_exit(0);
    }
    ::close(pipe_fds[1]);
    double mb = -1;
    if (::read(pipe_fds[0], &mb, sizeof mb) != sizeof mb) mb = -1;
    ::close(pipe_fds[0]);
    ::waitpid(child, nullptr, 0);
    return mb;
}

void BM_Pathological(benchmark::State& state) {
    const size_t which = static_cast<size_t>(state.range(0)), n = static_cast<size_t>(state.range(1));
    const PathologicalInput& input = PathologicalInputs()[which];
    state.SetLabel(std::string(input.name) + ", " + std::to_string(n) + " " + input.unit);
    const std::string path = WriteInput(input, n);
    Figure& figure = g_figures[{which, n}];
    figure.peak_mb = PeakMb(input, n, path);
    double total = 0;
    for (auto _ : state) {
        auto design = input.design(n);
        const double start = CpuSeconds();
        Ta_LunMgr mgr(path.c_str(), CP_UCF, nullptr);
        mgr.annotate(design->GetWorkView());
        const double seconds = CpuSeconds() - start;
        state.SetIterationTime(seconds);
        total += seconds;
    }
    figure.seconds = total / static_cast<double>(state.iterations());
    state.counters["peak_MB"] = figure.peak_mb;
    std::filesystem::remove(path);
}

void Sizes(benchmark::internal::Benchmark* b) {
    for (size_t i = 0; i < PathologicalInputs().size(); ++i)
        for (size_t n : {PathologicalInputs()[i].full / 4, PathologicalInputs()[i].full})
            b->Args({static_cast<int64_t>(i), static_cast<int64_t>(n)});
}
BENCHMARK(BM_Pathological)->Apply(Sizes)->UseManualTime()->Unit(benchmark::kMillisecond)->MinTime(0.5);

}  // namespace

int main(int argc, char** argv) {
    FILE* devnull = std::fopen("/dev/null", "w");
    Port_MsgManData::AddSink(std::make_shared<Port_TextSink>(devnull));
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 1;
    benchmark::RunSpecifiedBenchmarks();
    benchmark::Shutdown();
    std::printf("\n%-22s %14s %10s %10s %6s %10s %10s %6s\n", "input", "size", "s at n/4", "s at n", "ratio",
                "MB at n/4", "MB at n", "ratio");
    for (size_t i = 0; i < PathologicalInputs().size(); ++i) {
        const PathologicalInput& input = PathologicalInputs()[i];
        auto small = g_figures.find({i, input.full / 4}), big = g_figures.find({i, input.full});
        if (small == g_figures.end() || big == g_figures.end()) continue;
        const Figure &a = small->second, &b = big->second;
        std::printf("%-22s %14zu %10.3f %10.3f %6.2f %10.1f %10.1f %6.2f\n", input.name, input.full, a.seconds,
                    b.seconds, b.seconds / a.seconds, a.peak_mb, b.peak_mb, a.peak_mb > 0 ? b.peak_mb / a.peak_mb : 0.0);
    }
    return 0;
}
