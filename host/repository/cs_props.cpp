// Write-back of the repository's typed constraints onto a view (properties of objects, timing
// entries and settings of the constraint blocks), and take-in of constraint properties found
// on a view.
#include <cstring>

#include "host/design/ndm.h"
#include "host/design/ndm_constraint_blocks.h"
#include "host/filter/prop_attach.h"
#include "host/parser/pr_block_texts.h"
#include "host/parser/pr_logical.h"
#include "host/port/msgman.h"
#include "host/repository/cs_mgr.h"

std::unique_ptr<Cs_Constraint> Cs_MakeConstraint(const Cs_ConstraintType& type);

namespace {

// Attaches name = value (a flag when value is null) to object through the filter, as the
// annotators do: a temporary list, the filter's verdict, the name recorded in FROM_UCF.
bool Attach(Ndh_PropInFilter& filter, Ndm_PropertyHolder* object, const char* name, const char* value,
            Cs_ReturnCode& outcome, const Cs_Constraint& c) {
    Ndh_PropFiltResult verdict = Ndh_FilterOnto(filter, object, [&](Ndm_Property* list) {
        if (value)
            list->CreatePropertyString(name, value);
        else
            list->CreatePropertyBool(name);
    });
    if (verdict.BadPropName() || verdict.BadDataType()) {
        outcome.Add(std::make_shared<Cs_Status_Resolution>(
            Cs_StatusID::NO_RESOLVED_ASSOCIATIONS, Cs_Status::WARNING, 82,
            Port_Format("%s cannot be written on %s: the property filter refuses it.", c.GetMsgName().c_str(),
                        object->GetFullName().c_str()),
            &c));
        return false;
    }
    Ndh_RecordConstraintName(object, "FROM_UCF", name);
    return true;
}

// The view that holds a design object.
const Ndm_View* ViewOf(const Ndm_PropertyHolder* object) {
    switch (object->GetKind()) {
        case Ndm_ObjKind::Block: return static_cast<const Ndm_Block*>(object)->GetView();
        case Ndm_ObjKind::Network: return static_cast<const Ndm_Network*>(object)->GetView();
        case Ndm_ObjKind::Signal: return static_cast<const Ndm_Signal*>(object)->GetBlock()->GetView();
        case Ndm_ObjKind::Pin: return static_cast<const Ndm_Pin*>(object)->GetBlock()->GetView();
        default: return nullptr;
    }
}

}  // namespace

Cs_ReturnCode Cs_ConstraintMgr::WriteConstraintProps(const Cs_DesignRegion& region) const {
    Cs_ReturnCode outcome;
    const Ndm_View* view = region.GetView();
    if (!view) return outcome;
    Ndh_PropInFilter filter("ucf.prp", nullptr);
    ConstraintBlocks blocks;
    auto write = [&](const Cs_Constraint& c) {
        // Attributes without a class are the bridge's to attach.
        if (c.GetType() == Cs_Constraint_Unsupported::Type()) return;
        if (Ndm_Block* block = GetConstraintBlock(c, view, blocks)) {
            if (c.GetBlock() != Cs_Block::Config)
                Ndm_AddTimingEntry(block, c.GetEntryName(), c.GetStoredText());
            else if (Pr_IsBankVoltage(c.GetEntryName()))
                Ndm_ReplaceSetting(block, c.GetEntryName(), c.GetStoredText());
            else
                Attach(filter, block, c.GetEntryName(), c.GetStoredText(), outcome, c);
            return;
        }
        if (c.IsAssociationExempt()) return;
        for (Ndm_PropertyHolder* object : c.GetAssociatedDesignObjs())
            if (ViewOf(object) == view)
                Attach(filter, object, c.GetAttribute(), c.IsFlag() ? nullptr : c.GetValueText(), outcome, c);
    };
    ForEach(write);
    return outcome;
}

bool Cs_ConstraintMgr::IsFromNcf(const Cs_Constraint& c) const {
    const Cs_SourceFile* where = c.GetSourceInfo()->GetSourceFile();
    if (!where) return false;
    for (const Source& s : sources_)
        if (std::strcmp(s.info->GetFileName(), where->GetFile()) == 0)
            return s.info->GetSyntax() == Cs_ConstraintSyntax::NCF;
    return false;
}

Ndm_Block* Cs_ConstraintMgr::GetConstraintBlock(const Cs_Constraint& c, const Ndm_View* view,
                                                ConstraintBlocks& blocks) const {
    if (!view) view = design_ ? design_->GetWorkView() : nullptr;
    if (!view || c.GetBlock() == Cs_Block::None) return nullptr;
    return (IsFromNcf(c) ? blocks.ncf : blocks.ucf).Get(view->GetBlock(), Cs_BlockWord(c.GetBlock()));
}

Cs_ConstraintMgr::PropReplaceResults Cs_ConstraintMgr::ReplaceConstraintsFromProps(const Cs_DesignRegion& region) {
    PropReplaceResults results;
    const Ndm_View* view = region.GetView();
    if (!view || !view->GetBlock()) return results;
    Ndh_PropInFilter filter("ucf.prp", nullptr);
    // The object's full name is made only for an object with constraint properties: full names
    // grow with the depth of the hierarchy.
    std::string name;
    auto take = [&](Ndm_PropertyHolder* object, Cs_Scope scope) {
        name.clear();
        for (Ndm_Property* p : object->GetPropertyItr()) {
            const char* key = p->GetName();
            if (filter.CanonicalName(key).empty()) continue;
            if (name.empty()) name = object->GetFullName();
            std::vector<std::string> values;
            bool flag = false;
            switch (p->GetType()) {
                case NDM_PROP_STRING: values.push_back(p->GetValueString()); break;
                case NDM_PROP_STRING_LIST: values = p->GetStrings(); break;
                case NDM_PROP_INT32: values.push_back(std::to_string(p->GetInt32())); break;
                case NDM_PROP_FLOAT64: values.push_back(Port_Format("%.17g", p->GetFloat64())); break;
                case NDM_PROP_BOOL:
                    if (!p->GetBool()) continue;
                    flag = true;
                    values.push_back("");
                    break;
                default: continue;
            }
            for (const std::string& v : values) {
                std::unique_ptr<Cs_Constraint> c = Cs_MakeConstraint(Cs_Constraint_Unsupported::Type());
                c->scope_ = scope;
                c->flag_ = flag;
                c->target_ = Text(name);
                c->key_ = Text(key);
                c->value_ = Text(v);
                c->statement_ = Text(std::string(Cs_ScopeWord(scope)) + " \"" + name + "\" " + key +
                                     (flag ? std::string() : " = " + v));
                loose_.push_back(std::move(c));
            }
            results.properties_.push_back(p);
        }
    };
    std::vector<Ndm_Block*> stack{view->GetBlock()};
    while (!stack.empty()) {
        Ndm_Block* b = stack.back();
        stack.pop_back();
        if (b->GetParent() && !b->GetPropertyByName("TYPE")) take(b, Cs_Scope::Instance);
        for (Ndm_Pin* pin : b->GetPinItr()) take(pin, Cs_Scope::Pin);
        auto children = b->GetBlockItr();
        for (size_t i = children.size(); i-- > 0;) stack.push_back(children[i]);
    }
    for (Ndm_Network* n : view->GetNetworkItr()) take(n, Cs_Scope::Net);
    Changed();
    return results;
}
