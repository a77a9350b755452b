#include <gtest/gtest.h>

#include <cstring>
#include <random>

#include "host/port/ut_str.h"
#include "lookup_fixture.h"

using namespace lookup_test;

namespace {

const Pr_Logical_ConstraintHandle kLine3(3, "INST x;");
using V = std::vector<std::string>;

std::string Found(const char* what, const char* pattern, const char* found) {
    return Port_Format("Line 3 in 't.ucf': Found case insensitive match for %s name '%s'. %s is '%s'.\n",
                       what, pattern, std::strchr(what, ' ') ? "INST" : what, found);
}
V Names(const auto& objects) {
    V out;
    for (auto* o : objects)
        if (std::strncmp(o->GetName(), "zz_fill", 7) != 0) out.push_back(o->GetFullName());
    return out;
}

class Wildcards : public ::testing::TestWithParam<int> {
protected:
    void SetUp() override {
        Ta_LunResetCaseNotice();
        probe.SetView(d.view);
        // top: core(u1(u1a), u2), Core2, io; pins on u1 and u1a; filler after them when indexed.
        core = d.top->CreateBlock("core");
        u1 = core->CreateBlock("u1");
        u1a = u1->CreateBlock("u1a");
        u2 = core->CreateBlock("u2");
        d.top->CreateBlock("Core2");
        io = d.top->CreateBlock("io");
        Design::Pad(d.top, GetParam());
        Design::Pad(core, GetParam());
        for (const char* pin : {"D", "Q"}) u1->CreatePin(pin);
        for (const char* pin : {"D0", "d1"}) u1a->CreatePin(pin);
    }
    V Blocks(const char* pattern, unsigned char exact, unsigned char below) {
        std::vector<Ndm_Block*> out;
        probe.find_qual_blocks(d.top, &out, Buf(pattern).data(), exact, below, &kLine3);
        return Names(out);
    }
    V Pins(const char* blocks, const char* pins, unsigned char exact) {
        std::vector<Ndm_Pin*> out;
        probe.find_qual_pins(d.top, &out, Buf(blocks).data(), Buf(pins).data(), exact, &kLine3);
        return Names(out);
    }
    template <class F>
    V Sigs(F find, const char* pattern, unsigned char exact) {
        std::vector<Ndm_Signal*> out;
        find(&out, Buf(pattern).data(), exact);
        return Names(out);
    }
    V Hier(const char* p, unsigned char e, Ndm_Block* from = nullptr) {
        Ndm_Block* b = from ? from : d.top;
        return Sigs([&](auto* o, char* t, auto x) { probe.find_qual_sigs_hier(b, o, t, x, &kLine3); }, p, e);
    }
    V Nets(const char* p, unsigned char e) {
        return Sigs([&](auto* o, char* t, auto x) { probe.find_qual_sigs(o, t, x, &kLine3); }, p, e);
    }
    V Infos() {
        V out = capture.Texts(Port_Severity::Info);
        capture.Clear();
        return out;
    }

    Port_MsgCapture capture;
    Design d;
    Probe probe;
    Ndm_Block *core, *u1, *u1a, *u2, *io;
};

INSTANTIATE_TEST_SUITE_P(SmallAndIndexed, Wildcards, ::testing::Values(0, 20));

TEST_P(Wildcards, BlocksPinsAndFallback) {
    // A matching block stops the descent unless asked to go below.
    EXPECT_EQ(Blocks("core/u*", 1, 0), (V{"core/u1", "core/u2"}));
    EXPECT_EQ(Blocks("core/u*", 1, 1), (V{"core/u1", "core/u1/u1a", "core/u2"}));
    EXPECT_EQ(Blocks("c*", 1, 1), (V{"core", "core/u1", "core/u1/u1a", "core/u2"}));
    EXPECT_EQ(Blocks("c*", 1, 0), (V{"core"}));
    EXPECT_EQ(Blocks("core/u1/u1?", 1, 1), (V{"core/u1/u1a"}));
    EXPECT_EQ(Blocks("cor?/x*", 1, 1), V{});
    // "*" matches the empty full name of the top block, which never ends the descent.
    EXPECT_EQ(V(Blocks("*", 1, 0)).at(2), "Core2");
    EXPECT_EQ(Blocks("*", 1, 0).front(), "");
    EXPECT_EQ(Blocks("?*", 1, 0).front(), "core");
    // Pins of matching blocks at any depth, below non-matching ones too.
    EXPECT_EQ(Pins("core/u1*", "D*", 1), (V{"core/u1.D", "core/u1/u1a.D0"}));
    EXPECT_EQ(Pins("*a", "*", 1), (V{"core/u1/u1a.D0", "core/u1/u1a.d1"}));
    EXPECT_EQ(Blocks("CORE*", 1, 0), V{});
    EXPECT_TRUE(Infos().empty());
    EXPECT_EQ(Blocks("CORE*", 0, 0), (V{"core", "Core2"}));
    EXPECT_EQ(Infos(), (V{Notice("t.ucf"), Found("INST", "CORE*", "core"), Found("INST", "CORE*", "Core2")}));
    EXPECT_EQ(Pins("CORE/U1", "q", 0), (V{"core/u1.Q"}));
    EXPECT_EQ(Infos(), V{Found("wild_carded PIN", "CORE/U1.q", "core/u1.Q")});
}

TEST_P(Wildcards, SignalsInTheSubtreeAndByNetwork) {
    d.top->CreateSignal("clk");
    u1->CreateSignal("clk");
    u1a->CreateSignal("CLK_en");
    core->CreateSignal("data");
    EXPECT_EQ(Hier("*clk*", 1), (V{"clk", "core/u1/clk"}));
    EXPECT_EQ(Hier("core/u1/*", 0), (V{"core/u1/clk", "core/u1/u1a/CLK_en"}));  // "*" spans "/"
    EXPECT_EQ(Hier("core/u1/?lk", 1, u1), (V{"core/u1/clk"}));
    EXPECT_EQ(Hier("core/*/CLK*", 0), (V{"core/u1/clk", "core/u1/u1a/CLK_en"}));
    EXPECT_EQ(Infos().back(), Found("NET", "core/*/CLK*", "core/u1/u1a/CLK_en"));

    // By network: once per match, in network order, named after its highest signal.
    Ndm_Signal* inner = u1->CreateSignal("port");
    Ndm_Network* nb = d.view->CreateNetwork();
    nb->AddSignal(inner);
    nb->AddSignal(d.top->CreateSignal("bus_b"));
    d.view->CreateNetwork()->AddSignal(d.top->CreateSignal("bus_a"));
    EXPECT_EQ(Nets("bus_*", 1), (V{"bus_b", "bus_a"}));
    EXPECT_EQ(Nets("BUS_?", 0), (V{"bus_b", "bus_a"}));
    EXPECT_EQ(Infos(), (V{Found("NET", "BUS_?", "bus_b"), Found("NET", "BUS_?", "bus_a")}));
    std::vector<Ndm_Signal*> out(1);
    probe.find_qual_sigs(&out, Buf("bus_a").data(), 1, &kLine3);
    EXPECT_EQ(out.size(), 2u);  // appended to, never cleared

    // A higher signal renames a network; a new network joins in network order.
    Ndm_Network* net = d.view->CreateNetwork();
    net->AddSignal(u1a->CreateSignal("n"));
    EXPECT_EQ(Nets("core/u1/u1a/?", 1), (V{"core/u1/u1a/n"}));
    net->AddSignal(core->CreateSignal("n"));
    d.view->CreateNetwork()->AddSignal(core->CreateSignal("m"));
    for (int i = 0; i < GetParam(); ++i)
        d.view->CreateNetwork()->AddSignal(d.top->CreateSignal(("core" + std::to_string(i)).c_str()));
    EXPECT_EQ(Nets("core/u1/u1a/?", 1), V{});
    EXPECT_EQ(Nets("core/?", 1), (V{"core/n", "core/m"}));
    EXPECT_EQ(Nets("CORE/*", 0), (V{"core/n", "core/m"}));
}

TEST_P(Wildcards, RamBlocksBySimprimType) {
    u1->CreatePropertyString("SIMPRIMTYPE", "Q_RAMB4_X1");
    u1a->CreatePropertyString("SIMPRIMTYPE", "Q_RAMB4");
    u2->CreatePropertyString("SIMPRIMTYPE", "q_ramb4_x1");
    io->CreatePropertyInt32("SIMPRIMTYPE", 4);
    std::vector<Ndm_Block*> out;
    probe.find_all_ram_qual_blocks(d.top, &out);
    EXPECT_EQ(out, (std::vector<Ndm_Block*>{u1, u1a}));
}

TEST(BusDelimiters, CycleThroughTheStylesOnTheLastCompleteSubscript) {
    Probe probe;
    auto name = Buf("d(3)");
    for (const char* next : {"d[3]", "d<3>", "d{3}"}) {
        EXPECT_TRUE(probe.change_bus_delimiters(name.data()));
        EXPECT_STREQ(name.data(), next);
    }
    EXPECT_FALSE(probe.change_bus_delimiters(name.data()));
    EXPECT_STREQ(name.data(), "d(3)");
    ASSERT_EQ(probe.Tried().size(), 4u);
    EXPECT_STREQ(probe.Tried()[3].c_str(), "d{3}");
    probe.Tried().clear();
    // The rightmost closer decides; "a<1>x]" has no opener for it.
    for (const char* plain : {"a<1>x]", "a]b[", "x", "", "]", "ab", ")(", "(x"}) {
        auto n = Buf(plain);
        EXPECT_FALSE(probe.change_bus_delimiters(n.data())) << plain;
        EXPECT_STREQ(n.data(), plain);
    }
    EXPECT_TRUE(probe.Tried().empty());
    for (auto [from, to] : {std::pair{"a(1)(2)", "a(1)[2]"}, {"(7)", "[7]"}}) {
        auto n = Buf(from);
        EXPECT_TRUE(probe.change_bus_delimiters(n.data()));
        EXPECT_STREQ(n.data(), to);
    }
}

// Straight transcriptions of the rules, visiting every child, to compare against.
bool Match(bool exact, const std::string& name, const std::string& pattern) {
    return (exact ? UT_STR::Match : UT_STR::IMatch)(name.c_str(), pattern.c_str());
}
Ndm_Block* NaiveHier(Ndm_Block* b, const std::string& path, bool exact) {
    size_t n = std::strlen(b->GetName());
    if (path.size() < n || (exact ? UT_STR::NCompare : UT_STR::INCompare)(path.c_str(), b->GetName(), n))
        return nullptr;
    if (path.size() == n) return b;
    if (path[n] != '/') return nullptr;
    std::string rest = path.substr(n + 1);
    for (Ndm_Block* c : b->GetBlockItr())
        if (rest == c->GetName() || (!exact && !UT_STR::ICompare(rest.c_str(), c->GetName()))) return c;
    for (Ndm_Block* c : b->GetBlockItr())
        if (Ndm_Block* r = NaiveHier(c, rest, exact)) return r;
    return nullptr;
}
void NaiveWalk(Ndm_Block* b, const std::string& pattern, bool exact, bool below, bool stopped,
               std::vector<Ndm_Block*>& blocks, std::vector<Ndm_Signal*>& sigs) {
    for (Ndm_Signal* s : b->GetSignalItr())
        if (Match(exact, s->GetFullName(), pattern)) sigs.push_back(s);
    std::string full = b->GetFullName();
    if (!stopped && Match(exact, full, pattern)) {
        blocks.push_back(b);
        stopped = !below && !full.empty();
    }
    for (Ndm_Block* c : b->GetBlockItr()) NaiveWalk(c, pattern, exact, below, stopped, blocks, sigs);
}

TEST(LookupRandom, SameResultsAsVisitingEveryChild) {
    const char* names[] = {"a", "A", "ab", "aB", "b", "a/b", "b/a", "ba", "A/B", "a/b/a", ""};
    const char* pieces[] = {"a", "A", "b", "/", "a/", "*", "?", "ab", "B/"};
    std::mt19937 rng(777);
    Port_MsgCapture capture;
    for (int round = 0; round < 30; ++round) {
        Design d;
        Probe probe;
        std::vector<Ndm_Block*> level{d.top};
        for (int depth = 0; depth < 3; ++depth) {
            std::vector<Ndm_Block*> next;
            for (Ndm_Block* b : level) {
                for (int k = rng() % 14; k > 0; --k) next.push_back(b->CreateBlock(names[rng() % 11]));
                for (int k = rng() % 12; k > 0; --k) b->CreateSignal(names[rng() % 11]);
            }
            level = std::move(next);
        }
        for (int q = 0; q < 100; ++q) {
            std::string path = rng() % 10 ? "top" : "TOP", pattern;
            for (int s = 1 + rng() % 5; s > 0; --s) path += std::string("/") + names[rng() % 11];
            for (int i = 1 + rng() % 5; i > 0; --i) pattern += pieces[rng() % 9];
            for (int exact = 0; exact < 2; ++exact) {
                EXPECT_EQ(probe.find_blk_hier(d.top, Buf(path).data(), exact, &kLine3),
                          NaiveHier(d.top, path, exact)) << path << " exact=" << exact;
                std::vector<Ndm_Signal*> want_sigs, got_sigs;
                for (int below = 0; below < 2; ++below) {
                    std::vector<Ndm_Block*> want, got;
                    want_sigs.clear();
                    NaiveWalk(d.top, pattern, exact, below, false, want, want_sigs);
                    probe.find_qual_blocks(d.top, &got, pattern.data(), exact, below, &kLine3);
                    EXPECT_EQ(got, want) << pattern << " exact=" << exact << " below=" << below;
                }
                probe.find_qual_sigs_hier(d.top, &got_sigs, pattern.data(), exact, &kLine3);
                EXPECT_EQ(got_sigs, want_sigs) << pattern << " exact=" << exact;
            }
        }
    }
}

}  // namespace
