// Building a repository from the rows of its file, and looking up the design objects of
// restored constraints when they are first asked for.
#include <algorithm>
#include <cstring>
#include <string>

#include "host/design/ndm.h"
#include "host/design/ndm_lookup.h"
#include "host/repository/cs_mgr.h"
#include "host/repository/cs_rows.h"

std::unique_ptr<Cs_Constraint> Cs_MakeConstraint(const Cs_ConstraintType& type);

namespace {

const char* Kept(std::string_view text) { return text.data() ? text.data() : ""; }

// The object of the view of a kind and full name, or null.
Ndm_PropertyHolder* FindObject(Ndm_View* view, Cs_Rows::Object kind, const char* full_name) {
    using Cs_Rows::Object;
    if (!view || !view->GetBlock()) return nullptr;
    Ndm_Block* top = view->GetBlock();
    Ndm_LookupReport silent;
    const bool flat = std::strchr(full_name, '/') == nullptr;
    auto path = [&] { return std::string(top->GetName()) + "/" + full_name; };
    switch (kind) {
        case Object::Block:
            if (!*full_name) return top;
            if (Ndm_Block* b = flat ? top->GetBlockByName(full_name) : nullptr) return b;
            return Ndm_Lookup::FindBlockPath(top, path(), true, silent);
        case Object::Network:
        case Object::Signal: {
            Ndm_Signal* s = flat ? top->GetSignalByName(full_name)
                                 : Ndm_Lookup::FindSignalPath(top, path().c_str(), true, silent);
            if (!s || kind == Object::Signal) return s;
            return s->GetNetwork();
        }
        case Object::Pin:
            if (Ndm_Pin* p = top->GetPinByName(full_name)) return p;
            return Ndm_Lookup::FindPinPath(top, path().c_str(), true, silent);
        default: return nullptr;
    }
}

}  // namespace

void Cs_Constraint::FindPending() const {
    // This constraint is done with, even when none of the rows left is its own.
    auto* self = const_cast<Cs_Constraint*>(this);  // constraints are made mutable, handed out const
    Cs_ConstraintMgr* mgr = self->pending_;
    self->lazy_ = false;
    self->many_ = nullptr;
    mgr->FindPendingObjects();
}

void Cs_ConstraintMgr::FindPendingObjects() {
    std::vector<PendingObject> rows;
    rows.swap(pending_);
    for (const PendingObject& r : rows) {
        r.constraint->lazy_ = false;
        r.constraint->many_ = nullptr;
    }
    Ndm_View* view = design_ ? design_->GetWorkView() : nullptr;
    // The rows of one constraint come together; the constraints of one statement that found
    // the same objects share one list, as after a resolution.
    Cs_Constraint* filling = nullptr;
    const Cs_Constraint* filled = nullptr;
    std::vector<Ndm_PropertyHolder*> found;
    auto flush = [&] {
        if (!filling) return;
        const auto before = filled ? filled->GetAssociatedDesignObjs() : std::span<Ndm_PropertyHolder* const>();
        if (filled && found.size() > 1 && filled->statement_ == filling->statement_ &&
            std::equal(found.begin(), found.end(), before.begin(), before.end())) {
            filling->many_ = filled->many_;
            found.clear();
        } else {
            SetObjects(*filling, found);
        }
        filled = filling;
        filling = nullptr;
    };
    for (const PendingObject& r : rows) {
        Ndm_PropertyHolder* o = FindObject(view, static_cast<Cs_Rows::Object>(r.kind), r.name);
        if (r.conflict) {
            if (o)  // an object the design no longer has: no conflict on it
                r.constraint->More().conflicts.emplace_back(static_cast<Cs_Conflict::CONFLICTTYPE>(r.conflict), o,
                                                            r.by);
            continue;
        }
        if (r.constraint != filling) flush();
        if (o) {
            filling = r.constraint;
            found.push_back(o);
        }
    }
    flush();
}

namespace Cs_Rows {

Builder::Builder(Cs_ConstraintMgr& target, Cs_ConstraintMgr& staged, bool same_design)
    : target_(target), staged_(staged), view_(target.design_ && target.design_->GetWorkView()),
      same_design_(same_design) {}

bool Builder::Fail(const char* why) {
    why_ = std::string("it is damaged (") + why + ")";
    return false;
}

Cs_Constraint* Builder::ById(int64_t id) const {
    return id >= 1 && static_cast<size_t>(id) <= constraints_.size() ? constraints_[id - 1] : nullptr;
}

bool Builder::Add(const Source& row) {
    Cs_ConstraintMgr::Source& s = staged_.AddSource(std::string(row.file), static_cast<int>(row.syntax));
    if (staged_.sources_.size() != source_files_.size() + 1) return Fail("a file is listed twice");
    s.info->hash_ = row.hash;
    s.info->size_ = row.size;
    s.info->read_ = row.read;
    source_files_.push_back(staged_.Text(s.info->GetFileName()));
    return true;
}

bool Builder::Add(const Constraint& row) {
    if (!row.type) return Fail("unknown constraint kind");
    if (row.id != static_cast<int64_t>(constraints_.size()) + 1) return Fail("constraints out of order");
    std::unique_ptr<Cs_Constraint> c = Cs_MakeConstraint(*row.type);
    c->scope_ = row.scope;
    c->target_ = Kept(row.target);
    c->key_ = Kept(row.key);
    c->value_ = Kept(row.value);
    c->flag_ = row.flag;
    c->statement_ = Kept(row.statement);
    c->block_ = row.block;
    if (row.block != Cs_Block::None) {
        c->More().entry = Kept(row.entry);
        c->More().stored = Kept(row.stored);
    }
    const char* file = nullptr;
    Cs_ConstraintMgr::Constraints* list = &staged_.loose_;
    if (row.source) {
        if (row.source < 1 || static_cast<size_t>(row.source) > source_files_.size())
            return Fail("a constraint of an unknown source");
        file = source_files_[row.source - 1];
        list = &staged_.sources_[row.source - 1].constraints;
    }
    c->source_ = Cs_ConstraintSourceInfo(Cs_SourceFile(file, static_cast<int>(row.line)));
    if (row.parent) links_.push_back({Link::Parent, c.get(), row.parent, 0, {}, 0});
    constraints_.push_back(c.get());
    list->push_back(std::move(c));
    return true;
}

bool Builder::Add(const Path& row) {
    Cs_Constraint* c = ById(row.constraint);
    if (!c) return Fail("a path of an unknown constraint");
    c->More().paths.push_back(Kept(row.group));
    return true;
}

bool Builder::Add(const Association& row) {
    Cs_Constraint* c = ById(row.constraint);
    if (!c) return Fail("an association of an unknown constraint");
    if (row.kind == Object::Constraint) {
        links_.push_back({Link::Associated, c, row.other, 0, {}, 0});
    } else if (!view_) {
        staged_.committed_[c].objects.emplace_back(row.object);
    } else if (same_design_) {
        staged_.pending_.push_back({c, Kept(row.object), static_cast<uint8_t>(row.kind), 0});
        c->lazy_ = true;
        c->pending_ = &target_;
    }
    return true;
}

bool Builder::Add(const Conflict& row) {
    Cs_Constraint* c = ById(row.constraint);
    if (!c) return Fail("a conflict of an unknown constraint");
    if (row.type != Cs_Conflict::OVERRIDE) return Fail("a conflict of an unknown kind");
    if (row.kind == Object::None) {
        links_.push_back({Link::Conflict, c, row.by, row.type, {}, 0});
    } else if (!view_) {
        links_.push_back({Link::Override, c, row.by, row.type, row.object, 0});
    } else if (same_design_) {
        links_.push_back({Link::PendingConflict, c, row.by, row.type, {}, staged_.pending_.size()});
        staged_.pending_.push_back(
            {c, Kept(row.object), static_cast<uint8_t>(row.kind), static_cast<uint8_t>(row.type)});
        c->lazy_ = true;
        c->pending_ = &target_;
    }
    return true;
}

bool Builder::Add(const Status& row) {
    if (row.id < static_cast<int>(Cs_StatusID::FILE_ERROR) || row.id > static_cast<int>(Cs_StatusID::REPOSITORY_ERROR) ||
        row.severity < Cs_Status::INFO || row.severity > Cs_Status::ERROR)
        return Fail("a status of an unknown kind");
    const auto id = static_cast<Cs_StatusID>(row.id);
    const auto severity = static_cast<Cs_Status::SEVERITY>(row.severity);
    const int number = static_cast<int>(row.number);
    std::shared_ptr<Cs_Status> st;
    if (!row.constraint) {
        auto parse = std::make_shared<Cs_Status_Parse>(id, number, std::string(row.message), std::string(row.file),
                                                       static_cast<int>(row.line));
        parse->SetSeverity(severity);
        st = parse;
    } else {
        st = std::make_shared<Cs_Status_Resolution>(id, severity, number, std::string(row.message),
                                                    ById(row.constraint));
    }
    if (row.source) {
        if (row.source < 1 || static_cast<size_t>(row.source) > staged_.sources_.size())
            return Fail("a status of an unknown source");
        staged_.sources_[row.source - 1].parse.Add(st);
    } else {
        staged_.resolution_.Add(st);
    }
    return true;
}

bool Builder::Finish() {
    // A constraint's parent comes first among the constraints it names, as after a resolution.
    for (const Link& l : links_)
        if (l.what == Link::Parent)
            if (Cs_Constraint* p = ById(l.to)) {
                l.from->More().parent = p;
                l.from->More().constraints.push_back(p);
            }
    for (const Link& l : links_) {
        Cs_Constraint* to = ById(l.to);
        switch (l.what) {
            case Link::Parent: break;
            case Link::Associated:
                if (to) l.from->More().constraints.push_back(to);
                break;
            case Link::Conflict:
                l.from->More().conflicts.emplace_back(static_cast<Cs_Conflict::CONFLICTTYPE>(l.conflict_type),
                                                      nullptr, to);
                break;
            case Link::Override: staged_.committed_[l.from].overrides.emplace_back(to, std::string(l.object)); break;
            case Link::PendingConflict: staged_.pending_[l.pending].by = to; break;
        }
    }
    return true;
}

}  // namespace Cs_Rows
