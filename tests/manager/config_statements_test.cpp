// Options, global settings (CONFIG, voltage, temperature), model statements, parse errors.
#include "manager_fixture.h"

namespace {

TEST_F(ManagerTest, BestEffortAndIdentifier) {
    TestMgr plain("a.ucf", CP_UCF, nullptr);
    EXPECT_EQ(plain.get_best_effort(), 0);
    EXPECT_STREQ(plain.get_identifier().c_str(), "");
    plain.set_best_effort(0, "X");
    EXPECT_STREQ(plain.get_identifier().c_str(), "X");
    ::setenv("ZEP_QUILLMAP_BEST_EFFORT_UCF", "", 1);
    TestMgr effort("a.ucf", CP_UCF, nullptr);
    ::unsetenv("ZEP_QUILLMAP_BEST_EFFORT_UCF");
    EXPECT_EQ(effort.get_best_effort(), 1);
    EXPECT_STREQ(effort.get_identifier().c_str(), "DEFAULT");
    EXPECT_EQ(effort.AllowUnmatchedLocs(), 1);
    EXPECT_EQ(effort.AllowUnmatchedLocs(), 1);
    EXPECT_TRUE(effort.IsAnIOProp("LOC"));
    EXPECT_TRUE(effort.IsAnIOProp("SLEW"));
    EXPECT_FALSE(effort.IsAnIOProp("loc"));
    EXPECT_FALSE(effort.IsAnIOProp("IOB"));
    EXPECT_FALSE(effort.IsAnIOProp("LOCATE"));
    EXPECT_FALSE(effort.IsAnIOProp(nullptr));
    TestMgr copy(effort);
    EXPECT_STREQ(copy.get_identifier().c_str(), "DEFAULT");
}

TEST_F(ManagerTest, UcfPartIsLeftToThePartReader) {
    EXPECT_EQ(Run("CONFIG PART = qx100-fg256-2;\n"), 0);
    EXPECT_EQ(Config(), nullptr);
    EXPECT_EQ(Run("CONFIG PART = qx100-fg256-2;\n", CP_NCF), 0);
    EXPECT_EQ(Value(Config(), "PART"), "qx100-fg256-2");
}

TEST_F(ManagerTest, SecondNcfPartIsUserFatal) {
    Port_MsgCapture capture;
    EXPECT_THROW(Run("CONFIG PART = a;\nCONFIG PART = b;\n", CP_NCF), Port_FatalError);
    auto fatal = capture.Texts(Port_Severity::UserFatal);
    ASSERT_EQ(fatal.size(), 1u);
    EXPECT_EQ(fatal[0], "Second \"CONFIG PART\" statement found in " + file +
                            ". First \"PART\" value found was a, second \"PART\" value is b. Please "
                            "remove one of the \"CONFIG PART\" statements from the " + file + " file.\n");
    EXPECT_EQ(capture.messages()[0].code, 2);
}

TEST_F(ManagerTest, PartFromEarlierFileOnlyCountsAfterAnotherConfig) {
    Port_MsgCapture capture;
    ASSERT_EQ(Run("CONFIG PART = a;\n", CP_NCF), 0);
    EXPECT_EQ(Run("CONFIG PART = b;\n", CP_NCF), 0);  // first CONFIG of this file: no test
    EXPECT_EQ(Value(Config(), "PART"), "b");
    EXPECT_THROW(Run("CONFIG STEPPING = ES;\nCONFIG PART = c;\n", CP_NCF), Port_FatalError);
}

TEST_F(ManagerTest, BankVoltagesBypassTheFilter) {
    ASSERT_EQ(Run("CONFIG INTERNAL_VREF_BANK2 = 0.9;\nCONFIG internal_vref_bank2 = 1.2;\n", CP_NCF), 0);
    Ndm_Block* cfg = Config();
    EXPECT_EQ(Prop(cfg, "INTERNAL_VREF_BANK2"), nullptr);
    EXPECT_EQ(Value(cfg, "internal_vref_bank2"), "1.2");
    EXPECT_EQ(Prop(cfg, "FROM_NCF"), nullptr);
    Port_MsgCapture capture;
    EXPECT_EQ(Run("CONFIG INTERNAL_VREF = 1;\n"), 1);  // too short: goes through the filter
    EXPECT_EQ(capture.Texts(Port_Severity::Error),
              std::vector<std::string>{At(1) + "'INTERNAL_VREF' is an invalid constraint name.\n"});
}

TEST_F(ManagerTest, DciCascadeWordsAreJoined) {
    ASSERT_EQ(Run("CONFIG dci_cascade = \"1 3  5\";\n", CP_NCF), 0);
    EXPECT_EQ(Value(Config(), "DCI_CASCADE"), "1,3,5");
    ASSERT_EQ(Run("CONFIG DCI_CASCADE = 7;\n", CP_NCF), 0);  // one chain per statement, all kept
    EXPECT_EQ(Value(Config(), "DCI_CASCADE"), "1,3,5 | 7");
}

TEST_F(ManagerTest, VoltageAndTemperatureTexts) {
    ASSERT_EQ(Run("VOLTAGE = 1.2;\nTEMPERATURE = -40 C;\n"), 0);
    EXPECT_EQ(Value(Config(), "VOLTAGE"), "1.200V");
    EXPECT_EQ(Value(Config(), "TEMPERATURE"), "-40.000C");
    ASSERT_EQ(Run("TEMPERATURE = 85.1234;\n"), 0);
    EXPECT_EQ(Value(Config(), "TEMPERATURE"), "85.123C");
}

TEST_F(ManagerTest, SecondPassRecordsNoSettingsButReportsModels) {
    configure = [](TestMgr& m) { m.set_second_pass(true); };
    Port_MsgCapture capture;
    EXPECT_EQ(Run("CONFIG STEPPING = ES;\nVOLTAGE = 1.2;\nTEMPERATURE = 20;\nMODEL m ATTR = 1;\n"), 1);
    EXPECT_EQ(Config(), nullptr);
    EXPECT_EQ(capture.Texts(Port_Severity::Error),
              std::vector<std::string>{At(4) + " MODEL constraints are not allowed in UCF or NCF files.\n"});
}

TEST_F(ManagerTest, ModelStatementsAndUnreadableValues) {
    Port_MsgCapture capture;
    EXPECT_EQ(Run("BEGIN MODEL m;\nEND;\nTIMESPEC TS_x = PERIOD g 10xs;\n"), 1);
    std::string f = file;
    EXPECT_EQ(capture.Texts(Port_Severity::Error),
              (std::vector<std::string>{
                  "Line 1 '" + f + "':  BEGIN MODEL constraints are not allowed in UCF or NCF files.\n",
                  "Line 2 '" + f + "':  END constraints used to end the MODEL scope are not supported UCF or NCF files.\n",
                  At(3) + "A parsing error occured while reading the constraint file.  The value '10xs' at  "
                          "column 26 is invalid.\n"}));
}

TEST_F(ManagerTest, UnreadableTimingValuesAreReportedAndSkipped) {
    Port_MsgCapture capture;
    EXPECT_EQ(Run("TIMESPEC TS_z = PERIOD g 0 MHz;\nTIMESPEC TS_p = FROM a TO b 5 ns PRIORITY 9999999999;\n"
                  "TIMESPEC TS_ok = PERIOD g 10 ns;\n"),
              1);
    EXPECT_EQ(capture.Texts(Port_Severity::Error),
              (std::vector<std::string>{
                  At(1) + "A parsing error occured while reading the constraint file.  The value '0 MHz' at  "
                          "column 26 is invalid.\n",
                  At(2) + "A parsing error occured while reading the constraint file.  The value '9999999999' at  "
                          "column 43 is invalid.\n"}));
    Ndm_Block* ts = top->GetBlockByName("top_TIMESPEC_UCF");
    ASSERT_NE(ts, nullptr);
    EXPECT_EQ(ts->GetPropertyByName("TIMESPEC")->GetNumEntries(), 1);  // only TS_ok
}

TEST_F(ManagerTest, TraceLinesWhenDebugging) {
    configure = [](TestMgr& m) { m.set_debug_callbacks(); };
    Port_MsgCapture capture(/*debug=*/true);
    Run("CONFIG STEPPING = ES;\nVOLTAGE = 1.2;\nNET clk LOC = P1;\n");
    auto debug = capture.Texts(Port_Severity::Debug);
    EXPECT_NE(std::find(debug.begin(), debug.end(), "MGR::config: Line: 1: CONFIG STEPPING = ES;"), debug.end());
    EXPECT_NE(std::find(debug.begin(), debug.end(), "MGR::Voltage: Line 2: VOLTAGE = 1.2;"), debug.end());
    EXPECT_NE(std::find(debug.begin(), debug.end(), "MGR::net: Line 3: NET clk LOC = P1;"), debug.end());
}

}  // namespace
