// The native design file: lossless round trips, detection by content, damaged files; and the
// text dump.
#include <gtest/gtest.h>
#include <simdjson.h>

#include <cmath>
#include <cstring>
#include <limits>

#include "design_test_util.h"
#include "host/design/design_io.h"
#include "host/design/native_format.h"
#include "host/port/msgman.h"

namespace {

using design_test::DumpText;
using design_test::kPieceSizes;
using design_test::PieceSize;
using design_test::ReadAll;
using design_test::TempDir;

// Every byte but NUL, then a real U+F7E9 (which stands for a byte in the file) and a euro sign.
std::string AllBytes() {
    std::string text;
    for (int b = 1; b < 256; ++b) text += static_cast<char>(b);
    return text + "\xef\x9f\xa9\xe2\x82\xac";
}

// A design using every kind of object and property, with awkward names and values.
std::unique_ptr<Ndm_Design> Sample() {
    auto d = std::make_unique<Ndm_Design>("chip \"A\"");
    d->CreatePropertyString("tool", "line1\nline2\t\\ \x01 caf\xc3\xa9");
    d->CreatePropertyBool("flag", false);
    Ndm_View* v = d->CreateView("EXPANDED");
    v->CreatePropertyInt32("min", std::numeric_limits<int32_t>::min());
    d->CreateView("EMPTY");
    Ndm_Block* top = v->CreateTopBlock("top");
    top->SetTypeName("top");
    Ndm_Block* a = top->CreateBlock("a/b");  // names may hold the separators
    a->SetTypeName("LUT4");
    Ndm_Block* b = a->CreateBlock("inner");
    Ndm_Signal* s0 = top->CreateSignal("clk");
    Ndm_Signal* s1 = a->CreateSignal("n[0]");
    Ndm_Signal* s2 = b->CreateSignal("clk");
    Ndm_Signal* lonely = b->CreateSignal("lonely");
    top->CreatePin("clk", Ndm_Dir::Input)->SetSignal(s0);
    a->CreatePin("I0", Ndm_Dir::Input)->SetSignal(s0);
    a->CreatePin("O", Ndm_Dir::Output);
    a->CreatePin("IO", Ndm_Dir::Inout)->SetSignal(s2);  // points down the file
    b->CreatePin("x")->SetSignal(s1);
    Ndm_Network* n = v->CreateNetwork();
    n->AddSignal(s2);
    n->AddSignal(s0);
    n->AddSignal(s1);
    v->CreateNetwork()->CreatePropertyString("note", "empty network");
    lonely->CreatePropertyFloat64("third", 1.0 / 3.0);
    Ndm_Property* list = a->CreatePropertyList("TIMING");
    list->CreatePropertyString("OFFSET", "IN 2 ns");
    list->CreatePropertyString("OFFSET", "OUT 3 ns");
    Ndm_Property* nested = list->CreatePropertyList("nested");
    nested->CreatePropertyFloat64("neg0", -0.0);
    nested->CreatePropertyFloat64("tiny", 4.9406564584124654e-324);
    nested->CreatePropertyFloat64("inf", -HUGE_VAL);
    nested->CreatePropertyFloat64("nan", std::nan(""));
    nested->CreatePropertyBool("yes");
    Ndm_Property* texts = s1->CreatePropertyStringList("aliases");
    texts->AddString("");
    texts->AddString("b\"q");
    a->GetPinByName("O")->CreatePropertyInt32("slack", -7);
    n->CreatePropertyFloat64("period", 2.5e-9);
    // Constraint files are bytes: Latin-1 names and values must come back exactly.
    Ndm_Block* latin = top->CreateBlock("r\xe9g\xff");
    latin->CreateSignal(AllBytes().c_str());
    latin->CreatePropertyString(("LOC\xe9" + AllBytes()).c_str(), AllBytes().c_str());
    latin->CreatePropertyStringList("TNM")->AddString(AllBytes().c_str());
    // More blocks and pins than a reader keeps waiting for their names and signals.
    Ndm_Block* bus = top->CreateBlock("bus");
    for (int i = 0; i < 20; ++i) {
        Ndm_Block* bit = bus->CreateBlock(("bit" + std::to_string(i)).c_str());
        bit->CreatePin("D", Ndm_Dir::Input)->SetSignal(i % 2 ? s0 : s1);
        bit->CreatePin("Q", Ndm_Dir::Output)->SetSignal(s2);
    }
    return d;
}

TEST(NativeDesignFile, RoundTripIsLosslessAndByteStable) {
    TempDir dir;
    auto design = Sample();
    std::string first = dir.File("a.lun"), second = dir.File("b.lun");
    ASSERT_TRUE(Ndm_WriteNative(*design, first.c_str()));
    for (size_t piece : kPieceSizes) {
        SCOPED_TRACE(piece);
        PieceSize size(piece);
        auto pieces = Ndm_ReadNative(first.c_str());
        ASSERT_TRUE(pieces);
        ASSERT_TRUE(Ndm_WriteNative(*pieces, second.c_str()));
        EXPECT_EQ(ReadAll(first), ReadAll(second));
    }
    auto again = Ndm_ReadNative(first.c_str());
    ASSERT_TRUE(again);
    EXPECT_TRUE(simdjson::validate_utf8(ReadAll(first)));
    EXPECT_EQ(DumpText(*design), DumpText(*again));
    Ndm_Block* latin = again->GetViewByName("EXPANDED")->GetBlock()->GetBlockByName("r\xe9g\xff");
    ASSERT_NE(latin, nullptr);
    EXPECT_NE(latin->GetSignalByName(AllBytes().c_str()), nullptr);
    ASSERT_NE(latin->GetPropertyByName(("LOC\xe9" + AllBytes()).c_str()), nullptr);
    EXPECT_EQ(latin->GetPropertyByName(("LOC\xe9" + AllBytes()).c_str())->GetValueString(), AllBytes());
    EXPECT_EQ(latin->GetPropertyByName("TNM")->GetStrings().at(0), AllBytes());

    // The dump shows every object, link and value (floats to 17 digits); these read the values
    // it can only print as text.
    Ndm_Block* a = again->GetViewByName("EXPANDED")->GetBlock()->GetBlockByName("a/b");
    Ndm_Property* nested = a->GetPropertyByName("TIMING")->GetEntryByName("nested");
    EXPECT_TRUE(std::signbit(nested->GetEntryByName("neg0")->GetFloat64()));
    EXPECT_EQ(nested->GetEntryByName("tiny")->GetFloat64(), 4.9406564584124654e-324);
    EXPECT_EQ(nested->GetEntryByName("inf")->GetFloat64(), -HUGE_VAL);
    EXPECT_TRUE(std::isnan(nested->GetEntryByName("nan")->GetFloat64()));
    EXPECT_EQ(a->GetBlockByName("inner")->GetSignalByName("lonely")->GetPropertyByName("third")->GetFloat64(), 1.0 / 3.0);

    // Loading by content picks the native reader; a stated top must match.
    Port_MsgCapture capture;
    EXPECT_TRUE(Ndm_LoadDesign(first.c_str(), nullptr));
    EXPECT_FALSE(Ndm_LoadDesign(first.c_str(), "other"));
    ASSERT_EQ(capture.Texts(Port_Severity::Error).size(), 1u);
    EXPECT_NE(capture.Texts(Port_Severity::Error)[0].find(first), std::string::npos);
}

TEST(NativeDesignFile, DeletedSubtreesLeaveNoDanglingReferences) {
    TempDir dir;
    auto design = Sample();
    Ndm_Block* top = design->GetViewByName("EXPANDED")->GetBlock();
    Ndm_Block* a = top->GetBlockByName("a/b");
    ASSERT_TRUE(a->DeleteBlock(a->GetBlockByName("inner")));  // a.IO now names a deleted signal
    std::string path = dir.File("d.lun");
    ASSERT_TRUE(Ndm_WriteNative(*design, path.c_str()));
    auto again = Ndm_ReadNative(path.c_str());
    ASSERT_TRUE(again);
    Ndm_Block* a2 = again->GetViewByName("EXPANDED")->GetBlock()->GetBlockByName("a/b");
    EXPECT_EQ(a2->GetPinByName("IO")->GetSignal(), nullptr);
    EXPECT_EQ(a2->GetNumBlocks(), 0);
    EXPECT_STREQ(again->GetViewByName("EXPANDED")->GetNetworkItr()[0]->GetName(), "clk");
}

TEST(NativeDesignFile, DamagedFilesGiveOneClearError) {
    TempDir dir;
    struct Case {
        const char* name;
        const char* text;
        const char* expect;
        const char* or_expect = nullptr;  // what a reading in pieces may say instead
    };
    const Case cases[] = {
        {"version.lun", R"({"format":"lun-design","version":9})", "has version 9"},
        {"marker.lun", R"({"format":"other"})", "\"format\" must be \"lun-design\""},
        {"signal.lun",
         R"({"format":"lun-design","version":1,"views":[{"name":"V","top":{"name":"t","pins":[{"name":"p","signal":3}]}}]})",
         "a pin names signal 3, but the file has 0 signals"},
        {"network.lun",
         R"({"format":"lun-design","version":1,"views":[{"name":"V","networks":[{"signals":[0]}]}]})",
         "a network names unknown signal 0"},
        {"twice.lun",
         R"({"format":"lun-design","version":1,"views":[{"name":"V","top":{"name":"t","signals":[{"name":"s"}]},"networks":[{"signals":[0]},{"signals":[0]}]}]})",
         "signal 0 is in two networks"},
        {"proptype.lun",
         R"({"format":"lun-design","version":1,"properties":[{"name":"x","type":"int64","value":1}]})",
         "unknown property type 'int64'"},
        {"range.lun",
         R"({"format":"lun-design","version":1,"properties":[{"name":"x","type":"int32","value":4294967296}]})",
         "int32 property is out of range"},
        {"noname.lun", R"({"format":"lun-design","version":1,"views":[{"name":"V","top":{"type":"x"}}]})",
         "a block must start with its \"name\""},
        {"cut.lun", R"({"format":"lun-design","version":1,"views":[{"name":"V","top":{"name":"t")",
         "is not valid JSON"},
        {"nul.lun", R"({"format":"lun-design","version":1,"views":[{"name":"V","top":{"name":"t\u0000x"}}]})",
         "block \"name\" holds a NUL character"},
        {"shortpin.lun", R"({"format":"lun-design","version":2,"views":[{"name":"V","top":{"name":"t","pins":[["p"]]}}]})",
         "a pin array holds a name, a direction and a signal number"},
        {"longpin.lun",
         R"({"format":"lun-design","version":2,"views":[{"name":"V","top":{"name":"t","pins":[["p","",0,1]]}}]})",
         "a pin array holds a name, a direction and a signal number"},
        {"pindir.lun",
         R"({"format":"lun-design","version":2,"views":[{"name":"V","top":{"name":"t","pins":[["p","sideways"]]}}]})",
         "a pin direction must be"},
        {"signum.lun", R"({"format":"lun-design","version":2,"views":[{"name":"V","top":{"name":"t","signals":[7]}}]})",
         "a signal must be a name or an object"},
        {"nullist.lun",
         R"({"format":"lun-design","version":1,"properties":[{"name":"l","type":"list","value":[{"name":"s","type":"string","value":"a\u0000"}]}]})",
         "string property holds a NUL character"},
        // Separators a reading in pieces checks itself.
        {"comma.lun", R"({"format":"lun-design","version":1,"views":[{"name":"V","top":{"name":"t"}},]})",
         "a view must be an object", "is not valid JSON"},
        {"lead.lun", R"({"format":"lun-design","version":1,"views":[ ,{"name":"V"}]})", "a view must be an object",
         "is not valid JSON"},
        {"colon.lun", R"({"format":"lun-design","version":1,"views":[{"name":"V","top" {"name":"t"}}]})",
         "is not valid JSON"},
        {"after.lun", R"({"format":"lun-design","version":1,"views":[{"name":"V","top":{"name":"t"} "x":1}]})",
         "is not valid JSON"},
        {"topless.lun", R"({"format":"lun-design","version":1,"views":[{"top":{"name":"t"},"name":"V"}]})",
         "a view must start with its \"name\""},
        {"nameless.lun", R"({"format":"lun-design","version":1,"views":[{"name":"V","top":{"blocks":[{"name":"u"}]}}]})",
         "a block must start with its \"name\""},
        {"views.lun", R"({"format":"lun-design","version":1,"views":{"name":"V"}})", "\"views\" must be an array"},
        {"unmarked.lun", R"({"version":1,"format":"lun-design"})", "does not start with the"},
    };
    for (size_t piece : kPieceSizes) {
        PieceSize size(piece);
        for (const Case& c : cases) {
            SCOPED_TRACE(std::string(c.name) + " in pieces of " + std::to_string(piece));
            std::string path = dir.Write(c.name, c.text);
            Port_MsgCapture capture;
            EXPECT_FALSE(Ndm_ReadNative(path.c_str()));
            std::vector<std::string> errors = capture.Texts(Port_Severity::Error);
            ASSERT_EQ(errors.size(), 1u);
            EXPECT_TRUE(errors[0].find(c.expect) != std::string::npos ||
                        (piece && c.or_expect && errors[0].find(c.or_expect) != std::string::npos))
                << errors[0];
            EXPECT_NE(errors[0].find(path), std::string::npos) << errors[0];
        }
    }
    // Writing into a missing directory fails with the path named.
    Port_MsgCapture capture;
    auto design = Sample();
    std::string bad = dir.File("no/such/dir/x.lun");
    EXPECT_FALSE(Ndm_WriteNative(*design, bad.c_str()));
    ASSERT_EQ(capture.Texts(Port_Severity::Error).size(), 1u);
    EXPECT_NE(capture.Texts(Port_Severity::Error)[0].find(bad), std::string::npos);
}

// Files of earlier writers name their networks; the name is found again from the signals.
TEST(NativeDesignFile, NetworkNamesOfEarlierFilesAreNotNeeded) {
    TempDir dir;
    const std::string path = dir.Write("old.lun", R"({"format":"lun-design","version":1,"name":"top","views":[
{"name":"EXPANDED","top":{"name":"top","signals":[{"name":"clk"}],"blocks":[{"name":"u","signals":[{"name":"c"}]}]},
"networks":[{"name":"stale","signals":[1,0]}]}]})");
    auto design = Ndm_ReadNative(path.c_str());
    ASSERT_TRUE(design);
    EXPECT_STREQ(design->GetWorkView()->GetNetworkItr()[0]->GetName(), "clk");
    ASSERT_TRUE(Ndm_WriteNative(*design, path.c_str()));
    EXPECT_NE(ReadAll(path).find("\n{\"signals\":[1,0]}]}]}"), std::string::npos) << ReadAll(path);
}

// Signals and pins without properties take their short forms: a name, and [name, direction,
// signal]; the others keep the object form, on lines of their own. Such a file reads back and
// writes the same bytes again.
TEST(NativeDesignFile, ShortFormsReadBackExactly) {
    TempDir dir;
    const std::string text = R"({"format":"lun-design","version":2,"name":"top","views":[
{"name":"EXPANDED","top":
{"name":"top","type":"top","signals":["a",
{"name":"b","properties":[{"name":"LOC","type":"string","value":"P1"}]}],"pins":[["a","input",0],
{"name":"b","dir":"output","signal":1,"properties":[{"name":"TIG","type":"bool","value":true}]},["c",""],["d","inout",2]],"blocks":[
{"name":"u","signals":["n"]}]},"networks":[
{"signals":[0]},
{"signals":[1]},
{"signals":[2]}]}]}
)";
    const std::string path = dir.Write("short.lun", text);
    for (size_t piece : kPieceSizes) {
        SCOPED_TRACE(piece);
        PieceSize size(piece);
        auto pieces = Ndm_ReadNative(path.c_str());
        ASSERT_TRUE(pieces);
        const std::string back = dir.File("back.lun");
        ASSERT_TRUE(Ndm_WriteNative(*pieces, back.c_str()));
        EXPECT_EQ(ReadAll(back), text);
    }
    auto design = Ndm_ReadNative(path.c_str());
    ASSERT_TRUE(design);
    const Ndm_Block* top = design->GetWorkView()->GetBlock();
    ASSERT_EQ(top->GetNumPins(), 4);
    EXPECT_EQ(top->GetPinByName("c")->GetDirection(), Ndm_Dir::None);
    EXPECT_EQ(top->GetPinByName("c")->GetSignal(), nullptr);
    EXPECT_EQ(top->GetPinByName("d")->GetSignal()->GetFullName(), "u/n");  // named before it is read
    EXPECT_TRUE(top->GetPinByName("b")->GetPropertyByName("TIG")->GetBool());
    const std::string again = dir.File("again.lun");
    ASSERT_TRUE(Ndm_WriteNative(*design, again.c_str()));
    EXPECT_EQ(ReadAll(again), text);
}

TEST(NativeDesignFile, MarkerDetection) {
    auto is = [](const char* text) { return Ndm_IsNativeText(text, std::strlen(text)); };
    EXPECT_TRUE(is("{\"format\":\"lun-design\",\"version\":1}"));
    EXPECT_TRUE(is("\xEF\xBB\xBF \n{ \"format\" : \"lun-design\""));
    EXPECT_FALSE(is("{\"creator\":\"Yosys\",\"format\":\"lun-design\"}"));
    EXPECT_FALSE(is("{\"format\":\"other\"}"));
    EXPECT_FALSE(is(""));
}

TEST(DesignDump, OneLinePerObjectWithFullNames) {
    auto design = Sample();
    std::string text = DumpText(*design);
    EXPECT_EQ(text.substr(0, text.find("view ")),
              "design \"chip \\\"A\\\"\"\n"
              "  % \"tool\" string \"line1\\nline2\\t\\\\ \\u0001 caf\xc3\xa9\"\n"
              "  % \"flag\" bool false\n");
    for (const char* line : {
             "view \"EXPANDED\"\n  % \"min\" int32 -2147483648\n  block \"top\" type \"top\"\n",
             "    signal \"clk\"\n    pin \"clk\" input -> \"clk\"\n    block \"a/b\" type \"LUT4\"\n",
             "      % \"TIMING\" list 3\n        % \"OFFSET\" string \"IN 2 ns\"\n        % \"OFFSET\" string \"OUT 3 ns\"\n",
             "          % \"neg0\" float64 -0\n",
             "      signal \"a/b/n[0]\"\n        % \"aliases\" string_list [\"\", \"b\\\"q\"]\n",
             "      pin \"a/b.O\" output\n        % \"slack\" int32 -7\n",
             "        pin \"a/b/inner.x\" none -> \"a/b/n[0]\"\n",
             "  network \"clk\" signals 3\n    % \"period\" float64 2.5000000000000001e-09\n"
             "    signal \"a/b/inner/clk\"\n    signal \"clk\"\n    signal \"a/b/n[0]\"\n",
             "  network \"\" signals 0\n    % \"note\" string \"empty network\"\nview \"EMPTY\"\n"}) {
        EXPECT_NE(text.find(line), std::string::npos) << line << "\n--- in ---\n" << text;
    }
}

}  // namespace
