// Name lookups on flat designs of 100,000 and 1,000,000 instances: exact paths should cost the
// same at both sizes; wildcard patterns with a literal prefix cost what they match, not the
// size of the design.
#include <benchmark/benchmark.h>

#include <chrono>
#include <cstdio>
#include <cstring>
#include <map>
#include <memory>
#include <random>
#include <string>
#include <vector>

#include "host/design/ndm.h"
#include "manager/lunmgr.h"

namespace {

class Probe : public Ta_LunMgr {
public:
    Probe() : Ta_LunMgr("bench.ucf", CP_UCF, nullptr) {}
    using Ta_LunMgr::find_blk_hier;
    using Ta_LunMgr::find_qual_blocks;
    using Ta_LunMgr::find_qual_sigs;
    using Ta_LunMgr::find_sig_hier;
    void SetView(Ndm_View* v) { view = v; }
};

struct Flat {
    Ndm_Design design{"flat"};
    Ndm_View* view = design.CreateView("EXPANDED");
    Ndm_Block* top = view->CreateTopBlock("top");
    std::vector<std::string> paths;      // "top/u<i>" for random i
    std::vector<std::string> sig_paths;  // "u<i>/q" for random i
};

// One flat design per size: a top block with n children u0..u<n-1>, each with a signal q
// in a network of its own.
Flat& Design(int n) {
    static std::map<int, std::unique_ptr<Flat>> designs;
    auto& slot = designs[n];
    if (slot) return *slot;
    slot = std::make_unique<Flat>();
    Flat& f = *slot;
    f.top->Reserve(static_cast<size_t>(n), 0, 0);
    for (int i = 0; i < n; ++i) {
        Ndm_Signal* q = f.top->CreateBlock(("u" + std::to_string(i)).c_str())->CreateSignal("q");
        f.view->CreateNetwork()->AddSignal(q);
    }
    std::mt19937 rng(42);
    for (int k = 0; k < 4096; ++k) {
        int i = static_cast<int>(rng() % static_cast<unsigned>(n));
        f.paths.push_back("top/u" + std::to_string(i));
        f.sig_paths.push_back("top/u" + std::to_string(i) + "/q");
    }
    // The first lookup builds the top block's name indexes; time it once.
    Probe probe;
    auto start = std::chrono::steady_clock::now();
    std::vector<char> first(f.paths[0].begin(), f.paths[0].end());
    first.push_back('\0');
    probe.find_blk_hier(f.top, first.data(), 1, nullptr);
    std::vector<Ndm_Block*> out;
    char warm[] = "u1*";
    probe.find_qual_blocks(f.top, &out, warm, 1, 1, nullptr);
    double ms = std::chrono::duration<double, std::milli>(std::chrono::steady_clock::now() - start).count();
    std::fprintf(stderr, "%d children: index build on first use %.1f ms\n", n, ms);
    return f;
}

void BM_ExactInstancePath(benchmark::State& state) {
    Flat& f = Design(static_cast<int>(state.range(0)));
    Probe probe;
    std::vector<std::vector<char>> bufs;
    for (const std::string& p : f.paths) bufs.emplace_back(p.c_str(), p.c_str() + p.size() + 1);
    size_t k = 0, found = 0;
    for (auto _ : state) {
        found += probe.find_blk_hier(f.top, bufs[k].data(), 1, nullptr) != nullptr;
        k = (k + 1) % bufs.size();
    }
    if (found != static_cast<size_t>(state.iterations())) state.SkipWithError("lookup failed");
    state.SetItemsProcessed(state.iterations());
}
BENCHMARK(BM_ExactInstancePath)->Arg(100000)->Arg(1000000);

void BM_ExactSignalPath(benchmark::State& state) {
    Flat& f = Design(static_cast<int>(state.range(0)));
    Probe probe;
    std::vector<std::vector<char>> bufs;
    for (const std::string& p : f.sig_paths) bufs.emplace_back(p.c_str(), p.c_str() + p.size() + 1);
    size_t k = 0, found = 0;
    for (auto _ : state) {
        found += probe.find_sig_hier(f.top, bufs[k].data(), 1, nullptr) != nullptr;
        k = (k + 1) % bufs.size();
    }
    if (found != static_cast<size_t>(state.iterations())) state.SkipWithError("lookup failed");
    state.SetItemsProcessed(state.iterations());
}
BENCHMARK(BM_ExactSignalPath)->Arg(100000)->Arg(1000000);

// Prefixed patterns: the walk enters only the children that can match.
void BM_PrefixedWildcard(benchmark::State& state, const char* pattern) {
    Flat& f = Design(static_cast<int>(state.range(0)));
    Probe probe;
    std::vector<char> buf(pattern, pattern + std::strlen(pattern) + 1);
    std::vector<Ndm_Block*> out;
    size_t matched = 0;
    for (auto _ : state) {
        out.clear();
        probe.find_qual_blocks(f.top, &out, buf.data(), 1, 1, nullptr);
        matched = out.size();
    }
    state.counters["matches"] = static_cast<double>(matched);
    state.SetItemsProcessed(state.iterations());
}
BENCHMARK_CAPTURE(BM_PrefixedWildcard, u12345_star, "u12345*")->Arg(100000)->Arg(1000000);
BENCHMARK_CAPTURE(BM_PrefixedWildcard, u9999_q, "u9999?")->Arg(100000)->Arg(1000000);
BENCHMARK_CAPTURE(BM_PrefixedWildcard, u4242_q_star, "u4242?*")->Arg(100000)->Arg(1000000);

// Networks of the view by name.
void BM_NetworkWildcard(benchmark::State& state, const char* pattern) {
    Flat& f = Design(static_cast<int>(state.range(0)));
    Probe probe;
    probe.SetView(f.view);
    std::vector<char> buf(pattern, pattern + std::strlen(pattern) + 1);
    std::vector<Ndm_Signal*> out;
    size_t matched = 0;
    for (auto _ : state) {
        out.clear();
        probe.find_qual_sigs(&out, buf.data(), 1, nullptr);
        matched = out.size();
    }
    state.counters["matches"] = static_cast<double>(matched);
    state.SetItemsProcessed(state.iterations());
}
BENCHMARK_CAPTURE(BM_NetworkWildcard, u4242_q_slash_q, "u4242?/q")->Arg(100000)->Arg(1000000);

// A pattern starting with "*" has to look at every instance.
BENCHMARK_CAPTURE(BM_PrefixedWildcard, star_77777, "*77777")->Arg(100000)->Arg(1000000)
    ->Unit(benchmark::kMillisecond);

}  // namespace

BENCHMARK_MAIN();
