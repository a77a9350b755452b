// Nothing a user wrote is lost on the way through quillmap: any byte, every repeated setting and
// group, the part, and each port's own pad.
#include <gtest/gtest.h>
#include <simdjson.h>

#include <cstdio>
#include <sstream>

#include "host/port/json_text.h"
#include "support/test_support.h"

namespace {

using lun_test::ReadFile;
using lun_test::RunCommand;

const std::string kBlinky = std::string(LUN_SOURCE_DIR) + "/examples/blinky/blinky.json";

using lun_test::Quillmap;
using lun_test::CountOf;

// Every byte 0x80..0xFF in names and values of each statement family: the messages are JSON,
// the saved design reads back, dumps, converts to the same bytes, extracts, and the extracted
// text annotates a design into the same constraint blocks again.
TEST(Fidelity, AnyByteSurvivesSaveDumpExtractAndAnnotate) {
    lun_test::ScratchDir dir;
    std::string ucf;
    for (int b = 0x80; b <= 0xFF; ++b) {
        const std::string B(1, static_cast<char>(b));
        ucf += "NET clk TNM_NET = g" + B + ";\nINST \"count_*\" TNM = c" + B + ";\nTIMEGRP t" + B + " = g" + B +
               ";\nTIMESPEC TS_" + B + " = PERIOD g" + B + " 10 ns HIGH 50%;\nCONFIG PROHIBIT = S" + B +
               ";\nAREA_GROUP ag" + B + " RANGE = SLICE_X" + B + ";\nTIMEGRP g" + B +
               " OFFSET = IN 1 ns BEFORE clk" + B + ";\nNET n" + B + " LOC = P1;\n";
    }
    std::string in = dir.Write("bytes.ucf", ucf), saved = dir.path() + "/o.qdf", out, err;
    ASSERT_EQ(Quillmap("--messages jsonl annotate " + kBlinky + " --aul --ucf " + in + " -o " + saved, &out, &err), 0)
        << err;

    // one JSON line per unmatched net, each naming its byte exactly
    std::istringstream lines(err);
    std::string line, texts;
    simdjson::dom::parser parser;
    int parsed = 0;
    while (std::getline(lines, line)) {
        std::string_view text;
        ASSERT_EQ(parser.parse(simdjson::padded_string(line))["text"].get(text), simdjson::SUCCESS) << line;
        texts += Port_DecodeByteEscapes(text);
        ++parsed;
    }
    EXPECT_EQ(parsed, 128);
    for (int b = 0x80; b <= 0xFF; ++b)
        EXPECT_NE(texts.find("net(s) 'n" + std::string(1, static_cast<char>(b)) + "'"), std::string::npos) << b;

    EXPECT_TRUE(simdjson::validate_utf8(ReadFile(saved)));
    ASSERT_EQ(Quillmap("dump " + saved, &out, &err), 0) << err;
    for (int b = 0x80; b <= 0xFF; ++b) {  // the dump shows a byte as its escape
        char escape[8];
        std::snprintf(escape, sizeof escape, "\\uf7%02x", b);
        EXPECT_NE(out.find("\"S" + std::string(escape) + "\""), std::string::npos) << b;
        EXPECT_NE(out.find("\"g" + std::string(escape) + "\""), std::string::npos) << b;
    }
    std::string copy = dir.path() + "/copy.qdf";
    ASSERT_EQ(Quillmap("convert " + saved + " -o " + copy, &out, &err), 0) << err;
    EXPECT_EQ(ReadFile(copy), ReadFile(saved));

    std::string text = dir.path() + "/x.ucf", again = dir.path() + "/again.qdf";
    ASSERT_EQ(Quillmap("extract " + saved + " -o " + text, &out, &err), 0) << err;
    std::string extracted = ReadFile(text);
    for (int b = 0x80; b <= 0xFF; ++b) {
        const std::string B(1, static_cast<char>(b));
        EXPECT_NE(extracted.find("CONFIG PROHIBIT = S" + B + " ;\n"), std::string::npos) << b;
        EXPECT_NE(extracted.find("TIMESPEC TS_" + B + " = PERIOD \"g" + B + "\""), std::string::npos) << b;
        EXPECT_NE(extracted.find("AREA_GROUP ag" + B + " RANGE = SLICE_X" + B + " ;\n"), std::string::npos) << b;
    }
    ASSERT_EQ(Quillmap("annotate " + kBlinky + " --ucf " + text + " -o " + again, &out, &err), 0) << err;
    ASSERT_EQ(Quillmap("extract " + again, &out, &err), 0) << err;
    EXPECT_EQ(out, extracted);
}

// The issue's shapes of repetition, run through annotate, dump and extract.
TEST(Fidelity, RepeatedSettingsAndGroupsKeepEveryValueInFileOrder) {
    lun_test::ScratchDir dir;
    std::string ucf = dir.Write("rep.ucf",
                                "CONFIG PROHIBIT = P1;\nCONFIG PROHIBIT = P2;\nPROHIBIT = P3, P4;\n"
                                "CONFIG VREF = V1;\nVREF = V2;\n"
                                "NET clk TNM_NET = FFS \"grp_a\"; NET clk TNM_NET = RAMS \"grp_b\";\n"
                                "NET clk TNM_NET = \"grp_c\";\nNET clk TIG = TS_x;\nNET clk TIG;\n"
                                "NET btn OFFSET = IN 2 ns BEFORE clk;\nNET btn OFFSET = IN 3 ns BEFORE clk2;\n"
                                "INST \"count_*\" TNM = cnt_a;\nINST \"count_*\" TNM = cnt_b;\n"
                                "TIMESPEC TS_x = FROM \"grp_a\" TO \"grp_b\" 5 ns;\n");
    std::string saved = dir.path() + "/rep.qdf", out, err;
    ASSERT_EQ(Quillmap("annotate " + kBlinky + " --ucf " + ucf + " -o " + saved, &out, &err), 0) << err;
    EXPECT_EQ(err, "");  // nothing is silently replaced, nothing needs a message
    ASSERT_EQ(Quillmap("dump " + saved, &out, &err), 0) << err;
    for (const char* expected :
         {"\"TNM_NET\" string_list [\"FFS : grp_a\", \"RAMS : grp_b\", \"grp_c\"]", "\"TIG\" string_list [\"TS_x\", \"\"]",
          "\"OFFSET\" string_list [\"IN : 2000.000000 pS : BEFORE : \\\"clk\\\"\", \"IN : 3000.000000 pS : BEFORE : "
          "\\\"clk2\\\"\"]",
          "\"TNM\" string_list [\"cnt_a\", \"cnt_b\"]"})
        EXPECT_NE(out.find(expected), std::string::npos) << expected << "\n" << out;
    ASSERT_EQ(Quillmap("extract " + saved, &out, &err), 0) << err;
    EXPECT_NE(out.find("CONFIG PROHIBIT = P1 ;\nCONFIG PROHIBIT = P2 ;\nCONFIG PROHIBIT = P3, P4 ;\n"
                       "CONFIG VREF = V1 ;\nCONFIG VREF = V2 ;\n"),
              std::string::npos)
        << out;
}

// A group or clock name the stored texts cannot quote is kept as written, with a warning at
// annotation (file and line) and one from extract naming each statement that will not read back.
TEST(Fidelity, NamesThatExtractionCannotQuoteAreSaid) {
    lun_test::ScratchDir dir;
    std::string ucf = dir.Write("q.ucf",
                                "TIMEGRP \"grp a;b\" = RISING \"uart regs;x\";\nOFFSET = OUT 12 ns AFTER \"c;lk\";\n"
                                "TIMEGRP \"g#1\" = FALLING plain;\nTIMEGRP fine = RISING plain;\n");
    std::string saved = dir.path() + "/q.qdf", out, err;
    ASSERT_EQ(Quillmap("annotate " + kBlinky + " --ucf " + ucf + " -o " + saved, &out, &err), 0) << err;
    for (const char* name : {"grp a;b", "uart regs;x", "c;lk", "g#1"})
        EXPECT_NE(err.find(std::string("': The name '") + name + "' holds a blank"), std::string::npos) << err;
    EXPECT_EQ(CountOf(err, "Line 1 in '" + ucf + "'"), 2u);
    EXPECT_EQ(CountOf(err, "WARNING"), 4u);
    ASSERT_EQ(Quillmap("extract " + saved, &out, &err), 0) << err;
    EXPECT_NE(out.find("TIMEGRP grp a;b = RISING uart regs;x  ;"), std::string::npos) << out;  // as stored
    EXPECT_EQ(CountOf(err, "will not read back as written"), 3u) << err;
    EXPECT_EQ(err.find("fine"), std::string::npos) << err;
}

// A netlist where one net reaches the input x and the outputs y and z (assign y = x; assign
// z = x;) and an internal net name.
constexpr const char* kCopiedPorts = R"({"modules": {"top": {"attributes": {"top": 1},
  "ports": {"x": {"direction": "input", "bits": [2]}, "y": {"direction": "output", "bits": [2]},
            "z": {"direction": "output", "bits": [2]}},
  "cells": {}, "netnames": {"x": {"bits": [2]}, "y": {"bits": [2]}, "z": {"bits": [2]}, "x_int": {"bits": [2]}}}}})";

TEST(Fidelity, EachPortKeepsItsOwnPadConstraints) {
    lun_test::ScratchDir dir;
    std::string netlist = dir.Write("copy.json", kCopiedPorts), saved = dir.path() + "/copy.qdf", out, err;
    std::string ucf = dir.Write("pads.ucf",
                                "NET x LOC = A1 | IOSTANDARD = LVCMOS33;\nNET y LOC = B2 | SLEW = FAST;\n"
                                "NET z LOC = C3 | PULLUP;\nNET x_int TNM_NET = g;\n");
    ASSERT_EQ(Quillmap("annotate " + netlist + " --ucf " + ucf + " -o " + saved, &out, &err), 0) << err;
    // the internal name is still an alias of the kept net
    EXPECT_NE(err.find("Line 4 in '" + ucf + "': The constraint for NET 'x_int' is being attached to the equivalent "
                       "NET 'x'."),
              std::string::npos)
        << err;
    EXPECT_EQ(CountOf(err, "equivalent NET"), 1u) << err;
    ASSERT_EQ(Quillmap("dump " + saved, &out, &err), 0) << err;
    EXPECT_NE(out.find("network \"x\" signals 2\n    % \"LOC\" string \"A1\"\n"), std::string::npos) << out;
    EXPECT_NE(out.find("network \"y\" signals 1\n    % \"LOC\" string \"B2\"\n"), std::string::npos) << out;
    EXPECT_NE(out.find("network \"z\" signals 1\n    % \"LOC\" string \"C3\"\n"), std::string::npos) << out;
}

// Small whole-command cases: the part through annotate and part, the exit status after an
// internal error, fatal extraction of values that do not split in two.
TEST(Fidelity, PartsStatusesAndFatalExtraction) {
    lun_test::ScratchDir dir;
    const std::string d = dir.path() + "/";
    dir.Write("a.ncf", "CONFIG PART = qx100-fg256-2;\n");
    dir.Write("b.ucf", "CONFIG STEPPING = ES;\n");
    dir.Write("c.ucf", "CONFIG STEPPING = ES;\nCONFIG PART = qx200-ff1-1;\n");
    dir.Write("p.ucf", "NET clk LOC = P10;\nCONFIG PART = qx100-fg256-2;\n");
    dir.Write("inst.ucf", "CONFIG PART = qx100-fg256-2;\nINST \"count_*\" PART = qx200-ff1-1;\n");
    dir.Write("dup.ucf", "TIMEGRP g OFFSET = IN 1 ns BEFORE clk TIMEGRP regs;\n"
                         "TIMEGRP g OFFSET = IN 2 ns BEFORE clk TIMEGRP regs;\n");
    dir.Write("set.ucf", "SET \"=s\" RLOC_RANGE = X0Y0:X1Y1;\n");
    dir.Write("ag.ucf", "AREA_GROUP ag RANGE = \"A:B=\";\n");
    struct Case {
        std::string args;
        int status;
        std::vector<std::string> out, err;  // texts that must appear
    } cases[] = {
        {"part " + d + "a.ncf " + d + "b.ucf", 0, {d + "a.ncf: PART = qx100-fg256-2\n" + d + "b.ucf: STEPPING = ES\n"}, {}},
        {"part " + d + "a.ncf " + d + "c.ucf",
         0,
         {d + "c.ucf: PART = qx200-ff1-1\n" + d + "c.ucf: STEPPING = ES\n"},
         {"different parts: PART = qx100-fg256-2 in '" + d + "a.ncf', PART = qx200-ff1-1 in '" + d + "c.ucf'."}},
        {"part " + d + "b.ucf", 0, {"STEPPING = ES\n"}, {"No PART setting found"}},
        // annotate runs the part reader over each UCF: the saved design keeps the part
        {"annotate " + kBlinky + " --ucf " + d + "p.ucf -o " + d + "p.qdf", 0, {}, {}},
        {"extract " + d + "p.qdf", 0, {"// Global Constraints\nCONFIG PART = qx100-fg256-2 ;\n"}, {}},
        {"annotate " + kBlinky + " --ncf " + d + "a.ncf --ucf " + d + "c.ucf -o " + d + "ac.qdf",
         0,
         {},
         {"different parts: PART = qx100-fg256-2 in '" + d + "a.ncf', PART = qx200-ff1-1 in '" + d + "c.ucf'."}},
        {"extract " + d + "ac.qdf",
         0,
         {"CONFIG PART = qx100-fg256-2 ;\n", "CONFIG PART = qx200-ff1-1 ;\nCONFIG STEPPING = ES ;\n"},
         {}},
        {"annotate " + d + "p.qdf --ucf " + d + "p.ucf", 2, {}, {"Second \"CONFIG PART\" statement found"}},
        // an NCF after a UCF finds the UCF's block: the warning says which part is kept
        {"annotate " + kBlinky + " --ucf " + d + "c.ucf --ncf " + d + "a.ncf",
         0,
         {},
         {"different parts: PART = qx200-ff1-1 in '" + d + "c.ucf', PART = qx100-fg256-2 in '" + d +
          "a.ncf'. The design keeps PART = qx100-fg256-2.\n"}},
        {"annotate " + kBlinky + " --ucf " + d + "inst.ucf",
         0,
         {},
         {"Line 2 in '" + d + "inst.ucf': PART = qx200-ff1-1 replaces the part qx100-fg256-2 read before."}},
        // a stream that can be read once feeds both the part reader and the annotator
        {"annotate " + kBlinky + " --aul --ucf /dev/stdin -o " + d + "pipe.qdf < " + LUN_SOURCE_DIR +
             "/examples/blinky/blinky.ucf",
         0,
         {},
         {"Line 40 in '/dev/stdin': Could not find net(s) 'dbg_probe'"}},
        {"extract " + d + "pipe.qdf", 0, {"CONFIG PART = qx100-fg256-2 ;\n", "TIMESPEC TS_clk = "}, {}},
        {"annotate " + kBlinky + " --ucf " + d, 1, {}, {"Could not open constraint file"}},
        {"annotate " + kBlinky + " --second-pass --ucf " + d + "p.ucf", 0, {}, {}},
        {"annotate " + kBlinky + " --ucf " + d + "dup.ucf", 1, {}, {"INTERNAL_ERROR", "duplicate OFFSET"}},
        {"annotate " + kBlinky + " --ucf " + d + "set.ucf -o " + d + "set.qdf", 0, {}, {}},
        {"extract " + d + "set.qdf", 2, {}, {"Unexpected Value for RLOC_RANGE"}},
        {"annotate " + kBlinky + " --ucf " + d + "ag.ucf -o " + d + "ag.qdf", 0, {}, {}},
        {"extract " + d + "ag.qdf", 2, {}, {"Unexpected Value for RANGE"}},
    };
    for (const Case& c : cases) {
        std::string out, err;
        EXPECT_EQ(Quillmap(c.args, &out, &err), c.status) << c.args << "\n" << err;
        for (const std::string& t : c.out) EXPECT_NE(out.find(t), std::string::npos) << c.args << "\n" << out;
        for (const std::string& t : c.err) EXPECT_NE(err.find(t), std::string::npos) << c.args << "\n" << err;
    }
}

}  // namespace
