// Construction, options, the run over a view and comment lines.
#include <cstdlib>

#include "frame_fixture.h"

namespace {

TEST_F(FrameTest, CaseSensitivityFollowsFileKind) {
    ProbeAnnotator ucf("a.ucf", CP_UCF, nullptr), ncf("a.ncf", CP_NCF, nullptr);
    ProbeAnnotator other("a.x", static_cast<CP_FILE_TYPE>(7), nullptr);
    EXPECT_FALSE(ucf.is_case_sensitive());
    EXPECT_TRUE(ncf.is_case_sensitive());
    EXPECT_TRUE(other.is_case_sensitive());
    ucf.set_case_sensitive(true);
    ncf.set_case_sensitive(false);
    EXPECT_TRUE(ucf.is_case_sensitive());
    EXPECT_FALSE(ncf.is_case_sensitive());
}

TEST_F(FrameTest, SecondPassFromEnvironmentWhateverItsValue) {
    ::unsetenv("ZEP_QUILLMAP_SECOND_UCF_PASS");
    ProbeAnnotator plain("a.ucf", CP_UCF, nullptr);
    EXPECT_FALSE(plain.get_second_pass());
    plain.set_second_pass(true);
    EXPECT_TRUE(plain.get_second_pass());
    ::setenv("ZEP_QUILLMAP_SECOND_UCF_PASS", "", 1);
    ProbeAnnotator second("a.ucf", CP_UCF, nullptr);
    ::unsetenv("ZEP_QUILLMAP_SECOND_UCF_PASS");
    EXPECT_TRUE(second.get_second_pass());
}

TEST_F(FrameTest, MissingFileNameOrViewIsFatal) {
    Port_MsgCapture capture;
    EXPECT_THROW(ProbeAnnotator(nullptr, CP_UCF, nullptr), Port_FatalError);
    ProbeAnnotator a(dir.Write("a.ucf", "").c_str(), CP_UCF, nullptr);
    EXPECT_THROW(a.annotate(nullptr), Port_FatalError);
    auto fatal = capture.Texts(Port_Severity::Fatal);
    ASSERT_EQ(fatal.size(), 2u);
    EXPECT_EQ(fatal[0], "No filename supplied!\n");
    EXPECT_EQ(fatal[1], "No design supplied!\n");
    EXPECT_EQ(capture.messages()[0].code, 2);
    EXPECT_EQ(capture.messages()[0].module, "lunbase");
}

TEST_F(FrameTest, AnnotateReturnsNegatedParseResult) {
    Port_MsgCapture capture;
    ProbeAnnotator good(dir.Write("good.ucf", "NET clk LOC = P10;\n").c_str(), CP_UCF, nullptr);
    EXPECT_EQ(good.annotate(view), 0);
    EXPECT_STREQ(Net("clk")->GetPropertyByName("LOC")->GetValueString(), "P10");
    ProbeAnnotator bad(dir.Write("bad.ucf", "NET nosuch LOC = P1;\n").c_str(), CP_UCF, nullptr);
    EXPECT_EQ(bad.annotate(view), 1);  // the callback failed
    ProbeAnnotator syntax(dir.Write("syn.ucf", "FOO bar;\n").c_str(), CP_UCF, nullptr);
    EXPECT_EQ(syntax.annotate(view), 1);
}

TEST_F(FrameTest, CommentLinesMarkConverterFiles) {
    struct Case {
        const char* text;
        bool marked;
    } cases[] = {
        {"# written by PROG CSTTRANS\n", true},
        {"// CSTTRANS then PROG\n", true},
        {"# only CSTTRANS\n", false},
        {"# prog CSTTRANS\n", false},
        {"# PROG CSTTRANS\n# later comment\nNET clk LOC = P1;\n", true},
    };
    for (const Case& c : cases) {
        ProbeAnnotator a(dir.Write("c.ucf", c.text).c_str(), CP_UCF, nullptr);
        a.annotate(view);
        EXPECT_EQ(a.is_file_from_csttrans(), c.marked ? 1 : 0) << c.text;
    }
}

TEST_F(FrameTest, FilterComesFromGivenFileElseDefault) {
    Port_MsgCapture capture;
    // a definition file that knows only MYFLAG: LOC becomes an unknown name
    std::string defs = dir.Write("only.pfd", "MYFLAG bool net\n");
    ProbeAnnotator custom(dir.Write("a.ucf", "NET clk LOC = P1;\nNET rst MYFLAG;\n").c_str(), CP_UCF,
                          defs.c_str());
    EXPECT_EQ(custom.annotate(view), 1);
    EXPECT_EQ(capture.Texts(Port_Severity::Error),
              std::vector<std::string>{"Line 1 in '" + dir.path() +
                                       "/a.ucf': 'LOC' is an invalid constraint name.\n"});
    EXPECT_NE(Net("rst")->GetPropertyByName("MYFLAG"), nullptr);

    capture.Clear();
    ProbeAnnotator standard(dir.Write("b.ucf", "NET clk LOC = P1;\n").c_str(), CP_UCF, nullptr);
    EXPECT_EQ(standard.annotate(view), 0);
    EXPECT_TRUE(capture.Texts(Port_Severity::Error).empty());
}

TEST_F(FrameTest, CopiesOwnTheirStrings) {
    std::string file = dir.Write("a.ucf", "NET clk LOC = P1;\n");
    auto original = std::make_unique<ProbeAnnotator>(file.c_str(), CP_NCF, "x.pfd");
    original->set_debug_callbacks();
    ProbeAnnotator copy(*original);
    ProbeAnnotator assigned("other.ucf", CP_UCF, nullptr);
    assigned = *original;
    ProbeAnnotator& self = assigned;
    assigned = self;      // self-assignment keeps everything
    original.reset();     // the copies must not depend on the source's buffers
    EXPECT_STREQ(copy.get_constraint_filename(), file.c_str());
    EXPECT_STREQ(copy.FilterFile(), "x.pfd");
    EXPECT_STREQ(assigned.get_constraint_filename(), file.c_str());
    EXPECT_TRUE(assigned.is_case_sensitive());
}

}  // namespace
