// The repository road of quillmap, end to end: tests/repository_road/steps.txt runs annotate
// --project and repo over blinky at each DRC level, restores, edits, damages the repository
// file and gives bad settings; expected.txt holds what each step prints. The example design
// then goes through both roads, which must leave the same constraints on it.
#include <gtest/gtest.h>

#include <cstdlib>
#include <cstring>
#include <set>
#include <fstream>
#include <sstream>

#include "support/test_support.h"

namespace {

using lun_test::Quillmap;
using lun_test::ReadFile;
using lun_test::RunCommand;

const std::string kCase = std::string(LUN_TEST_DIR) + "/repository_road/";
const std::string kExample = std::string(LUN_SOURCE_DIR) + "/examples/blinky/";

TEST(RepositoryRoad, StepsPrintWhatTheyPrinted) {
    lun_test::ScratchDir dir;
    ASSERT_EQ(RunCommand("cp " + kExample + "blinky.json " + kCase + "board.ucf " + kCase + "extra.ucf " + dir.path()),
              0);
    std::istringstream steps(ReadFile(kCase + "steps.txt"));
    std::string line, actual;
    while (std::getline(steps, line)) {
        if (line.empty() || line[0] == '#') continue;
        std::string command = line;
        size_t at = command.find("quillmap ");
        if (at != std::string::npos) command.replace(at, 8, QUILLMAP_EXE);
        std::string out, err;
        int status = RunCommand("cd " + dir.path() + " && (unset ZEP_QUILLMAP_CS ZEP_QUILLMAP_CONSTRAINT_DRC " +
                                    "ZEP_QUILLMAP_CONSTR_OVERRIDE_ERROR; " + command + ")",
                                &out, &err);
        actual += "$ " + line + "\n" + err + out + (status ? "exit " + std::to_string(status) + "\n" : "");
    }
    if (std::getenv("LUN_REGRESS_UPDATE")) std::ofstream(kCase + "expected.txt", std::ios::binary) << actual;
    EXPECT_EQ(actual, ReadFile(kCase + "expected.txt"));
}

// Every property of every object of a saved design, as "object: property", sorted: the two
// roads attach in different orders. The bookkeeping (the names of the files and of the
// attributes each attached) is left out.
std::multiset<std::string> ConstraintsOf(const std::string& saved) {
    std::string dump;
    EXPECT_EQ(Quillmap("dump " + saved, &dump), 0);
    std::istringstream lines(dump);
    std::string line, object;
    std::multiset<std::string> kept;
    while (std::getline(lines, line)) {
        size_t text = line.find_first_not_of(' ');
        if (text == std::string::npos) continue;
        if (line[text] != '%') {
            object = line;
            continue;
        }
        bool bookkeeping = false;
        for (const char* name : {"% \"FROM_UCF\"", "% \"EXPANDED_OVI_FILE\"", "% \"EXPANDED_BCD_FILE\""})
            bookkeeping |= line.compare(text, std::strlen(name), name) == 0;
        if (!bookkeeping) kept.insert(object + ": " + line);
    }
    return kept;
}

TEST(RepositoryRoad, WriteBackLeavesWhatTheFileRoadLeaves) {
    lun_test::ScratchDir dir;
    const std::string args = "annotate " + kExample + "blinky.json --aul --ucf " + kExample + "blinky.ucf -o ";
    ASSERT_EQ(Quillmap(args + dir.path() + "/file.qdf"), 0);
    std::string err;
    ASSERT_EQ(Quillmap(args + dir.path() + "/repo.qdf --project " + dir.path() + "/p.qpf", nullptr, &err), 0) << err;
    EXPECT_EQ(ConstraintsOf(dir.path() + "/repo.qdf"), ConstraintsOf(dir.path() + "/file.qdf"));
}

}  // namespace
