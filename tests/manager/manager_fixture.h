// A small hierarchical design and a helper that runs constraint text through Ta_LunMgr.
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <memory>
#include <string>
#include <vector>

#include "host/design/ndm.h"
#include "host/port/msgman.h"
#include "manager/lunmgr.h"
#include "support/test_support.h"

// Reaches the manager's protected state in tests.
class TestMgr : public Ta_LunMgr {
public:
    using Ta_LunMgr::Ta_LunMgr;
    bool ConfigSeen() const { return config_seen; }
    size_t TriedNames() const { return tried_names.size(); }
};

// top
//   u1 (pins A, B)        u1/u2 (pins D, Q)       u3       "data<3>"      pad1
// signals of top: clk, rst, din, "bus[0]", "bus[1]"; u1 holds signal n1 in clk's network
// and signal q in its own network "u1/q".
class ManagerTest : public ::testing::Test, public lun_test::TopDesign {
protected:
    void SetUp() override {
        ::unsetenv("ZEP_QUILLMAP_ALLOWUNMATCHEDUCF");
        ::unsetenv("ZEP_QUILLMAP_BEST_EFFORT_UCF");
        ::unsetenv("ZEP_QUILLMAP_SECOND_UCF_PASS");
        u1 = top->CreateBlock("u1");
        u2 = u1->CreateBlock("u2");
        u3 = top->CreateBlock("u3");
        data3 = top->CreateBlock("data<3>");
        pad1 = top->CreateBlock("pad1");
        u1->CreatePin("A");
        u1->CreatePin("B");
        u2->CreatePin("D");
        u2->CreatePin("Q");
        for (const char* n : {"clk", "rst", "din", "bus[0]", "bus[1]"})
            view->CreateNetwork()->AddSignal(top->CreateSignal(n));
        top->GetSignalByName("clk")->GetNetwork()->AddSignal(u1->CreateSignal("n1"));
        view->CreateNetwork()->AddSignal(u1->CreateSignal("q"));
    }

    // Runs text as a constraint file of the given kind; returns annotate's result.
    int Run(const std::string& text, CP_FILE_TYPE kind = CP_UCF) {
        file = dir.Write(kind == CP_UCF ? "t.ucf" : "t.ncf", text);
        TestMgr mgr(file.c_str(), kind, nullptr);
        if (configure) configure(mgr);
        return mgr.annotate(view);
    }
    Ndm_Property* Prop(Ndm_PropertyHolder* holder, const char* name) { return holder->GetPropertyByName(name); }
    std::string Value(Ndm_PropertyHolder* holder, const char* name) { return lun_test::PropText(holder, name); }
    Ndm_Network* Net(const char* name) { return top->GetSignalByName(name)->GetNetwork(); }
    Ndm_Block* Config() {
        for (Ndm_Block* b : top->GetBlockItr()) {
            Ndm_Property* t = b->GetPropertyByName("TYPE");
            if (t && t->GetValueString() && std::string(t->GetValueString()) == "CONFIG") return b;
        }
        return nullptr;
    }
    // "Line N in '<file>': " prefix of statement messages.
    std::string At(int line) const { return "Line " + std::to_string(line) + " in '" + file + "': "; }

    lun_test::ScratchDir dir;
    std::string file;
    std::function<void(TestMgr&)> configure;
    Ndm_Block *u1 = nullptr, *u2 = nullptr, *u3 = nullptr, *data3 = nullptr, *pad1 = nullptr;
};
