#include "host/design/ndm_property.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <new>

#include "host/design/ndm.h"
#include "host/design/name_pool.h"
#include "host/design/object_pool.h"
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

// ---- storage ----

unsigned char* Ndm_PropertyTables::chunks[Ndm_PropertyTables::kMaxChunks];
const char* const* Ndm_PropertyTables::names = nullptr;

namespace {
// Numbers of the chunks of cells; designs that go give theirs back for the next ones.
Ndm_Numbers& CellChunkNumbers() {
    static Ndm_Numbers numbers(Ndm_PropertyTables::kMaxChunks);
    return numbers;
}
}  // namespace

void Ndm_PropertyCells::Refill() {
    const uint32_t number = CellChunkNumbers().Take();
    void* chunk = std::aligned_alloc(Ndm_PropertyTables::kChunkBytes, Ndm_PropertyTables::kChunkBytes);
    if (!chunk) {
        CellChunkNumbers().Give(number);
        throw std::bad_alloc();
    }
    std::memcpy(chunk, &design_, sizeof design_);
    std::memcpy(static_cast<unsigned char*>(chunk) + sizeof design_, &number, sizeof number);
    Ndm_PropertyTables::chunks[number] = static_cast<unsigned char*>(chunk);
    chunks_.push_back(number);
    next_ = number << kPlaceBits;
    left_ = Ndm_PropertyTables::kCellsPerChunk;
}

Ndm_PropertyCells::~Ndm_PropertyCells() {
    for (uint32_t number : chunks_) {
#if NDM_ASAN
        ASAN_UNPOISON_MEMORY_REGION(Ndm_PropertyTables::chunks[number], Ndm_PropertyTables::kChunkBytes);
#endif
        std::free(Ndm_PropertyTables::chunks[number]);
        Ndm_PropertyTables::chunks[number] = nullptr;
        CellChunkNumbers().Give(number);
    }
}

Ndm_PropertyNames::Table& Ndm_PropertyNames::Tables() {
    static Table table;
    return table;
}

std::vector<const char*> Ndm_PropertyNames::names_;
Ndm_PropertyNames::Recent Ndm_PropertyNames::recent_[64];

uint32_t Ndm_PropertyNames::Id(const char* name) {
    const std::string_view text(name);
    Recent asked;
    Recent* recent = asked.key.Of(text) ? &recent_[asked.key.Slot(6)] : nullptr;
    if (recent && recent->id != kMaxIds && recent->key == asked.key) return recent->id;
    Table& t = Tables();
    const char* stored = t.pool.Intern(text);
    const auto next = reinterpret_cast<void*>(uintptr_t{names_.size()} + 1);
    const auto id = static_cast<uint32_t>(reinterpret_cast<uintptr_t>(t.ids.InsertIfAbsent(stored, next)) - 1);
    if (id == names_.size()) {
        if (id == kMaxIds) throw std::bad_alloc();
        names_.push_back(stored);
        Ndm_PropertyTables::names = names_.data();
    }
    if (recent) {
        asked.id = id;
        *recent = asked;
    }
    return id;
}

uint32_t Ndm_TextLists::Extend(uint32_t list, const char* text) {
    const Key key{list, text};
    Recent& recent = recent_[KeyHash()(key) % std::size(recent_)];
    if (recent.cell && recent.key == key) return recent.cell;
    Value& slot = lists_[key];
    if (!slot.texts) {
        const auto* before = list ? static_cast<const std::vector<std::string>*>(Ndm_PropertyCells::Held(list)) : nullptr;
        slot.texts = std::make_unique<std::vector<std::string>>();
        slot.texts->reserve((before ? before->size() : 0) + 1);
        if (before) *slot.texts = *before;
        slot.texts->emplace_back(text);
        slot.cell = cells_.Hold(slot.texts.get());
    }
    recent = Recent{key, slot.cell};
    return slot.cell;
}

// ---- properties ----

static_assert(sizeof(Ndm_Property) == Ndm_PropertyCells::kCell, "a property is three 32-bit words");

uint32_t Ndm_Property::Make(Ndm_Design* design, uint32_t link, int type, const char* name) {
    Ndm_PropertyCells& cells = design->PropertyCells();
    const uint32_t name_id = Ndm_PropertyNames::Id(name ? name : "");
    const uint32_t cell = cells.Get();
    Ndm_Property* p = new (At(cell)) Ndm_Property(link, name_id, type);
    if (type == NDM_PROP_FLOAT64) {
        p->value_ = cells.Get();
        const double zero = 0.0;
        std::memcpy(Ndm_PropertyCells::At(p->value_), &zero, sizeof zero);
    }
    return cell;
}

// An entry climbs to its list, a property of an object to the object's last property, which
// the design knows the object of.
Ndm_PropertyHolder* Ndm_Property::GetOwner() const {
    const Ndm_Property* p = this;
    for (;;) {
        while (!(p->link_ & kLast)) p = At(p->link_ >> 1);
        if (p->link_ == kLast) return Design()->OwnerOfLast(p);
        p = At(p->link_ >> 1);
    }
}

void* Ndm_Property::Pointer() const { return value_ ? Ndm_PropertyCells::Held(value_) : nullptr; }

double Ndm_Property::GetFloat64() const {
    if (GetType() != NDM_PROP_FLOAT64) return 0.0;
    double value;
    std::memcpy(&value, Ndm_PropertyCells::At(value_), sizeof value);
    return value;
}

void Ndm_Property::SetFloat64(double value) {
    if (GetType() == NDM_PROP_FLOAT64) std::memcpy(Ndm_PropertyCells::At(value_), &value, sizeof value);
}

const char* Ndm_Property::GetValueString() const {
    return GetType() == NDM_PROP_STRING ? Ndm_NamePool::Text(value_) : nullptr;
}

Ndm_Property::ListData* Ndm_Property::List() const {
    return GetType() == NDM_PROP_LIST && !(head_ & kOneEntry) && value_
               ? static_cast<ListData*>(Pointer())
               : nullptr;
}

Ndm_EntryRange Ndm_Property::GetListItr() const {
    Ndm_EntryRange range;
    if (GetType() != NDM_PROP_LIST) return range;
    if (head_ & kOneEntry) {
        range.one_ = value_;
        range.size_ = 1;
    } else if (const ListData* list = List()) {
        range.cells_ = list->entries.data();
        range.size_ = list->entries.size();
    }
    return range;
}

int Ndm_Property::GetNumEntries() const { return static_cast<int>(GetListItr().size()); }

// Frees one property, not its entries.
void Ndm_Property::Free(uint32_t cell, Ndm_PropertyCells& cells) {
    Ndm_Property* p = At(cell);
    const int type = p->GetType();
    if (type == NDM_PROP_STRING_LIST && p->OwnsStrings()) {
        delete static_cast<std::vector<std::string>*>(p->Pointer());
        cells.Put(p->value_);
    }
    if (ListData* list = p->List()) {
        delete list;
        cells.Put(p->value_);
    }
    if (type == NDM_PROP_FLOAT64) cells.Put(p->value_);
    p->~Ndm_Property();
    cells.Put(cell);
}

// Lists may nest as deeply as a file makes them: entries are freed from a work list, each
// after its own entries were taken out, so that nothing recurses. Most properties hold no
// entries, and a list of one plain entry is what every value passing the filter makes: those
// go without the work list.
void Ndm_Property::Destroy(uint32_t cell, Ndm_PropertyCells& cells) {
    Ndm_Property* p = At(cell);
    if (p->GetType() != NDM_PROP_LIST || p->GetNumEntries() == 0) return Free(cell, cells);
    if (p->head_ & kOneEntry && At(p->value_)->GetType() != NDM_PROP_LIST) {
        Free(p->value_, cells);
        return Free(cell, cells);
    }
    std::vector<uint32_t> work{cell};
    while (!work.empty()) {
        const uint32_t q = work.back();
        work.pop_back();
        const Ndm_Property* list = At(q);
        if (list->head_ & kOneEntry)
            work.push_back(list->value_);
        else if (const ListData* data = list->List())
            work.insert(work.end(), data->entries.begin(), data->entries.end());
        Free(q, cells);
    }
}

const std::vector<std::string>& Ndm_Property::GetStrings() const {
    static const std::vector<std::string> none;
    if (GetType() != NDM_PROP_STRING_LIST || !value_) return none;
    return *static_cast<const std::vector<std::string>*>(Pointer());
}

void Ndm_Property::SetValueString(const char* value) {
    if (GetType() != NDM_PROP_STRING) return;
    Ndm_Design* design = Design();
    value_ = design->TextId(design->Intern(value ? value : ""));
}

// Lists up to this long are shared; a longer one, which grows one text at a time (a statement
// may attach a hundred thousand constraints to one object), becomes the property's own.
static constexpr size_t kSharedTexts = 16;

bool Ndm_Property::AddString(const char* text) {
    if (GetType() != NDM_PROP_STRING_LIST) return false;
    if (!text) text = "";
    if (OwnsStrings()) {
        static_cast<std::vector<std::string>*>(Pointer())->emplace_back(text);
    } else if (GetStrings().size() < kSharedTexts) {
        Ndm_Design* design = Design();
        value_ = design->TextLists().Extend(value_, design->Intern(text));
    } else {
        auto own = std::make_unique<std::vector<std::string>>();
        own->reserve(GetStrings().size() * 2);
        *own = GetStrings();
        own->emplace_back(text);
        value_ = Design()->PropertyCells().Hold(own.release());
        head_ |= kOwnsStrings;
    }
    return true;
}

uint32_t Ndm_Property::AddEntry(int type, const char* name) {
    if (GetType() != NDM_PROP_LIST) return 0;
    const uint32_t entry = Make(Design(), EntryOf(Ndm_PropertyTables::IndexOf(this)), type, name);
    if (!(head_ & kOneEntry) && !value_) {
        value_ = entry;
        head_ |= kOneEntry;
        return entry;
    }
    if (head_ & kOneEntry) {
        auto data = std::make_unique<ListData>();
        data->entries.push_back(value_);
        value_ = Design()->PropertyCells().Hold(data.release());
        head_ &= ~kOneEntry;
    }
    ListData* list = List();
    list->entries.push_back(entry);
    if (list->index) list->index->try_emplace(At(entry)->GetName(), entry);
    return entry;
}

Ndm_Property* Ndm_Property::CreatePropertyString(const char* name, const char* value) {
    return Set(Entry(AddEntry(NDM_PROP_STRING, name)), value);
}
Ndm_Property* Ndm_Property::CreatePropertyBool(const char* name, bool value) {
    return Set(Entry(AddEntry(NDM_PROP_BOOL, name)), value);
}
Ndm_Property* Ndm_Property::CreatePropertyInt32(const char* name, int32_t value) {
    return Set(Entry(AddEntry(NDM_PROP_INT32, name)), value);
}
Ndm_Property* Ndm_Property::CreatePropertyFloat64(const char* name, double value) {
    return Set(Entry(AddEntry(NDM_PROP_FLOAT64, name)), value);
}
Ndm_Property* Ndm_Property::CreatePropertyList(const char* name) { return Entry(AddEntry(NDM_PROP_LIST, name)); }
Ndm_Property* Ndm_Property::CreatePropertyStringList(const char* name) {
    return Entry(AddEntry(NDM_PROP_STRING_LIST, name));
}

Ndm_Property* Ndm_Property::GetEntryByName(const char* name) const {
    if (!name || GetType() != NDM_PROP_LIST) return nullptr;
    if (head_ & kOneEntry) return std::strcmp(At(value_)->GetName(), name) == 0 ? At(value_) : nullptr;
    ListData* list = List();
    if (!list) return nullptr;
    if (list->entries.size() <= kIndexFrom) {
        for (uint32_t e : list->entries)
            if (std::strcmp(At(e)->GetName(), name) == 0) return At(e);
        return nullptr;
    }
    auto& index = list->index;
    if (!index) {
        // Timing lists grow to tens of thousands of entries; look them up by hash.
        index = std::make_unique<std::unordered_map<std::string_view, uint32_t>>();
        index->reserve(list->entries.size());
        for (uint32_t e : list->entries) index->try_emplace(At(e)->GetName(), e);
    }
    auto it = index->find(name);
    return it == index->end() ? nullptr : At(it->second);
}

bool Ndm_Property::DeleteEntry(Ndm_Property* entry) {
    if (GetType() != NDM_PROP_LIST || !entry) return false;
    if (head_ & kOneEntry) {
        if (At(value_) != entry) return false;
        const uint32_t cell = value_;
        value_ = 0;
        head_ &= ~kOneEntry;
        Destroy(cell, Design()->PropertyCells());
        return true;
    }
    ListData* list = List();
    if (!list) return false;
    auto it = std::find_if(list->entries.begin(), list->entries.end(), [&](uint32_t e) { return At(e) == entry; });
    if (it == list->entries.end()) return false;
    const uint32_t cell = *it;
    list->entries.erase(it);
    // The first entry of that name may have changed: the index is rebuilt on the next lookup.
    list->index.reset();
    Destroy(cell, Design()->PropertyCells());
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

Ndm_Property* Ndm_PropertyHolder::Last() const {
    if (!first_) return nullptr;
    Ndm_Property* p = Ndm_Property::At(first_);
    while (Ndm_Property* next = p->Next()) p = next;
    return p;
}

void Ndm_PropertyHolder::DeleteAllProperties() {
    if (!first_) return;
    Ndm_Design* design = OwnDesign();
    design->NoteLast(this, Last(), nullptr);
    Ndm_PropertyCells& cells = design->PropertyCells();
    for (uint32_t cell = first_; cell;) {
        const uint32_t link = Ndm_Property::At(cell)->link_;
        Ndm_Property::Destroy(cell, cells);
        cell = link & Ndm_Property::kLast ? 0 : link >> 1;
    }
    first_ = 0;
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
    if (!name || !first_) return nullptr;
    for (Ndm_Property* p = Ndm_Property::At(first_); p; p = p->Next())
        if (std::strcmp(p->GetName(), name) == 0) return p;
    return nullptr;
}

int Ndm_PropertyHolder::GetNumProperties() const { return static_cast<int>(GetPropertyItr().size()); }

// A property of a name the object has takes the place of the old one; a new name goes last.
Ndm_Property* Ndm_PropertyHolder::Create(int type, const char* name) {
    if (!name) return nullptr;
    Ndm_Design* design = OwnDesign();
    const uint32_t cell = Ndm_Property::Make(design, Ndm_Property::kLast, type, name);
    Ndm_Property* fresh = Ndm_Property::At(cell);
    Ndm_Property* prev = nullptr;
    uint32_t old = first_;
    while (old && Ndm_Property::At(old)->NameId() != fresh->NameId()) {
        prev = Ndm_Property::At(old);
        const uint32_t link = prev->link_;
        old = link & Ndm_Property::kLast ? 0 : link >> 1;
    }
    if (old) fresh->link_ = Ndm_Property::At(old)->link_;  // in the old one's place
    if (prev)
        prev->LinkTo(cell);
    else
        first_ = cell;
    // The object's last property changes when the new one goes last or replaces the last one.
    if (!old)
        design->NoteLast(this, prev, fresh);
    else if (fresh->link_ == Ndm_Property::kLast)
        design->NoteLast(this, Ndm_Property::At(old), fresh);
    if (old) Ndm_Property::Destroy(old, design->PropertyCells());
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
    for (uint32_t cell = first_; cell;) {
        Ndm_Property* p = Ndm_Property::At(cell);
        const uint32_t link = p->link_;
        if (p != property) {
            prev = p;
            cell = link & Ndm_Property::kLast ? 0 : link >> 1;
            continue;
        }
        if (prev)
            prev->link_ = link;
        else
            first_ = link & Ndm_Property::kLast ? 0 : link >> 1;
        Ndm_Design* design = OwnDesign();
        if (link == Ndm_Property::kLast) design->NoteLast(this, p, prev);
        Ndm_Property::Destroy(cell, design->PropertyCells());
        return true;
    }
    return false;
}
