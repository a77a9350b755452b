#include "check/ck_board_check.h"

#include <algorithm>
#include <set>
#include <tuple>

#include "host/design/ndm.h"
#include "host/repository/cs_mgr.h"

Ck_BoardCheck::Ck_BoardCheck(const Cs_ConstraintMgr& mgr, Ck_KindSet kinds)
    : mgr_(mgr), view_(mgr.GetDesign() ? mgr.GetDesign()->GetWorkView() : nullptr), kinds_(kinds) {}

void Ck_BoardCheck::Run() {
    findings_.clear();
    summary_ = Ck_Summary();
    active_.clear();
    position_.clear();
    for (const Cs_Constraint* c : mgr_.GetConstraints(Cs_ConstraintMgr::ACTIVE)) {
        position_.emplace(c, active_.size());
        active_.push_back(c);
    }
    files_.clear();
    for (const Cs_FileInfo* source : mgr_.GetConstraintSources()) files_.push_back(source->GetFileName());
    Statements();
    RepositoryMessages();
    Ports();
    PinClashes();
    LocationOverrides();
    Clocks();
    Groups();
    Sort();
    for (const Ck_Finding& f : findings_) ++summary_.findings[static_cast<int>(f.kind)];
    summary_.statements = statements_.size();
    summary_.files = files_.size();
}

bool Ck_BoardCheck::HasErrors() const {
    for (const Ck_Finding& f : findings_)
        if (Ck_SeverityOf(f.kind) == Ck_Severity::Error) return true;
    return false;
}

void Ck_BoardCheck::Statements() {
    statements_.clear();
    for (const Cs_Constraint* c : active_) {
        const Cs_SourceFile* where = c->GetSourceInfo()->GetSourceFile();
        const char* file = where ? where->GetFile() : "";
        const int line = where ? where->GetLine() : 0;
        // The constraints of a statement are neighbours and share its interned text.
        Ck_Statement* last = statements_.empty() ? nullptr : &statements_.back();
        if (!last || last->file != file || last->line != line || last->text != c->GetStatementText())
            last = &statements_.emplace_back(Ck_Statement{file, line, c->GetStatementText(), {}});
        last->constraints.push_back(c);
    }
}

// What the repository found itself: statements it cannot read and names that match nothing
// (once per statement). Its note that a timing statement names no group is a dangling group.
void Ck_BoardCheck::RepositoryMessages() {
    std::set<std::tuple<const char*, int, const char*>> unmatched;
    for (const auto& status : mgr_.GetFindings()) {
        if (const auto* parse = dynamic_cast<const Cs_Status_Parse*>(status.get())) {
            Ck_Ref ref;
            ref.file = parse->GetSourceFile()->GetFile() ? parse->GetSourceFile()->GetFile() : "";
            ref.line = parse->GetSourceFile()->GetLine();
            Add({Ck_Kind::ParseError, status->GetMessage(), {}, {ref}});
            continue;
        }
        const auto* about = dynamic_cast<const Cs_Status_Resolution*>(status.get());
        if (!about || status->GetID() != Cs_StatusID::NO_DESIGN_MATCH || !about->GetConstraint()) continue;
        const Cs_Constraint* c = about->GetConstraint();
        Ck_Ref ref = RefOf(c);
        if (unmatched.emplace(ref.file, ref.line, c->GetStatementText()).second)
            Add({Ck_Kind::UnmatchedName, status->GetMessage(), {c->GetTarget()}, {ref}});
    }
}

void Ck_BoardCheck::Add(Ck_Finding finding) {
    if (kinds_.Has(finding.kind)) findings_.push_back(std::move(finding));
}

Ck_Ref Ck_BoardCheck::RefOf(const Cs_Constraint* c, std::string object) const {
    Ck_Ref ref;
    const Cs_SourceFile* where = c->GetSourceInfo()->GetSourceFile();
    ref.file = where ? where->GetFile() : "";
    ref.line = where ? where->GetLine() : 0;
    ref.constraint = c;
    ref.object = std::move(object);
    return ref;
}

void Ck_BoardCheck::AddRef(Ck_Finding& f, const Cs_Constraint* c, std::string object) const {
    Ck_Ref ref = RefOf(c, std::move(object));
    if (!f.refs.empty()) {
        const Ck_Ref& last = f.refs.back();
        if (last.file == ref.file && last.line == ref.line && last.object == ref.object && last.constraint &&
            last.constraint->GetStatementText() == c->GetStatementText())
            return;
    }
    f.refs.push_back(std::move(ref));
}

void Ck_BoardCheck::Sort() {
    // A reference without a constraint (a file or statement that cannot be read) sorts by its
    // file and line among the others.
    auto file_index = [this](const char* file) {
        for (size_t i = 0; i < files_.size(); ++i)
            if (files_[i] == file) return i;
        return files_.size();
    };
    using Key = std::tuple<int, size_t, int, size_t>;
    std::vector<std::pair<Key, Ck_Finding*>> keyed;
    for (Ck_Finding& f : findings_) {
        Key key{static_cast<int>(f.kind), 0, 0, 0};
        if (!f.refs.empty()) {
            const Ck_Ref& r = f.refs.front();
            auto pos = r.constraint ? position_.find(r.constraint) : position_.end();
            key = {static_cast<int>(f.kind), file_index(r.file), r.line,
                   pos == position_.end() ? 0 : pos->second};
        }
        keyed.emplace_back(key, &f);
    }
    std::stable_sort(keyed.begin(), keyed.end(), [](const auto& a, const auto& b) {
        if (a.first != b.first) return a.first < b.first;
        return a.second->message < b.second->message;
    });
    std::vector<Ck_Finding> sorted;
    sorted.reserve(findings_.size());
    for (auto& [key, f] : keyed) sorted.push_back(std::move(*f));
    findings_ = std::move(sorted);
}
