// The whole job against Yosys on the same generated hierarchical netlists (16 submodules):
// quillmap reads the netlist, applies 1,000 exact net statements and 100 "u<j>/*reg*" instance
// patterns and saves the design; Yosys reads the netlist, sets the same attributes with setattr
// and writes its JSON. Each tool runs as a process of its own; its CPU time and peak resident
// size come from the system. Targets: quillmap >= 20 times faster in CPU time and <= 1/8 of
// Yosys's peak memory. Without a yosys on the PATH only quillmap's figures are printed.
//   yosys_compare_bench [CELLS...]   (default: 192000 1000000; LUN_BENCH_KEEP=1 keeps the files)
#include <sys/resource.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "cpu_time.h"
#include "yosys_netlist_gen.h"

namespace {

constexpr int kModules = 16;

struct Run {
    bool ok = false;
    double cpu = 0;  // user + system seconds
    double peak_mb = 0;
};

// Runs argv quietly and reports its CPU time and peak resident size.
Run Measure(const std::vector<std::string>& argv, const std::string& log) {
    Run run;
    std::fflush(stdout);  // the child must not print what is buffered again
    const pid_t child = ::fork();
    if (child == 0) {
        if (std::FILE* f = std::freopen(log.c_str(), "w", stdout)) (void)f;
        ::dup2(STDOUT_FILENO, STDERR_FILENO);
        std::vector<char*> args;
        for (const std::string& a : argv) args.push_back(const_cast<char*>(a.c_str()));
        args.push_back(nullptr);
        ::execvp(args[0], args.data());
        ::_exit(127);
    }
    int status = 0;
    struct rusage usage {};
    if (child < 0 || ::wait4(child, &status, 0, &usage) != child) return run;
    run.ok = WIFEXITED(status) && WEXITSTATUS(status) == 0;
    run.cpu = CpuSeconds(usage);
    run.peak_mb = static_cast<double>(usage.ru_maxrss) / 1024.0;
    return run;
}

bool HaveYosys() { return std::system("command -v yosys >/dev/null 2>&1") == 0; }

void Compare(int64_t cells, const std::string& dir) {
    const std::string netlist = dir + "/design.json";
    NetlistFile file(cells, kModules, netlist);
    const int64_t pairs = cells / 2 / kModules;
    // The same constraints for both tools: flip-flop output nets inside the submodules, and
    // every register of a submodule.
    std::ofstream ucf(dir + "/design.ucf");
    std::ofstream ys(dir + "/design.ys");
    ys << "read_json " << netlist << "\n";
    for (int i = 0; i < 1000; ++i) {
        const int module = i % kModules;
        const int64_t pair = (int64_t{i} * 7919) % pairs;
        ucf << "NET \"u" << module << "/r" << pair / 32 << "[" << pair % 32 << "]\" TNM_NET = tn" << i << ";\n";
        ys << "setattr -set TNM_NET \"tn" << i << "\" sub" << module << "/w:r" << pair / 32 << "\n";
    }
    for (int j = 0; j < 100; ++j) {
        const int module = j % kModules;
        ucf << "INST \"u" << module << "/*reg*\" TNM = regs" << j << ";\n";
        ys << "setattr -set TNM \"regs" << j << "\" sub" << module << "/c:*reg*\n";
    }
    ys << "write_json " << dir << "/yosys_out.json\n";
    ucf.close();
    ys.close();
    std::printf("%lld cells in %d submodules, %.0f MB of JSON\n", static_cast<long long>(file.cells()), kModules,
                static_cast<double>(file.bytes()) / (1 << 20));
    const Run ours = Measure({QUILLMAP_EXE, "annotate", netlist, "--ucf", dir + "/design.ucf", "-o",
                              dir + "/design.qdf"},
                             dir + "/quillmap.log");
    std::printf("  quillmap: %.2f s CPU, %.0f MB peak%s\n", ours.cpu, ours.peak_mb,
                ours.ok ? "" : " (FAILED: see quillmap.log)");
    if (!HaveYosys()) {
        std::printf("  yosys: not installed; no comparison\n");
        return;
    }
    const Run theirs = Measure({"yosys", "-q", "-s", dir + "/design.ys"}, dir + "/yosys.log");
    std::printf("  yosys: %.2f s CPU, %.0f MB peak%s\n", theirs.cpu, theirs.peak_mb,
                theirs.ok ? "" : " (FAILED: see yosys.log)");
    if (ours.ok && theirs.ok && ours.cpu > 0 && ours.peak_mb > 0)
        std::printf("  quillmap is %.1f times faster in CPU time (target >= 20) and needs 1/%.1f of the memory "
                    "(target <= 1/8)\n",
                    theirs.cpu / ours.cpu, theirs.peak_mb / ours.peak_mb);
}

}  // namespace

int main(int argc, char** argv) {
    std::vector<int64_t> sizes;
    for (int i = 1; i < argc; ++i) sizes.push_back(std::atoll(argv[i]));
    if (sizes.empty()) sizes = {192000, 1000000};
    const std::string dir =
        (std::filesystem::temp_directory_path() / ("lun_yosys_compare_" + std::to_string(::getpid()))).string();
    std::filesystem::create_directories(dir);
    for (int64_t cells : sizes) Compare(cells, dir);
    if (!std::getenv("LUN_BENCH_KEEP")) std::filesystem::remove_all(dir);
    return 0;
}
