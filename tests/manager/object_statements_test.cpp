// INST, NET and PIN statements: lookup order, retries, the equivalent-net message and the
// policy for names that match nothing.
#include "lookup/case_notice.h"
#include "manager_fixture.h"

namespace {

TEST_F(ManagerTest, InstNamesAreBelowTheTopBlock) {
    ASSERT_EQ(Run("INST u1/u2 LOC = S1;\nINST / LOC = S0;\n"), 0);
    EXPECT_EQ(Value(u2, "LOC"), "S1");
    EXPECT_EQ(Value(top, "LOC"), "S0");
    Port_MsgCapture capture;
    EXPECT_EQ(Run("INST top/u1 LOC = S2;\nINST /u1 LOC = S3;\n", CP_NCF), 1);
    EXPECT_EQ(capture.Texts(Port_Severity::Error).size(), 2u);
    EXPECT_EQ(Value(u1, "LOC"), "<none>");
}

TEST_F(ManagerTest, InstWildcardsAndTrailingSlash) {
    ASSERT_EQ(Run("INST /u* IOB = TRUE;\n"), 0);
    EXPECT_EQ(Value(u1, "IOB"), "TRUE");
    EXPECT_EQ(Value(u2, "IOB"), "TRUE");  // u1/u2 matches u* too, searched below the match
    EXPECT_EQ(Value(u3, "IOB"), "TRUE");
    ASSERT_EQ(Run("INST u*/ LOC = SITE;\n"), 0);
    EXPECT_EQ(Value(u1, "LOC"), "SITE");
    EXPECT_EQ(Value(u2, "LOC"), "<none>");  // not below a matching block
}

TEST_F(ManagerTest, CaseFallbackInUcfOnly) {
    Ta_LunResetCaseNotice();
    Port_MsgCapture capture;
    ASSERT_EQ(Run("INST U1/U2 LOC = S1;\n"), 0);
    EXPECT_EQ(Value(u2, "LOC"), "S1");
    auto info = capture.Texts(Port_Severity::Info);
    ASSERT_EQ(info.size(), 2u);
    EXPECT_EQ(info[1], At(1) + "Found case insensitive match for INST name 'U2'. INST is 'u1/u2'.\n");
    capture.Clear();
    EXPECT_EQ(Run("INST U3 LOC = S1;\n", CP_NCF), 1);
    EXPECT_EQ(capture.Texts(Port_Severity::Error),
              std::vector<std::string>{At(1) + "Could not find instance(s) 'U3' in the design.  To suppress this "
                                               "error use the -aul switch, specify the correct instance name or "
                                               "remove the constraint.\n"});
}

TEST_F(ManagerTest, PadRetryDropsTheLastFourCharacters) {
    ASSERT_EQ(Run("INST pad1.PAD IOSTANDARD = std33;\n"), 0);
    EXPECT_EQ(Value(pad1, "IOSTANDARD"), "std33");
    Port_MsgCapture capture;
    EXPECT_EQ(Run("INST pad1.PAD IOSTANDARD = std25;\n", CP_NCF), 1);  // only in a UCF
    EXPECT_EQ(Value(pad1, "IOSTANDARD"), "std33");
}

TEST_F(ManagerTest, BusDelimitersAreCycled) {
    ASSERT_EQ(Run("INST data(3) LOC = S7;\nNET bus(1) LOC = P4;\nNET bus<0> LOC = P3;\n"), 0);
    EXPECT_EQ(Value(data3, "LOC"), "S7");
    EXPECT_EQ(Value(Net("bus[1]"), "LOC"), "P4");
    EXPECT_EQ(Value(Net("bus[0]"), "LOC"), "P3");
    Port_MsgCapture capture;
    EXPECT_EQ(Run("NET bus(7) TNM = g;\n"), 1);
    // after the whole cycle the message quotes the name as written
    EXPECT_EQ(capture.Texts(Port_Severity::Error),
              std::vector<std::string>{At(1) + "Could not find net(s) 'bus(7)' in the design.  To suppress this "
                                               "error specify the correct net name or remove the constraint.\n"});
}

TEST_F(ManagerTest, NetsAttachToTheirNetworkWithEquivalentNetMessage) {
    Port_MsgCapture capture;
    ASSERT_EQ(Run("NET u1/n1 TNM_NET = g | IOSTANDARD = std;\n"), 0);
    Ndm_Network* clk = Net("clk");
    EXPECT_EQ(Value(clk, "TNM_NET"), "g");
    std::string msg = At(1) + "The constraint for NET 'u1/n1' is being attached to the equivalent NET 'clk'.\n";
    EXPECT_EQ(capture.Texts(Port_Severity::Info), (std::vector<std::string>{msg, msg}));
    capture.Clear();
    ASSERT_EQ(Run("NET u1/q TNM_NET = h;\nNET \"bus[*]\" IOSTANDARD = std25;\n"), 0);
    EXPECT_EQ(Value(u1->GetSignalByName("q")->GetNetwork(), "TNM_NET"), "h");
    EXPECT_EQ(Value(Net("bus[0]"), "IOSTANDARD"), "std25");
    EXPECT_EQ(Value(Net("bus[1]"), "IOSTANDARD"), "std25");
    EXPECT_TRUE(capture.Texts(Port_Severity::Info).empty());
}

TEST_F(ManagerTest, PinsByPathAndWildcard) {
    ASSERT_EQ(Run("PIN u1/u2.D LOC = S1;\nPIN u1.A* IOSTANDARD = std;\n"), 0);
    EXPECT_EQ(Value(u2->GetPinByName("D"), "LOC"), "S1");
    EXPECT_EQ(Value(u1->GetPinByName("A"), "IOSTANDARD"), "std");
    EXPECT_EQ(Value(u1->GetPinByName("B"), "IOSTANDARD"), "<none>");
}

TEST_F(ManagerTest, PinAndNetSearchesOnManyChildren) {
    for (int i = 0; i < 80; ++i) {
        Ndm_Block* cell = top->CreateBlock(("c" + std::to_string(i)).c_str());
        cell->CreatePin("I");
        view->CreateNetwork()->AddSignal(cell->CreateSignal("o"));
    }
    Ndm_Block* odd = top->GetBlockByName("c77");
    odd->CreatePin("c3.I");  // a pin literally named like a path, on another child
    ASSERT_EQ(Run("PIN c42.I LOC = S1;\nPIN c3.I IOSTANDARD = std;\nPIN C5.i LOC = S5;\nNET c9/o TNM_NET = g9;\n"), 0);
    EXPECT_EQ(Value(top->GetBlockByName("c42")->GetPinByName("I"), "LOC"), "S1");
    // the first child in stored order that yields a pin wins: c3 itself comes before c77
    EXPECT_EQ(Value(top->GetBlockByName("c3")->GetPinByName("I"), "IOSTANDARD"), "std");
    EXPECT_EQ(Value(odd->GetPinByName("c3.I"), "IOSTANDARD"), "<none>");
    EXPECT_EQ(Value(top->GetBlockByName("c5")->GetPinByName("I"), "LOC"), "S5");  // case fallback
    EXPECT_EQ(Value(top->GetBlockByName("c9")->GetSignalByName("o")->GetNetwork(), "TNM_NET"), "g9");
}

TEST_F(ManagerTest, UnmatchedPolicy) {
    struct Case {
        const char* text;
        std::function<void(TestMgr&)> setup;
        bool env;
        int result;
        Port_Severity severity;
        std::string message;  // after the line prefix; empty for no message
    };
    const std::string inst_io = "Could not find instance(s) 'nope' in the design.  To suppress this error use the "
                                "-aul switch, specify the correct instance name or remove the constraint.\n";
    const std::string inst_other = "Could not find instance(s) 'nope' in the design.  To suppress this error "
                                   "specify the correct instance name or remove the constraint.\n";
    const std::string pin = "Could not find pin(s) 'nope.X' in the design.  To suppress this error specify the "
                            "correct pin name or remove the constraint.\n";
    auto effort = [](TestMgr& m) { m.set_best_effort(1, "B"); };
    auto aul = [](TestMgr& m) { m.AllowUnmatchedLocs(); };
    const Case cases[] = {
        {"INST nope IOSTANDARD = x;", effort, false, 0, Port_Severity::Debug, ""},
        {"INST nope IOSTANDARD = x;", aul, false, 0, Port_Severity::Info,
         "Could not find instance(s) 'nope' in the design.  Since the -aul switch is set, the constraint will be "
         "ignored.\n"},
        {"INST nope IOSTANDARD = x;", nullptr, true, 0, Port_Severity::Warning, inst_io},
        {"INST nope IOSTANDARD = x;", nullptr, false, 1, Port_Severity::Error, inst_io},
        {"INST nope TNM = g | LOC = x;", aul, false, 1, Port_Severity::Error, inst_other},
        {"INST nope TNM = g;", nullptr, true, 0, Port_Severity::Warning, inst_other},
        {"NET nope LOC = P1;", aul, false, 0, Port_Severity::Info,
         "Could not find net(s) 'nope' in the design.  Since the -aul switch is set, the constraint will be "
         "ignored.\n"},
        {"PIN nope.X LOC = S;", effort, false, 1, Port_Severity::Error, pin},
        {"PIN nope.X LOC = S;", aul, true, 0, Port_Severity::Warning, pin},
    };
    for (const Case& c : cases) {
        configure = c.setup;
        if (c.env) ::setenv("ZEP_QUILLMAP_ALLOWUNMATCHEDUCF", "", 1);
        Port_MsgCapture capture(/*debug=*/true);
        EXPECT_EQ(Run(std::string(c.text) + "\n"), c.result) << c.text;
        ::unsetenv("ZEP_QUILLMAP_ALLOWUNMATCHEDUCF");
        std::vector<std::string> got;
        for (const auto& m : capture.messages())
            if (m.severity != Port_Severity::Debug) got.push_back(m.text);
        if (c.message.empty()) {
            EXPECT_TRUE(got.empty()) << c.text;
            auto debug = capture.Texts(Port_Severity::Debug);
            EXPECT_EQ(debug.back(), "Unmatched ucf constraint line: Line 1: " + std::string(c.text));
        } else {
            EXPECT_EQ(got, std::vector<std::string>{At(1) + c.message}) << c.text;
            ASSERT_FALSE(capture.messages().empty());
            EXPECT_EQ(capture.messages().back().severity, c.severity) << c.text;
        }
    }
}

TEST_F(ManagerTest, StatementWithoutConstraintsLooksNothingUp) {
    Port_MsgCapture capture;
    EXPECT_EQ(Run("NET nosuch;\nINST nosuch;\nPIN no.such;\n"), 0);
    EXPECT_TRUE(capture.messages().empty());
}

}  // namespace
