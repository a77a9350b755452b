// Typed properties of design objects, and the holder every design object derives from.
// Properties keep their creation order. On a holder, creating a property whose name is already
// there replaces that property in place; inside a list property, entries of equal names are
// all kept (a timing list may hold several "OFFSET" entries).
#pragma once

#include <cstdint>
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
    ~Ndm_Property();

    // Property name.
    const char* GetName() const { return name_; }
    // Type code (Ndm_PropType).
    int GetType() const { return type_; }
    // Object the property sits on (for list entries: the object of the list).
    Ndm_PropertyHolder* GetOwner() const { return owner_; }

    // Value accessors; each answers a neutral value for a property of another type.
    bool GetBool() const { return type_ == NDM_PROP_BOOL && int_ != 0; }
    int32_t GetInt32() const { return type_ == NDM_PROP_INT32 ? int_ : 0; }
    double GetFloat64() const { return type_ == NDM_PROP_FLOAT64 ? float_ : 0.0; }
    // Text of a string property, or null.
    const char* GetValueString() const { return type_ == NDM_PROP_STRING ? text_ : nullptr; }
    // Texts of a string list, in order (empty for other types).
    const std::vector<std::string>& GetStrings() const;
    // Entries of a list property, in order (empty for other types).
    std::span<Ndm_Property* const> GetListItr() const {
        return type_ == NDM_PROP_LIST && list_ ? std::span<Ndm_Property* const>(list_->entries)
                                               : std::span<Ndm_Property* const>();
    }
    int GetNumEntries() const {
        return type_ == NDM_PROP_LIST && list_ ? static_cast<int>(list_->entries.size()) : 0;
    }

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
        if (type_ == NDM_PROP_BOOL) int_ = value ? 1 : 0;
    }
    void SetInt32(int32_t value) {
        if (type_ == NDM_PROP_INT32) int_ = value;
    }
    void SetFloat64(double value) {
        if (type_ == NDM_PROP_FLOAT64) float_ = value;
    }
    void SetValueString(const char* value);

private:
    friend class Ndm_PropertyHolder;
    Ndm_Property(Ndm_PropertyHolder* owner, const char* interned_name, int type);
    // Properties and list data live in the design's cells.
    static Ndm_PropertyCells& CellsOf(const Ndm_PropertyHolder* owner);
    static Ndm_Property* Make(Ndm_PropertyHolder* owner, int type, const char* name);
    static void Destroy(Ndm_Property* p);
    Ndm_Property* AddEntry(int type, const char* name);

    // Entries of a list property (owned), and the first entry of each name, built by the first
    // lookup in a list of more than kIndexFrom entries and kept up to date by additions.
    struct ListData {
        std::vector<Ndm_Property*> entries;
        std::unique_ptr<std::unordered_map<std::string_view, Ndm_Property*>> index;
    };
    static constexpr size_t kIndexFrom = 8;
    static_assert(sizeof(ListData) <= 32);

    // Names and texts are interned in the design, and a short string list is a value the
    // design shares between every property holding the same texts (Ndm_TextLists): an object
    // pays for its properties, not for their values.
    Ndm_PropertyHolder* owner_;
    const char* name_;
    union {
        int32_t int_;
        double float_;
        const char* text_;                        // string
        const std::vector<std::string>* strings_;  // string list: shared, or owned when long
        ListData* list_;                          // list (owned), null while empty
    };
    uint8_t type_;
    bool owns_strings_ = false;
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
    std::span<Ndm_Property* const> GetPropertyItr() const;
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

    struct Props;            // count, room and the property pointers, in one allocation
    Props* props_ = nullptr;  // allocated on the first property
    Ndm_ObjKind kind_;
};
