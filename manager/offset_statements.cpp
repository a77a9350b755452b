// Ta_LunMgr: the four OFFSET statement forms, stored as entries of the TIMESPEC block.
#include <string>

#include "host/parser/pr_block_texts.h"
#include "host/port/msgman.h"
#include "manager/lunmgr.h"
#include "manager/statement_messages.h"

using lunmgr::Msg;

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
    WarnNamesLost(handle, {clock});
    Pr_BlockEntry entry = Pr_OffsetEntry(nullptr, in, time, valid, before, clock, nullptr, level);
    RecordOffset(entry.name.c_str(), entry.value, false, false, handle);
    return true;
}

bool Ta_LunMgr::cb_roffset(bool in, double time, const double* valid, bool before, const char* clock,
                           const char* regs, const char* level, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::roffset: line %I: %s", handle);
    if (second_pass) return true;
    WarnNamesLost(handle, {clock, regs});
    Pr_BlockEntry entry = Pr_OffsetEntry(nullptr, in, time, valid, before, clock, regs, level);
    RecordOffset(entry.name.c_str(), entry.value, false, false, handle);
    return true;
}

bool Ta_LunMgr::cb_toffset(const char* group, bool in, double time, const double* valid, bool before,
                           const char* clock, const char* level, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::toffset:line %I: %s", handle);
    if (second_pass) return true;
    WarnNamesLost(handle, {group, clock});
    Pr_BlockEntry entry = Pr_OffsetEntry(group, in, time, valid, before, clock, nullptr, level);
    RecordOffset(entry.name.c_str(), entry.value, true, true, handle);
    return true;
}

bool Ta_LunMgr::cb_troffset(const char* group, bool in, double time, const double* valid, bool before,
                            const char* clock, const char* regs, const char* level,
                            const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::troffset:line %I; %s", handle);
    if (second_pass) return true;
    WarnNamesLost(handle, {group, clock, regs});
    Pr_BlockEntry entry = Pr_OffsetEntry(group, in, time, valid, before, clock, regs, level);
    RecordOffset(entry.name.c_str(), entry.value, true, false, handle);
    return true;
}
