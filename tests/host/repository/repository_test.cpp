// The constraint repository: loading real constraint files over Yosys-made designs, resolution
// as the annotators resolve, overrides and associations, sources out of date, and the
// repository file (commit, restore, faults, damage).
#include <gtest/gtest.h>
#include <sqlite3.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <filesystem>
#include <fstream>
#include <map>
#include <set>

#include "host/design/design_io.h"
#include "host/repository/cs_rows.h"
#include "host/design/ndm.h"
#include "host/port/file.h"
#include "host/port/stream.h"
#include "host/port/msgman.h"
#include "host/repository/cs_mgr.h"
#include "manager/lunmgr.h"
#include "support/test_support.h"

namespace {

using lun_test::ReadFile;

const std::string kBlinky = std::string(LUN_SOURCE_DIR) + "/examples/blinky/";

struct Repo : ::testing::Test {
    void SetUp() override {
        design = Ndm_LoadDesign((kBlinky + "blinky.json").c_str(), nullptr);
        ASSERT_TRUE(design);
        mgr.SetDesign(design.get());
    }
    // The constraints as "Type scope target attribute = value @line", in repository order.
    std::vector<std::string> Listing() const {
        std::vector<std::string> out;
        for (const Cs_Constraint* c : mgr.GetConstraints(Cs_ConstraintMgr::ACTIVE)) {
            const Cs_SourceFile* at = c->GetSourceInfo()->GetSourceFile();
            out.push_back(std::string(c->GetType().GetName()) + " " + Cs_ScopeWord(c->GetScope()) + " " +
                          c->GetTarget() + " " + c->GetAttribute() + " = " + c->GetValueText() + " @" +
                          std::to_string(at ? at->GetLine() : 0));
        }
        return out;
    }
    const Cs_Constraint* Find(const std::string& attribute, const std::string& target = "", int nth = 0) const {
        for (const Cs_Constraint* c : mgr.GetConstraints(Cs_ConstraintMgr::ALL))
            if (attribute == c->GetAttribute() && (target.empty() || target == c->GetTarget()) && nth-- == 0) return c;
        return nullptr;
    }
    static std::vector<std::string> Names(const Cs_Constraint* c) {
        std::vector<std::string> out;
        for (const Ndm_PropertyHolder* o : c->GetAssociatedDesignObjs()) out.push_back(o->GetFullName());
        return out;
    }

    lun_test::ScratchDir dir;
    std::unique_ptr<Ndm_Design> design;
    Cs_ConstraintMgr mgr;
    Port_MsgCapture quiet;
};

// Every statement family of the bundled board file, typed, in file order, with its line.
TEST_F(Repo, LoadsEachStatementAsTypedConstraints) {
    Cs_ReturnCode rc = mgr.LoadConstraints((kBlinky + "blinky.ucf").c_str(), Cs_ConstraintSyntax::UCF);
    EXPECT_TRUE(rc);  // the unmatched probe is a warning, not a failure
    std::vector<std::string> listing = Listing();
    for (const char* expected : {
             "Unsupported CONFIG  PART = qx100-fg256-2 @2",
             "Prohibit CONFIG  PROHIBIT = P44 @4",
             "Locate NET clk LOC = P10 @8",
             "IOStandard NET clk IOSTANDARD = LVCMOS33 @8",
             "TimingName NET clk TNM_NET = FFS : clk_ffs @10",
             "TimeSpec TIMESPEC TS_clk TS_clk = PERIOD clk_grp 20 ns HIGH 50% @11",
             "Unsupported NET rst_n PULLUP =  @14",
             "Unsupported NET rst_n TIG =  @15",
             "Drive NET led<*> DRIVE = 8 @19",
             "Slew NET uart_txd SLEW = FAST @26",
             "Offset TIMESPEC  OFFSET = OUT 12 ns AFTER clk @27",
             "TimingName INST count_* TNM = cnt_regs @30",
             "TimeGrp TIMEGRP uart_rise uart_rise = RISING uart_regs @32",
             "AreaGroup INST tx0 AREA_GROUP = ag_uart @36",
             "AreaGroup AREA_GROUP ag_uart RANGE = SLICE_X0Y0:SLICE_X7Y7 @37",
         })
        EXPECT_NE(std::find(listing.begin(), listing.end(), expected), listing.end()) << expected;
    const Cs_Constraint* pullup = Find("PULLUP");
    ASSERT_NE(pullup, nullptr);
    EXPECT_TRUE(pullup->IsFlag());
    EXPECT_EQ(pullup->GetMsgName(), "NET \"rst_n\" PULLUP (" + kBlinky + "blinky.ucf line 14)");
    EXPECT_FALSE(pullup->IsAssociationExempt());
    EXPECT_TRUE(Find("TS_clk")->IsAssociationExempt());
    EXPECT_EQ(mgr.GetConstraints(Cs_Filter_ConstraintType(Cs_Constraint_Locate::Type()), Cs_ConstraintMgr::ACTIVE).size(),
              9u);

    // resolution: the objects the annotator would use, or a warning naming file and line
    EXPECT_EQ(Names(Find("LOC", "clk")), std::vector<std::string>{"clk"});
    EXPECT_EQ(Names(Find("DRIVE")), (std::vector<std::string>{"led[0]", "led[1]", "led[2]", "led[3]"}));
    const Cs_Constraint* probe = Find("LOC", "dbg_probe");
    ASSERT_NE(probe, nullptr);
    EXPECT_TRUE(probe->GetAssociatedDesignObjs().empty());
    int unmatched = 0;
    for (const auto& st : mgr.GetFindings()) {
        if (st->GetID() != Cs_StatusID::NO_DESIGN_MATCH) continue;
        ++unmatched;
        EXPECT_EQ(st->GetSeverity(), Cs_Status::WARNING);
        EXPECT_EQ(dynamic_cast<const Cs_Status_Resolution&>(*st).GetConstraint(), probe);
        EXPECT_EQ(st->GetMessage(), "NET \"dbg_probe\" LOC = P40 (" + kBlinky + "blinky.ucf line 40) matches no object of the design.");
    }
    EXPECT_EQ(unmatched, 1);

    // messages are bytes: the wide form converts back to the same bytes
    mgr.LoadConstraints(dir.Write("l.ucf", "NET \"n\xe9t\" LOC = P1;\n").c_str(), Cs_ConstraintSyntax::UCF);
    const Cs_Status* last = nullptr;
    for (const auto& st : mgr.GetFindings()) last = st.get();
    ASSERT_NE(last, nullptr);
    std::unique_ptr<char[]> narrow(Port::wcstombs(last->GetLocalizedMsg().c_str()));
    ASSERT_TRUE(narrow);
    EXPECT_EQ(std::string(narrow.get()), last->GetMessage());
    EXPECT_NE(last->GetMessage().find("n\xe9t"), std::string::npos);

    // a TIMESPEC is associated with the constraints that define its groups
    const Cs_Constraint* timing = Find("TS_cnt_uart");
    ASSERT_NE(timing, nullptr);
    std::set<std::string> groups;
    for (const Cs_Constraint* d : timing->GetAssociatedConstraints()) groups.insert(d->GetValueText());
    EXPECT_EQ(groups, (std::set<std::string>{"cnt_regs", "uart_regs"}));
    EXPECT_EQ(timing->GetAssociatedPaths().size(), 2u);
}

// Unreadable statements are kept; overrides are recorded on the constraint that loses.
TEST_F(Repo, InvalidStatementsOverridesAndDesignWideConflicts) {
    std::string ucf = dir.Write("o.ucf",
                                "NET clk LOC = P10;\n"
                                "NET clk LOC = P12 | IOSTANDARD = LVCMOS33;\n"
                                "NET clk LOC = P12;\n"
                                "NET btn TNM_NET = a; NET btn TNM_NET = b;\n"
                                "TIMESPEC TS_x = PERIOD a 10 ns;\n"
                                "NET clk PERIOD = 10 nanoseconds;\n"
                                "CONFIG PART = qx100-fg256-2;\nCONFIG PART = qx200-ff1-1;\n"
                                "TIMESPEC TS_x = PERIOD a 12 ns;\n");
    Cs_ReturnCode rc = mgr.LoadConstraints(ucf.c_str(), Cs_ConstraintSyntax::UCF);
    EXPECT_FALSE(rc);  // a parse error fails the load
    const Cs_Constraint* invalid = Find("INVALID_CONSTRAINT:");
    ASSERT_NE(invalid, nullptr);
    EXPECT_STREQ(invalid->GetValueText(), "NET clk PERIOD = 10 nanoseconds");
    EXPECT_EQ(invalid->GetSourceInfo()->GetSourceFile()->GetLine(), 6);
    int parse = 0;
    for (const auto& st : rc)
        if (st->GetID() == Cs_StatusID::PARSE_ERROR) {
            ++parse;
            auto& p = dynamic_cast<const Cs_Status_Parse&>(*st);
            EXPECT_STREQ(p.GetSourceFile()->GetFile(), ucf.c_str());
            EXPECT_EQ(p.GetSourceFile()->GetLine(), 6);
        }
    EXPECT_EQ(parse, 1);
    // the text of an invalid constraint parses again into its statuses
    Cs_ConstraintMgr scratch;
    Cs_ReturnCode again = scratch.CreateConstraints(invalid->GetValueText(), Cs_ConstraintSyntax::TEXT, nullptr);
    ASSERT_EQ(again.size(), 1u);
    EXPECT_EQ((*again.begin())->GetID(), Cs_StatusID::PARSE_ERROR);

    // the first LOC is overridden on the clock network by the second; the third repeats the
    // second and overrides nothing; group memberships add up
    const Cs_Constraint* first = Find("LOC", "clk", 0);
    ASSERT_EQ(first->GetConflicts().size(), 1u);
    const Cs_Conflict& k = first->GetConflicts()[0];
    EXPECT_EQ(k.GetType(), Cs_Conflict::OVERRIDE);
    EXPECT_EQ(k.GetDesignEntity()->GetFullName(), "clk");
    EXPECT_EQ(k.GetConflictingConstraint(), Find("LOC", "clk", 1));
    EXPECT_TRUE(Find("LOC", "clk", 1)->GetConflicts().empty());
    EXPECT_TRUE(Find("TNM_NET", "btn")->GetConflicts().empty());
    // design-wide: no object, the later statement wins
    for (const char* key : {"PART", "TS_x"}) {
        const Cs_Constraint* early = Find(key);
        ASSERT_EQ(early->GetConflicts().size(), 1u) << key;
        EXPECT_EQ(early->GetConflicts()[0].GetDesignEntity(), nullptr);
        EXPECT_EQ(early->GetConflicts()[0].GetConflictingConstraint(), Find(key, "", 1));
    }
}

// One table of names, run through the annotator and through the repository: the same objects.
TEST_F(Repo, FindsTheObjectsTheAnnotatorFinds) {
    const std::vector<std::string> names = {
        "NET clk",      "NET CLK",   "NET \"led<2>\"",  "NET led(1)",  "NET \"led*\"",   "NET tx0/*",
        "INST count_*", "INST tx0",  "INST TX0",        "INST tx0/*",  "INST \"tx0/\"",  "PIN *.C",
        "NET nosuch",   "INST \"/\"",
    };
    std::string text;
    for (size_t i = 0; i < names.size(); ++i) text += names[i] + " TPSYNC = probe" + std::to_string(i) + ";\n";
    std::string ucf = dir.Write("names.ucf", text);
    mgr.LoadConstraints(ucf.c_str(), Cs_ConstraintSyntax::UCF);

    auto file_road = Ndm_LoadDesign((kBlinky + "blinky.json").c_str(), nullptr);
    Ta_LunMgr annotator(ucf.c_str(), CP_UCF, nullptr);
    annotator.annotate(file_road->GetViewByName("EXPANDED"));
    // Objects carrying each probe on the file road, by full name.
    std::map<std::string, std::set<std::string>> annotated;
    lun_test::ForEachObject(file_road->GetViewByName("EXPANDED"), [&](Ndm_PropertyHolder* o) {
        if (const Ndm_Property* p = o->GetPropertyByName("TPSYNC"))
            for (const std::string& v : p->GetStrings()) annotated[v].insert(o->GetFullName());
    });
    for (size_t i = 0; i < names.size(); ++i) {
        const Cs_Constraint* c = Find("TPSYNC", "", static_cast<int>(i));
        ASSERT_NE(c, nullptr);
        std::vector<std::string> got = Names(c);
        EXPECT_EQ(std::set<std::string>(got.begin(), got.end()), annotated["probe" + std::to_string(i)]) << names[i];
    }
}

TEST_F(Repo, SourcesOutOfDateAfterAnEdit) {
    std::string a = dir.Write("a.ucf", "NET clk LOC = P10;\n"), b = dir.Write("b.ucf", "NET btn LOC = P12;\n");
    mgr.SetBulkConstraintMode(true);
    mgr.AddConstraintSource(a.c_str(), Cs_ConstraintSyntax::UCF);
    mgr.AddConstraintSource(b.c_str(), Cs_ConstraintSyntax::UCF);
    mgr.SetBulkConstraintMode(false);
    EXPECT_EQ(mgr.GetOutOfDateConstraintSources().size(), 2u);  // never read
    mgr.UpdateConstraintsFromSource();
    EXPECT_TRUE(mgr.GetOutOfDateConstraintSources().empty());
    EXPECT_EQ(mgr.GetNumConstraints(), 2u);
    // same size, same second: only the content tells
    dir.Write("a.ucf", "NET clk LOC = P11;\n");
    auto stale = mgr.GetOutOfDateConstraintSources();
    ASSERT_EQ(stale.size(), 1u);
    EXPECT_STREQ(stale[0]->GetFileName(), a.c_str());
    mgr.UpdateConstraintsFromSource();
    EXPECT_STREQ(Find("LOC", "clk")->GetValueText(), "P11");
    EXPECT_EQ(mgr.GetNumConstraints(), 2u);
    mgr.RemoveConstraintSource(b.c_str());
    EXPECT_EQ(mgr.GetConstraintSources().size(), 1u);
    EXPECT_EQ(Find("LOC", "btn"), nullptr);
}

// Write-back gives the typed constraints the properties the annotator gives them; take-in
// turns properties back into constraints.
TEST_F(Repo, WriteBackMatchesTheFileRoadAndTakeInReadsProperties) {
    std::string ucf = dir.Write("w.ucf", ReadFile(kBlinky + "blinky.ucf") +
                                             "NET \"led<1>\" OFFSET = IN 2 ns VALID 1 ns BEFORE clk;\n"
                                             "NET btn MAXDELAY = 3 ns;\nNET btn PERIOD = 10 ns HIGH 40%;\n");
    mgr.LoadConstraints(ucf.c_str(), Cs_ConstraintSyntax::UCF);
    Ndm_View* view = design->GetViewByName("EXPANDED");
    EXPECT_TRUE(mgr.WriteConstraintProps(Cs_DesignRegion_View(view)));

    auto file_road = Ndm_LoadDesign((kBlinky + "blinky.json").c_str(), nullptr);
    Ta_LunMgr annotator(ucf.c_str(), CP_UCF, nullptr);
    annotator.annotate(file_road->GetViewByName("EXPANDED"));
    const std::set<std::string> typed = {"LOC",    "IOSTANDARD", "DRIVE",    "SLEW",     "TNM",       "TNM_NET",
                                         "OFFSET", "PERIOD",     "MAXDELAY", "PROHIBIT", "AREA_GROUP"};
    auto is_typed = [&](const std::string& name) { return typed.count(name) > 0; };
    std::set<std::string> written = lun_test::ObjectProperties(view, is_typed);
    EXPECT_EQ(written, lun_test::ObjectProperties(file_road->GetViewByName("EXPANDED"), is_typed));
    EXPECT_TRUE(written.count("clk: LOC P10"));
    EXPECT_TRUE(written.count("led[3]: DRIVE 8"));

    // take-in: the properties become constraints of no file
    Cs_ConstraintMgr taken;
    taken.SetDesign(file_road.get());
    Cs_ConstraintMgr::PropReplaceResults results =
        taken.ReplaceConstraintsFromProps(Cs_DesignRegion_View(file_road->GetViewByName("EXPANDED")));
    EXPECT_TRUE(static_cast<Cs_ReturnCode>(results));
    std::set<std::string> names;
    for (const Ndm_Property* p : results.ConstraintProperties()) names.insert(p->GetOwner()->GetFullName() + "." + p->GetName());
    EXPECT_TRUE(names.count("clk.LOC"));
    EXPECT_TRUE(names.count("rst_n.PULLUP"));
    EXPECT_FALSE(names.count("clk.FROM_UCF"));
    const Cs_Constraint* loc = nullptr;
    for (const Cs_Constraint* c : taken.GetConstraints(Cs_ConstraintMgr::ALL))
        if (std::string(c->GetAttribute()) == "LOC" && std::string(c->GetTarget()) == "clk") loc = c;
    ASSERT_NE(loc, nullptr);
    EXPECT_STREQ(loc->GetValueText(), "P10");
    EXPECT_EQ(loc->GetSourceInfo()->GetSourceFile(), nullptr);
    EXPECT_EQ(Names(loc), std::vector<std::string>{"clk"});
}

// A canonical text of everything the repository file keeps.
std::string Snapshot(const Cs_ConstraintMgr& m) {
    std::string out;
    for (const Cs_FileInfo* f : m.GetConstraintSources())
        out += std::string("source ") + f->GetFileName() + " " + std::to_string(f->GetHash()) + "\n";
    for (const Cs_Constraint* c : m.GetConstraints(Cs_ConstraintMgr::ALL)) {
        out += c->GetMsgName() + " [" + c->GetType().GetName() + "]";
        for (const Ndm_PropertyHolder* o : c->GetAssociatedDesignObjs()) out += " obj:" + o->GetFullName();
        for (const Cs_Constraint* d : c->GetAssociatedConstraints()) out += " uses:" + d->GetMsgName();
        for (const Cs_Conflict& k : c->GetConflicts())
            out += " overridden" + (k.GetDesignEntity() ? " on " + k.GetDesignEntity()->GetFullName() : "") +
                   " by:" + k.GetConflictingConstraint()->GetMsgName();
        out += "\n";
    }
    for (const auto& st : m.GetFindings())
        out += "status " + std::to_string(static_cast<int>(st->GetID())) + "/" + std::to_string(st->GetSeverity()) +
               "/" + std::to_string(st->GetLocalizedMsgNum()) + ": " + st->GetMessage() + "\n";
    return out;
}

TEST_F(Repo, CommitThenRestoreGivesTheSameRepository) {
    std::string ucf = dir.Write("x.ucf", ReadFile(kBlinky + "blinky.ucf") +
                                             "NET clk LOC = P13;\nNET clk BAD = = ;\nCONFIG PART = other;\n");
    mgr.LoadConstraints(ucf.c_str(), Cs_ConstraintSyntax::UCF);
    std::string file = dir.path() + "/cst.qbcd";
    ASSERT_TRUE(mgr.Commit(file.c_str()));
    const std::string before = Snapshot(mgr);
    EXPECT_NE(before.find("overridden on clk by:NET \"clk\" LOC = P13"), std::string::npos) << before;
    EXPECT_NE(before.find("status 2/2/10"), std::string::npos) << before;

    Cs_ConstraintMgr restored;
    restored.SetDesign(design.get());
    EXPECT_TRUE(restored.Restore(file.c_str()));
    EXPECT_EQ(Snapshot(restored), before);
    EXPECT_TRUE(restored.GetOutOfDateConstraintSources().empty());
    // committing what was restored, unchanged, leaves the file alone (the same inode)
    auto inode = [](const std::string& path) {
        struct stat st {};
        return ::stat(path.c_str(), &st) == 0 ? st.st_ino : 0;
    };
    const auto was = inode(file);
    EXPECT_TRUE(restored.Commit(file.c_str()));
    EXPECT_EQ(inode(file), was);
    // a second commit of the restored repository writes the same content
    std::string copy = dir.path() + "/copy.qbcd";
    ASSERT_TRUE(restored.Commit(copy.c_str()));
    Cs_ConstraintMgr third;
    third.SetDesign(design.get());
    ASSERT_TRUE(third.Restore(copy.c_str()));
    EXPECT_EQ(Snapshot(third), before);

    // What the names resolved to is taken from the file only for the design it was committed
    // for: a design that now has the missing net is resolved again; without a design the
    // committed names are kept for listings.
    for (bool same : {true, false}) {
        auto grown = Ndm_LoadDesign((kBlinky + "blinky.json").c_str(), nullptr);
        Ndm_Block* top = grown->GetWorkView()->GetBlock();
        grown->GetWorkView()->CreateNetwork()->AddSignal(top->CreateSignal("dbg_probe"));
        if (!same) grown->SetSourceStamp(grown->GetSourceStamp() + "+edited");
        Cs_ConstraintMgr again;
        again.SetDesign(grown.get());
        ASSERT_TRUE(again.Restore(file.c_str()));
        const Cs_Constraint* probe = nullptr;
        for (const Cs_Constraint* c : again.GetConstraints(Cs_ConstraintMgr::ACTIVE))
            if (std::string(c->GetTarget()) == "dbg_probe") probe = c;
        ASSERT_NE(probe, nullptr);
        EXPECT_EQ(probe->GetAssociatedDesignObjs().size(), same ? 0u : 1u);
        // resolved again, the repository no longer holds what the file holds: a commit writes it
        const auto before = inode(file);
        ASSERT_TRUE(again.Commit(file.c_str()));
        EXPECT_EQ(inode(file) == before, same);
    }
    Cs_ConstraintMgr unbound;
    ASSERT_TRUE(unbound.Restore(file.c_str()));
    std::string committed;
    for (const Cs_Constraint* c : unbound.GetConstraints(Cs_ConstraintMgr::ACTIVE))
        if (const auto* names = unbound.GetCommittedNames(*c))
            for (const auto& [by, on] : names->overrides)
                committed += std::string(c->GetStatementText()) + " on " + on + " by " + by->GetStatementText() + "\n";
    EXPECT_EQ(committed, "NET \"clk\" LOC = P10 | IOSTANDARD = LVCMOS33 on clk by NET clk LOC = P13\n");
}

// The repository file is never torn: a failure at any step of a commit, or a process killed
// in the middle, leaves the previous file as it was; damage is refused with a clear status.
TEST_F(Repo, CommitsAreAtomicAndDamageIsRefused) {
    mgr.LoadConstraints((kBlinky + "blinky.ucf").c_str(), Cs_ConstraintSyntax::UCF);
    std::string file = dir.path() + "/cst.qbcd";
    ASSERT_TRUE(mgr.Commit(file.c_str()));
    const std::string good = ReadFile(file), snapshot = Snapshot(mgr);
    mgr.LoadConstraints(dir.Write("more.ucf", "NET btn LOC = P99;\n").c_str(), Cs_ConstraintSyntax::UCF);

    static std::string fail_at;
    Cs_SetCommitFaultHook([](const char* step) { return fail_at != step; });
    auto leftovers = [&] {
        std::string partial;
        for (const auto& e : std::filesystem::directory_iterator(dir.path()))
            if (e.path().extension() == ".partial") partial += e.path().filename().string() + " ";
        return partial;
    };
    for (const char* step : {"open", "write", "seal", "sync", "close", "rename"}) {
        fail_at = step;
        Cs_ReturnCode rc = mgr.Commit(file.c_str());
        EXPECT_FALSE(rc) << step;
        ASSERT_EQ(rc.size(), 1u);
        EXPECT_EQ((*rc.begin())->GetID(), Cs_StatusID::REPOSITORY_ERROR);
        EXPECT_NE((*rc.begin())->GetMessage().find("Cannot write repository file '" + file + "'"), std::string::npos);
        EXPECT_EQ(ReadFile(file), good) << step;
        EXPECT_EQ(leftovers(), "") << step;
    }
    // a child killed while writing
    pid_t child = fork();
    if (child == 0) {
        Cs_SetCommitFaultHook([](const char* step) {
            if (std::string(step) == "sync") ::kill(::getpid(), SIGKILL);
            return true;
        });
        mgr.Commit(file.c_str());
        ::_exit(0);
    }
    int status = 0;
    ::waitpid(child, &status, 0);
    EXPECT_TRUE(WIFSIGNALED(status));
    Cs_SetCommitFaultHook(nullptr);
    EXPECT_EQ(ReadFile(file), good);
    Cs_ConstraintMgr restored;
    restored.SetDesign(design.get());
    ASSERT_TRUE(restored.Restore(file.c_str()));
    EXPECT_EQ(Snapshot(restored), snapshot);
    EXPECT_NE(leftovers(), "");
    ASSERT_TRUE(mgr.Commit(file.c_str()));  // the next commit removes what the killed one left
    EXPECT_EQ(leftovers(), "");

    // damage: each is refused with one status naming the file and why; the file is untouched
    const std::string committed = ReadFile(file);
    std::string flipped = committed;
    size_t at = flipped.find("SLICE_X0Y0:SLICE_X7Y7");
    ASSERT_NE(at, std::string::npos);
    flipped[at + 6] ^= 0x01;
    std::string older = committed;  // written in the format before constraint blocks were kept
    size_t version = older.find("version4");
    ASSERT_NE(version, std::string::npos);
    older[version + 7] = '3';
    struct Case {
        std::string content, reason;
    } cases[] = {
        {flipped, "its content does not match its checksum"},
        {older, "it was written in format 3 by an older version; this program reads format 4"},
        {committed.substr(0, committed.size() / 2), "damaged"},
        {committed.substr(0, 100), ""},
        {"not a database at all, just text\n", ""},
    };
    for (const Case& c : cases) {
        std::string bad = dir.Write("bad.qbcd", c.content);
        Cs_ConstraintMgr victim;
        victim.LoadConstraints((kBlinky + "blinky.ucf").c_str(), Cs_ConstraintSyntax::UCF);
        const size_t count = victim.GetNumConstraints();
        Cs_ReturnCode rc = victim.Restore(bad.c_str());
        EXPECT_FALSE(rc);
        ASSERT_EQ(rc.size(), 1u);
        EXPECT_NE((*rc.begin())->GetMessage().find("Cannot restore repository file '" + bad + "': "), std::string::npos);
        EXPECT_NE((*rc.begin())->GetMessage().find(c.reason), std::string::npos) << (*rc.begin())->GetMessage();
        EXPECT_EQ(victim.GetNumConstraints(), count);  // left as it was
        EXPECT_EQ(ReadFile(bad), c.content);
    }

    // Changed but not damaged: a file changed since the commit is read from its tables. A
    // damaged snapshot, or an index a user added for queries, loses nothing.
    std::string snapshot_hit = committed;
    snapshot_hit[snapshot_hit.rfind("SLICE_X0Y0:SLICE_X7Y7") + 6] ^= 0x01;
    std::string indexed = dir.Write("indexed.qbcd", committed);
    sqlite3* db = nullptr;
    ASSERT_EQ(sqlite3_open(indexed.c_str(), &db), SQLITE_OK);
    ASSERT_EQ(sqlite3_exec(db, "CREATE INDEX mine ON constraints(value)", nullptr, nullptr, nullptr), SQLITE_OK);
    sqlite3_close(db);
    for (const std::string& changed : {dir.Write("snapshot_hit.qbcd", snapshot_hit), indexed}) {
        Cs_ConstraintMgr back;
        back.SetDesign(design.get());
        ASSERT_TRUE(back.Restore(changed.c_str())) << changed;
        EXPECT_EQ(Snapshot(back), Snapshot(mgr)) << changed;
    }
    // A damaged snapshot in a file sealed again (nothing but a deliberate act does that) is
    // decoded without harm: refused, or restored.
    const size_t blob = committed.find("LUNS");
    ASSERT_NE(blob, std::string::npos);
    for (size_t at = blob; at < committed.size(); at += 97) {
        std::string bad = committed;
        bad[at] = static_cast<char>(bad[at] ^ 0x5a);
        const std::string resealed = dir.Write("resealed.qbcd", bad);
        std::string error;
        ASSERT_TRUE(Cs_Rows::SealFile(resealed, error)) << error;
        Cs_ConstraintMgr back;
        back.SetDesign(design.get());
        if (!back.Restore(resealed.c_str())) continue;
        for (const Cs_Constraint* c : back.GetConstraints(Cs_ConstraintMgr::ALL)) c->GetAssociatedDesignObjs();
    }
}

}  // namespace
