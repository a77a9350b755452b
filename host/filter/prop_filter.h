// Property filter: decides whether a constraint property may go onto a design object, converts
// its value to the type the definition file declares, and puts accepted properties on the
// object under their canonical name. The definition file format is described in
// docs/property-filter.md; the shipped files are data/ucf.pfd and data/ucf.prp.
#pragma once

#include <memory>
#include <string>

class Ndm_Property;
class Ndm_PropertyHolder;

// Reserved second argument of the filter constructor; always null.
struct PM_SPEC;

// Verdict of one FilterProp call. Several flags may be set together (InhibitedFalseBool with
// DeletedTrueBool); none set means the call itself was malformed (no list, no object).
class Ndh_PropFiltResult {
public:
    enum Flag : unsigned {
        kSucceed = 1u << 0,
        kBadPropName = 1u << 1,
        kInhibitedFalseBool = 1u << 2,
        kDeletedTrueBool = 1u << 3,
        kBadDataType = 1u << 4,
    };

    Ndh_PropFiltResult() = default;
    explicit Ndh_PropFiltResult(unsigned flags) : flags_(flags) {}

    // The property passed and is now on the object.
    bool Succeed() const { return (flags_ & kSucceed) != 0; }
    // The name is not a known constraint; nothing was attached.
    bool BadPropName() const { return (flags_ & kBadPropName) != 0; }
    // A boolean constraint with a false value; not attached.
    bool InhibitedFalseBool() const { return (flags_ & kInhibitedFalseBool) != 0; }
    // With InhibitedFalseBool: a property of that name already on the object was removed.
    bool DeletedTrueBool() const { return (flags_ & kDeletedTrueBool) != 0; }
    // The value does not convert to the declared type, or the constraint is not allowed on this
    // kind of object; nothing was attached.
    bool BadDataType() const { return (flags_ & kBadDataType) != 0; }

    unsigned GetFlags() const { return flags_; }

private:
    unsigned flags_ = 0;
};

namespace ndh_filter {
struct Definitions;
}

class Ndh_PropInFilter {
public:
    // Reads (or takes from the process-wide cache) the definitions of definition_file. A bare
    // name that does not exist as given is looked up in Port_Env::DataDir() ($LUN_DATA_DIR,
    // else the installation's data folder). Failures are reported once through the message
    // manager and leave the filter invalid: it then answers BadPropName for every property.
    Ndh_PropInFilter(const char* definition_file, const PM_SPEC* spec);
    ~Ndh_PropInFilter();
    Ndh_PropInFilter(const Ndh_PropInFilter&) = default;
    Ndh_PropInFilter& operator=(const Ndh_PropInFilter&) = default;

    // Forgets the definitions read so far: a later filter reads its file again. For a tool
    // that rewrites a definition file within one process.
    static void ForgetReadDefinitions();

    bool IsValid() const { return defs_ != nullptr; }
    // Text of the error issued at construction; empty for a valid filter.
    const std::string& GetError() const { return error_; }
    // Path the definitions were read from (empty when the file was not found).
    const std::string& GetPath() const { return path_; }

    // Filters the single property held by the property list `list` against `object`; see
    // docs/property-filter.md for the verdicts. Accepted properties are created on `object`.
    Ndh_PropFiltResult FilterProp(Ndm_Property* list, Ndm_PropertyHolder* object);

    // Canonical (stored) spelling of a constraint name for any object kind, or the empty text
    // when the name is unknown. For tools and checks of definition files.
    std::string CanonicalName(const char* name) const;
    // True when the definitions keep every value of the constraint name on an object of kind
    // (a kind word of the definition file: "inst", "net", "pin", "config", ...): its type is
    // stringlist, so a later value adds to the earlier ones instead of replacing them.
    bool KeepsEveryValue(const char* name, const char* kind) const;

private:
    std::shared_ptr<const ndh_filter::Definitions> defs_;
    std::string path_;
    std::string error_;
};

class Ndh_PropUtil {
public:
    // Value of the string property `name` (exact name) of holder, or null when there is none or
    // it is not a string.
    static const char* GetStringProp(const Ndm_PropertyHolder* holder, const char* name);
};
