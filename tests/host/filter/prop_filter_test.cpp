#include "host/filter/prop_filter.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <tuple>

#include "host/design/ndm.h"
#include "host/port/msgman.h"
#include "support/test_support.h"

namespace {

namespace fs = std::filesystem;
using R = Ndh_PropFiltResult;

// A fresh directory per test, removed afterwards.
struct FilterDir {
    fs::path dir = fs::path(::testing::TempDir()) /
                   ("lun_filter_" + std::to_string(::getpid()) + "_" +
                    ::testing::UnitTest::GetInstance()->current_test_info()->name());
    FilterDir() { fs::remove_all(dir), fs::create_directories(dir); }
    ~FilterDir() { std::error_code ec; fs::remove_all(dir, ec); }
    std::string Write(const std::string& name, const std::string& text) const {
        std::ofstream((dir / name).string(), std::ios::binary) << text;
        return (dir / name).string();
    }
};

enum Where { NET, INST, CFG, PIN, SIG, TSPEC, DESIGN };
enum Kind { S, F, I, D };  // string, bool flag ("0" false), int32, float64 property

// A small design: an instance with a pin, a signal in a network, CONFIG and TIMESPEC blocks.
struct Objects {
    Ndm_Design design{"d"};
    Ndm_PropertyHolder* at[7];
    Objects() {
        Ndm_View* view = design.CreateView("v");
        Ndm_Block *top = view->CreateTopBlock("top"), *inst = top->CreateBlock("u1");
        Ndm_Block *cfg = top->CreateBlock("cfg"), *ts = top->CreateBlock("ts");
        cfg->CreatePropertyString("TYPE", "CONFIG");
        ts->CreatePropertyString("TYPE", "TIMESPEC");
        Ndm_Signal* sig = top->CreateSignal("clk");
        Ndm_Network* net = view->CreateNetwork();
        net->AddSignal(sig);
        at[NET] = net;
        at[INST] = inst, at[CFG] = cfg, at[PIN] = inst->CreatePin("D"), at[SIG] = sig;
        at[TSPEC] = ts, at[DESIGN] = &design;
    }
};

// Every property but TYPE, e.g. "LOC='P1' DRIVE=i8 PULLUP=T CLKDV=f2.5 TIG=[a|b]".
std::string Props(const Ndm_PropertyHolder* o) {
    std::ostringstream out;
    for (const Ndm_Property* p : o->GetPropertyItr()) {
        if (std::string(p->GetName()) == "TYPE") continue;
        out << (out.tellp() ? " " : "") << p->GetName() << '=';
        int t = p->GetType();
        if (t == NDM_PROP_BOOL) out << (p->GetBool() ? "T" : "F");
        if (t == NDM_PROP_INT32) out << 'i' << p->GetInt32();
        if (t == NDM_PROP_FLOAT64) out << 'f' << p->GetFloat64();
        if (t == NDM_PROP_STRING) out << '\'' << p->GetValueString() << '\'';
        if (t == NDM_PROP_STRING_LIST) {
            std::string sep = "[";
            for (const std::string& e : p->GetStrings()) out << sep << e, sep = "|";
            out << (sep == "[" ? "[]" : "]");
        }
    }
    return out.str();
}

// Filters one property the way the annotators do: inside a temporary list on the object.
R Run(Ndh_PropInFilter& f, Ndm_PropertyHolder* o, const char* name, Kind k, const char* v) {
    Ndm_Property* l = o->CreatePropertyList("_TempPropList");
    if (k == S) l->CreatePropertyString(name, v);
    if (k == F) l->CreatePropertyBool(name, std::string(v) != "0");
    if (k == I) l->CreatePropertyInt32(name, std::atoi(v));
    if (k == D) l->CreatePropertyFloat64(name, std::atof(v));
    R r = f.FilterProp(l, o);
    o->DeleteProperty(l);
    return r;
}

// Each "name=value" gives the verdict `flags` and leaves Props() == props (null: not checked).
struct Row { Where where; Kind kind; std::vector<std::string> props_in; unsigned flags;
             const char* props; };
constexpr unsigned OK = R::kSucceed, NAME = R::kBadPropName, TYPE = R::kBadDataType,
                   INH = R::kInhibitedFalseBool, DEL = R::kInhibitedFalseBool | R::kDeletedTrueBool;

// Rows run on fresh objects each, or (`shared`) one after another on the same objects.
void Check(Ndh_PropInFilter& f, std::initializer_list<Row> rows, Objects* shared = nullptr) {
    for (const Row& r : rows)
        for (const std::string& in : r.props_in) {
            Objects fresh;
            Ndm_PropertyHolder* o = (shared ? shared : &fresh)->at[r.where];
            SCOPED_TRACE("'" + in + "' kind " + std::to_string(r.kind));
            size_t eq = in.find('=');
            R got = Run(f, o, in.substr(0, eq).c_str(), r.kind, in.substr(eq + 1).c_str());
            EXPECT_EQ(got.GetFlags(), r.flags);
            if (r.props) {
                EXPECT_EQ(Props(o), r.props);
            }
        }
}

const char* kDefs =
    "# test definitions\n"
    "LOC        string      inst, net, sig, pin\n"
    "DRIVE      int         net,inst\n"
    "CLKDV      float       inst\n"
    "PULLUP     bool        net inst\n"
    "TIG        stringlist  net\n"
    "LOCK_PINS  flagstring  inst\n"
    "RANGE      stringlist  config\n"
    "RLOC_ORIGIN string     inst\n"
    "RLOC_ORIGIN stringlist config\n"
    "VREF_BANK* string      config\r\n"
    "INIT_[00-3F] string    inst   # comment after the fields\n";

struct FilterTest : ::testing::Test {
    FilterDir dir;
    Port_MsgCapture capture;
    std::string path = dir.Write("t.pfd", kDefs);
    Ndh_PropInFilter filter{path.c_str(), nullptr};
};

TEST_F(FilterTest, VerdictsConversionsAndStoredNames) {
    ASSERT_TRUE(filter.IsValid());
    EXPECT_TRUE(capture.messages().empty());
    Check(filter, {
        {NET, S, {"LOC=P10"}, OK, "LOC='P10'"}, {NET, S, {"loc=a9"}, OK, "LOC='a9'"},
        {NET, S, {"NOT_A_CONSTRAINT=x"}, NAME, ""},
        // Prefix and range families: the prefix as defined, the rest upper-cased.
        {CFG, S, {"vref_bank2a=0.9"}, OK, "VREF_BANK2A='0.9'"},
        {INST, S, {"init_3f=FF"}, OK, "INIT_3F='FF'"}, {INST, S, {"INIT_00=0"}, OK, "INIT_00='0'"},
        {INST, S, {"INIT_40=0", "INIT_0=0", "INIT_000=0", "INIT_0G=0"}, NAME, ""},
        {CFG, S, {"VREF_BANK=0", "VREF_BANK 1=0"}, NAME, ""},
        {NET, S, {"PULLUP=TRUE", "PULLUP=yes", "PULLUP=On", "PULLUP=1", "PULLUP= true ", "PULLUP="},
         OK, "PULLUP=T"},
        {NET, S, {"PULLUP=FALSE", "PULLUP=no", "PULLUP=off", "PULLUP=0", "PULLUP=false"}, INH, ""},
        {NET, S, {"PULLUP=maybe", "PULLUP=2", "PULLUP=truex", "DRIVE=strong", "DRIVE=2147483648",
                  "DRIVE=8mA", "DRIVE=1.5", "DRIVE=", "DRIVE=0x10"}, TYPE, ""},
        {NET, F, {"pullup=1"}, OK, "PULLUP=T"}, {NET, I, {"PULLUP=0"}, INH, ""},
        {NET, D, {"PULLUP=1"}, TYPE, ""}, {NET, F, {"DRIVE=1", "LOC=1"}, TYPE, ""},
        {NET, S, {"DRIVE=12"}, OK, "DRIVE=i12"}, {NET, I, {"DRIVE=24"}, OK, "DRIVE=i24"},
        {NET, S, {"DRIVE=-2147483648"}, OK, "DRIVE=i-2147483648"},
        {INST, S, {"CLKDV=2.5"}, OK, "CLKDV=f2.5"}, {INST, I, {"CLKDV=3"}, OK, "CLKDV=f3"},
        {INST, S, {"CLKDV=2.5ns", "CLKDV=nan", "CLKDV=inf", "CLKDV=0x1p3", "CLKDV=abc", "CLKDV="},
         TYPE, ""},
        // A number becomes text; flagstring takes a flag or text.
        {NET, I, {"LOC=7"}, OK, "LOC='7'"}, {INST, F, {"lock_pins=1"}, OK, "LOCK_PINS=T"},
        {INST, S, {"LOCK_PINS=I0:A1,I1:A2"}, OK, "LOCK_PINS='I0:A1,I1:A2'"},
        {CFG, F, {"RANGE=1"}, TYPE, ""}, {CFG, S, {"range=a = S0"}, OK, "RANGE=[a = S0]"},
        // The object kind picks the definition; kinds not allowed are refused as wrong type.
        {INST, S, {"RLOC_ORIGIN=X0Y0"}, OK, "RLOC_ORIGIN='X0Y0'"},
        {CFG, S, {"RLOC_ORIGIN=s = X0Y0"}, OK, "RLOC_ORIGIN=[s = X0Y0]"},
        {CFG, S, {"LOC=P1"}, TYPE, ""}, {INST, S, {"RANGE=x"}, TYPE, ""},
        {PIN, S, {"DRIVE=8"}, TYPE, ""}, {SIG, S, {"TIG=TS_a"}, TYPE, ""},
        {TSPEC, S, {"LOC=P1"}, TYPE, ""}, {DESIGN, S, {"LOC=P1"}, TYPE, ""},
        {PIN, S, {"LOC=P1"}, OK, "LOC='P1'"}, {SIG, S, {"LOC=P1"}, OK, "LOC='P1'"},
    });
    EXPECT_EQ(filter.CanonicalName("Init_0a"), "INIT_0A");
}

TEST_F(FilterTest, RepeatedValuesReplaceAppendOrDelete) {
    Objects o;
    o.at[NET]->CreatePropertyStringList("TIG")->AddString("");  // written around the filter
    o.at[INST]->CreatePropertyString("RLOC_ORIGIN", "old");
    o.at[CFG]->CreatePropertyString("RLOC_ORIGIN", "set0 = X0Y0");
    Check(filter, {
        {NET, S, {"LOC=a9"}, OK, "TIG=[] LOC='a9'"}, {NET, S, {"Loc=B9"}, OK, "TIG=[] LOC='B9'"},
        {NET, S, {"tig=TS_a"}, OK, "TIG=[|TS_a] LOC='B9'"},
        {NET, F, {"PULLUP=1"}, OK, "TIG=[|TS_a] LOC='B9' PULLUP=T"},
        {NET, F, {"PULLUP=0"}, DEL, "TIG=[|TS_a] LOC='B9'"},
        {NET, S, {"PULLUP=false"}, INH, "TIG=[|TS_a] LOC='B9'"},
        {INST, F, {"LOCK_PINS=1"}, OK, "RLOC_ORIGIN='old' LOCK_PINS=T"},
        {INST, S, {"LOCK_PINS=I0:A1"}, OK, "RLOC_ORIGIN='old' LOCK_PINS='I0:A1'"},
        {INST, F, {"LOCK_PINS=0"}, DEL, "RLOC_ORIGIN='old'"},
        {CFG, S, {"RANGE=ag1 = S0:S7", "range=ag2 = S8:S9", "RANGE=ag1 = S0:S7"}, OK, nullptr},
        {CFG, S, {"RLOC_ORIGIN=set1 = X1Y1"}, OK,
         "RLOC_ORIGIN=[set0 = X0Y0|set1 = X1Y1] RANGE=[ag1 = S0:S7|ag2 = S8:S9|ag1 = S0:S7]"},
    }, &o);
}

TEST_F(FilterTest, MalformedCallsSetNoFlag) {
    Objects o;
    Ndm_PropertyHolder* net = o.at[NET];
    EXPECT_EQ(filter.FilterProp(nullptr, net).GetFlags(), 0u);
    Ndm_Property* list = net->CreatePropertyList("_TempPropList");
    EXPECT_EQ(filter.FilterProp(list, net).GetFlags(), 0u);  // empty list
    list->CreatePropertyString("LOC", "P1");
    EXPECT_EQ(filter.FilterProp(list, nullptr).GetFlags(), 0u);
    list->CreatePropertyString("LOC", "P2");
    EXPECT_EQ(filter.FilterProp(list, net).GetFlags(), 0u);  // two entries
    EXPECT_EQ(net->GetPropertyByName("LOC"), nullptr);
}

TEST(FilterDefinitions, BadFilesNameFileAndLine) {
    FilterDir dir;
    const std::tuple<const char*, int, const char*> cases[] = {  // text, line, part of message
        {"LOC string net\nIOSTANDARD strng net\n", 2, "unknown type word 'strng'."},
        {"# c\n\nLOC string net, wire\n", 3, "unknown object kind 'wire'."},
        {"LOC string net\nloc string inst, net\n", 2, "duplicate definition of 'loc'"},
        {"INIT_[00-3F] string inst\nINIT_[20-7F] string inst\n", 2, "duplicate definition"},
        {"I_[00-0F] string inst\nI_[10-1F] string inst\nI_[08-18] string net, inst\n", 3, "(first on line 1)."},
        {"A* string net\nB* string net\na* int pin, net\n", 3, "duplicate definition of 'a*'"},
        {"LOC string\n", 1, "expected a name, a type word and at least one object kind."},
        {"LO-C string net\n", 1, "invalid character"},
        {"INIT_[3F-00] string inst\n", 1, "reversed range"},
        {"INIT_[0-FF] string inst\n", 1, "equal width"},
        {"INIT_[00-3F string inst\n", 1, "malformed range"},
        {"* string inst\n", 1, "prefix name needs text"},
    };
    int n = 0;
    for (const auto& [text, line, expect] : cases) {
        std::string path = dir.Write("bad" + std::to_string(n++) + ".pfd", text);
        Port_MsgCapture capture;
        Ndh_PropInFilter filter(path.c_str(), nullptr);
        EXPECT_FALSE(filter.IsValid()) << text;
        std::string head = "Property definition file '" + path + "' line " + std::to_string(line);
        EXPECT_EQ(filter.GetError().rfind(head + ": ", 0), 0u) << filter.GetError();
        EXPECT_NE(filter.GetError().find(expect), std::string::npos) << filter.GetError();
        ASSERT_EQ(capture.messages().size(), 1u) << text;
        EXPECT_EQ(capture.Texts(Port_Severity::Error), std::vector{filter.GetError()});
        EXPECT_EQ(capture.messages()[0].module + capture.messages()[0].program, "filterQuillmap");
    }
    // Disjoint kinds for one name and non-overlapping ranges are fine.
    std::string ok = dir.Write(
        "ok.pfd", "X string inst\nx stringlist config\nI_[00-0F] string inst\nI_[10-1F] int inst\n"
                  "I_[08-18] string net\nI_[0-F] string inst\nX* string inst\n");
    Port_MsgCapture capture;
    EXPECT_TRUE(Ndh_PropInFilter(ok.c_str(), nullptr).IsValid());
    EXPECT_TRUE(capture.messages().empty());
}

// Each definition is checked against the earlier ones of its name only: a file of 200,000
// definitions loads in a moment (it took minutes when each was compared with every other).
TEST(FilterDefinitions, LargeFilesLoadInLinearTime) {
    FilterDir dir;
    std::string text;
    char range[32];
    for (int i = 0; i < 100000; ++i) {
        std::snprintf(range, sizeof range, "R_[%05X-%05X]", i, i);
        text += "NAME_" + std::to_string(i) + " string inst\n" + range + " string net\n";
    }
    const std::string path = dir.Write("large.pfd", text);
    const auto start = std::chrono::steady_clock::now();
    Ndh_PropInFilter filter(path.c_str(), nullptr);
    EXPECT_TRUE(filter.IsValid()) << filter.GetError();
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(10));
    EXPECT_EQ(filter.CanonicalName("r_0abcd"), "R_0ABCD");
}

TEST(FilterDefinitions, MissingFileRefusesEveryName) {
    Port_MsgCapture capture;
    Ndh_PropInFilter filter((FilterDir().dir / "missing.pfd").c_str(), nullptr);
    EXPECT_FALSE(filter.IsValid());
    EXPECT_NE(filter.GetError().find("missing.pfd"), std::string::npos);
    EXPECT_EQ(capture.Texts(Port_Severity::Error).size(), 1u);
    Check(filter, {{NET, S, {"LOC=P1"}, NAME, ""}});
    EXPECT_EQ(filter.CanonicalName("LOC"), "");
}

TEST(FilterDefinitions, BareNamesResolveThroughDataDirAndParseOnce) {
    FilterDir dir;
    dir.Write("mine.pfd", "ONLY_HERE string net\n");
    Port_MsgCapture capture;
    {
        lun_test::ScopedEnv env("LUN_DATA_DIR", dir.dir.c_str());
        EXPECT_EQ(Ndh_PropInFilter("mine.pfd", nullptr).CanonicalName("only_here"), "ONLY_HERE");
        // The environment directory replaces the shipped folder.
        EXPECT_NE(Ndh_PropInFilter("ucf.pfd", nullptr).GetError().find(dir.dir.string()),
                  std::string::npos);
    }
    {
        // Without it, the data folder beside the library's folder: in the build tree, the copy
        // made there, not the sources.
        lun_test::ScopedEnv env("LUN_DATA_DIR", nullptr);
        Ndh_PropInFilter shipped("ucf.pfd", nullptr);
        ASSERT_TRUE(shipped.IsValid()) << shipped.GetError();
        EXPECT_TRUE(fs::equivalent(shipped.GetPath(), fs::path(LUN_BUILD_DATA_DIR) / "ucf.pfd"))
            << shipped.GetPath();
    }

    // A file changed after its first use is not read again.
    std::string path = dir.Write("once.pfd", "FIRST string net\n");
    ASSERT_TRUE(Ndh_PropInFilter(path.c_str(), nullptr).IsValid());
    dir.Write("once.pfd", "SECOND string net\n");
    EXPECT_EQ(Ndh_PropInFilter(path.c_str(), nullptr).CanonicalName("FIRST"), "FIRST");
    EXPECT_EQ(Ndh_PropInFilter(path.c_str(), nullptr).CanonicalName("SECOND"), "");
    // Until the definitions read are forgotten.
    Ndh_PropInFilter::ForgetReadDefinitions();
    EXPECT_EQ(Ndh_PropInFilter(path.c_str(), nullptr).CanonicalName("SECOND"), "SECOND");
}

struct ShippedFilter : ::testing::TestWithParam<const char*> {};

TEST_P(ShippedFilter, LoadsCleanlyAndKnowsTheVocabulary) {
    Port_MsgCapture capture;
    Ndh_PropInFilter filter((std::string(LUN_SOURCE_DIR) + "/data/" + GetParam()).c_str(), nullptr);
    ASSERT_TRUE(filter.IsValid()) << filter.GetError();
    EXPECT_TRUE(capture.messages().empty());
    std::istringstream keys(
        "LOC IOSTANDARD SLEW DRIVE PULLUP KEEP TNM TNM_NET PERIOD OFFSET MAXDELAY MAXSKEW TIG "
        "CLOCK_DEDICATED_ROUTE DIFF_TERM RLOC RLOC_ORIGIN U_SET HU_SET BEL AREA_GROUP PART VCCAUX "
        "PROHIBIT VREF DCI_CASCADE INTERNAL_VREF_BANK0 INTERNAL_VREF_BANK12 SYSTEM_JITTER IOB "
        "RLOC_RANGE LOCK_PINS S KEEP_HIERARCHY CLKDV_DIVIDE FEEDBACK PHASE_SHIFT INIT INIT_00 "
        "INIT_7F INITP_00 INITP_0F INIT_A SRVAL VOLTAGE TEMPERATURE RANGE COMPRESSION PLACE MODE");
    for (std::string key; keys >> key;) {
        std::string lower;
        for (char c : key) lower += static_cast<char>(std::tolower(c));
        EXPECT_EQ(filter.CanonicalName(key.c_str()), key);
        EXPECT_EQ(filter.CanonicalName(lower.c_str()), key) << lower;
    }
    for (const char* key : {"FROM_UCF", "FROM_NCF", "_TempPropList", "INIT_80", "INITP_10"})
        EXPECT_EQ(filter.CanonicalName(key), "") << key;

    Check(filter, {
        {NET, S, {"loc=P1,P2,P3", "PERIOD=10000.000000 pS HIGH 50.000000 %"}, OK, nullptr},
        {INST, S, {"LOC=SITE_X0Y58", "INIT_3F=0F0F", "CLKDV_DIVIDE=2.5"}, OK, nullptr},
        {CFG, S, {"VCCAUX=3.3", "PROHIBIT=P1, L3"}, OK, nullptr}, {CFG, S, {"LOC=P1"}, TYPE, ""},
        {NET, S, {"DRIVE=8"}, OK, "DRIVE=i8"}, {NET, F, {"pullup=1"}, OK, "PULLUP=T"},
        {NET, F, {"KEEP=1"}, OK, nullptr},
        // FALSE is the meaningful value here: kept as text, not dropped as a false flag.
        {NET, S, {"CLOCK_DEDICATED_ROUTE=FALSE"}, OK, "CLOCK_DEDICATED_ROUTE='FALSE'"},
        {CFG, S, {"internal_vref_bank0=0.75"}, OK, "INTERNAL_VREF_BANK0='0.75'"},
        {CFG, S, {"RLOC_RANGE=set1 = X0Y0:X3Y3"}, OK, "RLOC_RANGE='set1 = X0Y0:X3Y3'"},
    });
    Objects o;
    Check(filter, {{NET, S, {"TIG=TS_a", "TIG=TS_b"}, OK, nullptr},
                   {CFG, S, {"PLACE=ag1 = CLOSED", "PLACE=ag2 = OPEN"}, OK, nullptr}}, &o);
    EXPECT_EQ(Props(o.at[NET]) + " " + Props(o.at[CFG]), "TIG=[TS_a|TS_b] PLACE=[ag1 = CLOSED|ag2 = OPEN]");
}

INSTANTIATE_TEST_SUITE_P(Files, ShippedFilter, ::testing::Values("ucf.pfd", "ucf.prp"),
                         [](const auto& info) { return std::string(info.param).replace(3, 1, "_"); });

}  // namespace
