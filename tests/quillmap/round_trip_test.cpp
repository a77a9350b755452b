// Constraint text survives the whole road: annotate, save, load, extract, parse again.
#include <gtest/gtest.h>

#include <set>
#include <sstream>

#include "extract/cst_extractor.h"
#include "host/design/design_io.h"
#include "host/design/native_format.h"
#include "host/port/msgman.h"
#include "host/port/stream.h"
#include "manager/lunmgr.h"
#include "support/test_support.h"

namespace {

// Everything the view keeps but the names recorded from each file.
std::set<std::string> Contents(Ndm_View* view) {
    return lun_test::DesignProperties(view, [](const std::string& name) { return name != "FROM_UCF"; });
}

std::unique_ptr<Ndm_Design> EmptyDesign() { return std::move(lun_test::TopDesign().design); }

TEST(RoundTrip, ExtractedTextParsesIntoTheSameBlocks) {
    lun_test::ScratchDir dir;
    Port_MsgCapture capture;
    // annotate and save
    auto design = EmptyDesign();
    std::string ucf = dir.Write("all.ucf", lun_test::kEveryDesignWideForm);
    Ta_LunMgr first(ucf.c_str(), CP_UCF, nullptr);
    ASSERT_EQ(first.annotate(design->GetViewByName("EXPANDED")), 0);
    std::set<std::string> before = Contents(design->GetViewByName("EXPANDED"));
    std::string saved = dir.path() + "/annotated.qdf";
    ASSERT_TRUE(Ndm_WriteNative(*design, saved.c_str()));

    // load the saved design and extract its constraint text
    auto loaded = Ndm_LoadDesign(saved.c_str(), nullptr);
    ASSERT_NE(loaded, nullptr);
    Ndm_View* view = loaded->GetViewByName("EXPANDED");
    EXPECT_EQ(Contents(view), before);
    std::ostringstream text;
    Port::Stream stream(text);
    CstExtractor extractor;
    ASSERT_TRUE(extractor.Extract(view, stream));
    EXPECT_TRUE(Contents(view).empty());  // the blocks are gone after extraction

    // the extracted text annotates a fresh design with the same blocks
    auto again = EmptyDesign();
    std::string extracted = dir.Write("extracted.ucf", text.str());
    Ta_LunMgr second(extracted.c_str(), CP_UCF, nullptr);
    EXPECT_EQ(second.annotate(again->GetViewByName("EXPANDED")), 0) << text.str();
    EXPECT_EQ(Contents(again->GetViewByName("EXPANDED")), before) << text.str();
    EXPECT_TRUE(capture.Texts(Port_Severity::Error).empty());
    EXPECT_TRUE(capture.Texts(Port_Severity::Warning).empty());
}

}  // namespace
