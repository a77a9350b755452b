// `quillmap extract` through the built program.
#include <fstream>

#include "extract_fixture.h"
#include "host/design/native_format.h"
#include "support/test_support.h"

namespace {

using lun_test::ReadFile;
using lun_test::RunCommand;

TEST_F(ExtractTest, QuillmapExtractToStdoutAndFile) {
    lun_test::ScratchDir dir;
    Ndm_Block* cfg = Block(top, "top_CONFIG_UCF", "CONFIG");
    cfg->CreatePropertyString("PROHIBIT", "P1");
    cfg->CreatePropertyInt32("SLEW", 80);
    Block(top, "top_TIMESPEC_UCF", "TIMESPEC", {{"ENABLE", "TS_clk"}});
    std::string in = dir.path() + "/design.json", file = dir.path() + "/out.ucf";
    ASSERT_TRUE(Ndm_WriteNative(design, in.c_str()));
    std::string before = ReadFile(in), out, err;
    const std::string exe = std::string(QUILLMAP_EXE) + " extract ";
    const std::string tail = "\n// Timing Constraints\nENABLE = TS_clk ;\n\n";

    ASSERT_EQ(RunCommand(exe + in, &out, &err), 0) << err;
    EXPECT_EQ(out, "// Global Constraints\nCONFIG PROHIBIT = P1 ;\nCONFIG SLEW = 80 ;\n" + tail);
    EXPECT_EQ(ReadFile(in), before);  // blocks are deleted in memory only

    // Normalization is part of saving a design: convert --normalize, then dump or extract.
    Ndm_Network* q = view->CreateNetwork();
    q->AddSignal(top->CreateSignal("q"));
    q->CreatePropertyInt32("SLEW", 20);
    ASSERT_TRUE(Ndm_WriteNative(design, in.c_str()));
    std::string norm = dir.path() + "/norm.qdf";
    ASSERT_EQ(lun_test::Quillmap("convert --normalize " + in + " -o " + norm, &out, &err), 0)
        << err;
    ASSERT_EQ(lun_test::Quillmap("dump " + norm, &out, &err), 0) << err;
    EXPECT_NE(out.find("  network \"q\" signals 1\n    % \"SLEW\" string \"SLOW\"\n"), std::string::npos) << out;
    ASSERT_EQ(RunCommand(exe + "-o " + file + " " + norm, &out, &err), 0) << err;
    EXPECT_EQ(out, "");
    EXPECT_EQ(ReadFile(file), "// Global Constraints\nCONFIG PROHIBIT = P1 ;\nCONFIG SLEW = FAST ;\n" + tail);

    // A fatal error: exit status 2, no output and no file.
    Block(top, "bad", "TIMEGRP")->CreatePropertyBool("ODD");
    ASSERT_TRUE(Ndm_WriteNative(design, in.c_str()));
    std::string bad_file = dir.path() + "/bad.ucf";
    EXPECT_EQ(RunCommand(exe + "-o " + bad_file + " " + in, &out, &err), 2);
    EXPECT_NE(err.find("Unexpected property type found on TIMEGRP block for property ODD."), std::string::npos) << err;
    EXPECT_FALSE(std::ifstream(bad_file).good());
    EXPECT_EQ(RunCommand(exe + in, &out, &err), 2);
    EXPECT_EQ(out, "");
}

}  // namespace
