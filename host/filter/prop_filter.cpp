#include "host/filter/prop_filter.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <map>
#include <mutex>
#include <optional>
#include <string_view>
#include <unordered_map>
#include <vector>

#include "host/design/ndm_property.h"
#include "host/port/env.h"
#include "host/port/msgman.h"
#include "host/port/ut_str.h"

namespace ndh_filter {

enum class ValueType { Bool, Int, Float, String, StringList, FlagString };

// Object kinds, as a bit set.
enum : unsigned {
    kInst = 1u << 0,
    kNet = 1u << 1,
    kSignal = 1u << 2,
    kPin = 1u << 3,
    kConfig = 1u << 4,
    kTimespec = 1u << 5,
    kTimegrp = 1u << 6,
    kOther = 1u << 7,  // design, view
    kAllKinds = 0xFFu,
};

enum class Form { Exact, Prefix, Range };

struct Definition {
    Form form = Form::Exact;
    std::string name;     // exact name or pattern prefix, as written
    std::string upper;    // the same upper-cased
    int width = 0;        // Range: number of hex digits
    uint32_t lo = 0, hi = 0;
    ValueType type = ValueType::String;
    unsigned kinds = 0;
    int line = 0;
};

struct Definitions {
    std::vector<Definition> defs;
    std::unordered_map<std::string, std::vector<size_t>> exact;  // upper name -> defs
    std::vector<size_t> patterns;                                // in file order
};

namespace {

std::string Upper(std::string_view text) {
    std::string out(text);
    for (char& c : out)
        if (c >= 'a' && c <= 'z') c = static_cast<char>(c - 'a' + 'A');
    return out;
}

bool IsNameChar(char c) {
    return (c >= 'A' && c <= 'Z') || (c >= 'a' && c <= 'z') || (c >= '0' && c <= '9') || c == '_';
}

int HexValue(char c) {
    if (c >= '0' && c <= '9') return c - '0';
    if (c >= 'a' && c <= 'f') return c - 'a' + 10;
    if (c >= 'A' && c <= 'F') return c - 'A' + 10;
    return -1;
}

std::optional<uint32_t> ParseHex(std::string_view text) {
    if (text.empty() || text.size() > 8) return std::nullopt;
    uint32_t v = 0;
    for (char c : text) {
        int h = HexValue(c);
        if (h < 0) return std::nullopt;
        v = v * 16 + static_cast<uint32_t>(h);
    }
    return v;
}

std::optional<ValueType> TypeWord(std::string_view w) {
    static const std::pair<std::string_view, ValueType> words[] = {
        {"bool", ValueType::Bool},         {"int", ValueType::Int},
        {"float", ValueType::Float},       {"string", ValueType::String},
        {"stringlist", ValueType::StringList}, {"flagstring", ValueType::FlagString},
    };
    for (const auto& [word, type] : words)
        if (w == word) return type;
    return std::nullopt;
}

unsigned KindWord(std::string_view w) {
    static const std::pair<std::string_view, unsigned> words[] = {
        {"inst", kInst},     {"block", kInst},       {"net", kNet},         {"network", kNet},
        {"sig", kSignal},    {"signal", kSignal},    {"pin", kPin},         {"config", kConfig},
        {"timespec", kTimespec}, {"timegrp", kTimegrp}, {"all", kAllKinds},
    };
    for (const auto& [word, kind] : words)
        if (w == word) return kind;
    return 0;
}

// Parses the name field into d; returns an error text or empty.
std::string ParseName(std::string_view field, Definition& d) {
    size_t bracket = field.find('[');
    if (bracket != std::string_view::npos) {
        // PREFIX[LO-HI]
        std::string_view prefix = field.substr(0, bracket);
        if (prefix.empty() || field.back() != ']')
            return "malformed range name '" + std::string(field) + "' (expected PREFIX[LO-HI]).";
        std::string_view range = field.substr(bracket + 1, field.size() - bracket - 2);
        size_t dash = range.find('-');
        if (dash == std::string_view::npos)
            return "malformed range name '" + std::string(field) + "' (expected PREFIX[LO-HI]).";
        std::string_view lo = range.substr(0, dash), hi = range.substr(dash + 1);
        auto lv = ParseHex(lo), hv = ParseHex(hi);
        if (!lv || !hv || lo.size() != hi.size())
            return "range bounds of '" + std::string(field) +
                   "' must be hexadecimal numbers of equal width (at most 8 digits).";
        if (*lv > *hv) return "reversed range in '" + std::string(field) + "'.";
        d.form = Form::Range;
        d.width = static_cast<int>(lo.size());
        d.lo = *lv;
        d.hi = *hv;
        d.name = std::string(prefix);
    } else if (!field.empty() && field.back() == '*') {
        d.form = Form::Prefix;
        d.name = std::string(field.substr(0, field.size() - 1));
        if (d.name.empty()) return "a prefix name needs text before '*'.";
    } else {
        d.form = Form::Exact;
        d.name = std::string(field);
    }
    for (char c : d.name)
        if (!IsNameChar(c))
            return "invalid character in constraint name '" + std::string(field) + "'.";
    d.upper = Upper(d.name);
    return {};
}

bool Overlaps(const Definition& a, const Definition& b) {
    if ((a.kinds & b.kinds) == 0 || a.form != b.form || a.upper != b.upper) return false;
    if (a.form == Form::Range) return a.width == b.width && a.lo <= b.hi && b.lo <= a.hi;
    return true;
}

// The definitions read so far, by what two overlapping definitions share (see Overlaps): the
// form, the upper-cased name and a range's width. Exact and prefix definitions of one key
// have disjoint object kinds, so a key holds at most eight of them; ranges of one key are kept
// per object kind, by low bound, where they never overlap.
class OverlapIndex {
public:
    // The first definition of defs (in file order) that d overlaps, or null.
    const Definition* Find(const std::vector<Definition>& defs, const Definition& d) const {
        auto it = keys_.find(Key(d));
        if (it == keys_.end()) return nullptr;
        size_t first = SIZE_MAX;
        if (d.form != Form::Range) {
            for (size_t i : it->second.defs)
                if (Overlaps(d, defs[i])) first = std::min(first, i);
        } else {
            for (int kind = 0; kind < 8; ++kind) {
                if (!(d.kinds & (1u << kind))) continue;
                const std::map<uint32_t, size_t>& ranges = it->second.ranges[kind];
                // The ranges below d.hi, from the last one down, overlap d until one ends
                // below d.lo.
                for (auto at = ranges.upper_bound(d.hi); at != ranges.begin();) {
                    --at;
                    if (defs[at->second].hi < d.lo) break;
                    first = std::min(first, at->second);
                }
            }
        }
        return first == SIZE_MAX ? nullptr : &defs[first];
    }
    void Add(const Definition& d, size_t index) {
        Entry& entry = keys_[Key(d)];
        if (d.form != Form::Range) {
            entry.defs.push_back(index);
            return;
        }
        for (int kind = 0; kind < 8; ++kind)
            if (d.kinds & (1u << kind)) entry.ranges[kind].emplace(d.lo, index);
    }

private:
    struct Entry {
        std::vector<size_t> defs;                  // exact or prefix definitions
        std::map<uint32_t, size_t> ranges[8];      // per object kind: low bound -> definition
    };
    static std::string Key(const Definition& d) {
        return std::to_string(static_cast<int>(d.form)) + ':' + std::to_string(d.width) + ':' + d.upper;
    }
    std::unordered_map<std::string, Entry> keys_;
};

// Reads a definition file; on failure returns null and sets error.
std::shared_ptr<Definitions> Load(const std::string& path, std::string& error) {
    std::ifstream in(path, std::ios::binary);
    if (!in) {
        error = "Property definition file '" + path + "' cannot be opened.\n";
        return nullptr;
    }
    auto defs = std::make_shared<Definitions>();
    OverlapIndex overlaps;
    std::string raw;
    int line_no = 0;
    auto fail = [&](const std::string& why) {
        error = "Property definition file '" + path + "' line " + std::to_string(line_no) + ": " +
                why + "\n";
        return nullptr;
    };
    while (std::getline(in, raw)) {
        ++line_no;
        std::string_view line(raw);
        if (size_t hash = line.find('#'); hash != std::string_view::npos)
            line = line.substr(0, hash);
        // Fields: blanks, tabs, CR and commas separate.
        std::vector<std::string_view> fields;
        size_t i = 0;
        auto sep = [](char c) { return c == ' ' || c == '\t' || c == '\r' || c == ','; };
        while (i < line.size()) {
            while (i < line.size() && sep(line[i])) ++i;
            size_t start = i;
            while (i < line.size() && !sep(line[i])) ++i;
            if (i > start) fields.push_back(line.substr(start, i - start));
        }
        if (fields.empty()) continue;
        if (fields.size() < 3)
            return fail("expected a name, a type word and at least one object kind.");

        Definition d;
        d.line = line_no;
        if (std::string why = ParseName(fields[0], d); !why.empty()) return fail(why);
        auto type = TypeWord(fields[1]);
        if (!type) return fail("unknown type word '" + std::string(fields[1]) + "'.");
        d.type = *type;
        for (size_t k = 2; k < fields.size(); ++k) {
            unsigned kind = KindWord(fields[k]);
            if (!kind) return fail("unknown object kind '" + std::string(fields[k]) + "'.");
            d.kinds |= kind;
        }
        if (const Definition* other = overlaps.Find(defs->defs, d))
            return fail("duplicate definition of '" + std::string(fields[0]) +
                        "' for the same object kind (first on line " + std::to_string(other->line) + ").");
        size_t index = defs->defs.size();
        overlaps.Add(d, index);
        if (d.form == Form::Exact)
            defs->exact[d.upper].push_back(index);
        else
            defs->patterns.push_back(index);
        defs->defs.push_back(std::move(d));
    }
    if (in.bad()) return fail("read error.");
    return defs;
}

// Whether pattern d matches the upper-cased name.
bool PatternMatches(const Definition& d, const std::string& upper) {
    if (upper.size() <= d.upper.size() || upper.compare(0, d.upper.size(), d.upper) != 0)
        return false;
    std::string_view rest = std::string_view(upper).substr(d.upper.size());
    if (d.form == Form::Prefix) {
        for (char c : rest)
            if (!IsNameChar(c)) return false;
        return true;
    }
    if (static_cast<int>(rest.size()) != d.width) return false;
    auto v = ParseHex(rest);
    return v && *v >= d.lo && *v <= d.hi;
}

struct Match {
    bool known = false;               // some definition carries the name
    const Definition* def = nullptr;  // the one allowing the object kind
    std::string stored;               // canonical name for def (or the first match)
};

std::string StoredName(const Definition& d, const std::string& upper) {
    if (d.form == Form::Exact) return d.name;
    return d.name + upper.substr(d.upper.size());
}

Match Lookup(const Definitions& defs, const char* name, unsigned kind) {
    Match m;
    std::string upper = Upper(name ? name : "");
    // The first definition carrying the name gives the stored name, unless a later one allows
    // the kind of object. True once that one is found.
    auto take = [&](const Definition& d) {
        if (!m.known || (d.kinds & kind)) m.stored = StoredName(d, upper);
        m.known = true;
        if (!(d.kinds & kind)) return false;
        m.def = &d;
        return true;
    };
    if (auto it = defs.exact.find(upper); it != defs.exact.end()) {
        for (size_t i : it->second)
            if (take(defs.defs[i])) break;
    } else {
        for (size_t i : defs.patterns)
            if (PatternMatches(defs.defs[i], upper) && take(defs.defs[i])) break;
    }
    return m;
}

unsigned KindOf(const Ndm_PropertyHolder& object) {
    switch (object.GetKind()) {
        case Ndm_ObjKind::Block: {
            const char* type = Ndh_PropUtil::GetStringProp(&object, "TYPE");
            if (type) {
                std::string_view t(type);
                if (t == "CONFIG") return kConfig;
                if (t == "TIMESPEC") return kTimespec;
                if (t == "TIMEGRP") return kTimegrp;
            }
            return kInst;
        }
        case Ndm_ObjKind::Network: return kNet;
        case Ndm_ObjKind::Signal: return kSignal;
        case Ndm_ObjKind::Pin: return kPin;
        default: return kOther;
    }
}

std::string_view Trim(std::string_view t) {
    auto blank = [](char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\n'; };
    while (!t.empty() && blank(t.front())) t.remove_prefix(1);
    while (!t.empty() && blank(t.back())) t.remove_suffix(1);
    return t;
}

std::optional<bool> ToBool(const Ndm_Property& p) {
    switch (p.GetType()) {
        case NDM_PROP_BOOL: return p.GetBool();
        case NDM_PROP_INT32: return p.GetInt32() != 0;
        case NDM_PROP_STRING: {
            std::string u = Upper(Trim(p.GetValueString()));
            // An empty text is a flag written without a value.
            if (u.empty() || u == "TRUE" || u == "YES" || u == "ON" || u == "1") return true;
            if (u == "FALSE" || u == "NO" || u == "OFF" || u == "0") return false;
            return std::nullopt;
        }
        default: return std::nullopt;
    }
}

std::optional<int32_t> ToInt(const Ndm_Property& p) {
    switch (p.GetType()) {
        case NDM_PROP_INT32: return p.GetInt32();
        case NDM_PROP_FLOAT64: {
            double v = p.GetFloat64();
            if (std::isfinite(v) && v == std::floor(v) && v >= INT32_MIN && v <= INT32_MAX)
                return static_cast<int32_t>(v);
            return std::nullopt;
        }
        case NDM_PROP_STRING: {
            bool ok = false;
            int v = UT_STR::StrToINT32(p.GetValueString(), &ok);
            if (ok) return v;
            return std::nullopt;
        }
        default: return std::nullopt;
    }
}

std::optional<double> ToFloat(const Ndm_Property& p) {
    switch (p.GetType()) {
        case NDM_PROP_FLOAT64: return p.GetFloat64();
        case NDM_PROP_INT32: return p.GetInt32();
        case NDM_PROP_STRING: {
            std::string t(Trim(p.GetValueString()));
            if (t.empty()) return std::nullopt;
            char* end = nullptr;
            double v = std::strtod(t.c_str(), &end);
            if (end != t.c_str() + t.size() || !std::isfinite(v)) return std::nullopt;
            // strtod also reads hexadecimal and "inf"/"nan" forms; only decimal text is a number here.
            for (char c : t)
                if (!((c >= '0' && c <= '9') || c == '.' || c == '-' || c == '+' || c == 'e' ||
                      c == 'E'))
                    return std::nullopt;
            return v;
        }
        default: return std::nullopt;
    }
}

std::optional<std::string> ToText(const Ndm_Property& p) {
    switch (p.GetType()) {
        case NDM_PROP_STRING: return std::string(p.GetValueString());
        case NDM_PROP_INT32: return std::to_string(p.GetInt32());
        case NDM_PROP_FLOAT64: {
            char buf[64];
            auto r = std::to_chars(buf, buf + sizeof buf, p.GetFloat64());
            return std::string(buf, r.ptr);
        }
        default: return std::nullopt;
    }
}

using R = Ndh_PropFiltResult;

R AttachBool(bool value, const std::string& name, Ndm_PropertyHolder& object) {
    if (value) {
        object.CreatePropertyBool(name.c_str(), true);
        return R(R::kSucceed);
    }
    unsigned flags = R::kInhibitedFalseBool;
    if (object.DeleteProperty(name.c_str())) flags |= R::kDeletedTrueBool;
    return R(flags);
}

struct Cache {
    std::mutex mutex;
    std::map<std::string, std::shared_ptr<const Definitions>> by_path;
};

Cache& TheCache() {
    static Cache cache;
    return cache;
}

bool IsFile(const std::string& path) {
    std::error_code ec;
    return std::filesystem::is_regular_file(path, ec);
}

}  // namespace
}  // namespace ndh_filter

using namespace ndh_filter;

Ndh_PropInFilter::Ndh_PropInFilter(const char* definition_file, const PM_SPEC* /*spec*/) {
    std::string given = definition_file ? definition_file : "";
    std::string where;
    if (!given.empty() && IsFile(given)) {
        path_ = given;
    } else if (!given.empty() && given.find('/') == std::string::npos) {
        where = Port_Env::DataDir();
        if (!where.empty()) {
            std::string candidate = where + "/" + given;
            if (IsFile(candidate)) path_ = candidate;
        }
    }

    if (path_.empty()) {
        error_ = "Property definition file '" + given + "' not found";
        if (!where.empty()) error_ += " (also looked in '" + where + "')";
        error_ += ".\n";
    } else {
        std::error_code ec;
        std::filesystem::path canon = std::filesystem::weakly_canonical(path_, ec);
        std::string key = ec ? path_ : canon.string();
        Cache& cache = TheCache();
        std::lock_guard<std::mutex> lock(cache.mutex);
        if (auto it = cache.by_path.find(key); it != cache.by_path.end()) {
            defs_ = it->second;
        } else if (auto loaded = Load(path_, error_)) {
            defs_ = loaded;
            cache.by_path.emplace(key, defs_);
        }
    }
    if (!defs_)
        Port_MsgManData::createObject("Quillmap", "filter", __LINE__, "1.0")
            .issueError("%s", error_.c_str());
}

Ndh_PropInFilter::~Ndh_PropInFilter() = default;

void Ndh_PropInFilter::ForgetReadDefinitions() {
    Cache& cache = TheCache();
    std::lock_guard<std::mutex> lock(cache.mutex);
    cache.by_path.clear();
}

std::string Ndh_PropInFilter::CanonicalName(const char* name) const {
    if (!defs_ || !name) return {};
    return Lookup(*defs_, name, kAllKinds).stored;
}

bool Ndh_PropInFilter::KeepsEveryValue(const char* name, const char* kind) const {
    if (!defs_ || !name || !kind) return false;
    Match m = Lookup(*defs_, name, KindWord(kind));
    return m.def && m.def->type == ValueType::StringList;
}

Ndh_PropFiltResult Ndh_PropInFilter::FilterProp(Ndm_Property* list, Ndm_PropertyHolder* object) {
    if (!list || !object || list->GetType() != NDM_PROP_LIST || list->GetNumEntries() != 1)
        return R();
    const Ndm_Property& prop = *list->GetListItr()[0];
    if (!defs_) return R(R::kBadPropName);

    Match m = Lookup(*defs_, prop.GetName(), KindOf(*object));
    if (!m.known) return R(R::kBadPropName);
    // A known constraint on a kind of object it does not apply to is treated like a bad value:
    // ignored with a warning, without failing the statement.
    if (!m.def) return R(R::kBadDataType);
    const std::string& name = m.stored;

    switch (m.def->type) {
        case ValueType::Bool: {
            auto v = ToBool(prop);
            if (!v) return R(R::kBadDataType);
            return AttachBool(*v, name, *object);
        }
        case ValueType::Int: {
            auto v = ToInt(prop);
            if (!v) return R(R::kBadDataType);
            object->CreatePropertyInt32(name.c_str(), *v);
            return R(R::kSucceed);
        }
        case ValueType::Float: {
            auto v = ToFloat(prop);
            if (!v) return R(R::kBadDataType);
            object->CreatePropertyFloat64(name.c_str(), *v);
            return R(R::kSucceed);
        }
        case ValueType::FlagString:
            if (prop.GetType() == NDM_PROP_BOOL) return AttachBool(prop.GetBool(), name, *object);
            [[fallthrough]];
        case ValueType::String: {
            auto v = ToText(prop);
            if (!v) return R(R::kBadDataType);
            object->CreatePropertyString(name.c_str(), v->c_str());
            return R(R::kSucceed);
        }
        case ValueType::StringList: {
            auto v = ToText(prop);
            if (!v) return R(R::kBadDataType);
            Ndm_Property* existing = object->GetPropertyByName(name.c_str());
            if (!existing || existing->GetType() != NDM_PROP_STRING_LIST) {
                // A plain string of that name (written around the filter) becomes the first entry.
                std::optional<std::string> old;
                if (existing && existing->GetType() == NDM_PROP_STRING)
                    old = existing->GetValueString();
                existing = object->CreatePropertyStringList(name.c_str());
                if (old) existing->AddString(old->c_str());
            }
            existing->AddString(v->c_str());
            return R(R::kSucceed);
        }
    }
    return R();
}

const char* Ndh_PropUtil::GetStringProp(const Ndm_PropertyHolder* holder, const char* name) {
    if (!holder || !name) return nullptr;
    const Ndm_Property* p = holder->GetPropertyByName(name);
    return p ? p->GetValueString() : nullptr;
}
