// Ta_LunMgr: the four OFFSET statement forms, stored as entries of the TIMESPEC block.
#include <string>

#include "host/port/msgman.h"
#include "manager/lunmgr.h"
#include "manager/statement_messages.h"

using lunmgr::LineOf;
using lunmgr::Msg;
using lunmgr::TextOf;

namespace {

std::string ValidPart(const double* valid) {
    return valid ? Port_Format(" %s %f %s", "VALID", *valid, "pS") : std::string();
}
std::string LevelPart(const char* level) { return level ? Port_Format(" %s", level) : std::string(); }
}  // namespace

void Ta_LunMgr::RecordOffset(const char* entry, const std::string& value, bool generated, bool with_line,
                             const Pr_Logical_ConstraintHandle* handle) {
    Ndm_Block* block = GetConstraintBlock("TIMESPEC");
    if (generated) {
        // A generated name already among the block's timing entries is a second offset for the
        // same group, direction and clock.
        Ndm_Property* list = block->GetPropertyByName("TIMESPEC");
        if (block->GetPropertyByName(entry) || (list && list->GetEntryByName(entry))) {
            if (with_line)
                Msg(__LINE__).issueWarning("Line %i in '%s': Duplicate OFFSET properties named '%s'\n",
                                           handle ? handle->getline() : 0, constraint_filename, entry);
            else
                Msg(__LINE__).issueInternal("duplicate OFFSET properties named '%s'\n", entry);
        }
    }
    AttachTimeConstraint(entry, value.c_str(), block);
}

bool Ta_LunMgr::cb_offset(bool in, double time, const double* valid, bool before, const char* clock,
                          const char* level, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::offset:line %I: %s", handle);
    if (second_pass) return true;
    RecordOffset("OFFSET",
                 Port_Format("%s %f %s%s %s %s%s", in ? "IN" : "OUT", time, "pS", ValidPart(valid).c_str(),
                             before ? "BEFORE" : "AFTER", clock, LevelPart(level).c_str()),
                 false, false, handle);
    return true;
}

bool Ta_LunMgr::cb_roffset(bool in, double time, const double* valid, bool before, const char* clock,
                           const char* regs, const char* level, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::roffset: line %I: %s", handle);
    if (second_pass) return true;
    RecordOffset("OFFSET",
                 Port_Format("%s %f %s%s %s %s TIMEGRP %s%s", in ? "IN" : "OUT", time, "pS",
                             ValidPart(valid).c_str(), before ? "BEFORE" : "AFTER", clock, regs,
                             LevelPart(level).c_str()),
                 false, false, handle);
    return true;
}

bool Ta_LunMgr::cb_toffset(const char* group, bool in, double time, const double* valid, bool before,
                           const char* clock, const char* level, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::toffset:line %I: %s", handle);
    if (second_pass) return true;
    std::string entry = Port_Format("TSO_%s_%s_%s", group, in ? "in" : "out", clock);
    RecordOffset(entry.c_str(),
                 Port_Format("TIMEGRP %s OFFSET = %s %f %s%s %s %s%s", group, in ? "IN" : "OUT", time, "pS",
                             ValidPart(valid).c_str(), before ? "BEFORE" : "AFTER", clock,
                             LevelPart(level).c_str()),
                 true, true, handle);
    return true;
}

bool Ta_LunMgr::cb_troffset(const char* group, bool in, double time, const double* valid, bool before,
                            const char* clock, const char* regs, const char* level,
                            const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::troffset:line %I; %s", handle);
    if (second_pass) return true;
    std::string entry = Port_Format("TSO_%s_%s_%s_%s", group, in ? "in" : "out", clock, regs);
    RecordOffset(entry.c_str(),
                 Port_Format("TIMEGRP %s OFFSET = %s %f %s%s %s %s TIMEGRP %s%s", group, in ? "IN" : "OUT", time,
                             "pS", ValidPart(valid).c_str(), before ? "BEFORE" : "AFTER", clock, regs,
                             LevelPart(level).c_str()),
                 true, false, handle);
    return true;
}
