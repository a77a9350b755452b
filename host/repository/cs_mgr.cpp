#include "host/repository/cs_mgr.h"

#include <algorithm>
#include <unordered_set>

#include "host/parser/pr_logical.h"
#include "host/port/msgman.h"
#include "host/repository/cs_loader.h"

namespace {

uint64_t ContentHash(const Pr_FileText& text) { return Ndm_NamePool::Hash({text.data(), text.size()}); }

std::shared_ptr<Cs_Status> FileError(const std::string& file, const char* why) {
    return std::make_shared<Cs_Status_Parse>(Cs_StatusID::FILE_ERROR, 1,
                                             Port_Format("Cannot read constraint file '%s': %s.", file.c_str(), why),
                                             file, 0);
}

}  // namespace

Cs_ConstraintMgr::Cs_ConstraintMgr() : texts_(std::make_unique<Ndm_NamePool>()) {}

Cs_ConstraintMgr::~Cs_ConstraintMgr() = default;

size_t Cs_ConstraintMgr::GetNumConstraints() const {
    size_t n = loose_.size();
    for (const Source& s : sources_) n += s.constraints.size();
    return n;
}

Cs_ReturnCode Cs_ConstraintMgr::GetFindings() const {
    Cs_ReturnCode all;
    for (const Source& s : sources_) all.Append(s.parse);
    all.Append(resolution_);
    return all;
}

Cs_ReturnCode Cs_ConstraintMgr::SetDesign(const Ndm_Design* design) {
    design_ = design;
    committed_.clear();
    return Resolve();
}

Cs_ConstraintMgr::Source* Cs_ConstraintMgr::FindSource(const std::string& name) {
    for (Source& s : sources_)
        if (name == s.info->GetFileName()) return &s;
    return nullptr;
}

Cs_ConstraintMgr::Source& Cs_ConstraintMgr::AddSource(const std::string& name, int syntax) {
    if (Source* s = FindSource(name)) return *s;
    sources_.push_back(Source{std::make_unique<Cs_FileInfo>(name, syntax), {}, {}});
    return sources_.back();
}

void Cs_ConstraintMgr::ForgetPending(const Constraints& going) {
    if (pending_.empty() || going.empty()) return;
    std::unordered_set<const Cs_Constraint*> gone;
    for (const auto& c : going) gone.insert(c.get());
    std::erase_if(pending_, [&](const PendingObject& p) { return gone.count(p.constraint) || gone.count(p.by); });
}

Cs_ReturnCode Cs_ConstraintMgr::ReadSource(Source& source, std::shared_ptr<const Pr_FileText> text) {
    same_as_file_.clear();
    Cs_ReturnCode outcome;
    const std::string name = source.info->GetFileName();
    if (!text) text = Pr_FileText::Read(name.c_str());
    if (!text) {
        outcome.Add(FileError(name, "it cannot be opened or read"));
        return outcome;
    }
    Cs_Loader loader(*this, name.c_str(), source.info->GetSyntax() != Cs_ConstraintSyntax::NCF);
    loader.Read(text);
    ForgetPending(source.constraints);
    source.constraints = std::move(loader.constraints());
    source.info->hash_ = ContentHash(*text);
    source.info->size_ = text->size();
    source.info->read_ = true;
    source.info->read_here_ = true;
    source.parse = loader.outcome();
    outcome.Append(loader.outcome());
    return outcome;
}

void Cs_ConstraintMgr::Changed() {
    same_as_file_.clear();
    if (bulk_) {
        bulk_changed_ = true;
        return;
    }
    bulk_changed_ = false;
    Resolve();
}

Cs_ReturnCode Cs_ConstraintMgr::LoadConstraints(const Port::StringBase<char>& file, int syntax) {
    return ReplaceConstraintsFromFile(file, syntax);
}

Cs_ReturnCode Cs_ConstraintMgr::ReplaceConstraintsFromFile(const Port::StringBase<char>& file, int syntax) {
    Cs_ReturnCode outcome = ReadSource(AddSource(file.str(), syntax));
    Changed();
    return outcome;
}

Cs_ReturnCode Cs_ConstraintMgr::AddConstraintSource(const Port::StringBase<char>& file, int syntax) {
    same_as_file_.clear();
    AddSource(file.str(), syntax);
    return {};
}

Cs_ReturnCode Cs_ConstraintMgr::RemoveConstraintSource(const Port::StringBase<char>& file) {
    auto it = std::find_if(sources_.begin(), sources_.end(),
                           [&](const Source& s) { return file.str() == s.info->GetFileName(); });
    if (it == sources_.end()) return {};
    ForgetPending(it->constraints);
    sources_.erase(it);
    same_as_file_.clear();
    Changed();
    return {};
}

void Cs_ConstraintMgr::SetBulkConstraintMode(bool on) {
    bulk_ = on;
    if (!on && bulk_changed_) Changed();
}

Cs_ReturnCode Cs_ConstraintMgr::UpdateConstraintsFromSource() {
    Cs_ReturnCode outcome;
    // Each source is read once: the content that shows it changed is the content parsed.
    for (Source& s : sources_) {
        std::shared_ptr<const Pr_FileText> text;
        if (!IsStale(s, text)) continue;
        outcome.Append(ReadSource(s, text));
        bulk_changed_ = true;
    }
    if (!bulk_ && bulk_changed_) Changed();
    return outcome;
}

std::vector<Cs_FileInfo*> Cs_ConstraintMgr::GetConstraintSources() const {
    std::vector<Cs_FileInfo*> out;
    for (const Source& s : sources_) out.push_back(s.info.get());
    return out;
}

std::vector<Cs_FileInfo*> Cs_ConstraintMgr::GetOutOfDateConstraintSources() const {
    std::vector<Cs_FileInfo*> out;
    for (const Source& s : sources_) {
        std::shared_ptr<const Pr_FileText> text;
        if (IsStale(s, text)) out.push_back(s.info.get());
    }
    return out;
}

bool Cs_ConstraintMgr::IsStale(const Source& source, std::shared_ptr<const Pr_FileText>& text) {
    const Cs_FileInfo& info = *source.info;
    text = Pr_FileText::Read(info.GetFileName());
    return !info.read_ || !text || text->size() != info.size_ || ContentHash(*text) != info.hash_;
}

Cs_ReturnCode Cs_ConstraintMgr::CreateConstraints(const Port::StringBase<char>& text, int syntax,
                                                  Cs_Constraint* parent) {
    Cs_Loader loader(*this, nullptr, syntax != Cs_ConstraintSyntax::NCF);
    auto copy = Pr_FileText::FromText(text.str());
    loader.Read(copy);
    for (auto& c : loader.constraints()) {
        if (parent) c->More().parent = parent;
        loose_.push_back(std::move(c));
    }
    Changed();
    return loader.outcome();
}

Cs_SharedContainerT<Cs_Constraint*> Cs_ConstraintMgr::GetConstraints(int effective) const {
    Cs_SharedContainerT<Cs_Constraint*> out;
    ForEach([&](Cs_Constraint& c) {
        if (effective == ALL || !(c.GetType() == Cs_Constraint_Comment::Type())) out.push_back(&c);
    });
    return out;
}

Cs_SharedContainerT<Cs_Constraint*> Cs_ConstraintMgr::GetConstraints(const Cs_Filter_ConstraintType& filter,
                                                                    int effective) const {
    Cs_SharedContainerT<Cs_Constraint*> out;
    ForEach([&](Cs_Constraint& c) {
        if (filter.Accepts(c) && (effective == ALL || !(c.GetType() == Cs_Constraint_Comment::Type())))
            out.push_back(&c);
    });
    return out;
}

void Cs_ConstraintMgr::DeleteAllConstraints() {
    same_as_file_.clear();
    pending_.clear();
    sources_.clear();
    loose_.clear();
    object_lists_.clear();
    resolution_ = Cs_ReturnCode();
    committed_.clear();
    texts_ = std::make_unique<Ndm_NamePool>();
    bulk_changed_ = false;
}

Cs_ConstraintMgr* Cs_ConstraintMgr::CreateScratchPad() const {
    auto* scratch = new Cs_ConstraintMgr();
    scratch->design_ = design_;
    return scratch;
}
