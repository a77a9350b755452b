// Extract: sections, their order, every line form, block deletion and fatal errors.
#include "extract_fixture.h"

namespace {

TEST_F(ExtractTest, WholeDesignGoldenTextThenBlocksGone) {
    Ndm_Block* plain = top->CreateBlock("u1");  // not a constraint block: its child comes first
    Block(plain, "grp", "TIMEGRP", {{"fast", "RISING ffs FFS(u1/*)  EXCEPT slow "}});
    Ndm_Block* cfg = Block(top, "top_CONFIG_UCF", "CONFIG");
    cfg->CreatePropertyString("PROHIBIT", "P1, P2");
    cfg->CreatePropertyString("VOLTAGE", "1.200V");
    cfg->CreatePropertyInt32("TEMPERATURE", -5);
    List(cfg, "SYSTEM_JITTER", {"0.2 ns"});
    List(cfg, "VREF", {"P20", "P21"});
    List(cfg, "RANGE", {"ag1 = SITE_A0:SITE_A7", "\tag2 =  SITE_C0:SITE_C9 \t"});
    cfg->CreatePropertyString("RLOC_RANGE", "set1 = X0Y0:X3Y3");
    List(cfg, "RLOC_ORIGIN", {"set2=X1Y1"});
    cfg->CreatePropertyString("RLOC_ORIGIN_S", "x = y");
    List(cfg, "FROM_UCF", {"PROHIBIT"});
    cfg->CreatePropertyInt32("USER_VISIBLE", 1);  // bookkeeping, whatever its type
    Block(cfg, "inner", "TIMESPEC", {{"TS_in", "IGNORE"}});
    Ndm_Block* ts = Block(top, "top_TIMESPEC_UCF", "TIMESPEC",
                          {{"TS_clk", "PERIOD \"clk_grp\" 10000.000000 pS HIGH 50.000000 %"},
                           {"ENABLE", "TS_clk"},
                           {"OFFSET", "IN 2000.000000 pS BEFORE clk"},
                           {"OFFSET", "OUT 3000.000000 pS AFTER clk"},
                           {"TSO_data_in_clk", "TIMEGRP data OFFSET = IN 2000.000000 pS BEFORE clk"},
                           {"TS_AREA_DEF", "TIMEGRP tg1 AREA_GROUP = ag1"},
                           {"TS_a", "FROM \"OFFSET_PINS\" TO \"b\" 5000.000000 pS"},
                           {"T", "OFFSET"},
                           {"ts_b", "OFFSET"}});
    ts->CreatePropertyList("MORE")->CreatePropertyString("TS_old", "DROP_SPEC");
    CstExtractor ex;
    EXPECT_EQ(Run(ex),
              "// Timing Groups\n"
              "TIMEGRP fast = RISING ffs FFS(u1/*)  EXCEPT slow  ;\n"
              "\n"
              "// Timing Constraints\n"
              "TIMESPEC TS_in = IGNORE ;\n"
              "\n"
              "// Global Constraints\n"
              "CONFIG PROHIBIT = P1, P2 ;\n"
              "VOLTAGE = 1.200V ;\n"
              "CONFIG TEMPERATURE = -5 ;\n"
              "SYSTEM_JITTER = 0.2 ns ;\n"
              "CONFIG VREF = P20 ;\n"
              "CONFIG VREF = P21 ;\n"
              "AREA_GROUP ag1 RANGE = SITE_A0:SITE_A7 ;\n"
              "AREA_GROUP ag2 RANGE = SITE_C0:SITE_C9 ;\n"
              "SET set1 RLOC_RANGE = X0Y0:X3Y3 ;\n"
              "SET set2 RLOC_ORIGIN = X1Y1 ;\n"
              "CONFIG RLOC_ORIGIN_S = x = y ;\n"
              "\n"
              "// Timing Constraints\n"
              "TIMESPEC TS_clk = PERIOD \"clk_grp\" 10000.000000 pS HIGH 50.000000 % ;\n"
              "ENABLE = TS_clk ;\n"
              "OFFSET = IN 2000.000000 pS BEFORE clk ;\n"
              "OFFSET = OUT 3000.000000 pS AFTER clk ;\n"
              "TIMEGRP data OFFSET = IN 2000.000000 pS BEFORE clk ;\n"
              "TIMEGRP tg1 AREA_GROUP = ag1 ;\n"
              "FROM \"OFFSET_PINS\" TO \"b\" 5000.000000 pS ;\n"
              "TIMESPEC T = OFFSET ;\n"
              "TIMESPEC ts_b = OFFSET ;\n"
              "TIMESPEC TS_old = DROP_SPEC ;\n"
              "\n");
    ASSERT_EQ(top->GetNumBlocks(), 1);
    EXPECT_EQ(top->GetBlockItr()[0], plain);
    EXPECT_EQ(plain->GetNumBlocks(), 0);
    EXPECT_EQ(Run(ex), "");
    EXPECT_TRUE(ex.constraints_written);  // never reset
}

TEST_F(ExtractTest, NoConstraintBlocksAndEmptyBlocks) {
    top->CreateBlock("a")->CreatePropertyString("TYPE", "timespec");  // case-sensitive
    CstExtractor ex;
    EXPECT_EQ(Run(ex), "");
    EXPECT_FALSE(ex.constraints_written);
    EXPECT_EQ(top->GetNumBlocks(), 1);
    Block(top, "c", "CONFIG");
    Block(top, "g", "TIMEGRP");
    std::ostringstream text;
    Port::Stream stream(text);
    EXPECT_TRUE(ex.Extract(view, stream));
    EXPECT_EQ(text.str(), "// Global Constraints\n\n// Timing Groups\n\n");
    EXPECT_EQ(top->GetNumBlocks(), 1);
}

TEST_F(ExtractTest, DeepHierarchyIsWalkedWithoutRecursion) {
    Ndm_Block* b = top;
    for (int i = 0; i < 20000; ++i) b = b->CreateBlock("d");
    Block(b, "ts", "TIMESPEC", {{"TS_deep", "IGNORE"}});
    CstExtractor ex;
    EXPECT_EQ(Run(ex), "// Timing Constraints\nTIMESPEC TS_deep = IGNORE ;\n\n");
    EXPECT_EQ(b->GetNumBlocks(), 0);
}

TEST_F(ExtractTest, FatalsNameThePropertyAndLeaveTheDesignWhole) {
    struct Case {
        void (*make)(Ndm_Block* top);
        const char* message;
    };
    const Case cases[] = {
        {[](Ndm_Block* t) { Block(t, "c", "CONFIG")->CreatePropertyFloat64("R", 1.5); },
         "Unexpected property type found on CONFIG block for property R.\n"},
        {[](Ndm_Block* t) { Block(t, "c", "CONFIG")->CreatePropertyBool("A%sB"); },
         "Unexpected property type found on CONFIG block for property A%sB.\n"},
        {[](Ndm_Block* t) { Block(t, "g", "TIMEGRP")->CreatePropertyString("X", "x"); },
         "Unexpected property type found on TIMEGRP block for property X.\n"},
        {[](Ndm_Block* t) { Block(t, "s", "TIMESPEC")->GetPropertyByName("TIMESPEC")->CreatePropertyInt32("TS_n", 3); },
         "Unexpected property type found on TIMESPEC block for property TIMESPEC.\n"},
        {[](Ndm_Block* t) { List(Block(t, "c", "CONFIG"), "MODE", {"a = b = c"}); },
         "Unexpected Value for MODE\n"},
        // an empty piece before a leading or after a trailing "=" is a piece too
        {[](Ndm_Block* t) { List(Block(t, "c", "CONFIG"), "RLOC_ORIGIN", {"=s = x"}); },
         "Unexpected Value for RLOC_ORIGIN\n"},
        {[](Ndm_Block* t) { List(Block(t, "c", "CONFIG"), "RANGE", {"ag = A:B="}); }, "Unexpected Value for RANGE\n"},
        {[](Ndm_Block* t) { Block(t, "c", "CONFIG")->CreatePropertyString("RLOC_RANGE", "X0Y0"); },
         "Unexpected Value for RLOC_RANGE\n"},
    };
    Block(top, "first", "TIMEGRP", {{"g", "x"}});
    for (const Case& c : cases) {
        c.make(top);
        CstExtractor ex;
        std::ostringstream text;
        Port::Stream stream(text);
        EXPECT_EQ(Fatal([&] { ex.Extract(view, stream); }), c.message);
        EXPECT_EQ(text.str().rfind("// Timing Groups\nTIMEGRP g = x ;\n\n//", 0), 0u) << text.str();
        ASSERT_EQ(top->GetNumBlocks(), 2);
        top->DeleteBlock(top->GetBlockItr()[1]);
    }
}

TEST(ExtractorNames, BookkeepingAndAreaGroupLists) {
    for (const char* n : {"TYPE", "UCF", "NCF", "TERMINAL", "FROM_UCF", "USER_VISIBLE", "FROM_NCF"})
        EXPECT_TRUE(CstExtractor::IsBookkeepingProperty(n)) << n;
    for (const char* n : {"RANGE", "COMPRESSION", "PLACE", "GROUP", "MODE", "IMPLEMENT"})
        EXPECT_TRUE(CstExtractor::IsAreaGroupAttribute(n)) << n;
    for (const char* n : {"type", "TA_LUN_NEW_OBJ", "RLOC_RANGE", "range", "", static_cast<const char*>(nullptr)})
        EXPECT_FALSE(CstExtractor::IsBookkeepingProperty(n) || CstExtractor::IsAreaGroupAttribute(n));
}

}  // namespace
