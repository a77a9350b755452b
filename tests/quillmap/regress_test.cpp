// Regression cases: each folder below tests/regress holds a design (design.v, synthesised
// with yosys, or netlist.json), constraints.ucf and expected.txt: the exit status and messages
// of "quillmap annotate" followed by the text of "quillmap extract" on the saved design.
// LUN_REGRESS_UPDATE=1 rewrites expected.txt from the current output.
#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>

#include "host/port/file.h"
#include "support/test_support.h"

namespace {

namespace fs = std::filesystem;
using lun_test::ReadFile;
using lun_test::RunCommand;

std::vector<std::string> Cases() {
    std::vector<std::string> cases;
    for (const auto& entry : fs::directory_iterator(std::string(LUN_TEST_DIR) + "/regress"))
        if (entry.is_directory()) cases.push_back(entry.path().filename().string());
    std::sort(cases.begin(), cases.end());
    return cases;
}

class Regress : public ::testing::TestWithParam<std::string> {};

TEST_P(Regress, MessagesAndExtractedText) {
    const std::string dir = std::string(LUN_TEST_DIR) + "/regress/" + GetParam();
    lun_test::ScratchDir scratch;
    std::string netlist = dir + "/netlist.json";
    if (!Port::File::exist(netlist.c_str())) {
        if (RunCommand("yosys -V") != 0) GTEST_SKIP() << "yosys is not installed";
        netlist = scratch.path() + "/netlist.json";
        ASSERT_EQ(RunCommand("yosys -q -p 'read_verilog " + dir + "/design.v; synth -top top; autoname; write_json " +
                             netlist + "'"),
                  0);
    }
    // Run from the case folder so that messages name the constraint file as the user wrote it.
    const std::string saved = scratch.path() + "/annotated.qdf";
    std::string out, err, text;
    int status = RunCommand("cd " + dir + " && " + QUILLMAP_EXE + " annotate " + netlist +
                                " --ucf constraints.ucf -o " + saved,
                            &out, &err);
    std::string actual = "status " + std::to_string(status) + "\n" + err + "--- extract\n";
    EXPECT_EQ(lun_test::Quillmap("extract " + saved, &text), 0);
    actual += text;
    if (std::getenv("LUN_REGRESS_UPDATE")) std::ofstream(dir + "/expected.txt", std::ios::binary) << actual;
    EXPECT_EQ(actual, ReadFile(dir + "/expected.txt"));
}

INSTANTIATE_TEST_SUITE_P(Cases, Regress, ::testing::ValuesIn(Cases()),
                         [](const auto& info) { return info.param; });

}  // namespace
