// The TIMESPEC, TIMEGRP and CONFIG constraint blocks and the name tables.
#include "frame_fixture.h"

namespace {

class BlocksTest : public FrameTest {
protected:
    std::unique_ptr<ProbeAnnotator> Make(CP_FILE_TYPE kind) {
        auto a = std::make_unique<ProbeAnnotator>(dir.Write("f", "").c_str(), kind, nullptr);
        a->SetView(view);
        return a;
    }
};

TEST_F(BlocksTest, UcfRunCreatesMarkedBlockOnce) {
    auto ucf = Make(CP_UCF);
    Ndm_Block* ts = ucf->GetConstraintBlock("TIMESPEC");
    ASSERT_NE(ts, nullptr);
    EXPECT_STREQ(ts->GetName(), "top_TIMESPEC_UCF");
    EXPECT_EQ(ts->GetParent(), top);
    EXPECT_STREQ(ts->GetPropertyByName("TYPE")->GetValueString(), "TIMESPEC");
    EXPECT_NE(ts->GetPropertyByName("UCF"), nullptr);
    EXPECT_NE(ts->GetPropertyByName("TERMINAL"), nullptr);
    EXPECT_EQ(ucf->AttachTimeConstraint("TS_a", "DROP_SPEC", ts), 1);
    EXPECT_EQ(ucf->GetConstraintBlock("TIMESPEC"), ts);
    EXPECT_EQ(ucf->AttachTimeConstraint("TS_b", "IGNORE", ts), 1);
    Ndm_Property* list = ts->GetPropertyByName("TIMESPEC");
    ASSERT_EQ(list->GetNumEntries(), 2);
    EXPECT_STREQ(list->GetListItr()[1]->GetName(), "TS_b");
    EXPECT_STREQ(list->GetListItr()[1]->GetValueString(), "IGNORE");
    EXPECT_EQ(top->GetNumBlocks(), 3);
}

TEST_F(BlocksTest, KindsShareBlocksOnlyOneWay) {
    auto ncf = Make(CP_NCF);
    Ndm_Block* ncf_grp = ncf->GetConstraintBlock("TIMEGRP");
    EXPECT_STREQ(ncf_grp->GetName(), "top_TIMEGRP_NCF");
    EXPECT_EQ(ncf_grp->GetPropertyByName("UCF"), nullptr);
    auto ucf = Make(CP_UCF);
    Ndm_Block* ucf_grp = ucf->GetConstraintBlock("TIMEGRP");  // an unmarked block is not usable
    EXPECT_STREQ(ucf_grp->GetName(), "top_TIMEGRP_UCF");
    auto ucf_cfg = Make(CP_UCF)->GetConstraintBlock("CONFIG");
    auto other = Make(static_cast<CP_FILE_TYPE>(9));
    EXPECT_EQ(other->GetConstraintBlock("CONFIG"), ucf_cfg);  // any marked block will do
}

TEST_F(BlocksTest, SearchIsPreOrderAndRestoresTerminal) {
    Ndm_Block* deep = u2->CreateBlock("deep_cfg");
    deep->CreatePropertyString("TYPE", "CONFIG");
    Ndm_Block* later = u3->CreateBlock("later_cfg");
    later->CreatePropertyString("TYPE", "CONFIG");
    auto ncf = Make(CP_NCF);
    EXPECT_EQ(ncf->FindConstraintBlock(top, "CONFIG"), deep);
    EXPECT_EQ(ncf->FindConstraintBlock(u3, "CONFIG"), later);
    EXPECT_EQ(ncf->FindConstraintBlock(u3, "TIMESPEC"), nullptr);
    Ndm_Block* got = ncf->GetConstraintBlock("CONFIG");
    EXPECT_EQ(got, deep);
    EXPECT_NE(deep->GetPropertyByName("TERMINAL"), nullptr);
    deep->DeleteProperty("TERMINAL");
    EXPECT_EQ(ncf->GetConstraintBlock("CONFIG"), deep);
    EXPECT_NE(deep->GetPropertyByName("TERMINAL"), nullptr);
    // once the first block is gone, the next one in pre-order is used
    u2->DeleteBlock(deep);
    EXPECT_EQ(ncf->GetConstraintBlock("CONFIG"), later);
    EXPECT_EQ(top->GetNumBlocks(), 2);
}

TEST_F(BlocksTest, TimingEntriesOnlyOnTimingBlocks) {
    auto ucf = Make(CP_UCF);
    Ndm_Block* cfg = ucf->GetConstraintBlock("CONFIG");
    EXPECT_EQ(ucf->AttachTimeConstraint("TS_x", "IGNORE", cfg), 0);
    EXPECT_EQ(cfg->GetPropertyByName("CONFIG"), nullptr);
    EXPECT_EQ(cfg->GetPropertyByName("TIMESPEC"), nullptr);
    EXPECT_EQ(ucf->AttachTimeConstraint("TS_x", "IGNORE", u1), 0);
    Ndm_Block* grp = ucf->GetConstraintBlock("TIMEGRP");
    EXPECT_EQ(ucf->AttachTimeConstraint("OFFSET", "IN 1", grp), 1);
    EXPECT_EQ(ucf->AttachTimeConstraint("OFFSET", "IN 2", grp), 1);  // equal names both kept
    EXPECT_EQ(grp->GetPropertyByName("TIMEGRP")->GetNumEntries(), 2);
}

TEST_F(BlocksTest, EndToEndThroughParser) {
    ProbeAnnotator a(dir.Write("t.ucf", "TIMESPEC TS_old = DROP_SPEC;\nTIMESPEC TS_x = DROP_SPEC;\n").c_str(),
                     CP_UCF, nullptr);
    EXPECT_EQ(a.annotate(view), 0);
    Ndm_Block* ts = top->GetBlockByName("top_TIMESPEC_UCF");
    ASSERT_NE(ts, nullptr);
    EXPECT_EQ(ts->GetPropertyByName("TIMESPEC")->GetNumEntries(), 2);
}

TEST_F(BlocksTest, NameTables) {
    auto a = Make(CP_UCF);
    EXPECT_STREQ(a->GetEdgeString(PR_RISING), "RISING");
    EXPECT_STREQ(a->GetEdgeString(PR_TRANSLO), "TRANSLO");
    EXPECT_STREQ(a->GetEdgeString(static_cast<PR_EDGE>(4)), "");
    EXPECT_EQ(a->GetEdgeString(static_cast<PR_EDGE>(5)), nullptr);
    EXPECT_EQ(a->GetEdgeString(static_cast<PR_EDGE>(-1)), nullptr);
    EXPECT_STREQ(a->GetConstraintName(Pr_Logical_Constraint::INIT_), "INIT_");
    EXPECT_STREQ(a->GetConstraintName(Pr_Logical_Constraint::STRING_LIST_TYPE), "STRING_LIST_TYPE");
    EXPECT_EQ(a->GetConstraintName(static_cast<Pr_Logical_ConstraintType>(6)), nullptr);
}

}  // namespace
