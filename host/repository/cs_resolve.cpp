// Resolution: which design objects each constraint names, which constraints and groups it
// refers to, and which later constraints override it.
#include <cstring>
#include <map>
#include <string>
#include <unordered_map>

#include "host/design/ndm.h"
#include "host/design/ndm_lookup.h"
#include "host/filter/prop_filter.h"
#include "host/port/msgman.h"
#include "host/repository/cs_mgr.h"

namespace {


// The kind word of the property filter for the objects a scope's constraints sit on.
const char* FilterKind(Cs_Scope scope) {
    switch (scope) {
        case Cs_Scope::Instance: return "inst";
        case Cs_Scope::Net: return "net";
        case Cs_Scope::Pin: return "pin";
        default: return "config";  // design-wide settings, area-group and set attributes
    }
}

// Constraints that add to the earlier ones rather than override them: attributes the
// repository's property definitions (ucf.prp) keep every value of, and the timing entries
// that a TIMESPEC block lists side by side (global offsets, ENABLE, DISABLE).
bool Accumulates(const Ndh_PropInFilter& filter, const Cs_Constraint& c) {
    if (c.GetScope() == Cs_Scope::TimeSpec)
        for (const char* key : {"OFFSET", "ENABLE", "DISABLE"})
            if (std::strcmp(c.GetAttribute(), key) == 0) return true;
    return filter.KeepsEveryValue(c.GetAttribute(), FilterKind(c.GetScope()));
}

}  // namespace

Cs_ReturnCode Cs_ConstraintMgr::Resolve() {
    same_as_file_.clear();
    Cs_ReturnCode outcome;
    std::vector<Cs_Constraint*> all;
    object_lists_.clear();
    pending_.clear();
    ForEach([&](Cs_Constraint& c) {
        c.lazy_ = false;
        c.one_ = nullptr;
        c.many_ = nullptr;
        if (c.extra_) {
            c.extra_->conflicts.clear();
            c.extra_->constraints.clear();
            if (c.extra_->parent) c.extra_->constraints.push_back(c.extra_->parent);
        }
        all.push_back(&c);
    });

    // Groups and the constraints that define them, for the associations below.
    std::unordered_map<std::string, std::vector<const Cs_Constraint*>> groups;
    for (Cs_Constraint* c : all) {
        std::string_view group = Cs_DefinedGroup(*c);
        if (!group.empty()) groups[std::string(group)].push_back(c);
    }

    Ndm_View* view = design_ ? design_->GetWorkView() : nullptr;
    const Ndh_PropInFilter filter("ucf.prp", nullptr);
    // Names are found as the annotator of the source's file kind finds them: a UCF falls back
    // to other letter cases and tries ".PAD"; an NCF does neither.
    std::unique_ptr<Ndm_ObjectFinder> ucf_finder, ncf_finder;
    std::unordered_map<const char*, bool> ncf_file;
    for (const Source& s : sources_)
        ncf_file[texts_->Intern(s.info->GetFileName())] = s.info->GetSyntax() == Cs_ConstraintSyntax::NCF;
    Ndm_LookupReport silent;
    // The last constraint that set (object or design, attribute) and its value.
    std::map<std::pair<const void*, std::string>, const Cs_Constraint*> last;
    // Results per statement and name: the constraints of one statement share one lookup.
    std::string working;
    std::vector<Ndm_PropertyHolder*> found;
    const Cs_Constraint* previous = nullptr;
    for (Cs_Constraint* c : all) {
        const bool object = !c->IsAssociationExempt();
        if (object && view) {
            const Cs_SourceFile* where = c->source_.GetSourceFile();
            const bool ncf = where && ncf_file[where->GetFile()];
            std::unique_ptr<Ndm_ObjectFinder>& finder = ncf ? ncf_finder : ucf_finder;
            if (!finder) finder = std::make_unique<Ndm_ObjectFinder>(view, ncf, !ncf);
            const bool same = previous && previous->scope_ == c->scope_ && previous->target_ == c->target_ &&
                              previous->statement_ == c->statement_ &&
                              previous->source_.GetSourceFile() && where &&
                              previous->source_.GetSourceFile()->GetLine() == where->GetLine();
            if (same) {
                c->one_ = previous->one_;
                c->many_ = previous->many_;
            } else {
                switch (c->scope_) {
                    case Cs_Scope::Instance:
                        for (Ndm_Block* b : finder->Instances(c->target_, working, silent)) found.push_back(b);
                        break;
                    case Cs_Scope::Net:
                        for (Ndm_Signal* s : finder->Nets(c->target_, working, silent))
                            found.push_back(s->GetNetwork() ? static_cast<Ndm_PropertyHolder*>(s->GetNetwork()) : s);
                        break;
                    case Cs_Scope::Pin:
                        for (Ndm_Pin* p : finder->Pins(c->target_, working, silent)) found.push_back(p);
                        break;
                    default: break;
                }
                SetObjects(*c, found);
            }
            previous = c;
            if (c->GetAssociatedDesignObjs().empty()) {
                outcome.Add(std::make_shared<Cs_Status_Resolution>(
                    Cs_StatusID::NO_DESIGN_MATCH, Cs_Status::WARNING, 20,
                    Port_Format("%s matches no object of the design.", c->GetMsgName().c_str()), c));
            }
        }
        // Group references of TIMESPEC statements, groups and offsets.
        bool missing = false;
        for (const char* g : c->GetAssociatedPaths()) {
            auto it = groups.find(g);
            if (it == groups.end()) {
                missing = true;
                continue;
            }
            for (const Cs_Constraint* d : it->second)
                if (d != c) c->More().constraints.push_back(d);
        }
        if (missing && c->GetAssociatedConstraints().empty() && c->scope_ != Cs_Scope::Comment)
            outcome.Add(std::make_shared<Cs_Status_Resolution>(
                Cs_StatusID::NO_RESOLVED_ASSOCIATIONS, Cs_Status::INFO, 81,
                Port_Format("%s names no group that a constraint defines.", c->GetMsgName().c_str()), c));

        // Overrides: a later constraint setting the same attribute of the same object (or of
        // the design) to another value wins over the earlier one.
        if (c->scope_ == Cs_Scope::Comment || c->flag_ || Accumulates(filter, *c) ||
            std::strcmp(c->key_, "INVALID_CONSTRAINT:") == 0)
            continue;
        auto record = [&](const void* owner, Ndm_PropertyHolder* entity) {
            std::string key = std::string(Cs_ScopeWord(c->scope_)) + "\n" + c->target_ + "\n" + c->key_;
            if (entity) key = c->key_;
            auto [it, fresh] = last.try_emplace({owner, key}, c);
            if (fresh) return;
            const Cs_Constraint* earlier = it->second;
            if (std::strcmp(earlier->value_, c->value_) != 0)
                const_cast<Cs_Constraint*>(earlier)->More().conflicts.emplace_back(Cs_Conflict::OVERRIDE, entity, c);
            it->second = c;
        };
        if (object) {
            for (Ndm_PropertyHolder* o : c->GetAssociatedDesignObjs()) record(o, o);
        } else {
            record(nullptr, nullptr);
        }
    }
    resolution_ = outcome;
    return outcome;
}

void Cs_ConstraintMgr::SetObjects(Cs_Constraint& c, std::vector<Ndm_PropertyHolder*>& found) {
    c.one_ = found.size() == 1 ? found[0] : nullptr;
    c.many_ = nullptr;
    if (found.size() > 1) {
        object_lists_.push_back(std::move(found));
        object_lists_.back().shrink_to_fit();
        c.many_ = &object_lists_.back();
    }
    found.clear();
}
