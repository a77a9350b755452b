#include <gtest/gtest.h>

#include "lookup_fixture.h"

using namespace lookup_test;

namespace {

const Pr_Logical_ConstraintHandle kLine7(7, "INST x;");
using V = std::vector<std::string>;

std::string Found(const char* what, const char* searched, const char* found) {
    return Port_Format("Line 7 in 't.ucf': Found case insensitive match for %s name '%s'. %s is '%s'.\n",
                       what, searched, what, found);
}

class NameResolution : public ::testing::TestWithParam<int> {
protected:
    void SetUp() override {
        Ta_LunResetCaseNotice();
        probe.SetView(d.view);
    }
    // Filler children after the interesting ones, so that the indexed path is taken too.
    void Pad(Ndm_Block* b) { Design::Pad(b, GetParam()); }
    V Infos() {
        V out = capture.Texts(Port_Severity::Info);
        capture.Clear();
        return out;
    }
    Ndm_Block* Blk(const std::string& path, unsigned char exact, Ndm_Block* from = nullptr) {
        return probe.find_blk_hier(from ? from : d.top, Buf(path).data(), exact, &kLine7);
    }
    Ndm_Signal* Sig(Ndm_Block* from, const std::string& path, unsigned char exact) {
        return probe.find_sig_hier(from, Buf(path).data(), exact, &kLine7);
    }

    Port_MsgCapture capture;
    Design d;
    Probe probe;
};

INSTANTIATE_TEST_SUITE_P(SmallAndIndexed, NameResolution, ::testing::Values(0, 20));

TEST_P(NameResolution, FallbackTakesTheFirstChildMatchingIgnoringCase) {
    Ndm_Block* upper = d.top->CreateBlock("Abc");
    Ndm_Block* lower = d.top->CreateBlock("abc");
    Ndm_Block* xyz = d.top->CreateBlock("xyz");
    d.top->CreateBlock("XYZ");
    Pad(d.top);
    EXPECT_EQ(probe.find_blk(d.top, "abc", 1, &kLine7), lower);
    EXPECT_EQ(probe.find_blk(d.top, "xyz", 0, &kLine7), xyz);  // exact child first: silent
    EXPECT_TRUE(Infos().empty());
    EXPECT_FALSE(Ta_LunCaseNoticeIssued());
    EXPECT_EQ(probe.find_blk(d.top, "ABC", 1, &kLine7), nullptr);
    EXPECT_EQ(probe.find_blk(d.top, "abc", 0, &kLine7), upper);
    EXPECT_EQ(Infos(), (V{Notice("t.ucf"), Found("INST", "abc", "Abc")}));

    // Signals follow the same rules; a block without signals finds none.
    Ndm_Block* u1 = d.top->CreateBlock("u1");
    Ndm_Signal* clk = u1->CreateSignal("Clk");
    u1->CreateSignal("clk");
    for (int i = 0; i < GetParam(); ++i) u1->CreateSignal(("s" + std::to_string(i)).c_str());
    EXPECT_EQ(probe.find_sig(u1, "Clk", 1, &kLine7), clk);
    EXPECT_STREQ(probe.find_sig(u1, "clk", 1, &kLine7)->GetName(), "clk");
    EXPECT_EQ(probe.find_sig(u1, "CLK", 1, &kLine7), nullptr);
    EXPECT_EQ(probe.find_sig(u1, "CLK", 0, &kLine7), clk);
    EXPECT_EQ(Infos(), V{Found("NET", "CLK", "u1/Clk")});
    EXPECT_EQ(probe.find_sig(d.top, "clk", 0, &kLine7), nullptr);
}

TEST_P(NameResolution, HierarchicalBlockPaths) {
    Ndm_Block* u1 = d.top->CreateBlock("u1");
    Ndm_Block* walked = u1->CreateBlock("u2");
    Pad(d.top);
    Ndm_Block* literal = d.top->CreateBlock("u1/u2");  // stored after u1, still taken first
    Pad(u1);
    const std::pair<const char*, Ndm_Block*> cases[] = {
        {"top/u1/u2", literal}, {"top/u1", u1},       {"top", d.top},        {"topx/u1", nullptr},
        {"to", nullptr},        {"top/u1/u2/", nullptr}, {"top/u1x", nullptr}, {"top//u1", nullptr}};
    for (const auto& [path, want] : cases) EXPECT_EQ(Blk(path, 1), want) << path;
    EXPECT_EQ(probe.find_blk_hier(d.top, nullptr, 1, &kLine7), nullptr);
    d.top->DeleteBlock(literal);
    EXPECT_EQ(Blk("top/u1/u2", 1), walked);
    EXPECT_TRUE(Infos().empty());

    EXPECT_EQ(Blk("top/U1", 0), u1);
    EXPECT_EQ(Infos(), (V{Notice("t.ucf"), Found("INST", "U1", "u1")}));
    // A path ending at the starting block itself is reported in fallback mode, equal or not.
    EXPECT_EQ(Blk("U1", 0, u1), u1);
    EXPECT_EQ(Blk("u1", 0, u1), u1);
    EXPECT_EQ(Infos(), (V{Found("INST", "U1", "u1"), Found("INST", "u1", "u1")}));
}

TEST_P(NameResolution, FirstCandidateInStoredOrderWhoseDescentSucceedsWins) {
    // Path top/a/b/c: children "a" and "a/b" can both lead on; duplicates of "a" too.
    d.top->CreateBlock("a")->CreateBlock("x");  // a dead end
    Ndm_Block* c_below_ab = d.top->CreateBlock("A/b")->CreateBlock("c");
    Ndm_Block* c_below_a2 = d.top->CreateBlock("a")->CreateBlock("b")->CreateBlock("c");
    Pad(d.top);
    EXPECT_EQ(Blk("top/a/b/c", 1), c_below_a2);  // A/b differs in case
    EXPECT_EQ(Blk("top/a/b/c", 0), c_below_ab);  // A/b precedes the second a
    EXPECT_EQ(Blk("top/A/b/c", 1), c_below_ab);
    EXPECT_EQ(Blk("top/a/b/d", 1), nullptr);
}

TEST_P(NameResolution, SignalPathsSplitFromTheLastSlash) {
    Ndm_Block* u1 = d.top->CreateBlock("u1");
    Ndm_Block* u2 = u1->CreateBlock("u2");
    Pad(u1);
    Ndm_Signal* on_u1 = u1->CreateSignal("u2/clk");
    EXPECT_EQ(Sig(u1, "u1/u2/clk", 1), nullptr);  // u1/u2 has no clk; no shorter split tried
    Ndm_Signal* clk = u2->CreateSignal("clk");
    EXPECT_EQ(Sig(u1, "u1/u2/clk", 1), clk);
    u1->DeleteBlock(u2);
    EXPECT_EQ(Sig(u1, "u1/u2/clk", 1), on_u1);  // falls back to u1 with the signal u2/clk
    for (const char* path : {"clk", "/clk", "U1/u2/clk"}) EXPECT_EQ(Sig(u1, path, 1), nullptr) << path;
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
    const std::pair<const char*, Ndm_Pin*> exact[] = {
        {"u1/u2.D", literal}, {"u1/u2.Q", q_upper}, {"u1.x.D", xd},
        {"u1/u2.d", nullptr}, {".D", nullptr},      {"D", nullptr}};
    for (const auto& [path, want] : exact) EXPECT_EQ(find(path, 1), want) << path;
    EXPECT_EQ(probe.find_pin_hier(u2, "u2.D", 1, &kLine7), d_pin);
    EXPECT_TRUE(Infos().empty());

    // Fallback: an exactly named pin on the resolved block is silent; the block path taken
    // ignoring case is reported where it was found (the child U2 of u1).
    EXPECT_EQ(find("U1/U2.q", 0), q_lower);
    EXPECT_EQ(Infos(), (V{Notice("t.ucf"), Found("INST", "U2", "u1/u2")}));
    // The pin literally named u1/u2.D on u1 matches ignoring case before the path is split.
    EXPECT_EQ(find("u1/u2.d", 0), literal);
    EXPECT_EQ(Infos(), V{Found("PIN", "u1/u2.d", "u1.u1/u2.D")});
    EXPECT_EQ(find("u1/u2.D0", 0), nullptr);
    Ndm_Pin* d0 = u2->CreatePin("d0");
    EXPECT_EQ(find("u1/u2.D0", 0), d0);
    EXPECT_EQ(find("u1.X.d", 0), xd);
    EXPECT_EQ(Infos(), (V{Found("PIN", "u1/u2.D0", "u1/u2.d0"), Found("PIN", "u1.X.d", "u1.x.D")}));
}

TEST_P(NameResolution, LongNamesAndDeepPaths) {
    std::string seg(1500, 'n');  // longer than the working buffer
    Ndm_Block* deep = d.top->CreateBlock(seg.c_str())->CreateBlock(seg.c_str());
    Pad(d.top);
    Ndm_Signal* sig = deep->CreateSignal("s");
    Ndm_Pin* pin = deep->CreatePin("p");
    std::string path = "top/" + seg + "/" + seg;
    EXPECT_EQ(Blk(path, 1), deep);
    EXPECT_EQ(Sig(d.top, path + "/s", 1), sig);
    EXPECT_EQ(probe.find_pin_hier(d.top, (path + ".p").c_str(), 1, &kLine7), pin);
    EXPECT_EQ(Sig(d.top, path + "/t", 1), nullptr);
    std::string huge = "top" + std::string(100000, '/');
    EXPECT_EQ(Blk(huge, 0), nullptr);
    EXPECT_EQ(Sig(d.top, huge, 0), nullptr);

    Ndm_Block* b = d.top->CreateBlock("a");
    for (path = "top/a"; path.size() < 40000; path += "/a") b = b->CreateBlock("a");
    EXPECT_EQ(Blk(path, 1), b);
    EXPECT_EQ(Blk(path + "/a", 1), nullptr);
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

    capture.Clear();
    EXPECT_THROW(first.find_blk(nullptr, "a", 1, &kLine7), Port_FatalError);
    EXPECT_THROW(first.find_sig(d.top, nullptr, 1, &kLine7), Port_FatalError);
    auto& m = capture.messages();
    ASSERT_EQ(m.size(), 2u);
    EXPECT_EQ(m[0].text, "NULL block argument\n");
    EXPECT_EQ(m[1].text, "NULL name argument\n");
    EXPECT_EQ(m[1].code, 2);
}

}  // namespace
