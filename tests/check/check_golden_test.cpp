// quillmap check end to end on the board of tests/check/design.v: each folder below
// tests/check/golden holds constraint files (*.ucf and *.ncf, given as --ucf and --ncf in name
// order), an optional file "options" (more arguments), and expected.txt: the exit status, the
// messages and the output. LUN_REGRESS_UPDATE=1 rewrites expected.txt from the current output.
#include <gtest/gtest.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>

#include "host/port/file.h"
#include "support/test_support.h"

namespace {

namespace fs = std::filesystem;
using lun_test::ReadFile;
using lun_test::RunCommand;

const std::string kGolden = std::string(LUN_TEST_DIR) + "/check/golden/";

std::vector<std::string> Cases() {
    std::vector<std::string> cases;
    for (const auto& entry : fs::directory_iterator(kGolden))
        if (entry.is_directory()) cases.push_back(entry.path().filename().string());
    std::sort(cases.begin(), cases.end());
    return cases;
}

class CheckGolden : public ::testing::TestWithParam<std::string> {
protected:
    // The board's netlist, made once for every case.
    static void SetUpTestSuite() {
        if (RunCommand("yosys -V") != 0) return;
        netlist_dir_ = new lun_test::ScratchDir;
        RunCommand("yosys -q -p 'read_verilog " + std::string(LUN_TEST_DIR) +
                   "/check/design.v; synth -top top; autoname; write_json " + netlist_dir_->path() + "/design.json'");
    }
    static void TearDownTestSuite() {
        delete netlist_dir_;
        netlist_dir_ = nullptr;
    }
    static lun_test::ScratchDir* netlist_dir_;
};
lun_test::ScratchDir* CheckGolden::netlist_dir_ = nullptr;

TEST_P(CheckGolden, FindingsAsExpected) {
    if (!netlist_dir_) GTEST_SKIP() << "yosys is not installed";
    const std::string dir = kGolden + GetParam();
    // Run in a folder of its own, so that the output names the files as a user gives them.
    lun_test::ScratchDir work;
    std::string args = " check design.json";
    ASSERT_EQ(RunCommand("cp " + netlist_dir_->path() + "/design.json " + work.path()), 0);
    std::vector<std::string> files;
    for (const auto& entry : fs::directory_iterator(dir))
        if (entry.path().extension() == ".ucf" || entry.path().extension() == ".ncf")
            files.push_back(entry.path().filename().string());
    std::sort(files.begin(), files.end());
    for (const std::string& f : files) {
        ASSERT_EQ(RunCommand("cp " + dir + "/" + f + " " + work.path()), 0);
        args += " --" + f.substr(f.size() - 3) + " " + f;
    }
    std::string options = ReadFile(dir + "/options");
    options.erase(std::remove(options.begin(), options.end(), '\n'), options.end());
    std::string out, err;
    const int status =
        RunCommand("cd " + work.path() + " && " + QUILLMAP_EXE + args + " " + options + " --report report.html", &out,
                   &err);
    const std::string actual = "status " + std::to_string(status) + "\n" + err + out;
    if (std::getenv("LUN_REGRESS_UPDATE")) std::ofstream(dir + "/expected.txt", std::ios::binary) << actual;
    EXPECT_EQ(actual, ReadFile(dir + "/expected.txt"));
    // The page is written whenever the check ran.
    EXPECT_EQ(Port::File::exist((work.path() + "/report.html").c_str()), !out.empty());
}

INSTANTIATE_TEST_SUITE_P(Cases, CheckGolden, ::testing::ValuesIn(Cases()),
                         [](const auto& info) { return info.param; });

}  // namespace
