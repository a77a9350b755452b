#include <gtest/gtest.h>

#include <cstring>
#include <random>

#include "host/port/ut_str.h"
#include "lookup_fixture.h"

using namespace lookup_test;

namespace {

const Pr_Logical_ConstraintHandle kLine7(7, "INST x;");

std::string Inst(const char* searched, const char* found) {
    return Port_Format("Line 7 in 't.ucf': Found case insensitive match for INST name '%s'. INST is '%s'.\n",
                       searched, found);
}

class NameResolution : public ::testing::TestWithParam<int> {
protected:
    void SetUp() override {
        Ta_LunResetCaseNotice();
        probe.SetView(d.view);
    }
    // Filler children after the interesting ones, so that the indexed path is taken too.
    void Pad(Ndm_Block* b) { Design::Pad(b, GetParam()); }
    std::vector<std::string> Infos() const { return capture.Texts(Port_Severity::Info); }

    Port_MsgCapture capture;
    Design d;
    Probe probe;
};

INSTANTIATE_TEST_SUITE_P(SmallAndIndexed, NameResolution, ::testing::Values(0, 20));

TEST_P(NameResolution, FirstCaseInsensitiveChildWinsInFallback) {
    d.top->CreateBlock("Abc");
    Ndm_Block* abc = d.top->CreateBlock("abc");
    Pad(d.top);
    EXPECT_EQ(probe.find_blk(d.top, "abc", 1, &kLine7), abc);
    EXPECT_TRUE(Infos().empty());

    Ndm_Block* first = probe.find_blk(d.top, "abc", 0, &kLine7);
    EXPECT_STREQ(first->GetName(), "Abc");
    EXPECT_EQ(Infos(), (std::vector<std::string>{Notice("t.ucf"), Inst("abc", "Abc")}));
    EXPECT_EQ(probe.find_blk(d.top, "ABC", 1, &kLine7), nullptr);
}

TEST_P(NameResolution, ExactChildFoundFirstIsSilentInFallback) {
    Ndm_Block* low = d.top->CreateBlock("abc");
    d.top->CreateBlock("Abc");
    Pad(d.top);
    EXPECT_EQ(probe.find_blk(d.top, "abc", 0, &kLine7), low);
    EXPECT_TRUE(Infos().empty());
    EXPECT_FALSE(Ta_LunCaseNoticeIssued());
}

TEST_P(NameResolution, SignalsFollowTheSameRulesAndNeedNoChildren) {
    Ndm_Block* u1 = d.top->CreateBlock("u1");
    Ndm_Signal* clk = u1->CreateSignal("Clk");
    u1->CreateSignal("clk");
    for (int i = 0; i < GetParam(); ++i) u1->CreateSignal(("s" + std::to_string(i)).c_str());
    EXPECT_EQ(probe.find_sig(u1, "Clk", 1, &kLine7), clk);
    EXPECT_STREQ(probe.find_sig(u1, "clk", 1, &kLine7)->GetName(), "clk");
    EXPECT_EQ(probe.find_sig(u1, "CLK", 1, &kLine7), nullptr);
    EXPECT_EQ(probe.find_sig(u1, "CLK", 0, &kLine7), clk);
    EXPECT_EQ(Infos().back(),
              "Line 7 in 't.ucf': Found case insensitive match for NET name 'CLK'. NET is 'u1/Clk'.\n");
    EXPECT_EQ(probe.find_sig(d.top, "clk", 0, &kLine7), nullptr);  // no signals at all
}

TEST_P(NameResolution, HierarchicalBlockPaths) {
    Ndm_Block* u1 = d.top->CreateBlock("u1");
    Ndm_Block* walked = u1->CreateBlock("u2");
    Pad(d.top);
    Ndm_Block* literal = d.top->CreateBlock("u1/u2");  // stored after u1, still taken first
    Pad(u1);
    auto find = [&](const char* path, unsigned char exact) {
        return probe.find_blk_hier(d.top, Buf(path).data(), exact, &kLine7);
    };
    EXPECT_EQ(find("top/u1/u2", 1), literal);
    EXPECT_EQ(find("top/u1", 1), u1);
    EXPECT_EQ(find("top", 1), d.top);
    EXPECT_EQ(find("topx/u1", 1), nullptr);
    EXPECT_EQ(find("to", 1), nullptr);
    EXPECT_EQ(find("top/u1/u2/", 1), nullptr);
    EXPECT_EQ(find("top/u1x", 1), nullptr);
    EXPECT_EQ(find("top//u1", 1), nullptr);
    EXPECT_EQ(probe.find_blk_hier(d.top, nullptr, 1, &kLine7), nullptr);
    d.top->DeleteBlock(literal);
    EXPECT_EQ(find("top/u1/u2", 1), walked);
    EXPECT_TRUE(Infos().empty());

    EXPECT_EQ(find("top/U1", 0), u1);
    EXPECT_EQ(Infos(), (std::vector<std::string>{Notice("t.ucf"), Inst("U1", "u1")}));
    capture.Clear();
    // A path ending at the starting block itself is reported in fallback mode, equal or not.
    EXPECT_EQ(probe.find_blk_hier(u1, Buf("U1").data(), 0, &kLine7), u1);
    EXPECT_EQ(probe.find_blk_hier(u1, Buf("u1").data(), 0, &kLine7), u1);
    EXPECT_EQ(Infos(), (std::vector<std::string>{Inst("U1", "u1"), Inst("u1", "u1")}));
}

TEST_P(NameResolution, FirstCandidateInStoredOrderWhoseDescentSucceedsWins) {
    // Path top/a/b/c: children "a" and "a/b" can both lead on; duplicates of "a" too.
    Ndm_Block* dead_a = d.top->CreateBlock("a");  // no b below
    dead_a->CreateBlock("x");
    Ndm_Block* ab = d.top->CreateBlock("A/b");
    Ndm_Block* c_below_ab = ab->CreateBlock("c");
    Ndm_Block* a2 = d.top->CreateBlock("a");
    Ndm_Block* c_below_a2 = a2->CreateBlock("b")->CreateBlock("c");
    Pad(d.top);
    auto find = [&](const char* path, unsigned char exact) {
        return probe.find_blk_hier(d.top, Buf(path).data(), exact, &kLine7);
    };
    EXPECT_EQ(find("top/a/b/c", 1), c_below_a2);  // A/b differs in case
    EXPECT_EQ(find("top/a/b/c", 0), c_below_ab);  // A/b precedes the second a
    EXPECT_EQ(find("top/A/b/c", 1), c_below_ab);
    EXPECT_EQ(find("top/a/b/d", 1), nullptr);
}

TEST_P(NameResolution, SignalPathsSplitFromTheLastSlash) {
    Ndm_Block* u1 = d.top->CreateBlock("u1");
    Ndm_Block* u2 = u1->CreateBlock("u2");
    Pad(u1);
    Ndm_Signal* on_u1 = u1->CreateSignal("u2/clk");
    auto find = [&](const char* path, unsigned char exact) {
        return probe.find_sig_hier(u1, Buf(path).data(), exact, &kLine7);
    };
    // u1/u2 resolves, has no clk, and no shorter split is tried.
    EXPECT_EQ(find("u1/u2/clk", 1), nullptr);
    Ndm_Signal* clk = u2->CreateSignal("clk");
    EXPECT_EQ(find("u1/u2/clk", 1), clk);
    u1->DeleteBlock(u2);
    EXPECT_EQ(find("u1/u2/clk", 1), on_u1);  // falls back to u1 with the signal u2/clk
    EXPECT_EQ(find("clk", 1), nullptr);
    EXPECT_EQ(find("/clk", 1), nullptr);
    EXPECT_EQ(find("U1/u2/clk", 1), nullptr);
    EXPECT_TRUE(Infos().empty());
}

TEST_P(NameResolution, PinPathForms) {
    Ndm_Block* u1 = d.top->CreateBlock("u1");
    Ndm_Block* u2 = u1->CreateBlock("u2");
    Pad(u1);
    Ndm_Pin* literal = u1->CreatePin("u1/u2.D");
    Ndm_Pin* d_pin = u2->CreatePin("D");
    Ndm_Pin* xd = u1->CreatePin("x.D");
    Ndm_Pin* q_upper = u2->CreatePin("Q");
    Ndm_Pin* q_lower = u2->CreatePin("q");
    auto find = [&](const char* path, unsigned char exact) {
        return probe.find_pin_hier(u1, path, exact, &kLine7);
    };
    EXPECT_EQ(find("u1/u2.D", 1), literal);  // before the pin D of u1/u2
    EXPECT_EQ(find("u1/u2.Q", 1), q_upper);
    EXPECT_EQ(find("u1.x.D", 1), xd);
    EXPECT_EQ(probe.find_pin_hier(u2, "u2.D", 1, &kLine7), d_pin);
    EXPECT_EQ(find("u1/u2.d", 1), nullptr);
    EXPECT_EQ(find(".D", 1), nullptr);
    EXPECT_EQ(find("D", 1), nullptr);
    EXPECT_TRUE(Infos().empty());

    // Fallback: an exactly named pin on the resolved block is silent; the block path taken
    // ignoring case is reported where it was found (the child U2 of u1).
    EXPECT_EQ(find("U1/U2.q", 0), q_lower);
    EXPECT_EQ(Infos(), (std::vector<std::string>{Notice("t.ucf"), Inst("U2", "u1/u2")}));
    capture.Clear();
    // The pin literally named u1/u2.D on u1 matches ignoring case before the path is split.
    EXPECT_EQ(find("u1/u2.d", 0), literal);
    EXPECT_EQ(Infos(), (std::vector<std::string>{
                           "Line 7 in 't.ucf': Found case insensitive match for PIN name 'u1/u2.d'. "
                           "PIN is 'u1.u1/u2.D'.\n"}));
    capture.Clear();
    EXPECT_EQ(find("u1/u2.D0", 0), nullptr);
    u2->CreatePin("d0");
    EXPECT_EQ(find("u1/u2.D0", 0), u2->GetPinByName("d0"));
    EXPECT_EQ(Infos(), (std::vector<std::string>{
                           "Line 7 in 't.ucf': Found case insensitive match for PIN name 'u1/u2.D0'. "
                           "PIN is 'u1/u2.d0'.\n"}));
    capture.Clear();
    EXPECT_EQ(find("u1.X.d", 0), xd);
    EXPECT_EQ(Infos(), (std::vector<std::string>{
                           "Line 7 in 't.ucf': Found case insensitive match for PIN name 'u1.X.d'. "
                           "PIN is 'u1.x.D'.\n"}));
}

TEST_P(NameResolution, NamesLongerThanTheWorkingBuffer) {
    std::string seg(1500, 'n');
    Ndm_Block* deep = d.top->CreateBlock(seg.c_str())->CreateBlock(seg.c_str());
    Pad(d.top);
    Ndm_Signal* sig = deep->CreateSignal("s");
    Ndm_Pin* pin = deep->CreatePin("p");
    std::string path = "top/" + seg + "/" + seg;
    EXPECT_EQ(probe.find_blk_hier(d.top, Buf(path).data(), 1, &kLine7), deep);
    EXPECT_EQ(probe.find_sig_hier(d.top, Buf(path + "/s").data(), 1, &kLine7), sig);
    EXPECT_EQ(probe.find_pin_hier(d.top, (path + ".p").c_str(), 1, &kLine7), pin);
    EXPECT_EQ(probe.find_sig_hier(d.top, Buf(path + "/t").data(), 1, &kLine7), nullptr);
    std::string huge(100000, '/');
    EXPECT_EQ(probe.find_blk_hier(d.top, Buf("top" + huge).data(), 0, &kLine7), nullptr);
    EXPECT_EQ(probe.find_sig_hier(d.top, Buf("top" + huge).data(), 0, &kLine7), nullptr);
}

TEST(NameResolutionNotice, IssuedOncePerProcessAcrossAnnotators) {
    Ta_LunResetCaseNotice();
    Port_MsgCapture capture;
    Design d;
    d.top->CreateBlock("u1")->CreateSignal("s");
    Probe first("a.ucf"), second("b.ucf");
    EXPECT_NE(first.find_blk(d.top, "U1", 0, &kLine7), nullptr);
    EXPECT_NE(first.find_blk(d.top, "U1", 0, &kLine7), nullptr);
    EXPECT_NE(second.find_sig_hier(d.top, Buf("top/U1/S").data(), 0, &kLine7), nullptr);
    auto infos = capture.Texts(Port_Severity::Info);
    ASSERT_EQ(infos.size(), 5u);
    EXPECT_EQ(infos[0], Notice("a.ucf"));
    EXPECT_EQ(infos[3], "Line 7 in 'b.ucf': Found case insensitive match for INST name 'U1'. INST is 'u1'.\n");
    EXPECT_EQ(infos[4], "Line 7 in 'b.ucf': Found case insensitive match for NET name 'S'. NET is 'u1/s'.\n");
    for (const Port_Message& m : capture.messages()) EXPECT_EQ(m.module, "lunfind");
}

TEST(NameResolutionFatal, MissingBlockOrName) {
    Port_MsgCapture capture;
    Design d;
    Probe probe;
    EXPECT_THROW(probe.find_blk(nullptr, "a", 1, &kLine7), Port_FatalError);
    EXPECT_THROW(probe.find_sig(d.top, nullptr, 1, &kLine7), Port_FatalError);
    auto& m = capture.messages();
    ASSERT_EQ(m.size(), 2u);
    EXPECT_EQ(m[0].text, "NULL block argument\n");
    EXPECT_EQ(m[1].text, "NULL name argument\n");
    EXPECT_EQ(m[1].code, 2);
}

TEST(NameResolutionDeep, ThousandsOfLevels) {
    Design d;
    Probe probe;
    std::string path = "top";
    Ndm_Block* b = d.top;
    for (int i = 0; i < 20000; ++i) {
        b = b->CreateBlock("a");
        path += "/a";
    }
    EXPECT_EQ(probe.find_blk_hier(d.top, Buf(path).data(), 1, &kLine7), b);
    EXPECT_EQ(probe.find_blk_hier(d.top, Buf(path + "/a").data(), 1, &kLine7), nullptr);
}

// Straight transcription of the resolution rules, visiting every child, to compare against.
Ndm_Block* NaiveChild(Ndm_Block* b, const std::string& name, bool exact) {
    for (Ndm_Block* c : b->GetBlockItr()) {
        if (name == c->GetName()) return c;
        if (!exact && UT_STR::ICompare(name.c_str(), c->GetName()) == 0) return c;
    }
    return nullptr;
}

Ndm_Block* NaiveHier(Ndm_Block* b, const std::string& path, bool exact) {
    size_t n = std::strlen(b->GetName());
    if (path.size() < n) return nullptr;
    if ((exact ? UT_STR::NCompare : UT_STR::INCompare)(path.c_str(), b->GetName(), n) != 0) return nullptr;
    if (path.size() == n) return b;
    if (path[n] != '/') return nullptr;
    std::string rest = path.substr(n + 1);
    if (Ndm_Block* c = NaiveChild(b, rest, exact)) return c;
    for (Ndm_Block* c : b->GetBlockItr())
        if (Ndm_Block* r = NaiveHier(c, rest, exact)) return r;
    return nullptr;
}

TEST(NameResolutionRandom, SameResultsAsVisitingEveryChild) {
    const char* names[] = {"a", "A", "b", "a/b", "A/B", "b/a", "ab", "a/b/a", ""};
    std::mt19937 rng(12345);
    Port_MsgCapture capture;
    for (int round = 0; round < 30; ++round) {
        Design d;
        Probe probe;
        std::vector<Ndm_Block*> level{d.top};
        for (int depth = 0; depth < 3; ++depth) {
            std::vector<Ndm_Block*> next;
            for (Ndm_Block* b : level) {
                int kids = static_cast<int>(rng() % 14);
                for (int k = 0; k < kids; ++k) next.push_back(b->CreateBlock(names[rng() % 9]));
            }
            level = std::move(next);
        }
        for (int q = 0; q < 200; ++q) {
            std::string path = (rng() % 10) ? "top" : "TOP";
            int segs = 1 + static_cast<int>(rng() % 5);
            for (int s = 0; s < segs; ++s) path += std::string("/") + names[rng() % 9];
            for (int exact = 0; exact < 2; ++exact) {
                Ndm_Block* want = NaiveHier(d.top, path, exact);
                EXPECT_EQ(probe.find_blk_hier(d.top, Buf(path).data(), exact, &kLine7), want)
                    << path << " exact=" << exact;
            }
        }
    }
}

}  // namespace
