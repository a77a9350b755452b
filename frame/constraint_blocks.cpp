// Ta_LunBase: the TIMESPEC, TIMEGRP and CONFIG constraint blocks, timing entries, and the
// edge and constraint-kind names.
#include "frame/lunbase.h"
#include "host/filter/prop_filter.h"
#include "host/port/msgman.h"
#include "host/port/ut_str.h"

namespace {
int CacheSlot(const char* type) {
    if (UT_STR::Compare(type, "TIMESPEC") == 0) return 0;
    if (UT_STR::Compare(type, "TIMEGRP") == 0) return 1;
    if (UT_STR::Compare(type, "CONFIG") == 0) return 2;
    return -1;
}
}  // namespace

bool Ta_LunBase::IsUsable(Ndm_Block* block, const char* type) const {
    const char* block_type = Ndh_PropUtil::GetStringProp(block, "TYPE");
    if (!block_type || UT_STR::Compare(block_type, type) != 0) return false;
    return file_type != CP_UCF || block->GetPropertyByName("UCF") != nullptr;
}

Ndm_Block* Ta_LunBase::FindConstraintBlock(Ndm_Block* block, const char* type) {
    if (!block) return nullptr;
    // Pre-order with an explicit stack: deep hierarchies never exhaust the call stack.
    std::vector<Ndm_Block*> stack{block};
    while (!stack.empty()) {
        Ndm_Block* b = stack.back();
        stack.pop_back();
        if (IsUsable(b, type)) return b;
        auto children = b->GetBlockItr();
        for (size_t i = children.size(); i-- > 0;) stack.push_back(children[i]);
    }
    return nullptr;
}

Ndm_Block* Ta_LunBase::GetConstraintBlock(const char* type) {
    Ndm_Block* top = view ? view->GetBlock() : nullptr;
    if (!top) {
        Port_MsgManData::createObject("Quillmap", "lunbase", __LINE__, "1.0")
            .issueFatal(2, "Could not create timing block!\n");
    }
    // Within one run only this annotator makes constraint blocks, so a block found once stays
    // the first usable one in pre-order while it is still in place and usable.
    int slot = CacheSlot(type);
    Ndm_Block* found = slot >= 0 ? block_cache_[slot] : nullptr;
    if (found && !(found->GetParent() && IsUsable(found, type))) found = nullptr;
    if (!found && IsUsable(top, type)) found = top;
    if (!found) {
        for (Ndm_Block* child : top->GetBlockItr()) {
            if ((found = FindConstraintBlock(child, type))) break;
        }
    }
    if (!found) {
        char* name = zepform("%s_%s%s", top->GetName(), type, file_type == CP_UCF ? "_UCF" : "_NCF");
        found = top->CreateBlock(name, 0);
        delete[] name;
        if (!found) {
            Port_MsgManData::createObject("Quillmap", "lunbase", __LINE__, "1.0")
                .issueFatal(2, "Could not create timing block!\n");
        }
        found->CreatePropertyString("TYPE", type);
        if (file_type == CP_UCF) found->CreatePropertyBool("UCF");
    }
    if (!found->GetPropertyByName("TERMINAL")) found->CreatePropertyBool("TERMINAL");
    if (slot >= 0 && found != top) block_cache_[slot] = found;
    return found;
}

unsigned char Ta_LunBase::AttachTimeConstraint(const char* name, const char* value,
                                               Ndm_PropertyHolder* block) {
    const char* type = block ? Ndh_PropUtil::GetStringProp(block, "TYPE") : nullptr;
    if (!type || (UT_STR::Compare(type, "TIMESPEC") != 0 && UT_STR::Compare(type, "TIMEGRP") != 0))
        return 0;
    Ndm_Property* list = block->GetPropertyByName(type);
    if (!list) list = block->CreatePropertyList(type);
    return list->CreatePropertyString(name, value) ? 1 : 0;
}

const char* Ta_LunBase::GetEdgeString(PR_EDGE edge) {
    static const char* const kEdges[] = {"RISING", "FALLING", "TRANSHI", "TRANSLO", ""};
    int i = static_cast<int>(edge);
    return (i >= 0 && i < 5) ? kEdges[i] : nullptr;
}

const char* Ta_LunBase::GetConstraintName(Pr_Logical_ConstraintType type) {
    static const char* const kKinds[] = {"BASE", "STRING", "STRING_LIST_TYPE", "INIT_", "OFFSET", "PERIOD"};
    int i = static_cast<int>(type);
    return (i >= 0 && i < 6) ? kKinds[i] : nullptr;
}
