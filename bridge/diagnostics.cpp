// Ta_LunCSHelper: association, conflict and unparsable-constraint diagnostics by DRC level.
#include <memory>
#include <string>

#include "bridge/bridge_messages.h"
#include "bridge/luncshelper.h"
#include "host/design/ndm.h"
#include "host/port/env.h"
#include "host/port/msgman.h"

using luncshelper::Msg;

namespace {

bool IsIO(const Cs_Constraint& c) {
    const Cs_ConstraintType& t = c.GetType();
    return t == Cs_Constraint_Locate::Type() || t == Cs_Constraint_IOStandard::Type() ||
           t == Cs_Constraint_Drive::Type() || t == Cs_Constraint_Slew::Type();
}

bool IsMaxDelay(const Cs_Constraint& c) { return c.GetType() == Cs_Constraint_MaxDelay::Type(); }

// Reports a copy of status with another severity.
void ReportAs(const Cs_Status& status, Cs_Status::SEVERITY severity) {
    std::unique_ptr<Cs_Status> copy(status.Clone());
    copy->SetSeverity(severity);
    copy->Report();
}

// The report of one constraint overridden by another, both without a design object.
void OverrideReport(const Cs_Constraint& overridden, const Cs_Constraint& by) {
    const std::string a = overridden.GetMsgName(), b = by.GetMsgName();
    if (Port::StringBase<char>(a).Compare(b.c_str(), Port::StringBase<char>::IGNORE_CASE) == 0) return;
    if (Port_Env::GetEnv("ZEP_QUILLMAP_CONSTR_OVERRIDE_ERROR"))
        Msg(__LINE__).issueError("The constraint %s is overridden by the constraint %s.\n", a.c_str(), b.c_str());
    else
        Msg(__LINE__).issueWarning(
            "The constraint %s is overridden by the constraint %s.  Please set ZEP_QUILLMAP_CONSTR_OVERRIDE_ERROR to "
            "promote this message to an error.\n",
            a.c_str(), b.c_str());
}

}  // namespace

void Ta_LunCSHelper::AssociationDrc(const Cs_ReturnCode& outcome, bool allowUnmatchedIO, bool allowUnmatchedMaxDelay) {
    Msg(__LINE__).issueStatus("Checking Constraint Associations...\n");
    const int level = GetDrcLevel();
    if (level == NONE) return;
    for (const auto& status : outcome) {
        if (status->GetID() == Cs_StatusID::NO_DESIGN_MATCH) {
            auto* resolution = dynamic_cast<const Cs_Status_Resolution*>(status.get());
            const Cs_Constraint* c = resolution ? resolution->GetConstraint() : nullptr;
            const bool exempt = !c || c->IsAssociationExempt();
            if (allowUnmatchedIO && !exempt && IsIO(*c))
                ReportAs(*status, Cs_Status::INFO);
            else if (allowUnmatchedMaxDelay && !exempt && IsMaxDelay(*c))
                ReportAs(*status, Cs_Status::INFO);
            else if (level >= NORMAL && !exempt)
                ReportAs(*status, Cs_Status::ERROR);
            else
                status->Report();
        } else if (status->GetID() == Cs_StatusID::NO_RESOLVED_ASSOCIATIONS && status->GetLocalizedMsgNum() == 80) {
            continue;
        } else {
            status->Report();
        }
    }
}

void Ta_LunCSHelper::ReportNoAssociations(Cs_SharedContainerT<Cs_Constraint*>& constraints, bool allowUnmatchedIO,
                                          bool allowUnmatchedMaxDelay) {
    Msg(__LINE__).issueStatus("Checking Constraint Associations...\n");
    const int level = GetDrcLevel();
    if (level == NONE) return;
    static constexpr const char* kText = "Could not find any associations for the following constraint:\n    '%s'\n";
    for (const Cs_Constraint* c : constraints) {
        if (c->IsAssociationExempt() || c->GetType() == Cs_Constraint_Comment::Type() ||
            c->GetType() == Cs_Constraint_TimeGrp::Type() || !c->GetAssociatedDesignObjs().empty() ||
            !c->GetAssociatedConstraints().empty() || !c->GetAssociatedPaths().empty())
            continue;
        const std::string name = c->GetMsgName();
        if ((allowUnmatchedIO && IsIO(*c)) || (allowUnmatchedMaxDelay && IsMaxDelay(*c)))
            Msg(__LINE__).issueInfo(kText, name.c_str());
        else if (level <= NORMAL)
            Msg(__LINE__).issueWarning(kText, name.c_str());
        else
            Msg(__LINE__).issueError(kText, name.c_str());
    }
}

bool Ta_LunCSHelper::ReportConflicts() {
    const int level = GetDrcLevel();
    if (level == NONE) return true;
    for (const Cs_Constraint* c : m_cmgr->GetConstraints(Cs_ConstraintMgr::ALL)) {
        for (const Cs_Conflict& k : c->GetConflicts()) {
            if (k.GetType() != Cs_Conflict::OVERRIDE) continue;
            const Cs_Constraint* by = k.GetConflictingConstraint();
            if (!k.GetDesignEntity()) {
                if (by) OverrideReport(*c, *by);
            } else if (!by) {
                Port_MsgManData::debugStub("Unexpected Constraint Conflict\n");
            } else {
                const std::string a = c->GetMsgName(), object = k.GetDesignEntity()->GetFullName(),
                                  b = by->GetMsgName();
                const char* text = "The constraint %s is overridden on the design object %s by the constraint %s.\n";
                if (level > NORMAL)
                    Msg(__LINE__).issueError(text, a.c_str(), object.c_str(), b.c_str());
                else
                    Msg(__LINE__).issueWarning(text, a.c_str(), object.c_str(), b.c_str());
            }
        }
    }
    return true;
}

bool Ta_LunCSHelper::InvalidConstraintDrc(Cs_Constraint_Unsupported* constraint) {
    if (!constraint || constraint->GetKey().str() != "INVALID_CONSTRAINT:") return false;
    Cs_ConstraintMgr scratch;
    Cs_ReturnCode parsed = scratch.CreateConstraints(constraint->GetValue(), Cs_ConstraintSyntax::TEXT, nullptr);
    const Cs_SourceFile* where = constraint->GetSourceInfo()->GetSourceFile();
    const char* file = where && where->GetFile() ? where->GetFile() : "";
    const int line = where ? where->GetLine() : 0;
    for (const auto& status : parsed) {
        Port::StringBase<char> text;
        CreatePortString(status->GetLocalizedMsg().c_str(), text);
        Msg(__LINE__).issueError("\"%s\" Line %d: %s\n", file, line, text.c_str());
    }
    return true;
}
