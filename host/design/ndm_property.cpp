#include "host/design/ndm_property.h"

#include <algorithm>

#include "host/design/ndm.h"

const char* Ndm_PropTypeName(int type) {
    switch (type) {
        case NDM_PROP_BOOL: return "bool";
        case NDM_PROP_INT32: return "int32";
        case NDM_PROP_FLOAT64: return "float64";
        case NDM_PROP_LIST: return "list";
        case NDM_PROP_STRING: return "string";
        case NDM_PROP_STRING_LIST: return "string_list";
        default: return nullptr;
    }
}

namespace {
// Sets the value of a property just made (null when it could not be made) and passes it on.
Ndm_Property* Set(Ndm_Property* p, bool v) { return p ? (p->SetBool(v), p) : p; }
Ndm_Property* Set(Ndm_Property* p, int32_t v) { return p ? (p->SetInt32(v), p) : p; }
Ndm_Property* Set(Ndm_Property* p, double v) { return p ? (p->SetFloat64(v), p) : p; }
Ndm_Property* Set(Ndm_Property* p, const char* v) { return p ? (p->SetValueString(v), p) : p; }
}  // namespace

Ndm_Property::Ndm_Property(Ndm_PropertyHolder* owner, int type, const char* name)
    : owner_(owner), type_(type), name_(name ? name : "") {}

// Lists may nest as deeply as a file makes them: entries are freed from a work list, each
// after its own entries were taken out, so no destructor recurses.
Ndm_Property::~Ndm_Property() {
    if (!list_) return;
    std::vector<Ndm_Property*> work;
    work.swap(list_->entries);
    while (!work.empty()) {
        Ndm_Property* p = work.back();
        work.pop_back();
        if (p->list_) {
            work.insert(work.end(), p->list_->entries.begin(), p->list_->entries.end());
            p->list_->entries.clear();
        }
        delete p;
    }
}

bool Ndm_Property::AddString(const char* text) {
    if (type_ != NDM_PROP_STRING_LIST) return false;
    strings_.emplace_back(text ? text : "");
    return true;
}

Ndm_Property* Ndm_Property::AddEntry(int type, const char* name) {
    if (type_ != NDM_PROP_LIST) return nullptr;
    if (!list_) list_ = std::make_unique<ListData>();
    Ndm_Property* entry = list_->entries.emplace_back(new Ndm_Property(owner_, type, name));
    if (list_->index) list_->index->try_emplace(entry->name_, entry);
    return entry;
}

Ndm_Property* Ndm_Property::CreatePropertyString(const char* name, const char* value) {
    return Set(AddEntry(NDM_PROP_STRING, name), value);
}
Ndm_Property* Ndm_Property::CreatePropertyBool(const char* name, bool value) {
    return Set(AddEntry(NDM_PROP_BOOL, name), value);
}
Ndm_Property* Ndm_Property::CreatePropertyInt32(const char* name, int32_t value) {
    return Set(AddEntry(NDM_PROP_INT32, name), value);
}
Ndm_Property* Ndm_Property::CreatePropertyFloat64(const char* name, double value) {
    return Set(AddEntry(NDM_PROP_FLOAT64, name), value);
}
Ndm_Property* Ndm_Property::CreatePropertyList(const char* name) { return AddEntry(NDM_PROP_LIST, name); }
Ndm_Property* Ndm_Property::CreatePropertyStringList(const char* name) {
    return AddEntry(NDM_PROP_STRING_LIST, name);
}

Ndm_Property* Ndm_Property::GetEntryByName(const char* name) const {
    if (!name || !list_) return nullptr;
    std::vector<Ndm_Property*>& entries = list_->entries;
    if (entries.size() <= kIndexFrom) {
        for (Ndm_Property* e : entries)
            if (e->name_ == name) return e;
        return nullptr;
    }
    auto& index = list_->index;
    if (!index) {
        // Timing lists grow to tens of thousands of entries; look them up by hash.
        index = std::make_unique<std::unordered_map<std::string_view, Ndm_Property*>>();
        index->reserve(entries.size());
        for (Ndm_Property* e : entries) index->try_emplace(e->name_, e);
    }
    auto it = index->find(name);
    return it == index->end() ? nullptr : it->second;
}

bool Ndm_Property::DeleteEntry(Ndm_Property* entry) {
    if (!list_) return false;
    auto it = std::find(list_->entries.begin(), list_->entries.end(), entry);
    if (it == list_->entries.end()) return false;
    list_->entries.erase(it);
    // The first entry of that name may have changed: the index is rebuilt on the next lookup.
    list_->index.reset();
    delete entry;
    return true;
}

Ndm_PropertyHolder::~Ndm_PropertyHolder() { DeleteAllProperties(); }

void Ndm_PropertyHolder::DeleteAllProperties() {
    if (!props_) return;
    for (Ndm_Property* p : *props_) delete p;
    delete props_;
    props_ = nullptr;
}

const char* Ndm_PropertyHolder::GetName() const {
    switch (kind_) {
        case Ndm_ObjKind::Design: return static_cast<const Ndm_Design*>(this)->GetName();
        case Ndm_ObjKind::View: return static_cast<const Ndm_View*>(this)->GetName();
        case Ndm_ObjKind::Block: return static_cast<const Ndm_Block*>(this)->GetName();
        case Ndm_ObjKind::Signal: return static_cast<const Ndm_Signal*>(this)->GetName();
        case Ndm_ObjKind::Pin: return static_cast<const Ndm_Pin*>(this)->GetName();
        case Ndm_ObjKind::Network: return static_cast<const Ndm_Network*>(this)->GetName();
    }
    return "";
}

std::string Ndm_PropertyHolder::GetFullName() const {
    switch (kind_) {
        case Ndm_ObjKind::Block: return static_cast<const Ndm_Block*>(this)->GetFullName();
        case Ndm_ObjKind::Signal: return static_cast<const Ndm_Signal*>(this)->GetFullName();
        case Ndm_ObjKind::Pin: return static_cast<const Ndm_Pin*>(this)->GetFullName();
        case Ndm_ObjKind::Network: return static_cast<const Ndm_Network*>(this)->GetFullName();
        default: return GetName();
    }
}

Ndm_Property* Ndm_PropertyHolder::GetPropertyByName(const char* name) const {
    if (!props_ || !name) return nullptr;
    for (Ndm_Property* p : *props_)
        if (p->name_ == name) return p;
    return nullptr;
}

std::span<Ndm_Property* const> Ndm_PropertyHolder::GetPropertyItr() const {
    if (!props_) return {};
    return *props_;
}

int Ndm_PropertyHolder::GetNumProperties() const {
    return props_ ? static_cast<int>(props_->size()) : 0;
}

Ndm_Property* Ndm_PropertyHolder::Create(int type, const char* name) {
    if (!name) return nullptr;
    if (!props_) props_ = new std::vector<Ndm_Property*>();
    auto* fresh = new Ndm_Property(this, type, name);
    for (Ndm_Property*& p : *props_) {
        if (p->name_ == name) {
            delete p;
            p = fresh;
            return fresh;
        }
    }
    props_->push_back(fresh);
    return fresh;
}

Ndm_Property* Ndm_PropertyHolder::CreatePropertyBool(const char* name, bool value) {
    return Set(Create(NDM_PROP_BOOL, name), value);
}
Ndm_Property* Ndm_PropertyHolder::CreatePropertyInt32(const char* name, int32_t value) {
    return Set(Create(NDM_PROP_INT32, name), value);
}
Ndm_Property* Ndm_PropertyHolder::CreatePropertyFloat64(const char* name, double value) {
    return Set(Create(NDM_PROP_FLOAT64, name), value);
}
Ndm_Property* Ndm_PropertyHolder::CreatePropertyString(const char* name, const char* value) {
    return Set(Create(NDM_PROP_STRING, name), value);
}
Ndm_Property* Ndm_PropertyHolder::CreatePropertyList(const char* name) { return Create(NDM_PROP_LIST, name); }
Ndm_Property* Ndm_PropertyHolder::CreatePropertyStringList(const char* name) {
    return Create(NDM_PROP_STRING_LIST, name);
}

bool Ndm_PropertyHolder::DeleteProperty(const char* name) {
    return DeleteProperty(GetPropertyByName(name));
}

bool Ndm_PropertyHolder::DeleteProperty(Ndm_Property* property) {
    if (!props_ || !property) return false;
    auto it = std::find(props_->begin(), props_->end(), property);
    if (it == props_->end()) return false;
    props_->erase(it);
    delete property;
    return true;
}
