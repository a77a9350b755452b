// A small design and an annotator that exposes the frame's protected operations.
#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <string>

#include "frame/lunbase.h"
#include "host/design/ndm.h"
#include "host/port/msgman.h"
#include "support/test_support.h"

// Annotator that reaches the protected frame operations and, through the parser, attaches
// every string and flag constraint of a NET statement to the network of the top signal of
// that name (exact names only: the real name lookups live in the manager).
class ProbeAnnotator : public Ta_LunBase {
public:
    using Ta_LunBase::AddConstraintToList;
    using Ta_LunBase::AddQuotesToString;
    using Ta_LunBase::AttachConstraint;
    using Ta_LunBase::AttachTimeConstraint;
    using Ta_LunBase::FindConstraintBlock;
    using Ta_LunBase::GetConstraintBlock;
    using Ta_LunBase::GetConstraintName;
    using Ta_LunBase::GetEdgeString;
    using Ta_LunBase::Ta_LunBase;

    void SetView(Ndm_View* v) { view = v; }
    const char* FilterFile() const { return filter_filename; }

    bool cb_net(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* h) override {
        Ndm_Signal* sig = view->GetBlock()->GetSignalByName(defn.get_object_name());
        if (!sig) return false;
        for (auto it = defn.begin_constraint(); it != defn.end_constraint(); ++it) {
            Pr_Logical_Constraint* c = *it;
            if (c->get_type() == Pr_Logical_Constraint::BASE) {
                if (!AttachConstraint(c->get_name(), sig->GetNetwork(), h)) return false;
            } else if (auto* s = dynamic_cast<Pr_Logical_StringConstraint*>(c)) {
                if (!AttachConstraint(c->get_name(), s->get_value(), sig->GetNetwork(), h)) return false;
            }
        }
        return true;
    }
    bool cb_tspec_drop_spec(const char* name, const Pr_Logical_ConstraintHandle*) override {
        return AttachTimeConstraint(name, "DROP_SPEC", GetConstraintBlock("TIMESPEC")) == 1;
    }
};

// Design "d" with view EXPANDED: top block "top" with children u1 (holding u2) and u3, and
// top-level signals clk and rst, each in its own network.
class FrameTest : public ::testing::Test, public lun_test::TopDesign {
protected:
    void SetUp() override {
        u1 = top->CreateBlock("u1");
        u2 = u1->CreateBlock("u2");
        u3 = top->CreateBlock("u3");
        for (const char* n : {"clk", "rst"}) view->CreateNetwork()->AddSignal(top->CreateSignal(n));
    }
    Ndm_Network* Net(const char* name) { return top->GetSignalByName(name)->GetNetwork(); }
    static std::vector<std::string> Strings(Ndm_PropertyHolder* holder, const char* name) {
        Ndm_Property* p = holder->GetPropertyByName(name);
        return p ? p->GetStrings() : std::vector<std::string>{};
    }

    lun_test::ScratchDir dir;
    Ndm_Block* u1 = nullptr;
    Ndm_Block* u2 = nullptr;
    Ndm_Block* u3 = nullptr;
};
