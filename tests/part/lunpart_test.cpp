// Ta_LunPart: the target part and global settings, nothing else.
#include <gtest/gtest.h>

#include <memory>

#include "host/design/ndm.h"
#include "host/port/msgman.h"
#include "part/lunpart.h"
#include "support/test_support.h"

namespace {

class PartTest : public ::testing::Test, public lun_test::TopDesign {
protected:
    void SetUp() override { u1 = top->CreateBlock("u1"); }
    int Run(const std::string& text, CP_FILE_TYPE kind = CP_UCF, const char* filter = nullptr) {
        file = dir.Write("p.ucf", text);
        Ta_LunPart reader(file.c_str(), kind, filter);
        return reader.annotate(view);
    }
    Ndm_Block* Config() { return top->GetBlockByName(kind_ncf ? "top_CONFIG_NCF" : "top_CONFIG_UCF"); }
    std::string Value(const char* name) { return lun_test::PropText(Config(), name); }

    lun_test::ScratchDir dir;
    std::string file;
    bool kind_ncf = false;
    Ndm_Block* u1 = nullptr;
};

TEST_F(PartTest, KeepsPartAndSettingsOnly) {
    Port_MsgCapture capture;
    EXPECT_EQ(Run("CONFIG PART = qx100-fg256-2;\nCONFIG STEPPING = ES;\nCONFIG INTERNAL_VREF_BANK0 = 1.5;\n"
                  "CONFIG DCI_CASCADE = \"1 3\";\nNET nosuch LOC = P1;\nINST u1 LOC = X | TNM = g;\n"
                  "TIMESPEC TS_a = PERIOD g 10 ns;\n"),
              0);
    EXPECT_EQ(Value("PART"), "qx100-fg256-2");
    EXPECT_EQ(Value("STEPPING"), "ES");
    EXPECT_EQ(Value("INTERNAL_VREF_BANK0"), "<none>");
    EXPECT_EQ(Value("DCI_CASCADE"), "<none>");
    EXPECT_EQ(u1->GetNumProperties(), 0);
    EXPECT_EQ(top->GetNumBlocks(), 2);  // u1 and the CONFIG block: no timing block
    EXPECT_TRUE(capture.messages().empty());
}

TEST_F(PartTest, PartInsideObjectStatementsMustBeSpeltExactly) {
    EXPECT_EQ(Run("INST u1 part = a | LOC = X;\nNET x PART = qx200-ff1-1;\n", CP_NCF), 0);
    kind_ncf = true;
    EXPECT_EQ(Value("PART"), "qx200-ff1-1");
}

TEST_F(PartTest, SecondPartIsUserFatalAlsoAcrossRuns) {
    ASSERT_EQ(Run("CONFIG PART = a;\n"), 0);
    Port_MsgCapture capture;
    EXPECT_THROW(Run("CONFIG part = b;\n"), Port_FatalError);
    EXPECT_EQ(capture.Texts(Port_Severity::UserFatal),
              std::vector<std::string>{"Second \"CONFIG PART\" statement found in " + file +
                                       ". First \"PART\" value found was a, second \"PART\" value is b. Please "
                                       "remove one of the \"CONFIG PART\" statements from the " + file + " file.\n"});
    Config()->CreatePropertyBool("PART");  // a PART without text is named NONE
    capture.Clear();
    EXPECT_THROW(Run("CONFIG PART = c;\n"), Port_FatalError);
    EXPECT_NE(capture.Texts(Port_Severity::UserFatal)[0].find("value found was NONE, second"), std::string::npos);
}

TEST_F(PartTest, RefusalsAndParseErrors) {
    Port_MsgCapture capture;
    // a definition file that does not know PART: two status messages, the run goes on
    std::string defs = dir.Write("only.pfd", "STEPPING string config\n");
    EXPECT_EQ(Run("INST u1 PART = a;\nNET n PART = b;\nTIMESPEC TS_x = PERIOD g 10xs;\nCONFIG STEPPING = ES;\n",
                  CP_UCF, defs.c_str()),
              0);
    EXPECT_EQ(capture.Texts(Port_Severity::Status),
              (std::vector<std::string>{"Constraint property PART not generated\n", "INST entry is INST u1 PART = a;\n",
                                        "Constraint property PART not generated\n", "NET entry is NET n PART = b;"}));
    auto errors = capture.Texts(Port_Severity::Error);
    ASSERT_EQ(errors.size(), 3u);
    EXPECT_EQ(errors[2], "Line 3 in '" + file +
                             "': A parsing error has occurred while reading the constraint file. The value '10xs' "
                             "at column 26 is invalid.\n");
    EXPECT_EQ(Value("STEPPING"), "ES");
}

}  // namespace
