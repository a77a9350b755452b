#include <gtest/gtest.h>

#include <cstring>
#include <random>

#include "host/port/ut_str.h"
#include "lookup_fixture.h"

using namespace lookup_test;

namespace {

const Pr_Logical_ConstraintHandle kLine3(3, "INST x;");

std::vector<std::string> Names(const auto& objects) {
    std::vector<std::string> out;
    for (auto* o : objects) out.push_back(o->GetFullName());
    return out;
}

class Wildcards : public ::testing::TestWithParam<int> {
protected:
    void SetUp() override {
        Ta_LunResetCaseNotice();
        probe.SetView(d.view);
        // top: core(u1(u1a), u2), Core2, io; pins on u1 and u1a; signals at several levels.
        core = d.top->CreateBlock("core");
        u1 = core->CreateBlock("u1");
        u1a = u1->CreateBlock("u1a");
        u2 = core->CreateBlock("u2");
        core2 = d.top->CreateBlock("Core2");
        io = d.top->CreateBlock("io");
        Design::Pad(d.top, GetParam());
        Design::Pad(core, GetParam());
        u1->CreatePin("D");
        u1->CreatePin("Q");
        u1a->CreatePin("D0");
        u1a->CreatePin("d1");
    }
    std::vector<std::string> Blocks(const char* pattern, unsigned char exact, unsigned char below) {
        std::vector<Ndm_Block*> out;
        probe.find_qual_blocks(d.top, &out, Buf(pattern).data(), exact, below, &kLine3);
        std::erase_if(out, [](Ndm_Block* b) { return std::strncmp(b->GetName(), "zz_fill", 7) == 0; });
        return Names(out);
    }
    std::vector<std::string> Infos() const { return capture.Texts(Port_Severity::Info); }

    Port_MsgCapture capture;
    Design d;
    Probe probe;
    Ndm_Block *core, *u1, *u1a, *u2, *core2, *io;
};

INSTANTIATE_TEST_SUITE_P(SmallAndIndexed, Wildcards, ::testing::Values(0, 20));

using V = std::vector<std::string>;

TEST_P(Wildcards, MatchingBlockStopsTheDescentUnlessAskedToGoBelow) {
    EXPECT_EQ(Blocks("core/u*", 1, 0), (V{"core/u1", "core/u2"}));
    EXPECT_EQ(Blocks("core/u*", 1, 1), (V{"core/u1", "core/u1/u1a", "core/u2"}));
    EXPECT_EQ(Blocks("c*", 1, 1), (V{"core", "core/u1", "core/u1/u1a", "core/u2"}));
    EXPECT_EQ(Blocks("c*", 1, 0), (V{"core"}));
    EXPECT_EQ(Blocks("core/u?", 1, 1), (V{"core/u1", "core/u2"}));
    EXPECT_EQ(Blocks("core/u1/u1?", 1, 1), (V{"core/u1/u1a"}));
    EXPECT_EQ(Blocks("*u1a", 1, 1), (V{"core/u1/u1a"}));
    EXPECT_EQ(Blocks("core", 1, 1), (V{"core"}));
    EXPECT_EQ(Blocks("cor?/x*", 1, 1), V{});
    EXPECT_TRUE(Infos().empty());
}

TEST_P(Wildcards, TopBlockHasTheEmptyFullName) {
    // "*" matches the empty full name of the top block, which never ends the descent.
    V all = Blocks("*", 1, 0);
    ASSERT_GE(all.size(), 4u);
    EXPECT_EQ((V{all[0], all[1], all[2]}), (V{"", "core", "Core2"}));
    EXPECT_EQ(Blocks("?*", 1, 0).front(), "core");
}

TEST_P(Wildcards, FallbackReportsEveryMatch) {
    EXPECT_EQ(Blocks("CORE*", 1, 0), V{});
    EXPECT_EQ(Blocks("CORE*", 0, 0), (V{"core", "Core2"}));
    EXPECT_EQ(Infos(), (V{Notice("t.ucf"),
                          "Line 3 in 't.ucf': Found case insensitive match for INST name 'CORE*'. INST is 'core'.\n",
                          "Line 3 in 't.ucf': Found case insensitive match for INST name 'CORE*'. INST is 'Core2'.\n"}));
}

TEST_P(Wildcards, PinsOfMatchingBlocksAtAnyDepth) {
    std::vector<Ndm_Pin*> pins;
    probe.find_qual_pins(d.top, &pins, Buf("core/u1*").data(), Buf("D*").data(), 1, &kLine3);
    EXPECT_EQ(Names(pins), (V{"core/u1.D", "core/u1/u1a.D0"}));
    // The pattern matches u1a only, below the non-matching u1.
    pins.clear();
    probe.find_qual_pins(d.top, &pins, Buf("*a").data(), Buf("*").data(), 1, &kLine3);
    EXPECT_EQ(Names(pins), (V{"core/u1/u1a.D0", "core/u1/u1a.d1"}));
    EXPECT_TRUE(Infos().empty());
    pins.clear();
    probe.find_qual_pins(d.top, &pins, Buf("CORE/U1").data(), Buf("q").data(), 0, &kLine3);
    EXPECT_EQ(Names(pins), (V{"core/u1.Q"}));
    EXPECT_EQ(Infos().back(),
              "Line 3 in 't.ucf': Found case insensitive match for wild_carded PIN name 'CORE/U1.q'. "
              "INST is 'core/u1.Q'.\n");
}

TEST_P(Wildcards, SignalsInTheSubtree) {
    Ndm_Signal* a = d.top->CreateSignal("clk");
    Ndm_Signal* b = u1->CreateSignal("clk");
    Ndm_Signal* c = u1a->CreateSignal("CLK_en");
    core->CreateSignal("data");
    std::vector<Ndm_Signal*> sigs;
    probe.find_qual_sigs_hier(d.top, &sigs, Buf("*clk*").data(), 1, &kLine3);
    EXPECT_EQ(sigs, (std::vector<Ndm_Signal*>{a, b}));
    sigs.clear();
    probe.find_qual_sigs_hier(d.top, &sigs, Buf("core/u1/*").data(), 0, &kLine3);
    EXPECT_EQ(sigs, (std::vector<Ndm_Signal*>{b, c}));  // "*" spans "/"
    sigs.clear();
    probe.find_qual_sigs_hier(u1, &sigs, Buf("core/u1/?lk").data(), 1, &kLine3);
    EXPECT_EQ(sigs, (std::vector<Ndm_Signal*>{b}));
    sigs.clear();
    probe.find_qual_sigs_hier(d.top, &sigs, Buf("core/*/CLK*").data(), 0, &kLine3);
    EXPECT_EQ(sigs, (std::vector<Ndm_Signal*>{b, c}));
    EXPECT_EQ(Infos().back(),
              "Line 3 in 't.ucf': Found case insensitive match for NET name 'core/*/CLK*'. NET is "
              "'core/u1/u1a/CLK_en'.\n");
}

TEST_P(Wildcards, NetworksOncePerMatchInNetworkOrder) {
    Ndm_Signal* top_b = d.top->CreateSignal("bus_b");
    Ndm_Signal* top_a = d.top->CreateSignal("bus_a");
    Ndm_Signal* inner = u1->CreateSignal("port");
    Ndm_Network* nb = d.view->CreateNetwork();
    nb->AddSignal(inner);
    nb->AddSignal(top_b);  // higher: the network is named bus_b
    d.view->CreateNetwork()->AddSignal(top_a);
    std::vector<Ndm_Signal*> sigs;
    probe.find_qual_sigs(&sigs, Buf("bus_*").data(), 1, &kLine3);
    EXPECT_EQ(sigs, (std::vector<Ndm_Signal*>{top_b, top_a}));
    probe.find_qual_sigs(&sigs, Buf("core/*").data(), 1, &kLine3);
    EXPECT_EQ(sigs.size(), 2u);  // appended to, never cleared
    sigs.clear();
    probe.find_qual_sigs(&sigs, Buf("BUS_?").data(), 0, &kLine3);
    EXPECT_EQ(sigs, (std::vector<Ndm_Signal*>{top_b, top_a}));
    EXPECT_EQ(Infos(), (V{Notice("t.ucf"),
                          "Line 3 in 't.ucf': Found case insensitive match for NET name 'BUS_?'. NET is 'bus_b'.\n",
                          "Line 3 in 't.ucf': Found case insensitive match for NET name 'BUS_?'. NET is 'bus_a'.\n"}));
}

TEST_P(Wildcards, NetworkNamesFollowRenamesAndNewNetworks) {
    std::vector<Ndm_Signal*> sigs;
    Ndm_Signal* inner = u1a->CreateSignal("n");
    Ndm_Network* net = d.view->CreateNetwork();
    net->AddSignal(inner);
    probe.find_qual_sigs(&sigs, Buf("core/u1/u1a/?").data(), 1, &kLine3);
    EXPECT_EQ(sigs, (std::vector<Ndm_Signal*>{inner}));
    // A higher signal renames the network; a new network joins in network order.
    Ndm_Signal* outer = core->CreateSignal("n");
    net->AddSignal(outer);
    Ndm_Signal* later = core->CreateSignal("m");
    Ndm_Network* first = d.view->CreateNetwork();
    first->AddSignal(later);
    for (int i = 0; i < GetParam(); ++i) {
        std::string name = "core" + std::to_string(i);
        d.view->CreateNetwork()->AddSignal(d.top->CreateSignal(name.c_str()));
    }
    sigs.clear();
    probe.find_qual_sigs(&sigs, Buf("core/u1/u1a/?").data(), 1, &kLine3);
    EXPECT_TRUE(sigs.empty());
    probe.find_qual_sigs(&sigs, Buf("core/?").data(), 1, &kLine3);
    EXPECT_EQ(sigs, (std::vector<Ndm_Signal*>{outer, later}));
    sigs.clear();
    probe.find_qual_sigs(&sigs, Buf("CORE/*").data(), 0, &kLine3);
    EXPECT_EQ(sigs, (std::vector<Ndm_Signal*>{outer, later}));
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

TEST(BusDelimiters, CycleThroughTheFourStyles) {
    Probe probe;
    auto name = Buf("d(3)");
    EXPECT_TRUE(probe.change_bus_delimiters(name.data()));
    EXPECT_STREQ(name.data(), "d[3]");
    EXPECT_TRUE(probe.change_bus_delimiters(name.data()));
    EXPECT_STREQ(name.data(), "d<3>");
    EXPECT_TRUE(probe.change_bus_delimiters(name.data()));
    EXPECT_STREQ(name.data(), "d{3}");
    EXPECT_FALSE(probe.change_bus_delimiters(name.data()));
    EXPECT_STREQ(name.data(), "d(3)");
    ASSERT_EQ(probe.Tried().size(), 4u);
    EXPECT_STREQ(probe.Tried()[3].c_str(), "d{3}");
}

TEST(BusDelimiters, OnlyTheLastCompleteSubscript) {
    Probe probe;
    auto two = Buf("a(1)(2)");
    EXPECT_TRUE(probe.change_bus_delimiters(two.data()));
    EXPECT_STREQ(two.data(), "a(1)[2]");
    auto mixed = Buf("a<1>x]");  // the rightmost closer decides, and has no opener
    EXPECT_FALSE(probe.change_bus_delimiters(mixed.data()));
    probe.Tried().clear();
    for (const char* plain : {"a]b[", "x", "", "]", "ab", ")(", "(x"}) {
        auto n = Buf(plain);
        EXPECT_FALSE(probe.change_bus_delimiters(n.data())) << plain;
        EXPECT_STREQ(n.data(), plain);
    }
    EXPECT_TRUE(probe.Tried().empty());
    auto leading = Buf("(7)");  // the opener may be the first character
    EXPECT_TRUE(probe.change_bus_delimiters(leading.data()));
    EXPECT_STREQ(leading.data(), "[7]");
}

// Every block and signal, visited naively in pre-order with full names from the database.
void NaiveBlocks(Ndm_Block* b, const char* pattern, bool exact, bool below, std::vector<Ndm_Block*>& out) {
    std::string full = b->GetFullName();
    if ((exact ? UT_STR::Match : UT_STR::IMatch)(full.c_str(), pattern)) {
        out.push_back(b);
        if (!below && !full.empty()) return;
    }
    for (Ndm_Block* c : b->GetBlockItr()) NaiveBlocks(c, pattern, exact, below, out);
}

void NaiveSigs(Ndm_Block* b, const char* pattern, bool exact, std::vector<Ndm_Signal*>& out) {
    for (Ndm_Signal* s : b->GetSignalItr())
        if ((exact ? UT_STR::Match : UT_STR::IMatch)(s->GetFullName().c_str(), pattern)) out.push_back(s);
    for (Ndm_Block* c : b->GetBlockItr()) NaiveSigs(c, pattern, exact, out);
}

TEST(WildcardsRandom, NarrowedWalkFindsWhatAFullWalkFinds) {
    const char* names[] = {"a", "A", "ab", "aB", "b", "a/b", "b/a", "ba", ""};
    const char* pieces[] = {"a", "A", "b", "/", "a/", "*", "?", "ab", "B/"};
    std::mt19937 rng(777);
    Port_MsgCapture capture;
    for (int round = 0; round < 25; ++round) {
        Design d;
        Probe probe;
        std::vector<Ndm_Block*> level{d.top};
        for (int depth = 0; depth < 3; ++depth) {
            std::vector<Ndm_Block*> next;
            for (Ndm_Block* b : level) {
                int kids = static_cast<int>(rng() % 14);
                for (int k = 0; k < kids; ++k) next.push_back(b->CreateBlock(names[rng() % 9]));
                int sigs = static_cast<int>(rng() % 12);
                for (int k = 0; k < sigs; ++k) b->CreateSignal(names[rng() % 9]);
            }
            level = std::move(next);
        }
        for (int q = 0; q < 60; ++q) {
            std::string pattern;
            int n = 1 + static_cast<int>(rng() % 5);
            for (int i = 0; i < n; ++i) pattern += pieces[rng() % 9];
            for (int exact = 0; exact < 2; ++exact) {
                for (int below = 0; below < 2; ++below) {
                    std::vector<Ndm_Block*> want, got;
                    NaiveBlocks(d.top, pattern.c_str(), exact, below, want);
                    probe.find_qual_blocks(d.top, &got, pattern.data(), exact, below, &kLine3);
                    EXPECT_EQ(got, want) << pattern << " exact=" << exact << " below=" << below;
                }
                std::vector<Ndm_Signal*> want, got;
                NaiveSigs(d.top, pattern.c_str(), exact, want);
                probe.find_qual_sigs_hier(d.top, &got, pattern.data(), exact, &kLine3);
                EXPECT_EQ(got, want) << pattern << " exact=" << exact;
            }
        }
    }
}

}  // namespace
