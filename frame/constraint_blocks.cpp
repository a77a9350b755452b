// Ta_LunBase: the TIMESPEC, TIMEGRP and CONFIG constraint blocks, timing entries, and the
// edge and constraint-kind names.
#include "frame/lunbase.h"
#include "host/design/ndm_constraint_blocks.h"
#include "host/parser/pr_block_texts.h"
#include "host/port/msgman.h"

Ndm_Block* Ta_LunBase::FindConstraintBlock(Ndm_Block* block, const char* type) { return blocks_.Find(block, type); }

Ndm_Block* Ta_LunBase::GetConstraintBlock(const char* type) {
    Ndm_Block* found = blocks_.Get(view ? view->GetBlock() : nullptr, type);
    if (!found) {
        Port_MsgManData::createObject("Quillmap", "lunbase", __LINE__, "1.0")
            .issueFatal(2, "Could not create timing block!\n");
    }
    return found;
}

unsigned char Ta_LunBase::AttachTimeConstraint(const char* name, const char* value,
                                               Ndm_PropertyHolder* block) {
    return Ndm_AddTimingEntry(block, name, value) ? 1 : 0;
}

const char* Ta_LunBase::GetEdgeString(PR_EDGE edge) { return Pr_EdgeText(edge); }

const char* Ta_LunBase::GetConstraintName(Pr_Logical_ConstraintType type) {
    static const char* const kKinds[] = {"BASE", "STRING", "STRING_LIST_TYPE", "INIT_", "OFFSET", "PERIOD"};
    int i = static_cast<int>(type);
    return (i >= 0 && i < 6) ? kKinds[i] : nullptr;
}
