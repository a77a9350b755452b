// Attaching constraints through the filter: verdict messages, name lists, the second pass.
#include "frame_fixture.h"

namespace {

class AttachTest : public FrameTest {
protected:
    void SetUp() override {
        FrameTest::SetUp();
        ucf = std::make_unique<ProbeAnnotator>(dir.Write("a.ucf", "").c_str(), CP_UCF, nullptr);
        ucf->annotate(view);  // binds the view and creates the default filter
    }
    const std::string file() const { return dir.path() + "/a.ucf"; }
    std::unique_ptr<ProbeAnnotator> ucf;
    Pr_Logical_ConstraintHandle line7{7, "NET x ...;"};
};

TEST_F(AttachTest, NamesAreRecordedUpperCasedOnEveryAttachment) {
    Ndm_Network* clk = Net("clk");
    EXPECT_EQ(ucf->AttachConstraint("LOC", "P1", clk, &line7), 1);
    EXPECT_EQ(ucf->AttachConstraint("loc", "P2", clk, &line7), 1);
    EXPECT_EQ(Strings(clk, "FROM_UCF"), (std::vector<std::string>{"LOC", "LOC"}));
    EXPECT_STREQ(clk->GetPropertyByName("LOC")->GetValueString(), "P2");
    EXPECT_EQ(clk->GetPropertyByName("_TempPropList"), nullptr);
    EXPECT_EQ(clk->GetPropertyByName("FROM_NCF"), nullptr);
}

TEST_F(AttachTest, UnknownNameFailsWithErrorAndLeavesNoTrace) {
    Port_MsgCapture capture;
    Ndm_Network* clk = Net("clk");
    EXPECT_EQ(ucf->AttachConstraint("NOT_A_CONSTRAINT", "1", clk, &line7), 0);
    ASSERT_EQ(capture.messages().size(), 1u);
    EXPECT_EQ(capture.messages()[0].severity, Port_Severity::Error);
    EXPECT_EQ(capture.messages()[0].module, "lunbase");
    EXPECT_EQ(capture.messages()[0].text,
              "Line 7 in '" + file() + "': 'NOT_A_CONSTRAINT' is an invalid constraint name.\n");
    EXPECT_EQ(clk->GetNumProperties(), 0);
}

TEST_F(AttachTest, WrongValueTypeWarnsButCountsAsDone) {
    Port_MsgCapture capture;
    Ndm_Network* clk = Net("clk");
    EXPECT_EQ(ucf->AttachConstraint("DRIVE", "strong", clk, &line7), 1);
    EXPECT_EQ(capture.Texts(Port_Severity::Warning),
              std::vector<std::string>{
                  "Line 7 in '" + file() +
                  "': Invalid constraint value type for 'DRIVE'.  Make sure the syntax for this "
                  "constraint is consistent with what is specified in the Constraints Guide.  This "
                  "constraint will be ignored.\n"});
    EXPECT_EQ(clk->GetPropertyByName("DRIVE"), nullptr);
    EXPECT_EQ(Strings(clk, "FROM_UCF"), std::vector<std::string>{"DRIVE"});
}

TEST_F(AttachTest, FalseBooleanGoesToDebugChannelOnly) {
    Port_MsgCapture capture(/*debug=*/true);
    Ndm_Network* clk = Net("clk");
    EXPECT_EQ(ucf->AttachConstraint("PULLUP", "FALSE", clk, &line7), 1);
    EXPECT_EQ(ucf->AttachConstraint("PULLUP", clk, &line7), 1);
    EXPECT_NE(clk->GetPropertyByName("PULLUP"), nullptr);
    EXPECT_EQ(ucf->AttachConstraint("PULLUP", "FALSE", clk, &line7), 1);
    EXPECT_EQ(clk->GetPropertyByName("PULLUP"), nullptr);
    std::string first = "Line 7 in '" + file() +
                        "': 'PULLUP' not attached becauase it specified as a boolean property and  "
                        "has a false value.\n";
    EXPECT_EQ(capture.Texts(Port_Severity::Debug),
              (std::vector<std::string>{
                  first, first,
                  "'PULLUP' also already existed on this object, so the property filter removed it.\n"}));
    EXPECT_TRUE(capture.Texts(Port_Severity::Warning).empty());
    EXPECT_EQ(Strings(clk, "FROM_UCF"), (std::vector<std::string>{"PULLUP", "PULLUP", "PULLUP"}));
}

TEST_F(AttachTest, NameListDependsOnFileKind) {
    ProbeAnnotator ncf(dir.Write("a.ncf", "").c_str(), CP_NCF, nullptr);
    ProbeAnnotator other(dir.Write("a.x", "").c_str(), static_cast<CP_FILE_TYPE>(3), nullptr);
    ncf.annotate(view);
    other.annotate(view);
    EXPECT_EQ(ncf.AttachConstraint("LOC", "P1", Net("clk"), &line7), 1);
    EXPECT_EQ(Strings(Net("clk"), "FROM_NCF"), std::vector<std::string>{"LOC"});
    EXPECT_EQ(other.AttachConstraint("LOC", "P2", Net("rst"), &line7), 1);
    EXPECT_STREQ(Net("rst")->GetPropertyByName("LOC")->GetValueString(), "P2");
    EXPECT_EQ(Net("rst")->GetNumProperties(), 1);  // no name list for other kinds
    EXPECT_EQ(other.AddConstraintToList("IOB", Net("rst")), 1);
    EXPECT_EQ(Net("rst")->GetNumProperties(), 1);
    EXPECT_EQ(ncf.AddConstraintToList("iob", u1), 1);
    EXPECT_EQ(Strings(u1, "FROM_NCF"), std::vector<std::string>{"IOB"});
    EXPECT_EQ(u1->GetPropertyByName("IOB"), nullptr);
}

TEST_F(AttachTest, SecondPassLeavesFirstPassObjectsAlone) {
    Ndm_Network* clk = Net("clk");
    Ndm_Network* rst = Net("rst");
    ASSERT_EQ(ucf->AttachConstraint("LOC", "P1", clk, &line7), 1);  // first pass
    ucf->set_second_pass(true);
    Port_MsgCapture capture(/*debug=*/true);
    EXPECT_EQ(ucf->AttachConstraint("NOT_A_CONSTRAINT", "P9", clk, &line7), 1);  // not even checked
    EXPECT_EQ(ucf->AttachConstraint("IOSTANDARD", "std33", clk, &line7), 1);
    EXPECT_EQ(clk->GetPropertyByName("IOSTANDARD"), nullptr);
    EXPECT_TRUE(capture.messages().empty());
    EXPECT_EQ(ucf->AlreadyAnnotated("LOC", clk), 1);

    EXPECT_EQ(ucf->AlreadyAnnotated("LOC", rst), 0);  // marks it new
    EXPECT_NE(rst->GetPropertyByName("TA_LUN_NEW_OBJ"), nullptr);
    EXPECT_EQ(ucf->AttachConstraint("LOC", "P2", rst, &line7), 1);
    EXPECT_EQ(ucf->AttachConstraint("IOSTANDARD", "std33", rst, &line7), 1);  // straight through
    EXPECT_EQ(Strings(rst, "FROM_UCF"), (std::vector<std::string>{"LOC", "IOSTANDARD"}));
    EXPECT_EQ(ucf->AlreadyAnnotated("LOC", rst), 0);

    ucf->set_second_pass(false);
    EXPECT_EQ(ucf->AlreadyAnnotated("LOC", clk), 0);
}

TEST_F(AttachTest, SecondPassMarksNewObjectOnItsFirstAttachment) {
    ucf->set_second_pass(true);
    EXPECT_EQ(ucf->AttachConstraint("LOC", "SITE_X0Y0", u3, &line7), 1);
    EXPECT_NE(u3->GetPropertyByName("TA_LUN_NEW_OBJ"), nullptr);
    EXPECT_NE(u3->GetPropertyByName("LOC"), nullptr);
}

TEST_F(AttachTest, QuotedCopy) {
    char* quoted = ucf->AddQuotesToString("a b");
    EXPECT_STREQ(quoted, "\"a b\"");
    delete[] quoted;
}

TEST_F(AttachTest, NumericOverloads) {
    ProbeAnnotator custom(dir.Write("n.ucf", "").c_str(), CP_UCF,
                          dir.Write("n.pfd", "COUNT int block\nRATIO float block\n").c_str());
    custom.annotate(view);
    EXPECT_EQ(custom.AttachConstraint("COUNT", 12, u1, &line7), 1);
    EXPECT_EQ(custom.AttachConstraint("RATIO", 0.25, u1, &line7), 1);
    EXPECT_EQ(u1->GetPropertyByName("COUNT")->GetInt32(), 12);
    EXPECT_EQ(u1->GetPropertyByName("RATIO")->GetFloat64(), 0.25);
    EXPECT_EQ(Strings(u1, "FROM_UCF"), (std::vector<std::string>{"COUNT", "RATIO"}));
}

}  // namespace
