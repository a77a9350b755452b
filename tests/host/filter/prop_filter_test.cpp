#include "host/filter/prop_filter.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <functional>
#include <string>
#include <vector>

#include "host/design/ndm.h"
#include "host/port/msgman.h"

namespace {

namespace fs = std::filesystem;

// A fresh directory per test, removed afterwards.
class FilterDir {
public:
    FilterDir() {
        const auto* info = ::testing::UnitTest::GetInstance()->current_test_info();
        dir_ = fs::path(::testing::TempDir()) /
               ("lun_filter_" + std::to_string(::getpid()) + "_" + info->test_suite_name() + "_" +
                info->name());
        fs::remove_all(dir_);
        fs::create_directories(dir_);
    }
    ~FilterDir() {
        std::error_code ec;
        fs::remove_all(dir_, ec);
    }
    std::string Write(const std::string& name, const std::string& text) const {
        std::string path = (dir_ / name).string();
        std::ofstream(path, std::ios::binary) << text;
        return path;
    }
    std::string path() const { return dir_.string(); }

private:
    fs::path dir_;
};

// A small design: an instance with a pin, a signal in a network, a CONFIG block.
struct Objects {
    Ndm_Design design{"d"};
    Ndm_Block* top;
    Ndm_Block* inst;
    Ndm_Block* config;
    Ndm_Pin* pin;
    Ndm_Signal* sig;
    Ndm_Network* net;
    Objects() {
        Ndm_View* view = design.CreateView("v");
        top = view->CreateTopBlock("top");
        inst = top->CreateBlock("u1");
        pin = inst->CreatePin("D");
        config = top->CreateBlock("cfg");
        config->CreatePropertyString("TYPE", "CONFIG");
        sig = top->CreateSignal("clk");
        net = view->CreateNetwork();
        net->AddSignal(sig);
    }
};

// Filters one property the way the annotators do: inside a temporary list on the object.
Ndh_PropFiltResult Filter(Ndh_PropInFilter& filter, Ndm_PropertyHolder* object,
                       const std::function<void(Ndm_Property*)>& make) {
    Ndm_Property* list = object->CreatePropertyList("_TempPropList");
    make(list);
    Ndh_PropFiltResult r = filter.FilterProp(list, object);
    object->DeleteProperty(list);
    return r;
}
Ndh_PropFiltResult RunStr(Ndh_PropInFilter& f, Ndm_PropertyHolder* o, const char* n, const char* v) {
    return Filter(f, o, [&](Ndm_Property* l) { l->CreatePropertyString(n, v); });
}
Ndh_PropFiltResult RunFlag(Ndh_PropInFilter& f, Ndm_PropertyHolder* o, const char* n, bool v = true) {
    return Filter(f, o, [&](Ndm_Property* l) { l->CreatePropertyBool(n, v); });
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

class FilterTest : public ::testing::Test {
protected:
    FilterDir dir;
    Objects obj;
    Port_MsgCapture capture;
    std::string path = dir.Write("t.pfd", kDefs);
    Ndh_PropInFilter filter{path.c_str(), nullptr};
};

TEST_F(FilterTest, FiveVerdicts) {
    ASSERT_TRUE(filter.IsValid());
    EXPECT_TRUE(capture.messages().empty());
    auto ok = RunStr(filter, obj.net, "LOC", "P10");
    EXPECT_TRUE(ok.Succeed());
    EXPECT_EQ(ok.GetFlags(), unsigned(Ndh_PropFiltResult::kSucceed));
    EXPECT_STREQ(Ndh_PropUtil::GetStringProp(obj.net, "LOC"), "P10");

    auto bad_name = RunStr(filter, obj.net, "NOT_A_CONSTRAINT", "x");
    EXPECT_TRUE(bad_name.BadPropName());
    EXPECT_FALSE(bad_name.Succeed());
    EXPECT_EQ(obj.net->GetPropertyByName("NOT_A_CONSTRAINT"), nullptr);

    auto bad_type = RunStr(filter, obj.net, "DRIVE", "strong");
    EXPECT_TRUE(bad_type.BadDataType());
    EXPECT_FALSE(bad_type.Succeed());
    EXPECT_EQ(obj.net->GetPropertyByName("DRIVE"), nullptr);

    // False boolean with nothing to remove, then after a true one.
    auto inhibited = RunStr(filter, obj.net, "PULLUP", "false");
    EXPECT_TRUE(inhibited.InhibitedFalseBool());
    EXPECT_FALSE(inhibited.DeletedTrueBool());
    EXPECT_FALSE(inhibited.Succeed());
    ASSERT_TRUE(RunFlag(filter, obj.net, "PULLUP").Succeed());
    EXPECT_TRUE(obj.net->GetPropertyByName("PULLUP")->GetBool());
    auto deleted = RunFlag(filter, obj.net, "PULLUP", false);
    EXPECT_TRUE(deleted.InhibitedFalseBool());
    EXPECT_TRUE(deleted.DeletedTrueBool());
    EXPECT_EQ(obj.net->GetPropertyByName("PULLUP"), nullptr);
}

TEST_F(FilterTest, MalformedCallsSetNoFlag) {
    EXPECT_EQ(filter.FilterProp(nullptr, obj.net).GetFlags(), 0u);
    Ndm_Property* list = obj.net->CreatePropertyList("_TempPropList");
    EXPECT_EQ(filter.FilterProp(list, obj.net).GetFlags(), 0u);  // empty list
    list->CreatePropertyString("LOC", "P1");
    EXPECT_EQ(filter.FilterProp(list, nullptr).GetFlags(), 0u);
    list->CreatePropertyString("LOC", "P2");
    EXPECT_EQ(filter.FilterProp(list, obj.net).GetFlags(), 0u);  // two entries
    EXPECT_EQ(obj.net->GetPropertyByName("LOC"), nullptr);
}

TEST_F(FilterTest, NamesIgnoreCaseAndAreStoredCanonically) {
    EXPECT_TRUE(RunStr(filter, obj.net, "loc", "a9").Succeed());
    EXPECT_EQ(obj.net->GetPropertyByName("loc"), nullptr);
    EXPECT_STREQ(Ndh_PropUtil::GetStringProp(obj.net, "LOC"), "a9");
    // Replaces in place rather than adding a second LOC.
    EXPECT_TRUE(RunStr(filter, obj.net, "Loc", "B9").Succeed());
    EXPECT_STREQ(Ndh_PropUtil::GetStringProp(obj.net, "LOC"), "B9");
    EXPECT_EQ(obj.net->GetNumProperties(), 1);

    EXPECT_TRUE(RunFlag(filter, obj.net, "pullup").Succeed());
    EXPECT_NE(obj.net->GetPropertyByName("PULLUP"), nullptr);

    // Prefix and range families: the prefix as defined, the rest upper-cased.
    EXPECT_TRUE(RunStr(filter, obj.config, "vref_bank2a", "0.9").Succeed());
    EXPECT_STREQ(Ndh_PropUtil::GetStringProp(obj.config, "VREF_BANK2A"), "0.9");
    EXPECT_TRUE(RunStr(filter, obj.inst, "init_3f", "FF").Succeed());
    EXPECT_STREQ(Ndh_PropUtil::GetStringProp(obj.inst, "INIT_3F"), "FF");
    EXPECT_EQ(filter.CanonicalName("Init_0a"), "INIT_0A");
}

TEST_F(FilterTest, PatternBounds) {
    EXPECT_TRUE(RunStr(filter, obj.inst, "INIT_00", "0").Succeed());
    EXPECT_TRUE(RunStr(filter, obj.inst, "INIT_40", "0").BadPropName());   // above the range
    EXPECT_TRUE(RunStr(filter, obj.inst, "INIT_0", "0").BadPropName());    // too narrow
    EXPECT_TRUE(RunStr(filter, obj.inst, "INIT_000", "0").BadPropName());  // too wide
    EXPECT_TRUE(RunStr(filter, obj.inst, "INIT_0G", "0").BadPropName());
    EXPECT_TRUE(RunStr(filter, obj.config, "VREF_BANK", "0").BadPropName());  // empty suffix
    EXPECT_TRUE(RunStr(filter, obj.config, "VREF_BANK 1", "0").BadPropName());
}

TEST_F(FilterTest, BooleanConversions) {
    for (const char* t : {"TRUE", "yes", "On", "1", " true ", ""}) {
        obj.net->DeleteAllProperties();
        EXPECT_TRUE(RunStr(filter, obj.net, "PULLUP", t).Succeed()) << '"' << t << '"';
        ASSERT_NE(obj.net->GetPropertyByName("PULLUP"), nullptr);
        EXPECT_EQ(obj.net->GetPropertyByName("PULLUP")->GetType(), NDM_PROP_BOOL);
    }
    for (const char* t : {"FALSE", "no", "off", "0"})
        EXPECT_TRUE(RunStr(filter, obj.net, "PULLUP", t).InhibitedFalseBool()) << t;
    for (const char* t : {"maybe", "2", "truex"})
        EXPECT_TRUE(RunStr(filter, obj.net, "PULLUP", t).BadDataType()) << t;
    EXPECT_TRUE(Filter(filter, obj.net, [](Ndm_Property* l) { l->CreatePropertyInt32("PULLUP", 0); })
                    .InhibitedFalseBool());
    EXPECT_TRUE(Filter(filter, obj.net, [](Ndm_Property* l) { l->CreatePropertyFloat64("PULLUP", 1); })
                    .BadDataType());
}

TEST_F(FilterTest, NumericConversions) {
    EXPECT_TRUE(RunStr(filter, obj.net, "DRIVE", "12").Succeed());
    const Ndm_Property* p = obj.net->GetPropertyByName("DRIVE");
    ASSERT_NE(p, nullptr);
    EXPECT_EQ(p->GetType(), NDM_PROP_INT32);
    EXPECT_EQ(p->GetInt32(), 12);
    EXPECT_TRUE(RunStr(filter, obj.net, "DRIVE", "-2147483648").Succeed());
    EXPECT_EQ(obj.net->GetPropertyByName("DRIVE")->GetInt32(), INT32_MIN);
    for (const char* t : {"2147483648", "8mA", "1.5", "", "0x10"})
        EXPECT_TRUE(RunStr(filter, obj.net, "DRIVE", t).BadDataType()) << t;
    EXPECT_TRUE(Filter(filter, obj.net, [](Ndm_Property* l) { l->CreatePropertyInt32("DRIVE", 24); })
                    .Succeed());
    EXPECT_EQ(obj.net->GetPropertyByName("DRIVE")->GetInt32(), 24);
    EXPECT_TRUE(RunFlag(filter, obj.net, "DRIVE").BadDataType());

    EXPECT_TRUE(RunStr(filter, obj.inst, "CLKDV", "2.5").Succeed());
    EXPECT_EQ(obj.inst->GetPropertyByName("CLKDV")->GetType(), NDM_PROP_FLOAT64);
    EXPECT_DOUBLE_EQ(obj.inst->GetPropertyByName("CLKDV")->GetFloat64(), 2.5);
    EXPECT_TRUE(Filter(filter, obj.inst, [](Ndm_Property* l) { l->CreatePropertyInt32("CLKDV", 3); })
                    .Succeed());
    EXPECT_DOUBLE_EQ(obj.inst->GetPropertyByName("CLKDV")->GetFloat64(), 3.0);
    for (const char* t : {"2.5ns", "nan", "inf", "0x1p3", "abc", ""})
        EXPECT_TRUE(RunStr(filter, obj.inst, "CLKDV", t).BadDataType()) << t;
}

TEST_F(FilterTest, StringsAndFlags) {
    // A flag for a string constraint is a wrong type; a number becomes its text.
    EXPECT_TRUE(RunFlag(filter, obj.net, "LOC").BadDataType());
    EXPECT_EQ(obj.net->GetPropertyByName("LOC"), nullptr);
    EXPECT_TRUE(Filter(filter, obj.net, [](Ndm_Property* l) { l->CreatePropertyInt32("LOC", 7); })
                    .Succeed());
    EXPECT_STREQ(Ndh_PropUtil::GetStringProp(obj.net, "LOC"), "7");

    // flagstring takes both forms.
    EXPECT_TRUE(RunFlag(filter, obj.inst, "lock_pins").Succeed());
    EXPECT_EQ(obj.inst->GetPropertyByName("LOCK_PINS")->GetType(), NDM_PROP_BOOL);
    EXPECT_TRUE(RunStr(filter, obj.inst, "LOCK_PINS", "I0:A1,I1:A2").Succeed());
    EXPECT_STREQ(Ndh_PropUtil::GetStringProp(obj.inst, "LOCK_PINS"), "I0:A1,I1:A2");
    auto off = RunFlag(filter, obj.inst, "LOCK_PINS", false);
    EXPECT_TRUE(off.InhibitedFalseBool());
    EXPECT_TRUE(off.DeletedTrueBool());
}

TEST_F(FilterTest, StringListAppendsAcrossValues) {
    EXPECT_TRUE(RunStr(filter, obj.config, "RANGE", "ag1 = S0:S7").Succeed());
    EXPECT_TRUE(RunStr(filter, obj.config, "range", "ag2 = S8:S9").Succeed());
    EXPECT_TRUE(RunStr(filter, obj.config, "RANGE", "ag1 = S0:S7").Succeed());
    const Ndm_Property* p = obj.config->GetPropertyByName("RANGE");
    ASSERT_NE(p, nullptr);
    EXPECT_EQ(p->GetType(), NDM_PROP_STRING_LIST);
    EXPECT_EQ(p->GetStrings(), (std::vector<std::string>{"ag1 = S0:S7", "ag2 = S8:S9", "ag1 = S0:S7"}));

    // A TIG list written around the filter (valueless TIG) is extended, not replaced.
    obj.net->CreatePropertyStringList("TIG")->AddString("");
    EXPECT_TRUE(RunStr(filter, obj.net, "tig", "TS_a").Succeed());
    EXPECT_EQ(obj.net->GetPropertyByName("TIG")->GetStrings(), (std::vector<std::string>{"", "TS_a"}));
    // A plain string of the same name is kept as the first entry.
    obj.inst->CreatePropertyString("RLOC_ORIGIN", "old");
    obj.config->CreatePropertyString("RLOC_ORIGIN", "set0 = X0Y0");
    EXPECT_TRUE(RunStr(filter, obj.config, "RLOC_ORIGIN", "set1 = X1Y1").Succeed());
    EXPECT_EQ(obj.config->GetPropertyByName("RLOC_ORIGIN")->GetStrings(),
              (std::vector<std::string>{"set0 = X0Y0", "set1 = X1Y1"}));
    EXPECT_TRUE(RunFlag(filter, obj.config, "RANGE").BadDataType());
}

TEST_F(FilterTest, ObjectKindDecidesTypeAndRefusal) {
    // Same name, different type per kind.
    EXPECT_TRUE(RunStr(filter, obj.inst, "RLOC_ORIGIN", "X0Y0").Succeed());
    EXPECT_EQ(obj.inst->GetPropertyByName("RLOC_ORIGIN")->GetType(), NDM_PROP_STRING);
    EXPECT_TRUE(RunStr(filter, obj.config, "RLOC_ORIGIN", "s = X0Y0").Succeed());
    EXPECT_EQ(obj.config->GetPropertyByName("RLOC_ORIGIN")->GetType(), NDM_PROP_STRING_LIST);

    // Known names on kinds they do not allow: wrong type, nothing attached.
    EXPECT_TRUE(RunStr(filter, obj.config, "LOC", "P1").BadDataType());
    EXPECT_TRUE(RunStr(filter, obj.inst, "RANGE", "x").BadDataType());
    EXPECT_TRUE(RunStr(filter, obj.pin, "DRIVE", "8").BadDataType());
    EXPECT_TRUE(RunStr(filter, obj.sig, "TIG", "TS_a").BadDataType());
    EXPECT_EQ(obj.config->GetPropertyByName("LOC"), nullptr);
    EXPECT_EQ(obj.pin->GetPropertyByName("DRIVE"), nullptr);
    // The CONFIG block is recognised by its TYPE; without it a block is an instance.
    EXPECT_TRUE(RunStr(filter, obj.pin, "LOC", "P1").Succeed());
    Ndm_Block* timespec = obj.top->CreateBlock("ts");
    timespec->CreatePropertyString("TYPE", "TIMESPEC");
    EXPECT_TRUE(RunStr(filter, timespec, "LOC", "P1").BadDataType());
    EXPECT_TRUE(RunStr(filter, &obj.design, "LOC", "P1").BadDataType());
}

TEST(FilterDefinitions, BadFilesNameFileAndLine) {
    FilterDir dir;
    struct Case {
        const char* text;
        const char* expect;  // part of the message after "line N: "
        int line;
    };
    const Case cases[] = {
        {"LOC string net\nIOSTANDARD strng net\n", "unknown type word 'strng'.", 2},
        {"# c\n\nLOC string net, wire\n", "unknown object kind 'wire'.", 3},
        {"LOC string net\nloc string inst, net\n", "duplicate definition of 'loc'", 2},
        {"INIT_[00-3F] string inst\nINIT_[20-7F] string inst\n", "duplicate definition", 2},
        {"LOC string\n", "expected a name, a type word and at least one object kind.", 1},
        {"LO-C string net\n", "invalid character", 1},
        {"INIT_[3F-00] string inst\n", "reversed range", 1},
        {"INIT_[0-FF] string inst\n", "equal width", 1},
        {"INIT_[00-3F string inst\n", "malformed range", 1},
        {"* string inst\n", "prefix name needs text", 1},
    };
    int n = 0;
    for (const Case& c : cases) {
        std::string path = dir.Write("bad" + std::to_string(n++) + ".pfd", c.text);
        Port_MsgCapture capture;
        Ndh_PropInFilter filter(path.c_str(), nullptr);
        EXPECT_FALSE(filter.IsValid()) << c.text;
        std::string prefix = "Property definition file '" + path + "' line " + std::to_string(c.line) + ": ";
        EXPECT_EQ(filter.GetError().rfind(prefix, 0), 0u) << filter.GetError();
        EXPECT_NE(filter.GetError().find(c.expect), std::string::npos) << filter.GetError();
        auto errors = capture.Texts(Port_Severity::Error);
        ASSERT_EQ(errors.size(), 1u) << c.text;
        EXPECT_EQ(errors[0], filter.GetError());
        ASSERT_EQ(capture.messages().size(), 1u);
        EXPECT_EQ(capture.messages()[0].module, "filter");
        EXPECT_EQ(capture.messages()[0].program, "Quillmap");
    }
    // Disjoint kinds for one name and overlapping-free ranges are fine.
    std::string ok = dir.Write("ok.pfd", "X string inst\nx stringlist config\nI_[00-0F] string inst\nI_[10-1F] int inst\n");
    Port_MsgCapture capture;
    EXPECT_TRUE(Ndh_PropInFilter(ok.c_str(), nullptr).IsValid());
    EXPECT_TRUE(capture.messages().empty());
}

TEST(FilterDefinitions, InvalidFilterRefusesEveryName) {
    FilterDir dir;
    Objects obj;
    Port_MsgCapture capture;
    Ndh_PropInFilter filter((dir.path() + "/missing.pfd").c_str(), nullptr);
    EXPECT_FALSE(filter.IsValid());
    EXPECT_NE(filter.GetError().find("missing.pfd"), std::string::npos);
    EXPECT_EQ(capture.Texts(Port_Severity::Error).size(), 1u);
    EXPECT_TRUE(RunStr(filter, obj.net, "LOC", "P1").BadPropName());
    EXPECT_EQ(obj.net->GetPropertyByName("LOC"), nullptr);
    EXPECT_EQ(filter.CanonicalName("LOC"), "");
}

TEST(FilterDefinitions, BareNamesResolveThroughDataDir) {
    FilterDir dir;
    dir.Write("mine.pfd", "ONLY_HERE string net\n");
    const char* saved = std::getenv("LUN_DATA_DIR");
    std::string saved_value = saved ? saved : "";
    ::setenv("LUN_DATA_DIR", dir.path().c_str(), 1);
    {
        Port_MsgCapture capture;
        Ndh_PropInFilter filter("mine.pfd", nullptr);
        EXPECT_TRUE(filter.IsValid()) << filter.GetError();
        EXPECT_EQ(filter.CanonicalName("only_here"), "ONLY_HERE");
        // The environment directory replaces the shipped folder.
        Ndh_PropInFilter shipped("ucf.pfd", nullptr);
        EXPECT_FALSE(shipped.IsValid());
        EXPECT_NE(shipped.GetError().find(dir.path()), std::string::npos);
    }
    ::unsetenv("LUN_DATA_DIR");
    {
        Ndh_PropInFilter shipped("ucf.pfd", nullptr);
        EXPECT_TRUE(shipped.IsValid()) << shipped.GetError();
        EXPECT_EQ(shipped.GetPath(), std::string(LUN_SOURCE_DIR) + "/data/ucf.pfd");
    }
    if (saved) ::setenv("LUN_DATA_DIR", saved_value.c_str(), 1);
}

TEST(FilterDefinitions, ParsedOncePerFile) {
    FilterDir dir;
    std::string path = dir.Write("once.pfd", "FIRST string net\n");
    Ndh_PropInFilter a(path.c_str(), nullptr);
    ASSERT_TRUE(a.IsValid());
    dir.Write("once.pfd", "SECOND string net\n");
    Ndh_PropInFilter b(path.c_str(), nullptr);
    EXPECT_EQ(b.CanonicalName("FIRST"), "FIRST");
    EXPECT_EQ(b.CanonicalName("SECOND"), "");
}

class ShippedFilter : public ::testing::TestWithParam<const char*> {
protected:
    std::string Path() const { return std::string(LUN_SOURCE_DIR) + "/data/" + GetParam(); }
};

TEST_P(ShippedFilter, LoadsCleanly) {
    Port_MsgCapture capture;
    Ndh_PropInFilter filter(Path().c_str(), nullptr);
    EXPECT_TRUE(filter.IsValid()) << filter.GetError();
    EXPECT_TRUE(capture.messages().empty());
}

TEST_P(ShippedFilter, KnowsKeywordsOfRealFiles) {
    Ndh_PropInFilter filter(Path().c_str(), nullptr);
    const char* keys[] = {
        "LOC", "IOSTANDARD", "SLEW", "DRIVE", "PULLUP", "PULLDOWN", "KEEPER", "KEEP", "TNM",
        "TNM_NET", "PERIOD", "OFFSET", "MAXDELAY", "MAXSKEW", "TIG", "CLOCK_DEDICATED_ROUTE",
        "IN_TERM", "OUT_TERM", "DIFF_TERM", "RLOC", "RLOC_ORIGIN", "U_SET", "H_SET", "HU_SET",
        "BEL", "AREA_GROUP", "PART", "STEPPING", "VCCAUX", "PROHIBIT", "VREF", "DCI_CASCADE",
        "INTERNAL_VREF_BANK0", "INTERNAL_VREF_BANK12", "SYSTEM_JITTER",
        // further vocabulary
        "IOB", "IOBDELAY", "FAST", "NODELAY", "IFD_DELAY_VALUE", "RLOC_RANGE", "LOCK_PINS", "S",
        "SAVE", "MAP", "BLKNM", "HBLKNM", "LUTNM", "XBLKNM", "KEEP_HIERARCHY", "CLKIN_PERIOD",
        "CLKFX_MULTIPLY", "CLKFX_DIVIDE", "CLKDV_DIVIDE", "DUTY_CYCLE_CORRECTION", "FEEDBACK",
        "DIVIDE1_BY", "DIVIDE2_BY", "PHASE_SHIFT", "CLKOUT_PHASE_SHIFT", "DESKEW_ADJUST",
        "STARTUP_WAIT", "DFS_FREQUENCY_MODE", "DLL_FREQUENCY_MODE", "INIT", "INIT_00", "INIT_7F",
        "INITP_00", "INITP_0F", "INIT_A", "INIT_B", "SRVAL", "WRITE_MODE", "VOLTAGE",
        "TEMPERATURE", "RANGE", "COMPRESSION", "PLACE", "GROUP", "MODE", "IMPLEMENT"};
    for (const char* key : keys) {
        EXPECT_EQ(filter.CanonicalName(key), key) << key;
        std::string lower(key);
        for (char& c : lower) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
        EXPECT_EQ(filter.CanonicalName(lower.c_str()), key) << lower;
    }
    for (const char* key : {"FROM_UCF", "FROM_NCF", "_TempPropList", "INIT_80", "INITP_10"})
        EXPECT_EQ(filter.CanonicalName(key), "") << key;
}

TEST_P(ShippedFilter, ValueShapesOfRealFiles) {
    Objects obj;
    Ndh_PropInFilter filter(Path().c_str(), nullptr);
    EXPECT_TRUE(RunStr(filter, obj.net, "loc", "P1,P2,P3").Succeed());
    EXPECT_TRUE(RunStr(filter, obj.inst, "LOC", "SITE_X0Y58").Succeed());
    EXPECT_TRUE(RunStr(filter, obj.net, "DRIVE", "8").Succeed());
    EXPECT_EQ(obj.net->GetPropertyByName("DRIVE")->GetInt32(), 8);
    EXPECT_TRUE(RunFlag(filter, obj.net, "pullup").Succeed());
    EXPECT_TRUE(RunFlag(filter, obj.net, "KEEP").Succeed());
    // FALSE is the meaningful value here: kept as text, not dropped as a false flag.
    EXPECT_TRUE(RunStr(filter, obj.net, "CLOCK_DEDICATED_ROUTE", "FALSE").Succeed());
    EXPECT_STREQ(Ndh_PropUtil::GetStringProp(obj.net, "CLOCK_DEDICATED_ROUTE"), "FALSE");
    EXPECT_TRUE(RunStr(filter, obj.net, "PERIOD", "10000.000000 pS HIGH 50.000000 %").Succeed());
    EXPECT_TRUE(RunStr(filter, obj.net, "TIG", "TS_a").Succeed());
    EXPECT_TRUE(RunStr(filter, obj.net, "TIG", "TS_b").Succeed());
    EXPECT_EQ(obj.net->GetPropertyByName("TIG")->GetStrings().size(), 2u);
    EXPECT_TRUE(RunStr(filter, obj.inst, "INIT_3F", "0F0F").Succeed());
    EXPECT_TRUE(RunStr(filter, obj.inst, "CLKDV_DIVIDE", "2.5").Succeed());
    EXPECT_TRUE(RunStr(filter, obj.config, "VCCAUX", "3.3").Succeed());
    EXPECT_TRUE(RunStr(filter, obj.config, "PROHIBIT", "P1, L3").Succeed());
    EXPECT_TRUE(RunStr(filter, obj.config, "internal_vref_bank0", "0.75").Succeed());
    EXPECT_STREQ(Ndh_PropUtil::GetStringProp(obj.config, "INTERNAL_VREF_BANK0"), "0.75");
    for (const char* ag : {"ag1 = CLOSED", "ag2 = OPEN"})
        EXPECT_TRUE(RunStr(filter, obj.config, "PLACE", ag).Succeed());
    EXPECT_EQ(obj.config->GetPropertyByName("PLACE")->GetStrings().size(), 2u);
    EXPECT_TRUE(RunStr(filter, obj.config, "RLOC_RANGE", "set1 = X0Y0:X3Y3").Succeed());
    EXPECT_EQ(obj.config->GetPropertyByName("RLOC_RANGE")->GetType(), NDM_PROP_STRING);
    EXPECT_TRUE(RunStr(filter, obj.config, "LOC", "P1").BadDataType());
}

INSTANTIATE_TEST_SUITE_P(Files, ShippedFilter, ::testing::Values("ucf.pfd", "ucf.prp"),
                         [](const auto& info) {
                             return std::string(info.param).replace(3, 1, "_");
                         });

}  // namespace
