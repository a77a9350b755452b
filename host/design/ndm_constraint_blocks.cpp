#include "host/design/ndm_constraint_blocks.h"

#include <cstring>
#include <string>
#include <vector>

#include "host/port/ut_str.h"

namespace {

int Slot(const char* type) {
    if (std::strcmp(type, "TIMESPEC") == 0) return 0;
    if (std::strcmp(type, "TIMEGRP") == 0) return 1;
    if (std::strcmp(type, "CONFIG") == 0) return 2;
    return -1;
}

// The text of holder's string property TYPE, or null.
const char* TypeOf(const Ndm_PropertyHolder* holder) {
    const Ndm_Property* p = holder ? holder->GetPropertyByName("TYPE") : nullptr;
    return p ? p->GetValueString() : nullptr;
}

}  // namespace

bool Ndm_ConstraintBlocks::IsUsable(const Ndm_Block* block, const char* type) const {
    const char* block_type = TypeOf(block);
    if (!block_type || std::strcmp(block_type, type) != 0) return false;
    return !ucf_ || block->GetPropertyByName("UCF") != nullptr;
}

Ndm_Block* Ndm_ConstraintBlocks::Find(Ndm_Block* block, const char* type) const {
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

Ndm_Block* Ndm_ConstraintBlocks::Get(Ndm_Block* top, const char* type) {
    if (!top || !type) return nullptr;
    const int slot = Slot(type);
    Ndm_Block* found = slot >= 0 ? handed_out_[slot] : nullptr;
    if (found && !(found->GetParent() && IsUsable(found, type))) found = nullptr;
    if (!found && IsUsable(top, type)) found = top;
    if (!found) {
        for (Ndm_Block* child : top->GetBlockItr())
            if ((found = Find(child, type))) break;
    }
    if (!found) {
        std::string name = std::string(top->GetName()) + "_" + type + (ucf_ ? "_UCF" : "_NCF");
        found = top->CreateBlock(name.c_str(), 0);
        if (!found) return nullptr;
        found->CreatePropertyString("TYPE", type);
        if (ucf_) found->CreatePropertyBool("UCF");
    }
    if (!found->GetPropertyByName("TERMINAL")) found->CreatePropertyBool("TERMINAL");
    if (slot >= 0 && found != top) handed_out_[slot] = found;
    return found;
}

void Ndm_ConstraintBlocks::Forget() {
    for (Ndm_Block*& b : handed_out_) b = nullptr;
}

bool Ndm_AddTimingEntry(Ndm_PropertyHolder* block, const char* name, const char* value) {
    const char* type = TypeOf(block);
    if (!type || (std::strcmp(type, "TIMESPEC") != 0 && std::strcmp(type, "TIMEGRP") != 0)) return false;
    Ndm_Property* list = block->GetPropertyByName(type);
    if (!list) list = block->CreatePropertyList(type);
    return list->CreatePropertyString(name, value) != nullptr;
}

void Ndm_ReplaceSetting(Ndm_PropertyHolder* block, const char* name, const char* value) {
    for (bool again = true; again;) {
        again = false;
        for (Ndm_Property* p : block->GetPropertyItr()) {
            if (UT_STR::ICompare(p->GetName(), name) == 0) {
                block->DeleteProperty(p);
                again = true;
                break;
            }
        }
    }
    block->CreatePropertyString(name, value);
}
