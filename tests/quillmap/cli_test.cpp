// The quillmap command line: exit statuses, messages on bad input, output files.
#include <gtest/gtest.h>

#include <filesystem>

#include "host/port/file.h"
#include "host/port/version.h"
#include "support/chain_netlist.h"
#include "support/test_support.h"

namespace {

using lun_test::RunCommand;

const std::string kExample = std::string(LUN_SOURCE_DIR) + "/examples/blinky/";

using lun_test::Quillmap;

TEST(Cli, UsageAndVersion) {
    std::string out, err;
    EXPECT_EQ(Quillmap("--version", &out), 0);
    EXPECT_EQ(out, "quillmap " LUN_VERSION " (liblun " + std::string(lun_version()) + ")\n");
    EXPECT_EQ(Quillmap("", &out, &err), 2);  // a subcommand is required
    EXPECT_EQ(Quillmap("annotate --no-such-option x", &out, &err), 2);
    EXPECT_EQ(Quillmap("annotate --help", &out), 0);
    EXPECT_NE(out.find("--allow-unmatched-locs"), std::string::npos);
}

TEST(Cli, AnnotateExampleStatusFollowsMessages) {
    lun_test::ScratchDir dir;
    std::string out, err;
    std::string saved = dir.path() + "/b.qdf";
    EXPECT_EQ(Quillmap("annotate " + kExample + "blinky.json --ucf " + kExample + "blinky.ucf -o " + saved, &out, &err),
              1);
    EXPECT_NE(err.find("Could not find net(s) 'dbg_probe' in the design."), std::string::npos) << err;
    EXPECT_TRUE(Port::File::exist(saved.c_str()));  // the design is saved despite errors
    EXPECT_EQ(Quillmap("annotate " + kExample + "blinky.json --aul --ucf " + kExample + "blinky.ucf", &out, &err), 0)
        << err;
    EXPECT_NE(err.find("'dbg_probe' in the design.  Since the -aul switch is set"), std::string::npos) << err;

    EXPECT_EQ(Quillmap("annotate --best-effort " + kExample + "blinky.json --ucf " + kExample + "blinky.ucf", &out, &err),
              0);
    EXPECT_EQ(err, "");  // best effort passes over the missing net without a message

    // the saved design can be dumped and extracted
    EXPECT_EQ(Quillmap("dump " + saved, &out, &err), 0);
    EXPECT_NE(out.find("\"TNM\" string_list [\"cnt_regs\"]"), std::string::npos);
    EXPECT_EQ(Quillmap("extract " + saved, &out, &err), 0) << err;
    EXPECT_NE(out.find("TIMESPEC TS_clk = PERIOD \"clk_grp\" 20000.000000 pS HIGH 50.000000 % ;"), std::string::npos)
        << out;
}

TEST(Cli, JsonLinesMessages) {
    lun_test::ScratchDir dir;
    std::string ucf = dir.Write("x.ucf", "NET nosuch LOC = P1;\n");
    std::string out, err;
    EXPECT_EQ(Quillmap("--messages jsonl annotate " + kExample + "blinky.json --ucf " + ucf, &out, &err), 1);
    EXPECT_EQ(err,
              "{\"severity\":\"error\",\"program\":\"Quillmap\",\"module\":\"lunmgr\",\"text\":\"Line 1 in '" + ucf +
                  "': Could not find net(s) 'nosuch' in the design.  To suppress this error use the -aul switch, "
                  "specify the correct net name or remove the constraint.\\n\"}\n");
}

TEST(Cli, BadInputNamesTheFile) {
    lun_test::ScratchDir dir;
    struct Case {
        std::string args;
        int status;
        std::vector<std::string> words;  // each must appear in stderr
    } cases[] = {
        {"dump " + dir.path() + "/missing.json", 1, {"missing.json"}},
        {"dump " + dir.Write("text.json", "{ \"modules\": [1, 2,"), 1, {"text.json"}},
        {"dump " + dir.Write("plain.json", "this is not json"), 1, {"plain.json"}},
        {"dump " + dir.Write("other.json", "{\"creator\": \"me\"}"), 1, {"other.json"}},
        {"dump " + kExample + "blinky.json --top nosuch", 1, {"nosuch"}},
        {"--max-cells 5 dump " + kExample + "blinky.json", 1, {"blinky.json", "more than the limit of 5."}},
        {"convert " + kExample + "blinky.json --max-cells 5 -o " + dir.path() + "/x.qdf", 1, {"limit of 5."}},
        {"--max-cells 0 dump " + kExample + "blinky.json", 2, {"--max-cells"}},
        {"annotate " + kExample + "blinky.json --ucf " + dir.path() + "/none.ucf", 1, {"none.ucf"}},
        {"annotate " + kExample + "blinky.json --filter " + dir.Write("bad.pfd", "LOC strng net\n") + " --ucf " +
             kExample + "blinky.ucf",
         1,
         {"bad.pfd", "line 1", "strng"}},
    };
    // quillmap never writes over what it reads, and says when its output is lost
    const std::string copy = dir.path() + "/copy.json", ucf = dir.path() + "/copy.ucf";
    lun_test::RunCommand("cp " + kExample + "blinky.json " + copy + " && cp " + kExample + "blinky.ucf " + ucf);
    const std::string same = "is the input file";
    std::vector<Case> more = {
        {"annotate " + copy + " -o " + copy, 2, {same}},
        {"annotate " + copy + " --ucf " + ucf + " -o " + ucf, 2, {same, "copy.ucf"}},
        {"extract " + copy + " -o " + copy, 2, {same}},
        {"convert " + copy + " -o " + copy, 2, {same}},
        {"dump " + copy + " > /dev/full", 1, {"Cannot write to the standard output: No space left on device."}},
        {"part " + ucf + " > /dev/full", 1, {"Cannot write to the standard output"}},
        {"convert " + copy + " -o " + dir.path(), 1, {"is not a regular file"}},
    };
    for (const Case& c : cases) more.push_back(c);
    for (const Case& c : more) {
        std::string out, err;
        EXPECT_EQ(Quillmap(c.args, &out, &err), c.status) << c.args << "\n" << err;
        for (const std::string& word : c.words) EXPECT_NE(err.find(word), std::string::npos) << c.args << "\n" << err;
    }
    EXPECT_EQ(lun_test::ReadFile(copy), lun_test::ReadFile(kExample + "blinky.json"));
    EXPECT_EQ(lun_test::ReadFile(ucf), lun_test::ReadFile(kExample + "blinky.ucf"));
}

TEST(Cli, FatalLeavesNoOutputBehind) {
    lun_test::ScratchDir dir;
    std::string ncf = dir.Write("two.ncf", "CONFIG PART = a;\nCONFIG PART = b;\n");
    std::string saved = dir.path() + "/out.qdf";
    std::string out, err;
    EXPECT_EQ(Quillmap("annotate " + kExample + "blinky.json --ncf " + ncf + " -o " + saved, &out, &err), 2);
    EXPECT_NE(err.find("Second \"CONFIG PART\" statement found"), std::string::npos) << err;
    EXPECT_FALSE(Port::File::exist(saved.c_str()));
}

// A netlist 100,000 levels deep annotates by full paths and patterns, saves, reads back and
// saves the same bytes again, and dumps to a few kilobytes a level; one that doubles at every level is refused with one message.
TEST(Cli, DeepAndExplodingNetlists) {
    lun_test::ScratchDir dir;
    constexpr int kLevels = 100000;
    std::string path;
    for (int i = 1; i < kLevels; ++i) path += "u/";
    const std::string chain = dir.Write("chain.json", lun_test::ChainNetlist(kLevels));
    const std::string ucf = dir.Write("deep.ucf", "NET \"" + path + "w\" LOC = P1;\nINST \"" + path + "g\" TNM = leaf;\n" +
                                                      "PIN \"" + path + "g.A\" TIG;\nNET \"*/w\" TNM_NET = ws;\n");
    const std::string first = dir.path() + "/first.qdf", second = dir.path() + "/second.qdf";
    std::string out, err;
    EXPECT_EQ(Quillmap("annotate " + chain + " --ucf " + ucf + " -o " + first, &out, &err), 0) << err.substr(0, 300);
    EXPECT_EQ(Quillmap("convert " + first + " -o " + second, &out, &err), 0) << err.substr(0, 300);
    const std::string saved = lun_test::ReadFile(first);
    EXPECT_EQ(saved, lun_test::ReadFile(second));
    for (const char* property : {"\"LOC\"", "\"TNM\"", "\"TIG\""})
        EXPECT_NE(saved.find(property), std::string::npos) << property;
    EXPECT_GE(lun_test::CountOf(saved, "\"TNM_NET\""), static_cast<size_t>(kLevels - 1));  // every level's w
    const std::string dump = dir.path() + "/deep.txt";
    EXPECT_EQ(Quillmap("dump " + first + " -o " + dump, &out, &err), 0) << err.substr(0, 300);
    EXPECT_LT(std::filesystem::file_size(dump), static_cast<uintmax_t>(kLevels) * 4000);

    const std::string doubling = dir.Write("doubling.json", lun_test::ChainNetlist(40, true));
    EXPECT_EQ(Quillmap("annotate " + doubling + " --ucf " + ucf + " -o " + dir.path() + "/d.qdf", &out, &err), 1);
    EXPECT_EQ(lun_test::CountOf(err, "\n"), 1u) << err;
    EXPECT_NE(err.find("expands to 1649267441663 instances"), std::string::npos) << err;
}

TEST(Cli, PartReadsWithoutNetlist) {
    lun_test::ScratchDir dir;
    std::string ucf = dir.Write("p.ucf", "CONFIG PART = qx100-fg256-2;\nCONFIG STEPPING = ES;\nNET x LOC = P1;\n");
    std::string out, err;
    EXPECT_EQ(Quillmap("part " + ucf, &out, &err), 0) << err;
    EXPECT_EQ(out, "PART = qx100-fg256-2\nSTEPPING = ES\n");
}

}  // namespace
