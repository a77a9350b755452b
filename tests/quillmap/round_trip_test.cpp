// Constraint text survives the whole road: annotate, save, load, extract, parse again.
#include <gtest/gtest.h>

#include <map>
#include <sstream>

#include "extract/cst_extractor.h"
#include "host/design/design_io.h"
#include "host/design/native_format.h"
#include "host/port/msgman.h"
#include "host/port/stream.h"
#include "manager/lunmgr.h"
#include "support/test_support.h"

namespace {

// Entries of every constraint block: "TYPE/list/name = text" for timing entries and
// "CONFIG/name = text" for settings (string lists one line per text), in block order.
std::vector<std::string> BlockContents(Ndm_View* view) {
    std::vector<std::string> out;
    for (Ndm_Block* b : view->GetBlock()->GetBlockItr()) {
        Ndm_Property* type = b->GetPropertyByName("TYPE");
        if (!type) continue;
        std::string t = type->GetValueString();
        for (Ndm_Property* p : b->GetPropertyItr()) {
            std::string name = p->GetName();
            if (name == "TYPE" || name == "UCF" || name == "TERMINAL" || name == "FROM_UCF") continue;
            if (p->GetType() == NDM_PROP_LIST) {
                for (Ndm_Property* e : p->GetListItr()) out.push_back(t + "/" + e->GetName() + " = " + e->GetValueString());
            } else if (p->GetType() == NDM_PROP_STRING_LIST) {
                for (const auto& s : p->GetStrings()) out.push_back(t + "/" + name + " = " + s);
            } else if (p->GetValueString()) {
                out.push_back(t + "/" + name + " = " + p->GetValueString());
            }
        }
    }
    return out;
}

std::unique_ptr<Ndm_Design> EmptyDesign() { return std::move(lun_test::TopDesign().design); }

const char* kEveryForm =
    "CONFIG STEPPING = ES;\n"
    "VOLTAGE = 1.2 V;\nTEMPERATURE = 85 C;\n"
    "PROHIBIT = SITE_C0, SITE_C1;\nVREF = P20, P21;\n"
    "TIMESPEC TS_clk = PERIOD clk_grp 10 ns HIGH 50%;\n"
    "TIMESPEC TS_clk2 = PERIOD clk2_grp TS_clk * 2 PHASE + 2.5 ns HIGH 50% PRIORITY 1;\n"
    "TIMESPEC TS_fast = PERIOD fast_grp 250MHz LOW 2 ns INPUT_JITTER 100 ps;\n"
    "TIMESPEC TS_s = PERIOD s_grp 8 ns LOW 4 ns;\n"
    "TIMESPEC TS_ab = FROM grpA TO grpB 5 ns DATAPATHONLY PRIORITY 2;\n"
    "TIMESPEC TS_abc = FROM grpA THRU grpB TO grpC TS_1 / 2;\n"
    "TIMESPEC TS_f = FROM grpA TO grpB 200 MHz;\n"
    "TIMESPEC TS_tig = FROM grpA TO grpB TIG PRIORITY 3;\n"
    "TIMESPEC TS_ign = TIG;\nTIMESPEC TS_old = DROP_SPEC;\n"
    "ENABLE = TS_clk;\nDISABLE = TS_old;\n"
    "OFFSET = IN 2 ns BEFORE clk;\n"
    "OFFSET = OUT 3 ns VALID 1 ns AFTER clk TIMEGRP regs HIGH;\n"
    "TIMEGRP data OFFSET = IN 2 ns BEFORE clk;\n"
    "TIMEGRP data OFFSET = OUT 2.5 ns AFTER clk TIMEGRP regs;\n"
    "TIMEGRP fast = RISING ffs FFS(u1/*) EXCEPT slow;\n"
    "TIMEGRP both = grpA FALLING grpB;\n"
    "TIMEGRP tg1 AREA_GROUP = ag1;\n"
    "AREA_GROUP ag1 RANGE = SITE_A0:SITE_A7, SITE_B0:SITE_B3 | PLACE = closed | COMPRESSION = 50;\n"
    "AREA_GROUP ag2 RANGE = SITE_C0:SITE_C9 | GROUP = open | MODE = reconfig | IMPLEMENT = auto;\n"
    "SET set1 RLOC_RANGE = X0Y0:X3Y3 | RLOC_ORIGIN = X0Y0;\n";

TEST(RoundTrip, ExtractedTextParsesIntoTheSameBlocks) {
    lun_test::ScratchDir dir;
    Port_MsgCapture capture;
    // annotate and save
    auto design = EmptyDesign();
    std::string ucf = dir.Write("all.ucf", kEveryForm);
    Ta_LunMgr first(ucf.c_str(), CP_UCF, nullptr);
    ASSERT_EQ(first.annotate(design->GetViewByName("EXPANDED")), 0);
    std::vector<std::string> before = BlockContents(design->GetViewByName("EXPANDED"));
    std::string saved = dir.path() + "/annotated.qdf";
    ASSERT_TRUE(Ndm_WriteNative(*design, saved.c_str()));

    // load the saved design and extract its constraint text
    auto loaded = Ndm_LoadDesign(saved.c_str(), nullptr);
    ASSERT_NE(loaded, nullptr);
    Ndm_View* view = loaded->GetViewByName("EXPANDED");
    EXPECT_EQ(BlockContents(view), before);
    std::ostringstream text;
    Port::Stream stream(text);
    CstExtractor extractor;
    ASSERT_TRUE(extractor.Extract(view, stream));
    EXPECT_TRUE(BlockContents(view).empty());  // the blocks are gone after extraction

    // the extracted text annotates a fresh design with the same blocks
    auto again = EmptyDesign();
    std::string extracted = dir.Write("extracted.ucf", text.str());
    Ta_LunMgr second(extracted.c_str(), CP_UCF, nullptr);
    EXPECT_EQ(second.annotate(again->GetViewByName("EXPANDED")), 0) << text.str();
    EXPECT_EQ(BlockContents(again->GetViewByName("EXPANDED")), before) << text.str();
    EXPECT_TRUE(capture.Texts(Port_Severity::Error).empty());
    EXPECT_TRUE(capture.Texts(Port_Severity::Warning).empty());
}

}  // namespace
