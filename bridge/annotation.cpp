// Ta_LunCSHelper: annotation through the repository, and the attachment of the attributes it
// keeps as plain key and value.
#include <memory>
#include <span>
#include <string>

#include "bridge/bridge_messages.h"
#include "bridge/luncshelper.h"
#include "frame/lunbase.h"
#include "host/design/ndm.h"
#include "host/filter/prop_attach.h"
#include "host/parser/pr_logical.h"
#include "host/port/msgman.h"

using luncshelper::Msg;

namespace {

bool Matches(const Port::StringBase<char>& key, const char* word) {
    return key.Compare(word, Port::StringBase<char>::IGNORE_CASE) == 0;
}

// A ranged initialisation key: INIT_hh..hh (the dots at 7 and 8) or INITP_hh..hh (at 8 and 9).
bool IsRange(const std::string& key) {
    auto dots = [&](size_t at) { return key.size() > at + 1 && key[at] == '.' && key[at + 1] == '.'; };
    if (key.find("INIT_") != std::string::npos) return dots(7);
    if (key.find("INITP_") != std::string::npos) return dots(8);
    return false;
}

// The objects an attribute kept as text goes on: the constraint block of a design-wide one (a
// CONFIG PART on the CONFIG block, as the annotators store it; block holds it), else the
// objects it names.
std::span<Ndm_PropertyHolder* const> Targets(const Cs_ConstraintMgr& mgr, const Cs_Constraint& c,
                                             Cs_ConstraintMgr::ConstraintBlocks& blocks, Ndm_PropertyHolder*& block) {
    block = mgr.GetConstraintBlock(c, nullptr, blocks);
    if (block) return {&block, 1};
    return c.GetAssociatedDesignObjs();
}

// Loads several files into mgr: each is removed and added again inside one bulk bracket, then
// all are read; status_per_file tells whether each is announced as a status or a trace line.
Cs_ReturnCode Load(Cs_ConstraintMgr& mgr, Util_FNameGroup* files, int count, const char* multi_trace,
                   bool status_per_file) {
    Port_MsgManData::debugStub(multi_trace, count);
    mgr.SetBulkConstraintMode(true);
    for (int i = 0; i < count; ++i) {
        const char* file = files->get_fname(static_cast<uint16_t>(i));
        if (!file) continue;
        if (status_per_file)
            Msg(__LINE__).issueStatus("Annotating constraints to design from ucf file \"%s\" ...\n", file);
        else
            Port_MsgManData::debugStub("Annotating constraints to design from ucf file \"%s\" ...\n", file);
        mgr.RemoveConstraintSource(file);
        mgr.AddConstraintSource(file, Cs_ConstraintSyntax::UCF);
    }
    mgr.SetBulkConstraintMode(false);
    return mgr.UpdateConstraintsFromSource();
}

}  // namespace

bool Ta_LunCSHelper::Annotate(Util_FNameGroup* files, int count, bool useFilter) {
    Cs_ReturnCode outcome;
    if (count == 1 && files) {
        if (const char* file = files->get_fname(0)) {
            Msg(__LINE__).issueStatus("Annotating constraints to design from ucf file \"%s\" ...\n", file);
            Port_MsgManData::debugStub("Replacing Constraints from file %s\n", file);
            outcome = m_cmgr->ReplaceConstraintsFromFile(file, Cs_ConstraintSyntax::UCF);
        }
    } else if (count >= 2 && files) {
        outcome = Load(*m_cmgr, files, count, "Annotate constraints -- multiple ucf files (%d)\n", true);
    }
    if (outcome && outcome.GetUnexpectedCount() != 0)
        outcome.GetUnexpectedStatusObjs().Report();
    else if (!outcome)
        outcome.Report();
    if (!useFilter) return true;

    Port_MsgManData::debugStub("Using property filter for attributes\n");
    Cs_Filter_ConstraintType filter(Cs_Constraint_Unsupported::Type());
    Cs_ConstraintMgr::ConstraintBlocks blocks;
    Ndm_PropertyHolder* block = nullptr;
    for (Cs_Constraint* c : m_cmgr->GetConstraints(filter, Cs_ConstraintMgr::ACTIVE)) {
        auto* u = static_cast<Cs_Constraint_Unsupported*>(c);
        if (InvalidConstraintDrc(u)) continue;
        const auto objects = Targets(*m_cmgr, *u, blocks, block);
        if (objects.empty())
            Msg(__LINE__).issueError("Could not find any associations for the following constraint:\n    '%s'\n",
                                     u->GetMsgName().c_str());
        for (Ndm_PropertyHolder* object : objects) {
            const Cs_SourceFile* where = u->GetSourceInfo()->GetSourceFile();
            if (where)
                Port_MsgManData::debugStub("%s was read from file %s line: %i\n", u->GetType().GetName(),
                                           where->GetFile(), where->GetLine());
            AttachUnsupportedConstraint(u, where, object);
        }
    }
    return true;
}

bool Ta_LunCSHelper::AnnotateSpecificUnsupportedType(Util_FNameGroup* files, int count,
                                                     const Port::StringBase<char>& key) {
    if (!files || count == 0) return false;
    std::unique_ptr<Cs_ConstraintMgr> scratch(m_cmgr->CreateScratchPad());
    if (count == 1) {
        const char* file = files->get_fname(0);
        if (!file) return false;
        Port_MsgManData::debugStub("Annotate %s constraints from %s\n", key.c_str(), file);
        scratch->LoadConstraints(file, Cs_ConstraintSyntax::UCF);
    } else {
        Load(*scratch, files, count, "AnnotateSpecificUnsupportedType -- multiple ucf files (%d)\n", false);
    }
    m_attachBufferType = true;
    Cs_Filter_ConstraintType filter(Cs_Constraint_Unsupported::Type());
    Cs_ConstraintMgr::ConstraintBlocks blocks;
    Ndm_PropertyHolder* block = nullptr;
    for (Cs_Constraint* c : scratch->GetConstraints(filter, Cs_ConstraintMgr::ACTIVE)) {
        auto* u = static_cast<Cs_Constraint_Unsupported*>(c);
        if (!(u->GetKey() == key)) {
            Port_MsgManData::debugStub("Skipping %s\n", u->GetKey().c_str());
            continue;
        }
        for (Ndm_PropertyHolder* object : Targets(*scratch, *u, blocks, block)) {
            const Cs_SourceFile* where = u->GetSourceInfo()->GetSourceFile();
            if (where)
                Port_MsgManData::debugStub("%s was read from file %s line: %i\n", u->GetType().GetName(),
                                           where->GetFile(), where->GetLine());
            Port_MsgManData::debugStub("Attaching %s\n", key.c_str());
            AttachUnsupportedConstraint(u, where, object);
        }
    }
    m_attachBufferType = false;
    scratch->DeleteAllConstraints();
    return true;
}

bool Ta_LunCSHelper::GetPartAndSteppingFromUCF(Util_FNameGroup* files, int count, Port::StringBase<char>& part,
                                               Port::StringBase<char>& stepping) {
    Cs_ReturnCode outcome;
    if (count >= 2 && files) {
        Port_MsgManData::debugStub("GetPartAndStepping -- multiple (%d) ucf files\n", count);
        for (int i = 0; i < count; ++i)
            if (const char* file = files->get_fname(static_cast<uint16_t>(i)))
                outcome = m_cmgr->AddConstraintSource(file, Cs_ConstraintSyntax::UCF);
        outcome = m_cmgr->UpdateConstraintsFromSource();
    } else if (count == 1 && files && files->get_fname(0)) {
        m_cmgr->ReplaceConstraintsFromFile(files->get_fname(0), Cs_ConstraintSyntax::UCF);
    }
    if (!outcome.Successful()) {
        outcome.Report();
        return false;
    }
    for (Cs_Constraint* c : m_cmgr->GetConstraints(Cs_ConstraintMgr::ACTIVE)) {
        if (c->GetType() == Cs_Constraint_Unsupported::Type()) {
            auto* u = static_cast<Cs_Constraint_Unsupported*>(c);
            if (Matches(u->GetKey(), "PART")) {
                Port_MsgManData::debugStub("Found PART property in UCF.\n");
                part = u->GetValue();
            }
        } else if (c->GetType() == Cs_Constraint_Stepping::Type()) {
            stepping = static_cast<Cs_Constraint_Stepping*>(c)->GetValue();
        }
    }
    return true;
}

bool Ta_LunCSHelper::AttachUnsupportedConstraint(Cs_Constraint_Unsupported* constraint,
                                                 const Cs_SourceFile* sourceFile, Ndm_PropertyHolder* object) {
    Port::StringBase<char> key = constraint->GetKey();
    std::string value = constraint->GetValue().str();
    if (Matches(key, "BUFFER_TYPE") && !m_attachBufferType) return true;
    Check_Buffer_Type(constraint, sourceFile, object, "UCF");
    if (Matches(key, "ROUTE")) std::erase(value, ' ');
    Port_MsgManData::debugStub("Unsupported Constraint %s : %s\n", key.c_str(), value.c_str());
    if (IsRange(key.str())) {
        Pr_Logical_InitRangeConstraint range(Pr_Logical_Constraint::INIT_, key.c_str(), value.c_str());
        for (auto it = range.begin_name(); it != range.end_name(); ++it)
            if (!AttachConstraint(*it, range.get_constraint_value(), object, sourceFile)) return false;
        return true;
    }
    return AttachConstraint(key.c_str(), value.c_str(), object, sourceFile);
}

bool Ta_LunCSHelper::AttachConstraint(const char* name, const char* value, Ndm_PropertyHolder* object,
                                      const Cs_SourceFile* sourceFile) {
    if (!object) return false;
    Ndh_PropFiltResult result =
        Ndh_FilterOnto(*m_filter, object, [&](Ndm_Property* list) { list->CreatePropertyString(name, value); });
    if (!ConstraintDRC(result, name, sourceFile)) return false;
    return AddConstraintToList(name, object);
}

bool Ta_LunCSHelper::AddConstraintToList(const char* name, Ndm_PropertyHolder* object) {
    if (object) Ndh_RecordConstraintName(object, "FROM_UCF", name);
    return true;
}

bool Ta_LunCSHelper::ConstraintDRC(const Ndh_PropFiltResult& result, const char* name,
                                   const Cs_SourceFile* sourceFile) {
    const char* file = sourceFile && sourceFile->GetFile() ? sourceFile->GetFile() : "<not avail>";
    const int line = sourceFile ? sourceFile->GetLine() : -999;
    return Ta_LunReportVerdict(result, name, file, line, "luncshelper") != 0;
}

bool Ta_LunCSHelper::Check_Buffer_Type(Cs_Constraint_Unsupported* constraint, const Cs_SourceFile* sourceFile,
                                       Ndm_PropertyHolder* object, const char* fileKind) {
    if (!constraint || constraint->GetKey().str() != "BUFFER_TYPE") return false;
    const char* file = sourceFile && sourceFile->GetFile() ? sourceFile->GetFile() : "<not avail>";
    const int line = sourceFile ? sourceFile->GetLine() : -999;
    if (object)
        Msg(__LINE__).issueError(luncshelper::kBufferTypeOnInstance, object->GetName(), fileKind, file, line, fileKind);
    else
        Msg(__LINE__).issueError(luncshelper::kBufferType, fileKind, file, line, fileKind);
    return true;
}
