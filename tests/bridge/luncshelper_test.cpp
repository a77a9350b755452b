// The repository bridge through the real repository over the Yosys-made example design,
// grouped as the bridge is: DRC level and reporting; set-up, modes and commit; diagnostics;
// annotation; write-back.
#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>
#include <set>

#include "bridge/luncshelper.h"
#include "host/design/design_io.h"
#include "host/design/ndm_constraint_blocks.h"
#include "host/design/ndm.h"
#include "host/port/file.h"
#include "host/port/msgman.h"
#include "host/util/shared_resource.h"
#include "manager/lunmgr.h"
#include "support/test_support.h"

namespace {

const std::string kBlinky = std::string(LUN_SOURCE_DIR) + "/examples/blinky/";

using Env = lun_test::ScopedEnv;

struct Bridge : ::testing::Test {
    void SetUp() override {
        design = Ndm_LoadDesign((kBlinky + "blinky.json").c_str(), nullptr);
        ASSERT_TRUE(design);
        project = dir.path() + "/proj.ovi";
    }
    std::string Ucf(const std::string& name, const std::string& text) { return dir.Write(name, text); }
    static std::string Join(const std::vector<std::string>& texts) {
        std::string out;
        for (const std::string& t : texts) out += t;
        return out;
    }
    lun_test::ScratchDir dir;
    std::unique_ptr<Ndm_Design> design;
    std::string project;
};

// ---------------------------------------------------------------- DRC level and reporting

TEST_F(Bridge, DrcLevelAndParseErrors) {
    struct Level {
        const char* value;
        int level;  // -1: fatal
    } levels[] = {{nullptr, 20}, {"NONE", 0}, {"WARN_ONLY", 10}, {"NORMAL", 20},
                  {"STRICT", 30}, {"strict", -1}, {"STRICT ", -1}};
    for (const Level& l : levels) {
        Env env("ZEP_QUILLMAP_CONSTRAINT_DRC", l.value);
        Port_MsgCapture capture;
        if (l.level >= 0) {
            EXPECT_EQ(Ta_LunCSHelper::GetDrcLevel(), l.level) << (l.value ? l.value : "unset");
        } else {
            EXPECT_THROW(Ta_LunCSHelper::GetDrcLevel(), Port_FatalError);
            ASSERT_EQ(capture.messages().size(), 1u);
            EXPECT_EQ(capture.messages()[0].text, "Invalid argument for ZEP_QUILLMAP_CONSTRAINT_DRC env var\n");
            EXPECT_EQ(capture.messages()[0].code, 0);
        }
    }
    // A parse error by level; number 80 dropped, another number of the same finding reported.
    Cs_ReturnCode outcome;
    outcome.Add(std::make_shared<Cs_Status_Parse>(Cs_StatusID::PARSE_ERROR, 10, "Syntax error at column 3 near 'x'.",
                                                  "a.ucf", 7));
    outcome.Add(std::make_shared<Cs_Status_Resolution>(Cs_StatusID::NO_RESOLVED_ASSOCIATIONS, Cs_Status::WARNING, 80,
                                                       "eighty", nullptr));
    outcome.Add(std::make_shared<Cs_Status_Resolution>(Cs_StatusID::NO_RESOLVED_ASSOCIATIONS, Cs_Status::WARNING, 81,
                                                       "eighty-one", nullptr));
    const std::string parse = "Line 7 in a.ucf: Syntax error at column 3 near 'x'.\n";
    struct Expect {
        const char* level;
        std::vector<std::string> warnings, errors;
    } expects[] = {{"NONE", {}, {}},
                   {"WARN_ONLY", {parse, "eighty-one\n"}, {}},
                   {"NORMAL", {"eighty-one\n"}, {parse}},
                   {"STRICT", {"eighty-one\n"}, {parse}}};
    for (const Expect& e : expects) {
        Env env("ZEP_QUILLMAP_CONSTRAINT_DRC", e.level);
        Port_MsgCapture capture;
        EXPECT_TRUE(Ta_LunCSHelper::Drc(outcome));
        EXPECT_EQ(capture.Texts(Port_Severity::Warning), e.warnings) << e.level;
        EXPECT_EQ(capture.Texts(Port_Severity::Error), e.errors) << e.level;
    }
}

// ---------------------------------------------------------------- set-up, modes, commit

TEST_F(Bridge, OneBridgeAtATimeAndCopiesShareIt) {
    Port_MsgCapture capture(true);
    auto first = std::make_unique<Ta_LunCSHelper>(project.c_str(), "ovi");
    EXPECT_EQ(first->GetBcdPath().str(), dir.path() + "/proj_qdb/cst.qbcd");
    EXPECT_TRUE(std::filesystem::is_directory(dir.path() + "/proj_qdb"));
    EXPECT_EQ(Join(capture.Texts(Port_Severity::Debug)), "BCD Path: " + dir.path() + "/proj_qdb/cst.qbcd\n");
    try {
        Ta_LunCSHelper second(project.c_str(), "ovi");
        ADD_FAILURE() << "a second bridge was built";
    } catch (const Util::IllegalMethodCalledException& e) {
        EXPECT_STREQ(e.what(), "Shared Object already exists. Use Get() instead of Create().\n");
        EXPECT_EQ(e.program(), "Quillmap");
    }
    {
        Ta_LunCSHelper copy(*first);  // shares the manager: releasing the copy keeps it
        EXPECT_EQ(copy.GetConstraintsMgr(), first->GetConstraintsMgr());
    }
    first->GetConstraintsMgr()->DeleteAllConstraints();  // still alive
    first.reset();
    Ta_LunCSHelper again(project.c_str(), "flow");  // the manager was released: a new one can be made
}

TEST_F(Bridge, ModesAndPaths) {
    const auto cwd = std::filesystem::current_path();
    std::filesystem::current_path(dir.path());
    {
        Port_MsgCapture capture(true);
        Ta_LunCSHelper b("", "ovi");
        EXPECT_EQ(b.GetBcdPath().str(), "zepk_auto_0_qdb/cst.qbcd");
        EXPECT_TRUE(std::filesystem::is_directory("zepk_auto_0_qdb"));
        EXPECT_TRUE(capture.Texts(Port_Severity::Debug).empty());
    }
    std::filesystem::current_path(cwd);
    struct Mode {
        const char* value;
        int mode;  // 0: fatal
        const char* trace;
    } modes[] = {{nullptr, 3, "Ta_LunCSHelper::MODE = WRITE_BACK\n"}, {"0", 1, "Ta_LunCSHelper::MODE = NO_CS\n"},
                 {"1", 2, "Ta_LunCSHelper::MODE = CREATE_BCD\n"},    {"2", 3, "Ta_LunCSHelper::MODE = WRITE_BACK\n"},
                 {"3", 4, "Ta_LunCSHelper::MODE = NO_CS\n"},         {"01", 0, ""},
                 {" 1", 0, ""}};
    for (const Mode& m : modes) {
        Env env("ZEP_QUILLMAP_CS", m.value);
        Ta_LunCSHelper b(project.c_str(), "OVI");
        Port_MsgCapture capture(true);
        if (m.mode == 0) {
            EXPECT_THROW(b.GetMode(), Port_FatalError) << m.value;
            EXPECT_EQ(capture.Texts(Port_Severity::Fatal),
                      std::vector<std::string>{"Invalid argument for ZEP_QUILLMAP_CS env var\n"});
            continue;
        }
        EXPECT_EQ(b.GetMode(), m.mode);
        EXPECT_EQ(Join(capture.Texts(Port_Severity::Debug)), m.trace);
        Env changed("ZEP_QUILLMAP_CS", "garbage");  // read once
        EXPECT_EQ(b.GetMode(), m.mode);
    }
}

TEST_F(Bridge, CommitThenInitRestoresAndRereadsChangedSources) {
    std::string ucf = Ucf("a.ucf", "NET clk LOC = P10;\nNET btn PULLUP;\n");
    {
        Ta_LunCSHelper b(project.c_str(), "ovi");
        Port_MsgCapture capture;
        EXPECT_TRUE(b.Init(design.get()));  // nothing to restore yet
        Util_FNameGroup files;
        files.add_fname(ucf.c_str());
        EXPECT_TRUE(b.Annotate(&files, 1, true));
        EXPECT_TRUE(b.Commit());
        Ndm_View* view = design->GetViewByName("EXPANDED");
        EXPECT_STREQ(view->GetPropertyByName("EXPANDED_OVI_FILE")->GetValueString(), project.c_str());
        EXPECT_EQ(view->GetPropertyByName("EXPANDED_BCD_FILE")->GetValueString(), b.GetBcdPath().str());
    }
    {
        Env no_props("ZEP_QUILLMAP_NO_OVI_PROP", "");
        auto fresh = Ndm_LoadDesign((kBlinky + "blinky.json").c_str(), nullptr);
        Ta_LunCSHelper b(project.c_str(), "ovi");
        Port_MsgCapture capture(true);
        EXPECT_TRUE(b.Init(fresh.get()));
        EXPECT_EQ(capture.Texts(Port_Severity::Status),
                  std::vector<std::string>{"Reading in constraint information from '" + ucf + "'...\n"});
        EXPECT_EQ(b.GetConstraintsMgr()->GetNumConstraints(), 2u);
        EXPECT_EQ(Join(capture.Texts(Port_Severity::Debug)).find("out of date"), std::string::npos);
        EXPECT_TRUE(b.Commit());
        EXPECT_EQ(fresh->GetViewByName("EXPANDED")->GetPropertyByName("EXPANDED_OVI_FILE"), nullptr);
    }
    Ucf("a.ucf", "NET clk LOC = P11;\nNET btn PULLUP;\nNET clk BAD = = ;\n");
    {
        Ta_LunCSHelper b(project.c_str(), "ovi");
        Port_MsgCapture capture(true);
        EXPECT_TRUE(b.Init(design.get()));
        EXPECT_NE(Join(capture.Texts(Port_Severity::Debug)).find("There are some out of date constraint sources...\n"),
                  std::string::npos);
        // the re-read file's parse error goes through Drc
        EXPECT_EQ(capture.Texts(Port_Severity::Error),
                  std::vector<std::string>{"Line 3 in " + ucf + ": Syntax error at column 15 near '='.\n"});
    }
    {
        // without the OVI flow nothing is restored
        Ta_LunCSHelper b(project.c_str(), "make");
        Port_MsgCapture capture;
        EXPECT_TRUE(b.Init(design.get()));
        EXPECT_EQ(b.GetConstraintsMgr()->GetNumConstraints(), 0u);
        EXPECT_TRUE(capture.Texts(Port_Severity::Status).empty());
    }
}

// ---------------------------------------------------------------- diagnostics

TEST_F(Bridge, DiagnosticsByLevel) {
    std::string ucf = Ucf("d.ucf",
                          "NET nosuch LOC = P1;\n"             // unmatched I/O constraint
                          "NET nosuch2 TNM_NET = g;\n"         // unmatched other constraint
                          "NET clk LOC = P10;\nNET clk LOC = P12;\n"  // override on an object
                          "CONFIG PART = a;\nCONFIG PART = b;\n"      // override without an object
                          "TIMESPEC TS_x = PERIOD g 10 ns; timespec ts_x = period g 10 NS;\n"  // same name
                          "NET clk BAD = = ;\n");              // unparsable
    const std::string at = " (" + ucf + " line ";
    const std::string io = "NET \"nosuch\" LOC = P1" + at + "1) matches no object of the design.\n";
    const std::string other = "NET \"nosuch2\" TNM_NET = g" + at + "2) matches no object of the design.\n";
    const std::string none_io = "Could not find any associations for the following constraint:\n    'NET \"nosuch\" LOC = P1" + at + "1)'\n";
    const std::string none_other = "Could not find any associations for the following constraint:\n    'NET \"nosuch2\" TNM_NET = g" + at + "2)'\n";
    const std::string object = "The constraint NET \"clk\" LOC = P10" + at + "3) is overridden on the design object clk by the constraint NET \"clk\" LOC = P12" + at + "4).\n";
    const std::string part = "The constraint CONFIG PART = a" + at + "5) is overridden by the constraint CONFIG PART = b" + at + "6).  Please set ZEP_QUILLMAP_CONSTR_OVERRIDE_ERROR to promote this message to an error.\n";
    const std::string invalid = "\"" + ucf + "\" Line 8: Syntax error at column 15 near '='.\n";
    const std::string parse = "Line 8 in '" + ucf + "': Syntax error at column 15 near '='.\n";  // reports itself

    struct Row {
        const char* level;
        bool allow_io;
        std::vector<std::string> infos, warnings, errors;
    } rows[] = {
        {"NONE", false, {}, {}, {invalid}},
        {"WARN_ONLY", false, {}, {io, other, none_io, none_other, object, part}, {invalid, parse}},
        {"WARN_ONLY", true, {io, none_io}, {other, none_other, object, part}, {invalid, parse}},
        {"NORMAL", false, {}, {none_io, none_other, object, part}, {io, other, invalid, parse}},
        {"NORMAL", true, {io, none_io}, {none_other, object, part}, {other, invalid, parse}},
        {"STRICT", false, {}, {part}, {io, other, none_io, none_other, object, invalid, parse}},
    };
    for (const Row& r : rows) {
        Env env("ZEP_QUILLMAP_CONSTRAINT_DRC", r.level);
        Ta_LunCSHelper b(project.c_str(), "make");
        Port_MsgCapture quiet;
        b.Init(design.get());
        b.GetConstraintsMgr()->ReplaceConstraintsFromFile(ucf.c_str(), 4);
        Cs_ReturnCode outcome = b.GetConstraintsMgr()->GetFindings();
        Port_MsgCapture capture;
        Ta_LunCSHelper::AssociationDrc(outcome, r.allow_io, false);
        auto all = b.GetConstraintsMgr()->GetConstraints(Cs_ConstraintMgr::ACTIVE);
        Ta_LunCSHelper::ReportNoAssociations(all, r.allow_io, false);
        b.ReportConflicts();
        Cs_Filter_ConstraintType unsupported(Cs_Constraint_Unsupported::Type());
        for (Cs_Constraint* c : b.GetConstraintsMgr()->GetConstraints(unsupported, Cs_ConstraintMgr::ACTIVE))
            Ta_LunCSHelper::InvalidConstraintDrc(static_cast<Cs_Constraint_Unsupported*>(c));
        auto sorted = [](std::vector<std::string> v) { return std::multiset<std::string>(v.begin(), v.end()); };
        std::string label = std::string(r.level) + (r.allow_io ? " --aul" : "");
        EXPECT_EQ(sorted(capture.Texts(Port_Severity::Info)), sorted(r.infos)) << label;
        EXPECT_EQ(sorted(capture.Texts(Port_Severity::Warning)), sorted(r.warnings)) << label;
        EXPECT_EQ(sorted(capture.Texts(Port_Severity::Error)), sorted(r.errors)) << label;
        EXPECT_EQ(capture.Texts(Port_Severity::Status),
                  std::vector<std::string>(2, "Checking Constraint Associations...\n"));
    }
    Env error("ZEP_QUILLMAP_CONSTR_OVERRIDE_ERROR", "");
    Ta_LunCSHelper b(project.c_str(), "make");
    Port_MsgCapture capture;
    b.Init(design.get());
    b.GetConstraintsMgr()->ReplaceConstraintsFromFile(ucf.c_str(), 4);
    b.ReportConflicts();
    EXPECT_NE(Join(capture.Texts(Port_Severity::Error))
                  .find("The constraint CONFIG PART = a" + at + "5) is overridden by the constraint CONFIG PART = b" + at + "6).\n"),
              std::string::npos);
}

// ---------------------------------------------------------------- annotation

TEST_F(Bridge, AnnotateAttachesUnsupportedAttributes) {
    std::string ucf = Ucf("u.ucf",
                          "NET btn PULLUP;\n"
                          "NET clk ROUTE = \"{3;1;fg256;a b c}\";\n"
                          "INST \"count_$_SDFF_PP0__Q\" INIT_00..02 = 1234;\n"
                          "INST tx0 BUFFER_TYPE = BUFG;\n"
                          "INST nosuch KEEP;\n"
                          "CONFIG PART = qx100-fg256-2; CONFIG STEPPING = ES; CONFIG PART = qx200-ff1-1;\n");
    Ta_LunCSHelper b(project.c_str(), "make");
    Port_MsgCapture capture;
    b.Init(design.get());
    Util_FNameGroup files;
    files.add_fname(ucf.c_str());
    EXPECT_TRUE(b.Annotate(&files, 1, true));
    Ndm_View* view = design->GetViewByName("EXPANDED");
    Ndm_Block* top = view->GetBlock();
    Ndm_Network* btn = top->GetSignalByName("btn")->GetNetwork();
    EXPECT_TRUE(btn->GetPropertyByName("PULLUP")->GetBool());
    EXPECT_EQ(lun_test::PropText(btn, "FROM_UCF"), "PULLUP");
    EXPECT_EQ(lun_test::PropText(top->GetSignalByName("clk")->GetNetwork(), "ROUTE"), "{3;1;fg256;abc}");
    Ndm_Block* ff = top->GetBlockByName("count_$_SDFF_PP0__Q");
    for (const char* name : {"INIT_00", "INIT_01", "INIT_02"}) EXPECT_EQ(lun_test::PropText(ff, name), "1234");
    EXPECT_EQ(lun_test::PropText(Ndm_ConstraintBlocks(true).Find(top, "CONFIG"), "PART"), "qx200-ff1-1");
    EXPECT_EQ(top->GetPropertyByName("PART"), nullptr);  // design-wide: on the CONFIG block
    EXPECT_EQ(capture.Texts(Port_Severity::Error),
              (std::vector<std::string>{
                  "BUFFER_TYPE attribute on AUTOBUF instance <tx0> is being modified in UCF file " + ucf +
                      " on line number 4.  This functionality is not supported in this release of OVI.  It is "
                      "suggested to remove this line from the UCF file and modify the source code accordingly to "
                      "modify the buffer spec" "ification if needed.\n",
                  "Could not find any associations for the following constraint:\n    'INST \"nosuch\" KEEP (" + ucf +
                      " line 5)'\n"}));
    Port::StringBase<char> part = "none", stepping = "none";
    EXPECT_TRUE(b.GetPartAndSteppingFromUCF(&files, 1, part, stepping));
    EXPECT_EQ(part.str(), "qx200-ff1-1");
    EXPECT_EQ(stepping.str(), "ES");

    // a ranged key is attached once per name; after a run for one key BUFFER_TYPE is passed over
    Ndm_Block* tx0 = top->GetBlockByName("tx0");
    EXPECT_EQ(lun_test::PropText(tx0, "BUFFER_TYPE"), "BUFG");  // reported, then attached
    tx0->DeleteProperty("BUFFER_TYPE");
    std::string more = Ucf("m.ucf", "INST tx0 INIT_00..02 = 1234 | BUFFER_TYPE = BUFG;\n");
    capture.Clear();
    Util_FNameGroup second;
    second.add_fname(more.c_str());
    EXPECT_TRUE(b.AnnotateSpecificUnsupportedType(&second, 1, "INIT_00..02"));
    for (const char* name : {"INIT_00", "INIT_01", "INIT_02"}) EXPECT_EQ(lun_test::PropText(tx0, name), "1234");
    EXPECT_EQ(tx0->GetPropertyByName("BUFFER_TYPE"), nullptr);
    EXPECT_FALSE(b.AnnotateSpecificUnsupportedType(nullptr, 1, "X"));
    capture.Clear();
    EXPECT_TRUE(b.Annotate(&second, 1, true));
    // the repository still holds the first file: its unmatched KEEP is reported again, while
    // BUFFER_TYPE now passes silently
    EXPECT_EQ(capture.Texts(Port_Severity::Error),
              std::vector<std::string>{"Could not find any associations for the following constraint:\n    'INST "
                                       "\"nosuch\" KEEP (" + ucf + " line 5)'\n"});
    EXPECT_EQ(tx0->GetPropertyByName("BUFFER_TYPE"), nullptr);

    // the verdict messages point at the constraint's file and line, or at no file
    capture.Clear();
    Cs_SourceFile where(ucf.c_str(), 9);
    EXPECT_FALSE(b.AttachConstraint("NOSUCH", "1", tx0, &where));
    EXPECT_FALSE(b.AttachConstraint("NOSUCH", "1", tx0, nullptr));
    EXPECT_TRUE(b.AttachConstraint("DRIVE", "strong", tx0, nullptr));
    EXPECT_EQ(capture.Texts(Port_Severity::Error),
              (std::vector<std::string>{"Line 9 in '" + ucf + "': 'NOSUCH' is an invalid constraint name.\n",
                                        "Line -999 in '<not avail>': 'NOSUCH' is an invalid constraint name.\n"}));
    EXPECT_EQ(capture.Texts(Port_Severity::Warning).size(), 1u);
}

// ---------------------------------------------------------------- write-back

// Mode 3 on the example: unsupported attributes through Annotate, typed constraints through the
// write-back, and the whole design as the file road (quillmap annotate) leaves it: the same
// properties on every object and the same constraint blocks with the same timing entries and
// settings; the same again from the repository file, over the board file and over a file of
// every design-wide form (and a part named by a NET statement).
TEST_F(Bridge, RepositoryRoadGivesTheFileRoadsDesign) {
    auto not_bookkeeping = [](const std::string& name) {
        for (const char* b : {"FROM_UCF", "FROM_NCF", "TA_LUN_NEW_OBJ", "EXPANDED_OVI_FILE", "EXPANDED_BCD_FILE"})
            if (name == b) return false;
        return true;
    };
    std::unique_ptr<Ndm_Design> file_road;
    const std::string every = std::string(lun_test::kEveryDesignWideForm) + "NET clk PART = qx200-ff1-1;\n";
    for (const std::string& ucf : {Ucf("all.ucf", every), kBlinky + "blinky.ucf"}) {
        const std::string saved = dir.path() + "/file_road.qdf";
        lun_test::Quillmap("annotate " + kBlinky + "blinky.json --ucf " + ucf + " -o " + saved);  // errors: the probe
        file_road = Ndm_LoadDesign(saved.c_str(), nullptr);
        ASSERT_TRUE(file_road);
        const std::set<std::string> expected =
            lun_test::DesignProperties(file_road->GetViewByName("EXPANDED"), not_bookkeeping);
        std::filesystem::remove(dir.path() + "/proj_qdb/cst.qbcd");
        for (bool restored : {false, true}) {
            auto design = Ndm_LoadDesign((kBlinky + "blinky.json").c_str(), nullptr);
            Ta_LunCSHelper b(project.c_str(), "ovi");
            Port_MsgCapture quiet;
            b.Init(design.get());  // restores the repository file the first pass committed
            Util_FNameGroup files;
            files.add_fname(ucf.c_str());
            b.Annotate(&files, restored ? 0 : 1, true);
            EXPECT_TRUE(b.WriteConstraintsToNgd(true));
            EXPECT_TRUE(b.WriteConstraintsToNgd(false));  // no view SOURCE: nothing happens
            EXPECT_EQ(lun_test::DesignProperties(design->GetViewByName("EXPANDED"), not_bookkeeping), expected)
                << ucf << (restored ? " restored" : "");
            EXPECT_TRUE(b.Commit());
        }
    }

    // take-in (of the board file's design): with deletion the properties taken are gone, the
    // others stay
    Ta_LunCSHelper b(project.c_str(), "make");
    Port_MsgCapture quiet;
    b.Init(file_road.get());
    Ndm_Network* clk = file_road->GetViewByName("EXPANDED")->GetBlock()->GetSignalByName("clk")->GetNetwork();
    b.ReplaceConstraintFromProps(file_road->GetViewByName("EXPANDED"), false);
    EXPECT_NE(clk->GetPropertyByName("LOC"), nullptr);
    b.ReplaceConstraintFromProps(file_road->GetViewByName("EXPANDED"), true);
    EXPECT_EQ(clk->GetPropertyByName("LOC"), nullptr);
    EXPECT_NE(clk->GetPropertyByName("FROM_UCF"), nullptr);

    Port::StringBase<char> target = "kept";
    Ta_LunCSHelper::CreatePortString(L"", target);
    EXPECT_EQ(target.str(), "");
    target = "kept";
    const wchar_t bad[] = {0xD800, 0};
    Ta_LunCSHelper::CreatePortString(bad, target);
    EXPECT_EQ(target.str(), "kept");
}

}  // namespace
