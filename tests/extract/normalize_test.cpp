// NormalizeProperties / NormalizeProperty: rewrites, walk, fatal errors before any change.
#include "extract_fixture.h"

namespace {

// "NAME:type=value" for every property of a holder, in order.
std::string Props(const Ndm_PropertyHolder* h) {
    std::string out;
    for (const Ndm_Property* p : h->GetPropertyItr()) {
        out += std::string(out.empty() ? "" : " ") + p->GetName();
        switch (p->GetType()) {
            case NDM_PROP_BOOL: out += p->GetBool() ? ":b=1" : ":b=0"; break;
            case NDM_PROP_INT32: out += ":i=" + std::to_string(p->GetInt32()); break;
            case NDM_PROP_STRING: out += std::string(":s=") + p->GetValueString(); break;
            default: out += ":t" + std::to_string(p->GetType()); break;
        }
    }
    return out;
}

TEST_F(ExtractTest, NormalizeRewritesBlocksChildrenAndNetworks) {
    top->CreatePropertyInt32("SLEW", 80);
    top->CreatePropertyInt32("DELAYMODE", 0);
    top->CreatePropertyInt32("DELAYMODE_X", 0);
    top->CreatePropertyBool("FIXED", false);
    for (const char* n : {"LOG_PICSPEC", "LOG_PICSPEED", "LOG_VENDOR", "INITSTATE", "VL_LEVEL", "log_vendor"})
        top->CreatePropertyString(n, n);
    List(top, "LOG_VENDOR_L", {"v"});
    top->CreatePropertyInt32("FIXED_I", 1);
    Ndm_Block* deep = top;
    for (int i = 0; i < 20000; ++i) deep = deep->CreateBlock("d");
    deep->CreatePropertyInt32("SLEW", 20);
    deep->CreatePropertyInt32("DELAYMODE", 1);  // only 0 is rewritten
    Ndm_Network* net = view->CreateNetwork();
    net->AddSignal(top->CreateSignal("s"));
    net->CreatePropertyInt32("SLEW", 10);
    net->CreatePropertyBool("SLEW_B");
    CstExtractor ex;
    EXPECT_TRUE(ex.NormalizeProperties(view));
    const char* expected =
        "DELAYMODE_X:i=0 log_vendor:s=log_vendor LOG_VENDOR_L:t10 FIXED_I:i=1 SLEW:s=FAST "
        "NODELAY:b=1 P:b=0 PICSPEC:s=LOG_PICSPEC PICSPEED:s=LOG_PICSPEED VENDOR:s=LOG_VENDOR "
        "INIT:s=INITSTATE LEVEL:s=VL_LEVEL";
    EXPECT_EQ(Props(top), expected);
    EXPECT_EQ(Props(deep), "DELAYMODE:i=1 SLEW:s=SLOW");
    EXPECT_EQ(Props(net), "SLEW_B:b=1 SLEW:s=QUIETIO");
    EXPECT_TRUE(ex.NormalizeProperties(view));  // nothing left to rewrite
    EXPECT_EQ(Props(top), expected);
}

TEST_F(ExtractTest, NormalizeFatalsChangeNothing) {
    Ndm_Block* u0 = top->CreateBlock("u0");
    u0->CreatePropertyString("LOG_VENDOR", "acme");  // met before the failure
    Ndm_Block* u1 = top->CreateBlock("u1");
    u1->CreatePropertyInt32("SLEW", 5);
    top->CreatePropertyInt32("SLEW", 7);  // the parent comes after its children
    CstExtractor ex;
    EXPECT_EQ(Fatal([&] { ex.NormalizeProperties(view); }), "Unexpected SLEW property value 5 found on u1.\n");
    EXPECT_EQ(Props(u0), "LOG_VENDOR:s=acme");

    u1->CreatePropertyInt32("SLEW", 80);
    top->CreatePropertyInt32("SLEW", 20);
    Ndm_Network* net = view->CreateNetwork();
    net->AddSignal(u1->CreateSignal("q"));
    net->CreatePropertyFloat64("CAP", 1.0);
    EXPECT_EQ(Fatal([&] { ex.NormalizeProperties(view); }),
              "Unexpected property type found on u1/q object for property CAP.\n");
    EXPECT_EQ(Props(u1), "SLEW:i=80");
    EXPECT_EQ(Fatal([&] { ex.NormalizeProperty(net, net->GetPropertyByName("CAP")); }),
              "Unexpected property type found on u1/q object for property CAP.\n");

    // A rename replaces a same-named property not yet met, so that one never fails.
    net->DeleteProperty("CAP");
    u0->CreatePropertyFloat64("VENDOR", 2.0);
    EXPECT_TRUE(ex.NormalizeProperties(view));
    EXPECT_EQ(Props(u0), "VENDOR:s=acme");
    EXPECT_EQ(Props(u1), "SLEW:s=FAST");
}

TEST_F(ExtractTest, NormalizeOneProperty) {
    top->CreatePropertyInt32("SLEW", 20);
    top->CreatePropertyBool("FIXED");
    CstExtractor ex;
    ex.NormalizeProperty(top, top->GetPropertyByName("SLEW"));
    ex.NormalizeProperty(view, top->GetPropertyByName("FIXED"));  // not a property of view
    ex.NormalizeProperty(top, nullptr);
    EXPECT_EQ(Props(top), "FIXED:b=1 SLEW:s=SLOW");
}

}  // namespace
