// Where the pads go: sites given to two nets, pads given two values of a setting, top-level
// ports without a LOC or an I/O standard.
#include <algorithm>
#include <cstring>
#include <unordered_set>

#include "check/ck_board_check.h"
#include "check/ck_ordered_groups.h"
#include "check/ck_text.h"
#include "host/design/ndm.h"
#include "host/port/msgman.h"
#include "host/repository/cs_mgr.h"

namespace {

bool Is(const char* a, const char* b) { return std::strcmp(a, b) == 0; }

// "Net", "Instance" or "Pin": what a constraint of an object statement sits on.
const char* ObjectWord(const Ndm_PropertyHolder* o) {
    switch (o->GetKind()) {
        case Ndm_ObjKind::Block: return "Instance";
        case Ndm_ObjKind::Pin: return "Pin";
        default: return "Net";
    }
}

std::string Setting(const Cs_Constraint& c) {
    if (c.IsFlag()) return c.GetAttribute();
    return std::string(c.GetAttribute()) + " = " + c.GetValueText();
}

// The sites of a LOC value: a list is written "P1,P2"; a range stays one site.
std::vector<std::string> Sites(const char* value) {
    std::vector<std::string> sites;
    std::string site;
    for (const char* p = value;; ++p) {
        if (*p == ',' || *p == '\0') {
            if (!site.empty()) sites.push_back(site);
            site.clear();
            if (!*p) break;
        } else if (*p != ' ') {
            site += *p;
        }
    }
    return sites;
}

std::string Upper(std::string text) {
    for (char& c : text)
        if (c >= 'a' && c <= 'z') c = static_cast<char>(c - 'a' + 'A');
    return text;
}

// Values a location override names in its message before the last.
constexpr size_t kValuesNamed = 4;

bool IsPull(const Cs_Constraint& c) {
    return c.IsFlag() && (Is(c.GetAttribute(), "PULLUP") || Is(c.GetAttribute(), "PULLDOWN") ||
                          Is(c.GetAttribute(), "KEEPER"));
}

}  // namespace

void Ck_BoardCheck::Ports() {
    ports_.clear();
    if (!view_ || !view_->GetBlock()) return;
    std::unordered_map<const Ndm_PropertyHolder*, size_t> index;
    for (Ndm_Pin* pin : view_->GetBlock()->GetPinItr()) {
        Ndm_Signal* s = pin->GetSignal();
        Ndm_PropertyHolder* net = s ? (s->GetNetwork() ? static_cast<Ndm_PropertyHolder*>(s->GetNetwork()) : s) : nullptr;
        index.emplace(pin, ports_.size());
        if (net) index.emplace(net, ports_.size());
        ports_.push_back({pin, net, {}});
    }
    if (ports_.empty()) return;
    for (const Cs_Constraint* c : active_)
        for (Ndm_PropertyHolder* o : c->GetAssociatedDesignObjs()) {
            auto it = index.find(o);
            if (it != index.end()) ports_[it->second].constraints.push_back(c);
        }

    Ck_Finding unplaced{Ck_Kind::UnplacedPort, "", {}, {}};
    Ck_Finding bare{Ck_Kind::NoIoStandard, "", {}, {}};
    for (const Port& port : ports_) {
        const Cs_Constraint* loc = nullptr;
        bool standard = false;
        for (const Cs_Constraint* c : port.constraints) {
            if (!loc && c->GetType() == Cs_Constraint_Locate::Type()) loc = c;
            standard = standard || c->GetType() == Cs_Constraint_IOStandard::Type();
        }
        if (!loc) {
            unplaced.objects.push_back(port.pin->GetName());
            continue;
        }
        ++summary_.ports_placed;
        if (standard) {
            ++summary_.placed_with_iostandard;
            continue;
        }
        bare.objects.push_back(port.pin->GetName());
        bare.refs.push_back(RefOf(loc, port.pin->GetName()));
    }
    summary_.ports = ports_.size();
    if (!unplaced.objects.empty()) {
        const size_t n = unplaced.objects.size();
        unplaced.message = Port_Format("%zu of %zu top-level ports %s no LOC: %s.", n, ports_.size(),
                                       n == 1 ? "has" : "have", Ck_NameList(unplaced.objects).c_str());
        Add(std::move(unplaced));
    }
    if (!bare.objects.empty()) {
        const size_t n = bare.objects.size();
        bare.message = Port_Format("%zu of %zu placed ports %s no IOSTANDARD: %s.", n, summary_.ports_placed,
                                   n == 1 ? "has" : "have", Ck_NameList(bare.objects).c_str());
        Add(std::move(bare));
    }
}

void Ck_BoardCheck::PinClashes() {
    if (!kinds_.Has(Ck_Kind::PinClash)) return;
    struct Use {
        Ndm_PropertyHolder* object;
        const Cs_Constraint* by;
        std::string site;  // as written
    };
    // A LOC that a later one replaces on an object does not hold the site there.
    std::unordered_set<std::pair<const Cs_Constraint*, const Ndm_PropertyHolder*>, Ck_PairHash> replaced;
    Ck_OrderedGroups<std::string, Use> sites;
    for (const Cs_Constraint* c : active_) {
        if (c->GetType() != Cs_Constraint_Locate::Type() || c->GetScope() != Cs_Scope::Net) continue;
        for (const Cs_Conflict& k : c->GetConflicts())
            if (k.GetDesignEntity()) replaced.emplace(c, k.GetDesignEntity());
        for (const std::string& site : Sites(c->GetValueText())) {
            std::vector<Use>& uses = sites[Upper(site)];
            for (Ndm_PropertyHolder* o : c->GetAssociatedDesignObjs())
                if (!replaced.count({c, o})) uses.push_back({o, c, site});
        }
    }
    for (const auto& [key, uses] : sites.groups()) {
        std::vector<const Ndm_PropertyHolder*> objects;
        for (const Use& u : uses)
            if (std::find(objects.begin(), objects.end(), u.object) == objects.end()) objects.push_back(u.object);
        if (objects.size() < 2) continue;
        Ck_Finding f{Ck_Kind::PinClash, "", {}, {}};
        for (const Ndm_PropertyHolder* o : objects) f.objects.push_back(o->GetFullName());
        for (const Use& u : uses) AddRef(f, u.by, u.object->GetFullName());
        f.message = Port_Format("Site %s is given to %zu nets: %s.", uses.front().site.c_str(), objects.size(),
                                Ck_NameList(f.objects).c_str());
        Add(std::move(f));
    }
}

void Ck_BoardCheck::LocationOverrides() {
    if (!kinds_.Has(Ck_Kind::LocationOverride)) return;
    // The statements that give one object different values of one setting: the repository's
    // overrides for valued settings; pull-up, pull-down and keeper (flags, which never override
    // in the repository) count as one setting.
    using Key = std::pair<const Ndm_PropertyHolder*, const char*>;
    Ck_OrderedGroups<Key, const Cs_Constraint*, Ck_PairHash> chains;
    static const char* const kPull = "pull";
    for (const Cs_Constraint* c : active_) {
        const char* key = c->GetAttribute();
        if (IsPull(*c)) {
            for (Ndm_PropertyHolder* o : c->GetAssociatedDesignObjs()) chains[{o, kPull}].push_back(c);
            continue;
        }
        if (!Is(key, "LOC") && !Is(key, "IOSTANDARD") && !Is(key, "DRIVE") && !Is(key, "SLEW")) continue;
        for (const Cs_Conflict& k : c->GetConflicts()) {
            if (k.GetType() != Cs_Conflict::OVERRIDE || !k.GetDesignEntity() || !k.GetConflictingConstraint()) continue;
            std::vector<const Cs_Constraint*>& chain = chains[{k.GetDesignEntity(), key}];
            chain.push_back(c);
            chain.push_back(k.GetConflictingConstraint());
        }
    }
    for (auto& [key, chain] : chains.groups()) {
        std::sort(chain.begin(), chain.end(),
                  [this](const Cs_Constraint* a, const Cs_Constraint* b) { return position_[a] < position_[b]; });
        chain.erase(std::unique(chain.begin(), chain.end()), chain.end());
        if (key.second == kPull) {
            bool differ = false;
            for (const Cs_Constraint* c : chain) differ = differ || !Is(c->GetAttribute(), chain[0]->GetAttribute());
            if (!differ) continue;
        }
        const std::string object = key.first->GetFullName();
        Ck_Finding f{Ck_Kind::LocationOverride, "", {object}, {}};
        // The message names the first values and the last; the statements list them all.
        std::string values;
        for (size_t i = 0; i < chain.size(); ++i) {
            Ck_Ref ref = RefOf(chain[i], object);
            if (i < kValuesNamed || i + 1 == chain.size()) {
                if (i + 1 == chain.size() && i > kValuesNamed)
                    values += ", " + std::to_string(i - kValuesNamed) + " more";
                values += (values.empty() ? "" : ", ") + Setting(*chain[i]) + " (" + Ck_Where(ref) + ")";
            }
            f.refs.push_back(std::move(ref));
        }
        f.refs.back().wins = true;
        f.message = Port_Format("%s '%s' is given %s; %s wins.", ObjectWord(key.first), object.c_str(),
                                values.c_str(), Ck_Where(f.refs.back()).c_str());
        Add(std::move(f));
    }
}
