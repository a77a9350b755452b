// Constraints of INST, NET and PIN statements turned into properties, value texts included.
#include "manager_fixture.h"

namespace {

TEST_F(ManagerTest, StringAndFlagConstraints) {
    ASSERT_EQ(Run("INST u3 PULLUP | LOC = SITE_X0Y1;\nNET din MAXDELAY = 1.5 ns | maxskew = 400ps;\n"), 0);
    EXPECT_NE(Prop(u3, "PULLUP"), nullptr);
    EXPECT_EQ(Prop(u3, "PULLUP")->GetType(), NDM_PROP_BOOL);
    EXPECT_EQ(Value(u3, "LOC"), "SITE_X0Y1");
    EXPECT_EQ(Value(Net("din"), "MAXDELAY"), "1500 pS");
    EXPECT_EQ(Value(Net("din"), "MAXSKEW"), "400");  // only the upper-case keywords get the unit
}

TEST_F(ManagerTest, PartAndDivideDependOnFileKind) {
    Port_MsgCapture capture;
    EXPECT_EQ(Run("INST u3 PART = x;\n"), 0);
    EXPECT_EQ(Prop(u3, "PART"), nullptr);
    EXPECT_EQ(Run("INST u3 DIVIDE1_BY = 2;\n"), 1);
    EXPECT_EQ(capture.Texts(Port_Severity::Error),
              std::vector<std::string>{
                  At(1) + "DIVIDE_BY constraints are not supported in the ucf file. The ucf file is processed "
                          "after netlist expansion, which is when the DIVIDE_BY constraint is operational. This "
                          "constraint should be placed in the appropriate netlist or added to a .ncf file.\n"});
    EXPECT_EQ(Run("INST u3 DIVIDE1_BY = 2 | PART = y;\n", CP_NCF), 0);
    EXPECT_EQ(Prop(u3, "DIVIDE1_BY")->GetInt32(), 2);
    EXPECT_EQ(Value(u3, "PART"), "y");
}

TEST_F(ManagerTest, ListConstraints) {
    Port_MsgCapture capture;
    ASSERT_EQ(Run("NET rst TIG;\nNET rst TIG;\n"
                  "INST u3 TNM = FFS grp | RLOC_RANGE = X0Y0:X3Y3 | FEEDBACK = 1.5 ns clkfb;\n"
                  "INST u1 TNM = grp1 | RLOC_RANGE = A, B, C | FEEDBACK = 1 ns;\n"
                  "NET din LOC = P1, P2, P3;\n"
                  "NET din TIG = TS_a, TS_b;\n"),
              0);
    EXPECT_EQ(Prop(Net("rst"), "TIG")->GetStrings(), (std::vector<std::string>{"", ""}));
    EXPECT_EQ(Prop(Net("rst"), "FROM_UCF"), nullptr);  // the valueless TIG bypasses the bookkeeping
    EXPECT_EQ(Value(u3, "TNM"), "FFS : grp");
    EXPECT_EQ(Value(u3, "RLOC_RANGE"), "X0Y0:X3Y3");
    EXPECT_EQ(Value(u3, "FEEDBACK"), "1.5 ns clkfb");
    EXPECT_EQ(Value(u1, "TNM"), "grp1");
    EXPECT_EQ(Prop(u1, "RLOC_RANGE"), nullptr);
    EXPECT_EQ(Prop(u1, "FEEDBACK"), nullptr);
    EXPECT_EQ(Value(Net("din"), "LOC"), "P1,P2,P3");
    EXPECT_EQ(Prop(Net("din"), "TIG")->GetStrings(), (std::vector<std::string>{"TS_a", "TS_b"}));
    EXPECT_TRUE(capture.Texts(Port_Severity::Error).empty());
}

TEST_F(ManagerTest, ReservedSitesIsRefusedEverywhere) {
    for (CP_FILE_TYPE kind : {CP_UCF, CP_NCF}) {
        Port_MsgCapture capture;
        EXPECT_EQ(Run("INST u3 RESERVED_SITES = A, B;\n", kind), 1);
        EXPECT_EQ(capture.Texts(Port_Severity::Error),
                  std::vector<std::string>{At(1) + "'RESERVED_SITES' is no longer a vaild constraint name.  Please "
                                                   "use the LOC and PROHIBIT constraints to reserve or prohibit "
                                                   "placement  in Modular Design.\n"});
    }
}

TEST_F(ManagerTest, InitRangesOffsetsAndPeriods) {
    ASSERT_EQ(Run("INST u3 INIT_00..03 = 0F0F;\n"
                  "NET din OFFSET = IN 2 ns VALID 4 ns BEFORE clk TIMEGRP regs HIGH;\n"
                  "NET rst OFFSET = OUT 3 ns AFTER \"clk\";\n"
                  "NET clk period = 100 MHz LOW 40%;\n"
                  "NET bus[0] PERIOD = 8 ns HIGH 4 ns INPUT_JITTER 100 ps;\n"),
              0);
    for (const char* n : {"INIT_00", "INIT_01", "INIT_02", "INIT_03"}) EXPECT_EQ(Value(u3, n), "0F0F") << n;
    EXPECT_EQ(Value(Net("din"), "OFFSET"),
              "IN : 2000.000000 pS : VALID : 4000.000000 pS : BEFORE : \"clk\" : TIMEGRP regs : HIGH");
    EXPECT_EQ(Value(Net("rst"), "OFFSET"), "OUT : 3000.000000 pS : AFTER : \"clk\"");
    EXPECT_EQ(Value(Net("clk"), "PERIOD"), "10000.000000 pS LOW 40.000000 %");
    EXPECT_EQ(Value(Net("bus[0]"), "PERIOD"), "8000.000000 pS HIGH 4000.000000 pS INPUT_JITTER 100.000000 pS");
}

TEST_F(ManagerTest, RefusalStopsTheStatement) {
    Port_MsgCapture capture;
    EXPECT_EQ(Run("INST u* LOC = SITE_A | BOGUS = 1 | IOSTANDARD = x;\n"), 1);
    // the first match gets LOC, then the statement stops
    EXPECT_EQ(Value(u1, "LOC"), "SITE_A");
    EXPECT_EQ(Prop(u1, "IOSTANDARD"), nullptr);
    EXPECT_EQ(Prop(u2, "LOC"), nullptr);
    EXPECT_EQ(Prop(u3, "LOC"), nullptr);
    EXPECT_EQ(capture.Texts(Port_Severity::Error),
              std::vector<std::string>{At(1) + "'BOGUS' is an invalid constraint name.\n"});
}

}  // namespace
