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

class Ndm_EntryRange;

// Where properties are, for the inline accessors below (kept by property_store.h): the chunks of
// 12-byte cells of every design, by number, and the property names, by id. A chunk is 64 KB,
// aligned to its size, and begins with its design and its number, so that a property finds its
// design and its own index from its address.
struct Ndm_PropertyTables {
    static constexpr int kPlaceBits = 13;
    static constexpr size_t kCell = 12;
    static constexpr size_t kChunkBytes = size_t{1} << 16;
    static constexpr size_t kHead = 16;
    static constexpr uint32_t kCellsPerChunk = (kChunkBytes - kHead) / kCell;
    static constexpr size_t kMaxChunks = size_t{1} << (31 - kPlaceBits);
    static unsigned char* chunks[kMaxChunks];
    static const char* const* names;
    static unsigned char* Cell(uint32_t cell) {
        return chunks[cell >> kPlaceBits] + kHead + (cell & ((uint32_t{1} << kPlaceBits) - 1)) * kCell;
    }
    static Ndm_Design* DesignOf(const void* cell) {
        return *reinterpret_cast<Ndm_Design* const*>(reinterpret_cast<uintptr_t>(cell) & ~(kChunkBytes - 1));
    }
    static uint32_t IndexOf(const void* cell) {
        const uintptr_t at = reinterpret_cast<uintptr_t>(cell), chunk = at & ~(kChunkBytes - 1);
        const uint32_t number = *reinterpret_cast<const uint32_t*>(chunk + sizeof(void*));
        return number << kPlaceBits | static_cast<uint32_t>((at - chunk - kHead) / kCell);
    }
};

class Ndm_Property {
public:
    Ndm_Property(const Ndm_Property&) = delete;
    Ndm_Property& operator=(const Ndm_Property&) = delete;

    // Property name.
    const char* GetName() const { return Ndm_PropertyTables::names[NameId()]; }
    // Type code (Ndm_PropType).
    int GetType() const { return static_cast<int>(head_ >> kTypeShift & 15); }
    // Object the property sits on (for list entries: the object of the list). Found from the
    // object's last property, which the design maps to the object (the map is made by the first
    // call).
    Ndm_PropertyHolder* GetOwner() const;

    // Value accessors; each answers a neutral value for a property of another type.
    bool GetBool() const { return GetType() == NDM_PROP_BOOL && value_ != 0; }
    int32_t GetInt32() const { return GetType() == NDM_PROP_INT32 ? static_cast<int32_t>(value_) : 0; }
    double GetFloat64() const;
    // Text of a string property, or null.
    const char* GetValueString() const;
    // Texts of a string list, in order (empty for other types).
    const std::vector<std::string>& GetStrings() const;
    // Entries of a list property, in order (empty for other types).
    Ndm_EntryRange GetListItr() const;
    int GetNumEntries() const;

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
        if (GetType() == NDM_PROP_BOOL) value_ = value ? 1 : 0;
    }
    void SetInt32(int32_t value) {
        if (GetType() == NDM_PROP_INT32) value_ = static_cast<uint32_t>(value);
    }
    void SetFloat64(double value);
    void SetValueString(const char* value);

private:
    friend class Ndm_PropertyHolder;
    friend class Ndm_PropertyRange;
    friend class Ndm_EntryRange;
    Ndm_Property(uint32_t link, uint32_t name, int type)
        : head_(name | static_cast<uint32_t>(type) << kTypeShift), link_(link), value_(0) {}
    ~Ndm_Property() = default;
    // Properties live in the design's cells and are known there by index.
    static Ndm_Property* At(uint32_t cell) { return reinterpret_cast<Ndm_Property*>(Ndm_PropertyTables::Cell(cell)); }
    Ndm_Design* Design() const { return Ndm_PropertyTables::DesignOf(this); }
    // A new property in design's cells with that link, as its cell's index.
    static uint32_t Make(Ndm_Design* design, uint32_t link, int type, const char* name);
    static void Destroy(uint32_t cell, Ndm_PropertyCells& cells);
    static void Free(uint32_t cell, Ndm_PropertyCells& cells);
    uint32_t AddEntry(int type, const char* name);
    Ndm_Property* Entry(uint32_t cell) { return cell ? At(cell) : nullptr; }

    // The name's id (Ndm_PropertyNames), the type code and two marks: the string list is the
    // property's own, and the list holds one entry, whose index is the value (a list made to
    // carry one value through the filter costs no allocation).
    static constexpr int kTypeShift = 24;
    static constexpr uint32_t kNameMask = (uint32_t{1} << kTypeShift) - 1;
    static constexpr uint32_t kOwnsStrings = uint32_t{1} << 28, kOneEntry = uint32_t{1} << 29;
    uint32_t NameId() const { return head_ & kNameMask; }
    bool OwnsStrings() const { return head_ & kOwnsStrings; }

    // The link: the next property of the same object; or, marked by the low bit, nothing after
    // the last property of an object, and the list for an entry of a list.
    static constexpr uint32_t kLast = 1;
    static uint32_t EntryOf(uint32_t list) { return list << 1 | kLast; }
    Ndm_Property* Next() const { return link_ & kLast ? nullptr : At(link_ >> 1); }
    void LinkTo(uint32_t cell) { link_ = cell << 1; }
    // What a string list or a list of several entries points to, kept in a cell of its own.
    void* Pointer() const;

    // Entries of a list property (owned, by index), and the first entry of each name, built by
    // the first lookup in a list of more than kIndexFrom entries and kept up to date by
    // additions.
    struct ListData {
        std::vector<uint32_t> entries;
        std::unique_ptr<std::unordered_map<std::string_view, uint32_t>> index;
    };
    static constexpr size_t kIndexFrom = 8;
    ListData* List() const;

    // A property is 12 bytes. Its value: an int32 or bool; a string's text id in the design's
    // name pool; a float64's own cell; the cell pointing to a string list (shared between every
    // property holding the same texts, Ndm_TextLists, or owned when long); a list's one entry,
    // or the cell pointing to its entries.
    uint32_t head_;
    uint32_t link_;
    uint32_t value_;
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

// The entries of a list property in order, as a range of pointers; also made over any span of
// properties. It stays valid while the list is not changed.
class Ndm_EntryRange {
public:
    class iterator : public Ndm_PointerIterator<Ndm_Property> {
    public:
        iterator() = default;
        iterator(const Ndm_EntryRange* range, size_t at) : range_(range), at_(at) {}
        Ndm_Property* operator*() const { return (*range_)[at_]; }
        iterator& operator++() {
            ++at_;
            return *this;
        }
        iterator operator++(int) {
            iterator before = *this;
            ++at_;
            return before;
        }
        bool operator==(const iterator&) const = default;

    private:
        const Ndm_EntryRange* range_ = nullptr;
        size_t at_ = 0;
    };
    Ndm_EntryRange() = default;
    Ndm_EntryRange(std::span<Ndm_Property* const> props) : pointers_(props.data()), size_(props.size()) {}  // NOLINT
    iterator begin() const { return iterator(this, 0); }
    iterator end() const { return iterator(this, size_); }
    size_t size() const { return size_; }
    bool empty() const { return size_ == 0; }
    Ndm_Property* operator[](size_t i) const {
        if (pointers_) return pointers_[i];
        return Ndm_Property::At(cells_ ? cells_[i] : one_);
    }

private:
    friend class Ndm_Property;
    Ndm_Property* const* pointers_ = nullptr;
    const uint32_t* cells_ = nullptr;
    uint32_t one_ = 0;
    size_t size_ = 0;
};

// Kinds of design objects.
enum class Ndm_ObjKind : uint8_t { Design, View, Block, Signal, Pin, Network };

// Base of every design object: an ordered set of typed properties. Objects without
// properties pay four bytes.
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
    Ndm_PropertyRange GetPropertyItr() const { return Ndm_PropertyRange(first_ ? Ndm_Property::At(first_) : nullptr); }
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
    friend class Ndm_Design;
    Ndm_Property* Create(int type, const char* name);
    // The last property, or null.
    Ndm_Property* Last() const;

    // The design the object belongs to, which interns the property names and texts.
    Ndm_Design* OwnDesign() const;

    uint32_t first_ = 0;  // the first property's cell, linked to the next
    Ndm_ObjKind kind_;
};
