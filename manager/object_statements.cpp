// Ta_LunMgr: INST, NET and PIN statements (name lookup with its retries, one property per
// constraint and object) and the policy for names that match nothing.
#include <string>
#include <vector>

#include "host/parser/pr_property_texts.h"
#include "host/port/env.h"
#include "host/port/msgman.h"
#include "manager/lunmgr.h"
#include "manager/statement_messages.h"

using lunmgr::LineOf;
using lunmgr::Msg;
using lunmgr::TextOf;

namespace {

// The statement's first keyword, or null.
const char* FirstKeyword(const Pr_Logical_ConstraintDefn& defn) {
    if (defn.num_constraints() == 0) return nullptr;
    const char* key = (*defn.begin_constraint())->get_name();
    return key && *key ? key : nullptr;
}

const char* Keyword(const Pr_Logical_Constraint* c) {
    const char* key = c->get_name();
    return key && *key ? key : nullptr;
}

// The keyword (null when unknown) and the plan of a constraint of a statement.
struct PlannedConstraint {
    const char* keyword;
    Pr_PropertyPlan plan;
};

std::vector<PlannedConstraint> PlanConstraints(const Pr_Logical_ConstraintDefn& defn, bool ucf) {
    std::vector<PlannedConstraint> plans;
    for (auto it = defn.begin_constraint(); it != defn.end_constraint(); ++it) {
        const char* keyword = Keyword(*it);
        plans.push_back({keyword, keyword ? Pr_PlanProperties(**it, keyword, ucf) : Pr_PropertyPlan()});
    }
    return plans;
}
}  // namespace

Ndm_ObjectFinder& Ta_LunMgr::Finder() {
    if (!finder_ || finder_view_ != view) {
        finder_ = std::make_shared<Ndm_ObjectFinder>(view, case_sensitive, file_type == CP_UCF);
        finder_view_ = view;
    }
    finder_->SetCaseSensitive(case_sensitive);
    return *finder_;
}

bool Ta_LunMgr::ApplyUnmatchedPolicy(ObjectKind kind, const Pr_Logical_ConstraintDefn& defn, const char* name,
                                     const Pr_Logical_ConstraintHandle* handle) {
    int line = LineOf(handle);
    const bool tolerated = Port_Env::GetEnv("ZEP_QUILLMAP_ALLOWUNMATCHEDUCF") != nullptr;
    auto issue = [&](bool warn, const char* text) {
        if (warn)
            Msg(__LINE__).issueWarning(text, line, constraint_filename, name);
        else
            Msg(__LINE__).issueError(text, line, constraint_filename, name);
        return warn;
    };
    if (kind == ObjectKind::Pin) {
        if (best_effort) store_unmatched(handle);
        return issue(tolerated,
                     "Line %i in '%s': Could not find pin(s) '%s' in the design.  To suppress this error specify "
                     "the correct pin name or remove the constraint.\n");
    }
    if (best_effort) {
        store_unmatched(handle);
        return true;
    }
    bool inst = kind == ObjectKind::Inst;
    if (IsAnIOProp(FirstKeyword(defn))) {
        if (allow_unmatched_locs) {
            Msg(__LINE__).issueInfo(inst ? "Line %i in '%s': Could not find instance(s) '%s' in the design.  Since "
                                           "the -aul switch is set, the constraint will be ignored.\n"
                                         : "Line %i in '%s': Could not find net(s) '%s' in the design.  Since the "
                                           "-aul switch is set, the constraint will be ignored.\n",
                                    line, constraint_filename, name);
            return true;
        }
        return issue(tolerated, inst ? "Line %i in '%s': Could not find instance(s) '%s' in the design.  To "
                                       "suppress this error use the -aul switch, specify the correct instance "
                                       "name or remove the constraint.\n"
                                     : "Line %i in '%s': Could not find net(s) '%s' in the design.  To suppress "
                                       "this error use the -aul switch, specify the correct net name or remove "
                                       "the constraint.\n");
    }
    return issue(tolerated, inst ? "Line %i in '%s': Could not find instance(s) '%s' in the design.  To suppress "
                                   "this error specify the correct instance name or remove the constraint.\n"
                                 : "Line %i in '%s': Could not find net(s) '%s' in the design.  To suppress this "
                                   "error specify the correct net name or remove the constraint.\n");
}

bool Ta_LunMgr::cb_comp(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::comp: Line %I: %s", handle);
    if (defn.num_constraints() == 0) return true;
    std::string working;
    auto report = LookupReport(handle);
    std::vector<Ndm_Block*> found = Finder().Instances(defn.get_object_name(), working, report);
    tried_names.clear();
    if (found.empty()) return ApplyUnmatchedPolicy(ObjectKind::Inst, defn, working.c_str(), handle);
    const std::vector<PlannedConstraint> plans = PlanConstraints(defn, file_type == CP_UCF);

    for (Ndm_Block* block : found) {
        for (const PlannedConstraint& c : plans) {
            if (!c.keyword) {
                Msg(__LINE__).issueInternal("Constraint type for INST is unknown.\n INST entry is '%s'.", TextOf(handle));
                break;
            }
            unsigned char error_reported = 0;
            if (!create_planned(block, c.plan, &error_reported, handle)) return false;
        }
    }
    return true;
}

bool Ta_LunMgr::cb_net(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::net: Line %I: %s", handle);
    if (defn.num_constraints() == 0) return true;
    std::string working;
    auto report = LookupReport(handle);
    std::vector<Ndm_Signal*> found = Finder().Nets(defn.get_object_name(), working, report);
    tried_names.clear();
    if (found.empty()) return ApplyUnmatchedPolicy(ObjectKind::Net, defn, working.c_str(), handle);
    const std::vector<PlannedConstraint> plans = PlanConstraints(defn, file_type == CP_UCF);

    for (Ndm_Signal* sig : found) {
        Ndm_PropertyHolder* holder = sig->GetNetwork();
        if (!holder) holder = sig;  // a signal outside every network carries its own constraints
        for (const PlannedConstraint& c : plans) {
            if (!c.keyword) {
                Msg(__LINE__).issueInternal("Constraint type for NET is unknown. NET entry is '%s'.", TextOf(handle));
                break;
            }
            unsigned char error_reported = 0;
            if (!create_planned(holder, c.plan, &error_reported, handle)) return false;
            // A network is named after its top signal: the names are made (as long as the
            // hierarchy is deep) only for another signal.
            if (holder == sig || sig->GetNetwork()->GetTopSignal() == sig) continue;
            std::string net_name = holder->GetFullName();
            std::string sig_name = sig->GetFullName();
            if (net_name != sig_name)
                Msg(__LINE__).issueInfo(
                    "Line %i in '%s': The constraint for NET '%s' is being attached to the equivalent NET '%s'.\n",
                    LineOf(handle), constraint_filename, sig_name.c_str(), net_name.c_str());
        }
    }
    return true;
}

bool Ta_LunMgr::cb_pin(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::pin: Line %I: %s", handle);
    if (defn.num_constraints() == 0) return true;
    std::string working;
    auto report = LookupReport(handle);
    std::vector<Ndm_Pin*> found = Finder().Pins(defn.get_object_name(), working, report);
    tried_names.clear();
    if (found.empty()) return ApplyUnmatchedPolicy(ObjectKind::Pin, defn, working.c_str(), handle);
    const std::vector<PlannedConstraint> plans = PlanConstraints(defn, file_type == CP_UCF);

    for (Ndm_Pin* pin : found) {
        for (const PlannedConstraint& c : plans) {
            if (!c.keyword) {
                Msg(__LINE__).issueInternal("Constraint type for PIN is unknown. PIN entry is '%s'.", TextOf(handle));
                break;
            }
            unsigned char error_reported = 0;
            if (!create_planned(pin, c.plan, &error_reported, handle)) return false;
        }
    }
    return true;
}
