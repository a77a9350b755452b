#include "host/design/ndm_property.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <new>

#include "host/design/ndm.h"
#include "host/design/property_store.h"

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

void Ndm_PropertyCells::Refill() {
    // Chunks grow with the design, from 4 KB to 1 MB.
    const size_t count = std::min<size_t>(size_t{128} << std::min<size_t>(chunks_.size(), 8), 32768);
    std::unique_ptr<Cell[]> chunk(new Cell[count]);
    // Properties link to one another through 48-bit addresses, as every 64-bit system gives.
    if ((reinterpret_cast<uintptr_t>(chunk.get() + count) >> 48) != 0) throw std::bad_alloc();
    chunks_.push_back(std::move(chunk));
    cursor_ = chunks_.back().get();
    left_ = count;
}

static_assert(sizeof(Ndm_Property) == Ndm_PropertyCells::kCell, "a property is three words");

Ndm_PropertyCells& Ndm_Property::CellsOf(const Ndm_PropertyHolder* owner) {
    return owner->OwnDesign()->PropertyCells();
}

Ndm_Property* Ndm_Property::Make(Ndm_PropertyHolder* owner, int type, const char* name) {
    Ndm_Design* design = owner->OwnDesign();
    return new (design->PropertyCells().Get()) Ndm_Property(owner, design->Intern(name ? name : ""), type);
}

Ndm_Property::Ndm_Property(Ndm_PropertyHolder* owner, const char* interned_name, int type)
    : name_(interned_name), float_(0.0), link_(uint64_t{static_cast<uint8_t>(type)} << kTypeShift) {
    const auto at = reinterpret_cast<uintptr_t>(owner);
    // Every 64-bit system gives programs addresses of 48 bits.
    if ((at & ~kAddress) != 0) throw std::bad_alloc();
    LinkAs(at | kAtOwner);
    if (type == NDM_PROP_STRING) text_ = "";
    if (type == NDM_PROP_STRING_LIST) strings_ = nullptr;
    if (type == NDM_PROP_LIST) list_ = nullptr;
}

Ndm_PropertyHolder* Ndm_Property::GetOwner() const {
    const Ndm_Property* p = this;
    while (!(p->link_ & kAtOwner)) p = p->Next();
    return reinterpret_cast<Ndm_PropertyHolder*>(static_cast<uintptr_t>(p->link_ & kAddress));
}

// Frees one property, not its entries.
void Ndm_Property::Free(Ndm_Property* p, Ndm_PropertyCells& cells) {
    const int type = p->GetType();
    if (type == NDM_PROP_STRING_LIST && p->OwnsStrings()) delete p->strings_;
    if (type == NDM_PROP_LIST && !(p->link_ & kOneEntry)) delete p->list_;
    p->~Ndm_Property();
    cells.Put(p);
}

// Lists may nest as deeply as a file makes them: entries are freed from a work list, each
// after its own entries were taken out, so that nothing recurses. Most properties hold no
// entries, and a list of one plain entry is what every value passing the filter makes: those
// go without the work list.
void Ndm_Property::Destroy(Ndm_Property* p, Ndm_PropertyCells& cells) {
    if (p->GetType() != NDM_PROP_LIST || p->GetNumEntries() == 0) return Free(p, cells);
    if (p->link_ & kOneEntry && p->entry_->GetType() != NDM_PROP_LIST) {
        Free(p->entry_, cells);
        return Free(p, cells);
    }
    std::vector<Ndm_Property*> work{p};
    while (!work.empty()) {
        Ndm_Property* q = work.back();
        work.pop_back();
        const std::span<Ndm_Property* const> entries = q->GetListItr();
        work.insert(work.end(), entries.begin(), entries.end());
        Free(q, cells);
    }
}

const std::vector<std::string>& Ndm_Property::GetStrings() const {
    static const std::vector<std::string> none;
    return GetType() == NDM_PROP_STRING_LIST && strings_ ? *strings_ : none;
}

void Ndm_Property::SetValueString(const char* value) {
    if (GetType() == NDM_PROP_STRING) text_ = GetOwner()->OwnDesign()->Intern(value ? value : "");
}

const std::vector<std::string>* Ndm_TextLists::Extend(const std::vector<std::string>* list, const char* text) {
    const Key key{list, text};
    Recent& recent = recent_[KeyHash()(key) % std::size(recent_)];
    if (recent.list && recent.key == key) return recent.list;
    std::unique_ptr<std::vector<std::string>>& slot = lists_[key];
    if (!slot) {
        slot = std::make_unique<std::vector<std::string>>();
        slot->reserve((list ? list->size() : 0) + 1);
        if (list) *slot = *list;
        slot->emplace_back(text);
    }
    recent = Recent{key, slot.get()};
    return slot.get();
}

// Lists up to this long are shared; a longer one, which grows one text at a time (a statement
// may attach a hundred thousand constraints to one object), becomes the property's own.
static constexpr size_t kSharedTexts = 16;

bool Ndm_Property::AddString(const char* text) {
    if (GetType() != NDM_PROP_STRING_LIST) return false;
    if (!text) text = "";
    if (OwnsStrings()) {
        const_cast<std::vector<std::string>*>(strings_)->emplace_back(text);
    } else if (!strings_ || strings_->size() < kSharedTexts) {
        Ndm_Design* design = GetOwner()->OwnDesign();
        strings_ = design->TextLists().Extend(strings_, design->Intern(text));
    } else {
        auto* own = new std::vector<std::string>();
        own->reserve(strings_->size() * 2);
        *own = *strings_;
        own->emplace_back(text);
        strings_ = own;
        link_ |= kOwnsStrings;
    }
    return true;
}

Ndm_Property* Ndm_Property::AddEntry(int type, const char* name) {
    if (GetType() != NDM_PROP_LIST) return nullptr;
    Ndm_PropertyHolder* owner = GetOwner();
    Ndm_Property* entry = Make(owner, type, name);
    if (!(link_ & kOneEntry) && !list_) {
        entry_ = entry;
        link_ |= kOneEntry;
        return entry;
    }
    if (link_ & kOneEntry) {
        auto data = std::make_unique<ListData>();
        data->entries.push_back(entry_);
        list_ = data.release();
        link_ &= ~kOneEntry;
    }
    list_->entries.push_back(entry);
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
    if (!name) return nullptr;
    const std::span<Ndm_Property* const> entries = GetListItr();
    if (entries.size() <= kIndexFrom) {
        for (Ndm_Property* e : entries)
            if (std::strcmp(e->name_, name) == 0) return e;
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
    if (GetType() != NDM_PROP_LIST || !entry) return false;
    if (link_ & kOneEntry) {
        if (entry_ != entry) return false;
        list_ = nullptr;
        link_ &= ~kOneEntry;
        Destroy(entry, CellsOf(GetOwner()));
        return true;
    }
    if (!list_) return false;
    auto it = std::find(list_->entries.begin(), list_->entries.end(), entry);
    if (it == list_->entries.end()) return false;
    list_->entries.erase(it);
    // The first entry of that name may have changed: the index is rebuilt on the next lookup.
    list_->index.reset();
    Destroy(entry, CellsOf(GetOwner()));
    return true;
}

// ---- holders ----

Ndm_Design* Ndm_PropertyHolder::OwnDesign() const {
    switch (kind_) {
        case Ndm_ObjKind::Design: return const_cast<Ndm_Design*>(static_cast<const Ndm_Design*>(this));
        case Ndm_ObjKind::View: return static_cast<const Ndm_View*>(this)->GetDesign();
        case Ndm_ObjKind::Block: return static_cast<const Ndm_Block*>(this)->GetView()->GetDesign();
        case Ndm_ObjKind::Signal: return static_cast<const Ndm_Signal*>(this)->GetBlock()->GetView()->GetDesign();
        case Ndm_ObjKind::Pin: return static_cast<const Ndm_Pin*>(this)->GetBlock()->GetView()->GetDesign();
        case Ndm_ObjKind::Network: return static_cast<const Ndm_Network*>(this)->GetView()->GetDesign();
    }
    return nullptr;
}

Ndm_PropertyHolder::~Ndm_PropertyHolder() { DeleteAllProperties(); }

void Ndm_PropertyHolder::DeleteAllProperties() {
    if (!props_) return;
    Ndm_PropertyCells& cells = Ndm_Property::CellsOf(this);
    for (Ndm_Property* p = props_; p;) {
        Ndm_Property* next = p->Next();
        Ndm_Property::Destroy(p, cells);
        p = next;
    }
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
    if (!name) return nullptr;
    for (Ndm_Property* p = props_; p; p = p->Next())
        if (std::strcmp(p->name_, name) == 0) return p;
    return nullptr;
}

int Ndm_PropertyHolder::GetNumProperties() const { return static_cast<int>(GetPropertyItr().size()); }

// A property of a name the object has takes the place of the old one; a new name goes last.
Ndm_Property* Ndm_PropertyHolder::Create(int type, const char* name) {
    if (!name) return nullptr;
    Ndm_Property* fresh = Ndm_Property::Make(this, type, name);
    Ndm_Property* prev = nullptr;
    Ndm_Property* p = props_;
    // Names are interned: equal names are the same pointer.
    while (p && p->name_ != fresh->name_) {
        prev = p;
        p = p->Next();
    }
    if (p) fresh->LinkAs(p->link_);  // in the old one's place
    if (prev)
        prev->LinkTo(fresh);
    else
        props_ = fresh;
    if (p) Ndm_Property::Destroy(p, Ndm_Property::CellsOf(this));
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
    if (!property) return false;
    Ndm_Property* prev = nullptr;
    for (Ndm_Property* p = props_; p; prev = p, p = p->Next()) {
        if (p != property) continue;
        if (prev)
            prev->LinkAs(p->link_);
        else
            props_ = p->Next();
        Ndm_Property::Destroy(p, Ndm_Property::CellsOf(this));
        return true;
    }
    return false;
}
