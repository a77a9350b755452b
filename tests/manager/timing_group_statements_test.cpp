// TIMESPEC, OFFSET, TIMEGRP, AREA_GROUP, SET, PROHIBIT and VREF statements: the stored texts.
#include "manager_fixture.h"

namespace {

using Entries = std::vector<std::pair<std::string, std::string>>;

class TimingTest : public ManagerTest {
protected:
    Ndm_Block* BlockOfType(const char* type) {
        for (Ndm_Block* b : top->GetBlockItr()) {
            Ndm_Property* t = b->GetPropertyByName("TYPE");
            if (t && t->GetValueString() && std::string(t->GetValueString()) == type) return b;
        }
        return nullptr;
    }
    Entries EntriesOf(const char* type) {
        Entries out;
        Ndm_Block* block = BlockOfType(type);
        Ndm_Property* list = block ? block->GetPropertyByName(type) : nullptr;
        if (list)
            for (Ndm_Property* e : list->GetListItr()) out.emplace_back(e->GetName(), e->GetValueString());
        return out;
    }
};

TEST_F(TimingTest, StoredTextsOfEveryTimingForm) {
    ASSERT_EQ(Run("TIMESPEC TS_clk = PERIOD clk_grp 10 ns HIGH 50%;\n"
                  "TIMESPEC TS_clk2 = PERIOD clk2_grp TS_clk * 2 PHASE + 2.5 ns\n    HIGH 50% PRIORITY 1;\n"
                  "TIMESPEC \"TS_fast\" = PERIOD \"fast_grp\" 250MHz LOW 2 ns INPUT_JITTER 100 ps;\n"
                  "TIMESPEC TS_ab = FROM grpA TO grpB 5 ns DATAPATHONLY PRIORITY 2;\n"
                  "TIMESPEC TS_abc = FROM grpA THRU grpB TO grpC TS_1 / 2;\n"
                  "TIMESPEC TS_f = FROM grpA TO grpB 200 MHz;\n"
                  "TIMESPEC TS_tig = FROM grpA TO grpB TIG PRIORITY 3;\n"
                  "TIMESPEC TS_ign = TIG;\n"
                  "TIMESPEC TS_old = DROP_SPEC;\n"
                  "ENABLE = TS_clk;\nDISABLE = TS_old;\n"
                  "OFFSET = IN 2 ns BEFORE clk;\n"
                  "OFFSET = OUT 3 ns VALID 1 ns AFTER clk TIMEGRP regs HIGH;\n"
                  "TIMEGRP data OFFSET = IN 2 ns BEFORE clk;\n"
                  "timegrp data offset = out 2.5 ns after clk timegrp regs;\n"
                  "TIMEGRP fast = RISING ffs FFS(u1/*) EXCEPT slow;\n"
                  "TIMEGRP tg1 AREA_GROUP = ag1;\n"
                  "TIMESPEC TS_h = PERIOD h_grp TS_clk / 2 PHASE -1 ns;\n"
                  "TIMESPEC TS_r = PERIOD r_grp TS_clk;\n"
                  "TIMESPEC TS_o = TO out_grp 7 ns;\n"),
              0);
    Entries expected = {
        {"TS_clk", "PERIOD \"clk_grp\" 10000.000000 pS HIGH 50.000000 %"},
        {"TS_clk2", "PERIOD \"clk2_grp\" TS_clk * 2.000000 PHASE + 2500.000000 pS HIGH 50.000000 % PRIORITY 1"},
        {"TS_fast", "PERIOD \"fast_grp\" 250.000000 MHz LOW 2000.000000 pS INPUT_JITTER  100.000000 pS"},
        {"TS_ab", "FROM \"grpA\" TO \"grpB\" 5000.000000 pS DATAPATHONLY PRIORITY 2"},
        {"TS_abc", "FROM \"grpA\" THRU \"grpB\" TO \"grpC\" TS_1 / 2.000000"},
        {"TS_f", "FROM \"grpA\" TO \"grpB\" 200.000000 MHz"},
        {"TS_tig", "FROM \"grpA\" TO \"grpB\" TIG PRIORITY 3"},
        {"TS_ign", "IGNORE"},
        {"TS_old", "DROP_SPEC"},
        {"ENABLE", "TS_clk"},
        {"DISABLE", "TS_old"},
        {"OFFSET", "IN 2000.000000 pS BEFORE clk"},
        {"OFFSET", "OUT 3000.000000 pS VALID 1000.000000 pS AFTER clk TIMEGRP regs HIGH"},
        {"TSO_data_in_clk", "TIMEGRP data OFFSET = IN 2000.000000 pS BEFORE clk"},
        {"TSO_data_out_clk_regs", "TIMEGRP data OFFSET = OUT 2500.000000 pS AFTER clk TIMEGRP regs"},
        {"TS_AREA_DEF", "TIMEGRP tg1 AREA_GROUP = ag1"},
        {"TS_h", "PERIOD \"h_grp\" TS_clk / 2.000000 PHASE - 1000.000000 pS HIGH 50.000000 %"},
        {"TS_r", "PERIOD \"r_grp\" TS_clk HIGH 50.000000 %"},
        {"TS_o", "TO \"out_grp\" 7000.000000 pS"},
    };
    EXPECT_EQ(EntriesOf("TIMESPEC"), expected);
    EXPECT_EQ(EntriesOf("TIMEGRP"), (Entries{{"fast", "RISING ffs FFS(u1/*)  EXCEPT slow "}}));
    Ndm_Block* ts = BlockOfType("TIMESPEC");
    EXPECT_STREQ(ts->GetName(), "top_TIMESPEC_UCF");
}

TEST_F(TimingTest, DuplicateGroupOffsetsAreReportedAndKept) {
    Port_MsgCapture capture;
    ASSERT_EQ(Run("TIMEGRP d OFFSET = IN 1 ns BEFORE c;\nTIMEGRP d OFFSET = IN 2 ns BEFORE c;\n"
                  "TIMEGRP d OFFSET = OUT 1 ns AFTER c TIMEGRP r;\nTIMEGRP d OFFSET = OUT 2 ns AFTER c TIMEGRP r;\n"
                  "OFFSET = IN 1 ns BEFORE c;\nOFFSET = IN 1 ns BEFORE c;\n"),
              0);
    EXPECT_EQ(capture.Texts(Port_Severity::Warning),
              std::vector<std::string>{At(2) + "Duplicate OFFSET properties named 'TSO_d_in_c'\n"});
    EXPECT_EQ(capture.Texts(Port_Severity::Internal),
              std::vector<std::string>{"duplicate OFFSET properties named 'TSO_d_out_c_r'\n"});
    EXPECT_EQ(EntriesOf("TIMESPEC").size(), 6u);
}

TEST_F(TimingTest, RejectedTimingStatements) {
    Port_MsgCapture capture;
    EXPECT_EQ(Run("TIMEGRP g = ;\nTIMEGRP h = EXCEPT x;\n"), 1);
    EXPECT_EQ(capture.Texts(Port_Severity::Error),
              (std::vector<std::string>{At(1) + "No groups defined for timegroup 'g'\n",
                                        At(2) + "No groups defined for timegroup 'h'\n"}));
    EXPECT_EQ(BlockOfType("TIMEGRP"), nullptr);
}

TEST_F(TimingTest, AreaGroupsSetsAndNameLists) {
    Port_MsgCapture capture;
    EXPECT_EQ(Run("AREA_GROUP ag1 RANGE = SITE_A0:SITE_A7, SITE_B0:SITE_B3 | PLACE = closed;\n"
                  "AREA_GROUP ag2 RANGE = SITE_C0:SITE_C9 | COMPRESSION = 100 | SPEED = 3 | GROUP = open;\n"
                  "SET set1 RLOC_RANGE = X0Y0:X3Y3 | RLOC_ORIGIN = X0Y0;\n"
                  "SET set2 RLOC_RANGE = A, B, C;\n"
                  "PROHIBIT = SITE_C0, SITE_C1;\nCONFIG VREF = P20, P21;\n"),
              0);
    Ndm_Block* cfg = Config();
    EXPECT_EQ(Prop(cfg, "RANGE")->GetStrings(),
              (std::vector<std::string>{"ag1 = SITE_A0:SITE_A7,SITE_B0:SITE_B3", "ag2 = SITE_C0:SITE_C9"}));
    EXPECT_EQ(Prop(cfg, "PLACE")->GetStrings(), std::vector<std::string>{"ag1 = CLOSED"});
    EXPECT_EQ(Prop(cfg, "GROUP")->GetStrings(), std::vector<std::string>{"ag2 = OPEN"});
    EXPECT_EQ(Prop(cfg, "COMPRESSION")->GetStrings(), std::vector<std::string>{"ag2 = 100"});
    EXPECT_EQ(Value(cfg, "RLOC_RANGE"), "set1 = X0Y0:X3Y3");
    EXPECT_EQ(Prop(cfg, "RLOC_ORIGIN")->GetStrings(), std::vector<std::string>{"set1 = X0Y0"});
    EXPECT_EQ(Value(cfg, "PROHIBIT"), "SITE_C0, SITE_C1");
    EXPECT_EQ(Value(cfg, "VREF"), "P20, P21");
    EXPECT_EQ(capture.Texts(Port_Severity::Error),
              std::vector<std::string>{At(2) + "Unsupported AREA_GROUP attribute detected: 'SPEED'\n"});
}

TEST_F(TimingTest, BadAreaGroupValuesStopTheStatement) {
    struct Case {
        const char* text;
        std::string error;
    } cases[] = {
        {"AREA_GROUP a PLACE = half | GROUP = open;", "HALF is an unsupported PLACE value.\n"},
        {"AREA_GROUP a MODE = free;", "FREE is an unsupported MODE value.\n"},
        {"AREA_GROUP a IMPLEMENT = maybe;", "MAYBE is an unsupported RECONFIG value.\n"},
        {"AREA_GROUP a COMPRESSION = 101;",
         " Compression values need to be within the 0-100 range.  Unsupported compression value detected.\n"},
        {"AREA_GROUP a COMPRESSION = -1;",
         " Compression values need to be within the 0-100 range.  Unsupported compression value detected.\n"},
        {"AREA_GROUP a COMPRESSION = lots;",
         " Compression values need to be within the 0-100 range.  Unsupported compression value detected.\n"},
    };
    for (const Case& c : cases) {
        Port_MsgCapture capture;
        EXPECT_EQ(Run(std::string(c.text) + "\n"), 1) << c.text;
        EXPECT_EQ(capture.Texts(Port_Severity::Error), std::vector<std::string>{At(1) + c.error}) << c.text;
    }
    Ndm_Block* cfg = Config();
    ASSERT_NE(cfg, nullptr);
    EXPECT_EQ(Prop(cfg, "GROUP"), nullptr);  // the record after the refused one is never handled
    EXPECT_EQ(Run("AREA_GROUP a COMPRESSION = 0;\n"), 0);
}

TEST_F(TimingTest, SecondPassRecordsNothing) {
    configure = [](TestMgr& m) { m.set_second_pass(true); };
    Port_MsgCapture capture;
    EXPECT_EQ(Run("TIMESPEC TS_a = PERIOD g 10 ns;\nTIMEGRP g = ;\nOFFSET = IN 1 ns BEFORE c;\n"
                  "AREA_GROUP a PLACE = half;\nPROHIBIT = X;\nTIMEGRP t AREA_GROUP = a;\n"),
              0);
    EXPECT_TRUE(capture.messages().empty());
    EXPECT_EQ(top->GetNumBlocks(), 4);  // no constraint block was made
}

}  // namespace
