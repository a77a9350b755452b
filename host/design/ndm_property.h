// Typed properties of design objects, and the holder every design object derives from.
// Properties keep their creation order. On a holder, creating a property whose name is already
// there replaces that property in place; inside a list property, entries of equal names are
// all kept (a timing list may hold several "OFFSET" entries).
#pragma once

#include <cstddef>
#include <cstdint>
#include <iterator>
#include <memory>
#include <span>
#include <string>
#include <string_view>
#include <unordered_map>
#include <vector>

class Ndm_PropertyHolder;
class Ndm_Design;
class Ndm_PropertyCells;  // the design's storage of properties (property_store.h)
class Ndm_TextLists;

// Type codes reported by Ndm_Property::GetType.
enum Ndm_PropType : int {
    NDM_PROP_BOOL = 0,
    NDM_PROP_RESERVED = 1,  // not created by this database
    NDM_PROP_INT32 = 3,
    NDM_PROP_FLOAT64 = 4,
    NDM_PROP_LIST = 5,
    NDM_PROP_STRING = 9,
    NDM_PROP_STRING_LIST = 10,
};

// Name of a type code as used in dumps and in the native design file ("bool", "int32",
// "float64", "list", "string", "string_list"), or null.
const char* Ndm_PropTypeName(int type);

class Ndm_Property {
public:
    Ndm_Property(const Ndm_Property&) = delete;
    Ndm_Property& operator=(const Ndm_Property&) = delete;

    // Property name.
    const char* GetName() const { return name_; }
    // Type code (Ndm_PropType).
    int GetType() const { return static_cast<int>(link_ >> kTypeShift); }
    // Object the property sits on (for list entries: the object of the list). Found at the end
    // of the object's properties, which are few.
    Ndm_PropertyHolder* GetOwner() const;

    // Value accessors; each answers a neutral value for a property of another type.
    bool GetBool() const { return GetType() == NDM_PROP_BOOL && int_ != 0; }
    int32_t GetInt32() const { return GetType() == NDM_PROP_INT32 ? int_ : 0; }
    double GetFloat64() const { return GetType() == NDM_PROP_FLOAT64 ? float_ : 0.0; }
    // Text of a string property, or null.
    const char* GetValueString() const { return GetType() == NDM_PROP_STRING ? text_ : nullptr; }
    // Texts of a string list, in order (empty for other types).
    const std::vector<std::string>& GetStrings() const;
    // Entries of a list property, in order (empty for other types).
    std::span<Ndm_Property* const> GetListItr() const {
        if (GetType() != NDM_PROP_LIST) return {};
        if (link_ & kOneEntry) return {&entry_, 1};
        return list_ ? std::span<Ndm_Property* const>(list_->entries) : std::span<Ndm_Property* const>();
    }
    int GetNumEntries() const { return static_cast<int>(GetListItr().size()); }

    // Appends a text to a string list; false for other types.
    bool AddString(const char* text);
    // New entry inside a list property; null when this is not a list.
    Ndm_Property* CreatePropertyString(const char* name, const char* value);
    Ndm_Property* CreatePropertyBool(const char* name, bool value = true);
    Ndm_Property* CreatePropertyInt32(const char* name, int32_t value);
    Ndm_Property* CreatePropertyFloat64(const char* name, double value);
    Ndm_Property* CreatePropertyList(const char* name);
    Ndm_Property* CreatePropertyStringList(const char* name);
    // First entry of a list named name, or null.
    Ndm_Property* GetEntryByName(const char* name) const;
    // Removes and destroys one entry of a list; false when it is not an entry of this list.
    bool DeleteEntry(Ndm_Property* entry);

    // Replaces the value of a bool, int32, float64 or string property; a property of another
    // type is left as it is.
    void SetBool(bool value) {
        if (GetType() == NDM_PROP_BOOL) int_ = value ? 1 : 0;
    }
    void SetInt32(int32_t value) {
        if (GetType() == NDM_PROP_INT32) int_ = value;
    }
    void SetFloat64(double value) {
        if (GetType() == NDM_PROP_FLOAT64) float_ = value;
    }
    void SetValueString(const char* value);

private:
    friend class Ndm_PropertyHolder;
    friend class Ndm_PropertyRange;
    Ndm_Property(Ndm_PropertyHolder* owner, const char* interned_name, int type);
    ~Ndm_Property() = default;
    // Properties and list data live in the design's cells.
    static Ndm_PropertyCells& CellsOf(const Ndm_PropertyHolder* owner);
    static Ndm_Property* Make(Ndm_PropertyHolder* owner, int type, const char* name);
    static void Destroy(Ndm_Property* p, Ndm_PropertyCells& cells);
    static void Free(Ndm_Property* p, Ndm_PropertyCells& cells);
    Ndm_Property* AddEntry(int type, const char* name);

    // The link: the next property of the same object, or at the end (and for list entries) the
    // object itself, marked by the low bit; the second bit when a string list is the
    // property's own, the third when a list holds one entry, in entry_ (a list made to carry one
    // value through the filter costs no allocation); the type code in the top byte. Addresses
    // take 48 bits and are 8-aligned.
    static constexpr uint64_t kAtOwner = 1, kOwnsStrings = 2, kOneEntry = 4;
    static constexpr int kTypeShift = 56;
    static constexpr uint64_t kAddress = ((uint64_t{1} << 48) - 1) & ~uint64_t{7};
    Ndm_Property* Next() const {
        return link_ & kAtOwner ? nullptr : reinterpret_cast<Ndm_Property*>(static_cast<uintptr_t>(link_ & kAddress));
    }
    // Points the link at what another link points at (a property or the owner), keeping the
    // type and the strings mark.
    void LinkAs(uint64_t other) { link_ = (link_ & ~(kAddress | kAtOwner)) | (other & (kAddress | kAtOwner)); }
    void LinkTo(const Ndm_Property* next) { LinkAs(reinterpret_cast<uintptr_t>(next)); }
    bool OwnsStrings() const { return link_ & kOwnsStrings; }

    // Entries of a list property (owned), and the first entry of each name, built by the first
    // lookup in a list of more than kIndexFrom entries and kept up to date by additions.
    struct ListData {
        std::vector<Ndm_Property*> entries;
        std::unique_ptr<std::unordered_map<std::string_view, Ndm_Property*>> index;
    };
    static constexpr size_t kIndexFrom = 8;

    // Names and texts are interned in the design, and a short string list is a value the
    // design shares between every property holding the same texts (Ndm_TextLists): an object
    // pays for its properties, 24 bytes each, not for their values.
    const char* name_;
    union {
        int32_t int_;
        double float_;
        const char* text_;                        // string
        const std::vector<std::string>* strings_;  // string list: shared, or owned when long
        ListData* list_;                          // list of two entries or more (owned), else null
        Ndm_Property* entry_;                     // list of one entry
    };
    uint64_t link_;
};

// What an iterator that hands out pointers to T by value declares of itself.
template <class T>
struct Ndm_PointerIterator {
    using iterator_category = std::forward_iterator_tag;
    using value_type = T*;
    using difference_type = std::ptrdiff_t;
    using pointer = T* const*;
    using reference = T*;
    bool operator==(const Ndm_PointerIterator&) const = default;
};

// The properties of an object in creation order, as a range of pointers.
class Ndm_PropertyRange {
public:
    class iterator : public Ndm_PointerIterator<Ndm_Property> {
    public:
        iterator() = default;
        explicit iterator(Ndm_Property* at) : at_(at) {}
        Ndm_Property* operator*() const { return at_; }
        iterator& operator++() {
            at_ = at_->Next();
            return *this;
        }
        iterator operator++(int) {
            iterator before = *this;
            at_ = at_->Next();
            return before;
        }
        bool operator==(const iterator&) const = default;

    private:
        Ndm_Property* at_ = nullptr;
    };
    explicit Ndm_PropertyRange(Ndm_Property* first) : first_(first) {}
    iterator begin() const { return iterator(first_); }
    iterator end() const { return iterator(); }
    bool empty() const { return !first_; }
    size_t size() const {
        size_t n = 0;
        for (Ndm_Property* p = first_; p; p = p->Next()) ++n;
        return n;
    }
    // The property at place i (i < size()).
    Ndm_Property* operator[](size_t i) const {
        Ndm_Property* p = first_;
        while (i--) p = p->Next();
        return p;
    }

private:
    Ndm_Property* first_;
};

// Kinds of design objects.
enum class Ndm_ObjKind : uint8_t { Design, View, Block, Signal, Pin, Network };

// Base of every design object: an ordered set of typed properties. Objects without
// properties pay one pointer.
class Ndm_PropertyHolder {
public:
    Ndm_PropertyHolder(const Ndm_PropertyHolder&) = delete;
    Ndm_PropertyHolder& operator=(const Ndm_PropertyHolder&) = delete;

    Ndm_ObjKind GetKind() const { return kind_; }
    // Local name of the object (dispatches on the kind).
    const char* GetName() const;
    // Full hierarchical name (see docs/design-database.md).
    std::string GetFullName() const;

    // First property named name (exact), or null.
    Ndm_Property* GetPropertyByName(const char* name) const;
    // Properties in creation order.
    Ndm_PropertyRange GetPropertyItr() const { return Ndm_PropertyRange(props_); }
    int GetNumProperties() const;

    // Creates a property, replacing one of the same name in place.
    Ndm_Property* CreatePropertyBool(const char* name, bool value = true);
    Ndm_Property* CreatePropertyInt32(const char* name, int32_t value);
    Ndm_Property* CreatePropertyFloat64(const char* name, double value);
    Ndm_Property* CreatePropertyString(const char* name, const char* value);
    Ndm_Property* CreatePropertyList(const char* name);
    Ndm_Property* CreatePropertyStringList(const char* name);
    // Removes and destroys the first property named name; false when there is none.
    bool DeleteProperty(const char* name);
    // Removes and destroys this property (a property of this object); false otherwise.
    bool DeleteProperty(Ndm_Property* property);
    // Removes every property.
    void DeleteAllProperties();

protected:
    explicit Ndm_PropertyHolder(Ndm_ObjKind kind) : kind_(kind) {}
    ~Ndm_PropertyHolder();

private:
    friend class Ndm_Property;
    Ndm_Property* Create(int type, const char* name);

    // The design the object belongs to, which interns the property names and texts.
    Ndm_Design* OwnDesign() const;

    Ndm_Property* props_ = nullptr;  // the first property, linked to the next
    Ndm_ObjKind kind_;
};
