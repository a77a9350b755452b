// Reading Yosys JSON netlists: hierarchy, names, bits, networks, top choice and bad input.
#include <gtest/gtest.h>

#include <cstdlib>
#include <map>
#include <string>

#include "design_test_util.h"
#include "host/design/design_io.h"
#include "host/design/native_format.h"
#include "host/design/yosys_reader.h"
#include "host/port/msgman.h"
#include "support/chain_netlist.h"

namespace {

using design_test::DumpText;
using design_test::kPieceSizes;
using design_test::PieceSize;
using design_test::TempDir;

std::vector<std::string> NetworkMembers(const Ndm_Network* net) {
    std::vector<std::string> names;
    for (const Ndm_Signal* s = net->GetFirstSignal(); s; s = s->GetNextInNetwork()) names.push_back(s->GetFullName());
    return names;
}

const Ndm_Signal* SignalAt(const Ndm_Block* block, const char* name) {
    const Ndm_Signal* s = block->GetSignalByName(name);
    EXPECT_NE(s, nullptr) << name;
    return s;
}

// A two-level design through Yosys itself.
TEST(YosysReader, HierarchicalNetlistMadeByYosys) {
    if (std::system("test -x /usr/bin/yosys") != 0) GTEST_SKIP() << "yosys is not installed";
    TempDir dir;
    dir.Write("x.v", R"(
module leaf(input clk, input [1:0] a, output reg q);
  always @(posedge clk) q <= a[0] ^ a[1];
endmodule
module mid(input clk, input [3:0] d, output [1:0] y);
  leaf l0(.clk(clk), .a(d[1:0]), .q(y[0]));
  leaf l1(.clk(clk), .a(d[3:2]), .q(y[1]));
endmodule
module top(input clk, input [3:0] din, output [1:0] dout);
  mid m(.clk(clk), .d(din), .y(dout));
endmodule
)");
    std::string cmd = "cd " + dir.path() +
                      " && /usr/bin/yosys -q -p \"read_verilog x.v; synth -top top; write_json x.json\" >yosys.log 2>&1";
    ASSERT_EQ(std::system(cmd.c_str()), 0) << design_test::ReadAll(dir.File("yosys.log"));

    Port_MsgCapture capture;
    auto design = Ndm_LoadDesign(dir.File("x.json").c_str(), nullptr);
    ASSERT_TRUE(design);
    EXPECT_TRUE(capture.Texts(Port_Severity::Error).empty());
    EXPECT_STREQ(design->GetName(), "top");
    ASSERT_EQ(design->GetViewItr().size(), 1u);
    Ndm_View* view = design->GetViewByName("EXPANDED");
    ASSERT_NE(view, nullptr);
    Ndm_Block* top = view->GetBlock();
    EXPECT_STREQ(top->GetName(), "top");
    EXPECT_STREQ(top->GetTypeName(), "top");

    // Top ports: one pin per bit on the port's own signal.
    for (const char* name : {"clk", "din[0]", "din[3]", "dout[1]"}) {
        Ndm_Pin* pin = top->GetPinByName(name);
        ASSERT_NE(pin, nullptr) << name;
        EXPECT_EQ(pin->GetSignal(), top->GetSignalByName(name));
    }
    EXPECT_EQ(top->GetPinByName("clk")->GetDirection(), Ndm_Dir::Input);
    EXPECT_EQ(top->GetPinByName("dout[0]")->GetDirection(), Ndm_Dir::Output);
    EXPECT_EQ(top->GetPinByName("din[4]"), nullptr);

    // Hierarchy: m (mid) holds l0 and l1 (leaf), which hold Yosys gate cells.
    Ndm_Block* m = top->GetBlockByName("m");
    ASSERT_NE(m, nullptr);
    EXPECT_STREQ(m->GetTypeName(), "mid");
    Ndm_Block* l1 = m->GetBlockByName("l1");
    ASSERT_NE(l1, nullptr);
    EXPECT_STREQ(l1->GetTypeName(), "leaf");
    EXPECT_EQ(m->GetPinByName("d[2]")->GetSignal(), SignalAt(top, "din[2]"));
    EXPECT_EQ(m->GetPinByName("d[2]")->GetDirection(), Ndm_Dir::Input);
    EXPECT_EQ(l1->GetPinByName("a[0]")->GetSignal(), SignalAt(m, "d[2]"));
    EXPECT_EQ(l1->GetPinByName("q")->GetDirection(), Ndm_Dir::Output);
    bool saw_ff = false;
    for (const Ndm_Block* cell : l1->GetBlockItr()) {
        EXPECT_EQ(cell->GetNumBlocks(), 0);  // gate cells are leaves
        EXPECT_EQ(cell->GetTypeName()[0], '$');
        for (const Ndm_Pin* pin : cell->GetPinItr()) {
            ASSERT_NE(pin->GetSignal(), nullptr) << pin->GetFullName();
            EXPECT_EQ(pin->GetSignal()->GetBlock(), l1);
            EXPECT_NE(pin->GetDirection(), Ndm_Dir::None);
        }
        if (std::string(cell->GetTypeName()).find("DFF") != std::string::npos) {
            saw_ff = true;
            EXPECT_EQ(cell->GetPinByName("C")->GetSignal(), SignalAt(l1, "clk"));
            EXPECT_EQ(cell->GetPinByName("Q")->GetNetwork(), SignalAt(top, "dout[1]")->GetNetwork());
        }
    }
    EXPECT_TRUE(saw_ff);

    // Nets crossing the hierarchy are one network, named after the top-level signal.
    const Ndm_Network* clk = SignalAt(l1, "clk")->GetNetwork();
    ASSERT_NE(clk, nullptr);
    EXPECT_STREQ(clk->GetName(), "clk");
    EXPECT_EQ(NetworkMembers(clk), (std::vector<std::string>{"clk", "m/clk", "m/l0/clk", "m/l1/clk"}));
    const Ndm_Network* out1 = SignalAt(top, "dout[1]")->GetNetwork();
    EXPECT_EQ(SignalAt(m, "y[1]")->GetNetwork(), out1);
    EXPECT_EQ(SignalAt(l1, "q")->GetNetwork(), out1);
    EXPECT_NE(SignalAt(top, "dout[0]")->GetNetwork(), out1);
    // Every signal is in exactly the network its members say.
    size_t members = 0;
    for (const Ndm_Network* net : view->GetNetworkItr()) {
        EXPECT_EQ(net->GetTopSignal()->GetFullName(), net->GetName());
        for (const Ndm_Signal* s = net->GetFirstSignal(); s; s = s->GetNextInNetwork(), ++members)
            EXPECT_EQ(s->GetNetwork(), net);
    }
    EXPECT_EQ(members, design->GetStats().signals);

    // Native round trip: write, read, write gives the same bytes and the same database.
    ASSERT_TRUE(Ndm_WriteNative(*design, dir.File("a.lun").c_str()));
    auto again = Ndm_LoadDesign(dir.File("a.lun").c_str(), nullptr);
    ASSERT_TRUE(again);
    ASSERT_TRUE(Ndm_WriteNative(*again, dir.File("b.lun").c_str()));
    EXPECT_EQ(design_test::ReadAll(dir.File("a.lun")), design_test::ReadAll(dir.File("b.lun")));
    EXPECT_EQ(design_test::DumpText(*design), design_test::DumpText(*again));
}

// Hand-written netlist: names, bit order, hidden and constant nets, port directions.
constexpr const char* kNamesNetlist = R"({
  "creator": "hand",
  "modules": {
    "sub": {
      "ports": {
        "p": { "direction": "input", "offset": 2, "bits": [ 2, 3 ] },
        "o": { "direction": "output", "bits": [ 4 ] }
      },
      "cells": {},
      "netnames": {
        "p": { "hide_name": 0, "bits": [ 2, 3 ], "offset": 2 },
        "o": { "hide_name": 0, "bits": [ 4 ] }
      }
    },
    "\\top": {
      "attributes": { "top": "00000000000000000000000000000001" },
      "ports": {
        "d": { "direction": "input", "offset": 4, "bits": [ 2, 3 ] },
        "u": { "direction": "output", "upto": 1, "bits": [ 5, 6 ] },
        "k": { "direction": "output", "bits": [ "1" ] }
      },
      "cells": {
        "$abc$12$auto$lut": {
          "hide_name": 1,
          "type": "\\LUT2",
          "connections": { "A": [ "0", 2 ], "Y": [ 7 ] },
          "port_directions": { "Y": "output", "A": "input" }
        },
        "\\inst.x": {
          "type": "sub",
          "connections": { "p": [ 3, 7 ], "o": [ 5 ] }
        }
      },
      "netnames": {
        "$abc$12$n7": { "hide_name": 1, "bits": [ 7 ] },
        "d": { "hide_name": 0, "bits": [ 2, 3 ], "offset": 4 },
        "u": { "hide_name": 0, "bits": [ 5, 6 ], "upto": 1 },
        "alias": { "hide_name": 0, "bits": [ 7, 2 ] },
        "k": { "hide_name": 0, "bits": [ "1" ] }
      }
    }
  }
})";

TEST(YosysReader, NamesBitOrderHiddenAndConstantNets) {
    TempDir dir;
    std::string path = dir.Write("names.json", kNamesNetlist);
    auto design = Ndm_ReadYosysJson(path.c_str(), nullptr);
    ASSERT_TRUE(design);
    EXPECT_STREQ(design->GetName(), "top");  // chosen by its attribute; backslash dropped
    Ndm_Block* top = design->GetViewByName("EXPANDED")->GetBlock();
    std::vector<std::string> names;
    for (const Ndm_Signal* s : top->GetSignalItr()) names.push_back(s->GetName());
    // offset counts from the first bit; upto reverses the order; hidden nets are kept.
    EXPECT_EQ(names, (std::vector<std::string>{"$abc$12$n7", "d[4]", "d[5]", "u[1]", "u[0]", "alias[0]",
                                               "alias[1]", "k"}));

    Ndm_Block* lut = top->GetBlockByName("$abc$12$auto$lut");
    ASSERT_NE(lut, nullptr);
    EXPECT_STREQ(lut->GetTypeName(), "LUT2");
    ASSERT_EQ(lut->GetNumPins(), 3);
    EXPECT_STREQ(lut->GetPinItr()[0]->GetName(), "A[0]");
    EXPECT_EQ(lut->GetPinItr()[0]->GetSignal(), nullptr);  // constant
    EXPECT_EQ(lut->GetPinItr()[0]->GetDirection(), Ndm_Dir::Input);
    EXPECT_EQ(lut->GetPinByName("A[1]")->GetSignal(), top->GetSignalByName("d[4]"));
    // The first netname carrying a bit is the pin's signal, hidden or not.
    EXPECT_EQ(lut->GetPinByName("Y")->GetSignal(), top->GetSignalByName("$abc$12$n7"));
    EXPECT_EQ(lut->GetPinByName("Y")->GetDirection(), Ndm_Dir::Output);

    // Expanded cell: pins named after the module's ports (offset 2), directions from them.
    Ndm_Block* inst = top->GetBlockByName("inst.x");
    ASSERT_NE(inst, nullptr);
    EXPECT_STREQ(inst->GetTypeName(), "sub");
    EXPECT_EQ(inst->GetPinByName("p[2]")->GetSignal(), top->GetSignalByName("d[5]"));
    EXPECT_EQ(inst->GetPinByName("p[3]")->GetDirection(), Ndm_Dir::Input);
    EXPECT_EQ(inst->GetPinByName("o")->GetDirection(), Ndm_Dir::Output);
    ASSERT_NE(inst->GetSignalByName("p[3]"), nullptr);
    EXPECT_EQ(inst->GetFullName(), "inst.x");

    // Top pins: upto ports name bit 0 after the highest index; constant ports keep their net.
    EXPECT_EQ(top->GetPinByName("u[1]")->GetSignal(), top->GetSignalByName("u[1]"));
    EXPECT_EQ(top->GetPinByName("k")->GetSignal(), top->GetSignalByName("k"));
    EXPECT_EQ(top->GetSignalByName("k")->GetNetwork(), nullptr);

    // Networks: u[1] is driven through inst.o; bit 7 joins alias[0] and inst/p[3]. Within a
    // block, port names join first, then public names, then generated ones, so a public alias
    // names the network even when a generated name comes first in the file.
    EXPECT_EQ(inst->GetSignalByName("o")->GetNetwork(), top->GetSignalByName("u[1]")->GetNetwork());
    Ndm_Network* n7 = top->GetSignalByName("$abc$12$n7")->GetNetwork();
    EXPECT_STREQ(n7->GetName(), "alias[0]");
    EXPECT_EQ(NetworkMembers(n7), (std::vector<std::string>{"alias[0]", "$abc$12$n7", "inst.x/p[3]"}));
    std::vector<std::string> order;
    for (const Ndm_Network* net : design->GetViewByName("EXPANDED")->GetNetworkItr()) order.push_back(net->GetName());
    EXPECT_EQ(order, (std::vector<std::string>{"d[4]", "d[5]", "u[1]", "u[0]", "alias[0]"}));
    EXPECT_EQ(NetworkMembers(top->GetSignalByName("d[4]")->GetNetwork()),
              (std::vector<std::string>{"d[4]", "alias[1]"}));
}

// Two outputs copying one input in the top module, and an input wired to an output through a
// submodule: every top-level port bit keeps a network (a pad) of its own.
constexpr const char* kSharedPorts = R"({"modules": {
  "pass": {"ports": {"a": {"direction": "input", "bits": [2]}, "b": {"direction": "output", "bits": [2]}},
           "cells": {}, "netnames": {"a": {"bits": [2]}, "b": {"bits": [2]}}},
  "top": {"attributes": {"top": 1},
    "ports": {"a_copy": {"direction": "output", "bits": [2]}, "sys_clk": {"direction": "input", "bits": [2]},
              "b_copy": {"direction": "output", "bits": [2]}, "x": {"direction": "input", "bits": [3]},
              "y": {"direction": "output", "bits": [4]}},
    "cells": {"ff": {"type": "$_DFF_P_", "port_directions": {"C": "input", "D": "input"},
                     "connections": {"C": [2], "D": [4]}},
              "u": {"type": "pass", "connections": {"a": [3], "b": [4]}}},
    "netnames": {"a_copy": {"bits": [2]}, "b_copy": {"bits": [2]}, "internal": {"bits": [2]},
                 "sys_clk": {"bits": [2]}, "x": {"bits": [3]}, "y": {"bits": [4]}, "y_alias": {"bits": [4]}}}
}})";

TEST(YosysReader, EveryTopPortBitIsAPadOfItsOwn) {
    TempDir dir;
    auto design = Ndm_ReadYosysJson(dir.Write("pads.json", kSharedPorts).c_str(), nullptr);
    ASSERT_TRUE(design);
    Ndm_View* view = design->GetViewByName("EXPANDED");
    std::map<std::string, std::vector<std::string>> nets;
    for (const Ndm_Network* n : view->GetNetworkItr()) nets[n->GetFullName()] = NetworkMembers(n);
    const std::map<std::string, std::vector<std::string>> expected = {
        {"sys_clk", {"sys_clk", "internal"}},  // the input keeps the net
        {"a_copy", {"a_copy"}},
        {"b_copy", {"b_copy"}},
        {"x", {"x", "u/a", "u/b"}},
        {"y", {"y", "y_alias"}},  // joined to x only inside u: its own bit is its own net
    };
    EXPECT_EQ(nets, expected);
    Ndm_Block* top = view->GetBlock();
    EXPECT_EQ(top->GetBlockByName("ff")->GetPinByName("C")->GetSignal(), top->GetSignalByName("sys_clk"));
    EXPECT_EQ(top->GetPinByName("a_copy")->GetSignal(), top->GetSignalByName("a_copy"));
    EXPECT_EQ(top->GetPinByName("y")->GetSignal(), top->GetSignalByName("y"));
    EXPECT_EQ(top->GetBlockByName("ff")->GetPinByName("D")->GetSignal()->GetNetwork()->GetFullName(), "y");
}

constexpr const char* kTwoRoots = R"({"modules": {
  "a": {"ports": {}, "cells": {}, "netnames": {}},
  "b": {"ports": {}, "cells": {"x": {"type": "c", "connections": {}}}, "netnames": {}},
  "c": {"ports": {}, "cells": {}, "netnames": {}}
}})";

TEST(YosysReader, ChoosesTheTopModule) {
    TempDir dir;
    Port_MsgCapture capture;
    std::string two = dir.Write("two.json", kTwoRoots);
    EXPECT_FALSE(Ndm_ReadYosysJson(two.c_str(), nullptr));
    ASSERT_EQ(capture.Texts(Port_Severity::Error).size(), 1u);
    EXPECT_EQ(capture.Texts(Port_Severity::Error)[0],
              "Cannot tell the top module of '" + two +
                  "': modules 'a', 'b' are not instantiated by any other module. Name the top module.");

    auto b = Ndm_ReadYosysJson(two.c_str(), "b");
    ASSERT_TRUE(b);
    EXPECT_STREQ(b->GetViewByName("EXPANDED")->GetBlock()->GetName(), "b");
    EXPECT_STREQ(b->GetViewByName("EXPANDED")->GetBlock()->GetBlockByName("x")->GetTypeName(), "c");

    capture.Clear();
    EXPECT_FALSE(Ndm_ReadYosysJson(two.c_str(), "nope"));
    EXPECT_EQ(capture.Texts(Port_Severity::Error),
              std::vector<std::string>{"Top module 'nope' not found in '" + two + "'."});

    std::string one = dir.Write("one.json", R"({"modules": {
      "a": {"cells": {"i": {"type": "b"}}}, "b": {}}})");
    auto a = Ndm_ReadYosysJson(one.c_str(), nullptr);
    ASSERT_TRUE(a);
    EXPECT_STREQ(a->GetName(), "a");

    // Library cells (blackbox, whitebox) stay leaves and are never the top.
    std::string boxes = dir.Write("boxes.json", R"({"modules": {
      "BB": {"attributes": {"blackbox": "00000000000000000000000000000001"},
             "ports": {"a": {"direction": "input", "bits": [2]}, "y": {"direction": "output", "bits": [3]}},
             "netnames": {"a": {"bits": [2]}, "y": {"bits": [3]}}},
      "LIB": {"attributes": {"whitebox": 1}, "ports": {}},
      "top": {"cells": {"u": {"type": "BB", "connections": {"a": [5], "y": [6]}}},
              "netnames": {"n": {"bits": [5]}, "m": {"bits": [6]}}}}})");
    auto boxed = Ndm_ReadYosysJson(boxes.c_str(), nullptr);
    ASSERT_TRUE(boxed);
    EXPECT_STREQ(boxed->GetName(), "top");
    Ndm_Block* u = boxed->GetViewByName("EXPANDED")->GetBlock()->GetBlockByName("u");
    EXPECT_EQ(u->GetNumSignals(), 0);
    EXPECT_EQ(u->GetPinByName("a")->GetDirection(), Ndm_Dir::Input);
    EXPECT_EQ(u->GetPinByName("y")->GetDirection(), Ndm_Dir::Output);
    EXPECT_STREQ(u->GetPinByName("y")->GetSignal()->GetName(), "m");

    std::string marked = dir.Write("marked.json", R"({"modules": {
      "a": {"attributes": {"top": 1}}, "b": {"attributes": {"top": 1}}}})");
    capture.Clear();
    EXPECT_FALSE(Ndm_ReadYosysJson(marked.c_str(), nullptr));
    ASSERT_EQ(capture.Texts(Port_Severity::Error).size(), 1u);
    EXPECT_NE(capture.Texts(Port_Severity::Error)[0].find("'a', 'b' all carry the \"top\" attribute"),
              std::string::npos);
}

// Each bad input gives one error naming the file (and the byte offset for malformed JSON).
TEST(YosysReader, BadInputGivesOneClearError) {
    TempDir dir;
    struct Case {
        const char* name;
        const char* text;  // null: no such file
        const char* expect;
    };
    const Case cases[] = {
        {"missing.json", nullptr, "Cannot read design file '@': No such file or directory."},
        {"verilog.json", "module top; endmodule\n", "'@' is not valid JSON: "},
        {"truncated.json", "{\"modules\": {\"top\": {\"cells\": {", "'@' is not valid JSON: "},
        {"unclosed.json", "{\"modules\": {\"to", "'@' is not valid JSON: unclosed string at byte 13."},
        {"utf8.json", "{\"modules\": {\"t\xff\": {}}}", "'@' is not valid JSON: invalid UTF-8 at byte 15."},
        {"trailing.json", "{\"modules\": {\"a\": {}}} x", "'@' is not valid JSON: "},
        {"empty.json", "", "'@' is not valid JSON: no JSON value at byte 0."},
        {"array.json", "[1, 2]", "'@' is not a Yosys JSON netlist: the file does not hold a JSON object."},
        {"nomodules.json", "{\"creator\": \"x\"}", "'@' is not a Yosys JSON netlist: it has no \"modules\" object."},
        {"nomodule.json", "{\"modules\": {}}", "Netlist '@' holds no module."},
        {"modarray.json", "{\"modules\": []}", "'@' is not a Yosys JSON netlist: \"modules\" must be an object"},
        {"bits.json", "{\"modules\": {\"top\": {\"netnames\": {\"n\": {\"bits\": \"abc\"}}}}}",
         "'@' is not a Yosys JSON netlist: \"bits\" of netname 'n' in module 'top' must be an array of bits"},
        {"bitval.json", "{\"modules\": {\"top\": {\"netnames\": {\"n\": {\"bits\": [2, \"q\"]}}}}}",
         "constant other than"},
        {"dir.json",
         "{\"modules\": {\"top\": {\"ports\": {\"a\": {\"direction\": \"sideways\", \"bits\": [2]}}}}}",
         "\"direction\" of port 'a' in module 'top' must be \"input\", \"output\" or \"inout\""},
        {"dirlong.json",
         "{\"modules\": {\"top\": {\"cells\": {\"c\": {\"type\": \"X\", \"port_directions\": {\"A\": \"inputs\"}}}}}}",
         "direction of port 'A' of cell 'c' in module 'top' must be \"input\", \"output\" or \"inout\""},
        {"dirnumber.json",
         "{\"modules\": {\"top\": {\"cells\": {\"c\": {\"type\": \"X\", \"port_directions\": {\"A\": 1}}}}}}",
         "direction of port 'A' of cell 'c' in module 'top' must be a string"},
        {"notype.json", "{\"modules\": {\"top\": {\"cells\": {\"c\": {\"connections\": {}}}}}}",
         "cell 'c' in module 'top' has no \"type\""},
        {"recursive.json",
         "{\"modules\": {\"top\": {\"cells\": {\"i\": {\"type\": \"a\"}}}, \"a\": {\"cells\": {\"j\": "
         "{\"type\": \"b\"}}}, \"b\": {\"cells\": {\"k\": {\"type\": \"a\"}}}}}",
         "Module 'a' in '@' instantiates itself: a -> b -> a."},
        {"badport.json",
         "{\"modules\": {\"top\": {\"cells\": {\"i\": {\"type\": \"s\", \"connections\": {\"zz\": [2]}}}}, "
         "\"s\": {}}}",
         "Cell 'i' in module 'top' of '@' connects port 'zz', which module 's' does not have."},
    };
    for (size_t piece : kPieceSizes)
    for (const Case& c : cases) {
        SCOPED_TRACE(std::string(c.name) + " in pieces of " + std::to_string(piece));
        PieceSize size(piece);
        std::string path = c.text ? dir.Write(c.name, c.text) : dir.File(c.name);
        std::string expect = c.expect;
        if (size_t at = expect.find('@'); at != std::string::npos) expect.replace(at, 1, path);
        Port_MsgCapture capture;
        auto design = c.name == std::string("recursive.json") ? Ndm_ReadYosysJson(path.c_str(), "top")
                                                               : Ndm_LoadDesign(path.c_str(), nullptr);
        if (!c.text) {  // the reader itself says the same
            capture.Clear();
            EXPECT_FALSE(Ndm_ReadYosysJson(path.c_str(), nullptr));
            expect = "Cannot read netlist file '" + path + "': No such file or directory.";
        }
        EXPECT_FALSE(design);
        std::vector<std::string> errors = capture.Texts(Port_Severity::Error);
        ASSERT_EQ(errors.size(), 1u);
        EXPECT_NE(errors[0].find(expect), std::string::npos) << errors[0];
        EXPECT_NE(errors[0].find(path), std::string::npos) << errors[0];
        if (errors[0].find("not valid JSON") != std::string::npos) {
            EXPECT_NE(errors[0].find(" at byte "), std::string::npos) << errors[0];
        }
    }
    // A directory is not a netlist either.
    Port_MsgCapture capture;
    EXPECT_FALSE(Ndm_ReadYosysJson(dir.path().c_str(), nullptr));
    EXPECT_EQ(capture.Texts(Port_Severity::Error).size(), 1u);
}


// A large file is mapped and its pages are given back once read past: the design is whole, and
// an error found afterwards reports the offset it would in a small file.
TEST(YosysReader, LargeFileReadPastItsDroppedPages) {
    TempDir dir;
    std::string cells;
    constexpr int kCells = 400000;  // about 20 MB
    for (int i = 0; i < kCells; ++i)
        cells += (i ? ",\n" : "") + std::string("        \"cell_") + std::to_string(i) + "\": {\"type\": \"LUT4\"}";
    auto netlist = [&](const std::string& body, const char* bits) {
        return "{\"modules\": {\"top\": {\"cells\": {\n" + body + "\n}, \"netnames\": {\"n\": {\"bits\": " + bits +
               "}}}}}";
    };
    const std::string good = dir.Write("good.json", netlist(cells, "[2]"));
    Port_MsgCapture capture;
    auto design = Ndm_LoadDesign(good.c_str(), nullptr);
    ASSERT_TRUE(design);
    const Ndm_Block* top = design->GetWorkView()->GetBlock();
    ASSERT_EQ(top->GetNumBlocks(), kCells);
    EXPECT_STREQ(top->GetBlockItr()[kCells - 1]->GetName(), "cell_399999");
    EXPECT_STREQ(top->GetBlockItr()[kCells - 1]->GetTypeName(), "LUT4");

    auto offset_of_error = [&](const std::string& text) -> std::pair<size_t, size_t> {
        const std::string path = dir.Write("bad.json", text);
        capture.Clear();
        EXPECT_FALSE(Ndm_LoadDesign(path.c_str(), nullptr));
        std::vector<std::string> errors = capture.Texts(Port_Severity::Error);
        EXPECT_EQ(errors.size(), 1u);
        if (errors.empty()) return {0, 0};
        const size_t at = errors[0].rfind("at byte ");
        EXPECT_NE(at, std::string::npos) << errors[0];
        return {std::stoul(errors[0].substr(at + 8)), text.find("\"abc\"")};
    };
    const auto [small, small_abc] = offset_of_error(netlist("", "\"abc\""));
    const auto [large, large_abc] = offset_of_error(netlist(cells, "\"abc\""));
    EXPECT_EQ(large - large_abc, small - small_abc);
    // Read in pieces, the design is the same and the error is found at the same byte.
    PieceSize size(1 << 16);
    auto pieces = Ndm_LoadDesign(good.c_str(), nullptr);
    ASSERT_TRUE(pieces);
    EXPECT_EQ(DumpText(*pieces), DumpText(*design));
    const auto [piece, piece_abc] = offset_of_error(netlist(cells, "\"abc\""));
    EXPECT_EQ(piece, large);
}

// Names no object can carry (empty, cut short by a NUL, or taken twice in a module) each get an
// error naming the file, the module and the name; the whole file is read so that every one is
// listed, and the netlist is refused. Nothing in the body of a second object of a name is reported.
TEST(YosysReader, BadNamesAreEachReportedAndTheNetlistRefused) {
    TempDir dir;
    const std::string path = dir.Write("names.json", R"({"modules": {
      "top": {
        "ports": {"a": {"direction": "input", "bits": [2]}, "a": {"direction": "input", "bits": [3]},
                  "": {"direction": "input", "bits": [4]}},
        "cells": {"c": {"type": "X", "connections": {"A": [2], "A": [3]}},
                  "c": {"type": "X\u0000Z", "connections": {"B": [2], "B": [3], "C": "bad"}},
                  "e": {"type": "X"}, "e": {"type": "X"}, "f": {"type": "X"},
                  "n\u0000ul": {"type": "X"}, "t": {"type": "X\u0000Y"}},
        "netnames": {"w": {"bits": [2]}, "\\w": {"bits": [3], "offset": "bad"}, "": {"bits": [4]}}},
      "m\u0000": {}}})");
    const std::vector<std::string> expected = {
        "Module 'top' in '@' has two ports named 'a'",
        "Module 'top' in '@' has a port with an empty name",
        "Cell 'c' in module 'top' of '@' connects port 'A' twice",
        "Module 'top' in '@' has two cells named 'c'",
        "Module 'top' in '@' has two cells named 'e'",
        "Module 'top' in '@' has a cell named 'n\\u0000ul', which holds a NUL character",
        "Module 'top' in '@' has a cell type named 'X\\u0000Y', which holds a NUL character",
        "Module 'top' in '@' has two nets named 'w'",
        "Module 'top' in '@' has a net with an empty name",
        "Netlist '@' has a module named 'm\\u0000', which holds a NUL character",
    };
    for (size_t piece : kPieceSizes) {
        SCOPED_TRACE(piece);
        PieceSize size(piece);
        Port_MsgCapture capture;
        EXPECT_FALSE(Ndm_LoadDesign(path.c_str(), nullptr));
        const std::vector<std::string> errors = capture.Texts(Port_Severity::Error);
        ASSERT_EQ(errors.size(), expected.size());
        for (size_t i = 0; i < expected.size(); ++i) {
            std::string expect = expected[i];
            expect.replace(expect.find('@'), 1, path);
            EXPECT_EQ(errors[i].rfind(expect + " (at byte ", 0), 0u) << errors[i];
        }
    }
}

// A netlist read in pieces (large ones are) gives the design it gives read whole.
TEST(YosysReader, ReadingInPiecesGivesTheSameDesign) {
    TempDir dir;
    const std::string netlists[] = {
        design_test::ReadAll(LUN_SOURCE_DIR "/examples/blinky/blinky.json"), kNamesNetlist, kSharedPorts,
        lun_test::ChainNetlist(12, true, 3)};
    for (const std::string& text : netlists) {
        const std::string path = dir.Write("n.json", text);
        auto whole = Ndm_ReadYosysJson(path.c_str(), nullptr);
        ASSERT_TRUE(whole);
        for (size_t piece : kPieceSizes) {
            SCOPED_TRACE(text.substr(0, 80) + " in pieces of " + std::to_string(piece));
            PieceSize size(piece);
            auto pieces = Ndm_ReadYosysJson(path.c_str(), nullptr);
            ASSERT_TRUE(pieces);
            EXPECT_EQ(DumpText(*pieces), DumpText(*whole));
        }
    }
}

}  // namespace
