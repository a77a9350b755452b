// Timing: clock inputs that no PERIOD covers, and timing groups named but not defined or
// defined but not used.
#include <cctype>
#include <cstring>
#include <initializer_list>
#include <string_view>
#include <unordered_map>
#include <unordered_set>

#include "check/ck_board_check.h"
#include "check/ck_ordered_groups.h"
#include "check/ck_text.h"
#include "host/design/ndm.h"
#include "host/port/msgman.h"
#include "host/repository/cs_mgr.h"

namespace {

bool Is(const char* a, const char* b) { return std::strcmp(a, b) == 0; }

bool EqualIgnoringCase(std::string_view a, std::string_view b) {
    if (a.size() != b.size()) return false;
    for (size_t i = 0; i < a.size(); ++i)
        if (std::toupper(static_cast<unsigned char>(a[i])) != std::toupper(static_cast<unsigned char>(b[i])))
            return false;
    return true;
}

bool OneOf(std::string_view name, std::initializer_list<const char*> words) {
    for (const char* w : words)
        if (EqualIgnoringCase(name, w)) return true;
    return false;
}

bool EndsWithIgnoringCase(std::string_view name, std::string_view end) {
    return name.size() > end.size() && EqualIgnoringCase(name.substr(name.size() - end.size()), end);
}

// A pin's name without its bit index ("RD_CLK[1]" is RD_CLK).
std::string_view BaseName(const char* name) {
    std::string_view n(name);
    size_t bracket = n.find('[');
    return bracket == std::string_view::npos ? n : n.substr(0, bracket);
}

// What a leaf cell is to a clock: which of its pins take a clock, or whether a clock passes
// through it. docs/check.md gives the rule.
enum class Role : uint8_t { None, FineFlop, CoarseFlop, Memory, Buffer, Library };

Role RoleOf(std::string_view type) {
    if (type.starts_with("$_")) {
        if (type == "$_BUF_") return Role::Buffer;
        return type.find("DFF") != std::string_view::npos ? Role::FineFlop : Role::None;
    }
    if (type.starts_with("$")) {
        std::string_view t = type.substr(1);
        for (const char* flop : {"dff", "dffe", "adff", "adffe", "sdff", "sdffe", "sdffce", "dffsr", "dffsre", "aldff",
                                 "aldffe", "fsm"})
            if (t == flop) return Role::CoarseFlop;
        return t.starts_with("mem") ? Role::Memory : Role::None;
    }
    if (type.size() >= 3 && (EqualIgnoringCase(type.substr(0, 3), "BUF") ||
                             (type.size() >= 4 && EqualIgnoringCase(type.substr(0, 4), "IBUF"))))
        return Role::Buffer;
    return Role::Library;
}

bool IsClockPin(Role role, const Ndm_Pin* pin) {
    if (pin->GetDirection() == Ndm_Dir::Output) return false;
    const std::string_view name = BaseName(pin->GetName());
    switch (role) {
        case Role::FineFlop: return name == "C";
        case Role::CoarseFlop: return name == "CLK";
        case Role::Memory: return name == "CLK" || name == "RD_CLK" || name == "WR_CLK";
        case Role::Library:
            return OneOf(name, {"C", "CK", "CLK", "CLOCK", "CLKA", "CLKB"}) || EndsWithIgnoringCase(name, "CLK");
        default: return false;
    }
}

bool IsBufferInput(const Ndm_Pin* pin) {
    return pin->GetDirection() != Ndm_Dir::Output && OneOf(BaseName(pin->GetName()), {"A", "I", "I0", "I1"});
}

// A cell of the netlist's library (not an expanded module): no blocks, no signals of its own.
bool IsLeaf(const Ndm_Block* b) { return b->GetNumBlocks() == 0 && b->GetNumSignals() == 0; }

// How many buffers a clock is followed through (an input buffer and a global buffer, and then
// some).
constexpr int kBufferLevels = 4;

// Groups every design has without a definition: the keyword groups, alone or with a pattern
// ("FFS(u1/*)").
bool IsPredefinedGroup(std::string_view name) {
    size_t paren = name.find('(');
    if (paren != std::string_view::npos) name = name.substr(0, paren);
    return OneOf(name, {"FFS", "PADS", "LATCHES", "RAMS", "CPUS", "MULTS", "HSIOS", "DSPS", "BRAMS_PORTA",
                        "BRAMS_PORTB"});
}

// Statements that name groups: TIMESPEC, TIMEGRP and the OFFSET forms. ENABLE and DISABLE name
// TIMESPEC entries.
bool NamesGroups(const Cs_Constraint& c) {
    if (c.GetScope() != Cs_Scope::TimeSpec && c.GetScope() != Cs_Scope::TimeGroup) return false;
    return !Is(c.GetAttribute(), "ENABLE") && !Is(c.GetAttribute(), "DISABLE");
}

bool IsPeriodSpec(const Cs_Constraint& c) {
    if (c.GetType() != Cs_Constraint_TimeSpec::Type()) return false;
    std::string_view value = c.GetValueText();
    return value.size() >= 6 && EqualIgnoringCase(value.substr(0, 6), "PERIOD") &&
           (value.size() == 6 || value[6] == ' ');
}

}  // namespace

void Ck_BoardCheck::Clocks() {
    if (!view_) return;
    // Top-level inputs and the networks their clock reaches, level by level through buffers.
    struct Reach {
        size_t clock_pins = 0;
        const Ndm_Pin* first = nullptr;
        std::vector<const Ndm_PropertyHolder*> nets;
    };
    std::vector<Reach> reach(ports_.size());
    std::unordered_map<const Ndm_Network*, std::vector<size_t>> frontier;
    std::unordered_set<const Ndm_Network*> seen;
    for (size_t i = 0; i < ports_.size(); ++i) {
        const Ndm_Signal* s = ports_[i].pin->GetSignal();
        if (ports_[i].pin->GetDirection() != Ndm_Dir::Input || !s || !s->GetNetwork()) continue;
        frontier[s->GetNetwork()].push_back(i);
        seen.insert(s->GetNetwork());
        reach[i].nets.push_back(s->GetNetwork());
    }
    std::unordered_map<const char*, Role> roles;  // by interned type name
    for (int level = 0; level <= kBufferLevels && !frontier.empty(); ++level) {
        // A signal connects to the pins of its block's children: each such block is scanned
        // once per level, whatever the number of networks.
        std::vector<const Ndm_Block*> owners;
        std::unordered_set<const Ndm_Block*> listed;
        for (const auto& [net, origins] : frontier)
            for (const Ndm_Signal* s = net->GetFirstSignal(); s; s = s->GetNextInNetwork())
                if (listed.insert(s->GetBlock()).second) owners.push_back(s->GetBlock());
        std::unordered_map<const Ndm_Network*, std::vector<size_t>> next;
        for (const Ndm_Block* owner : owners)
            for (const Ndm_Block* cell : owner->GetBlockItr()) {
                if (!IsLeaf(cell)) continue;
                auto [role_it, fresh] = roles.try_emplace(cell->GetTypeName(), Role::None);
                if (fresh) role_it->second = RoleOf(cell->GetTypeName());
                const Role role = role_it->second;
                if (role == Role::None) continue;
                for (const Ndm_Pin* pin : cell->GetPinItr()) {
                    auto hit = pin->GetSignal() ? frontier.find(pin->GetNetwork()) : frontier.end();
                    if (hit == frontier.end()) continue;
                    if (IsClockPin(role, pin))
                        for (size_t origin : hit->second) {
                            if (!reach[origin].first) reach[origin].first = pin;
                            ++reach[origin].clock_pins;
                        }
                    if (role != Role::Buffer || !IsBufferInput(pin)) continue;
                    for (const Ndm_Pin* out : cell->GetPinItr()) {
                        const Ndm_Network* n = out->GetDirection() == Ndm_Dir::Output ? out->GetNetwork() : nullptr;
                        if (!n || !seen.insert(n).second) continue;
                        std::vector<size_t>& origins = next[n];
                        origins.insert(origins.end(), hit->second.begin(), hit->second.end());
                        for (size_t origin : hit->second) reach[origin].nets.push_back(n);
                    }
                }
            }
        frontier = std::move(next);
    }

    // The groups a PERIOD times: those its TIMESPEC names, and the members of those that are
    // TIMEGRP definitions.
    std::unordered_map<std::string_view, std::vector<const char*>> members;
    std::vector<std::string_view> work;
    for (const Cs_Constraint* c : active_) {
        if (c->GetType() == Cs_Constraint_TimeGrp::Type() && !Cs_DefinedGroup(*c).empty())
            for (const char* m : c->GetAssociatedPaths()) members[Cs_DefinedGroup(*c)].push_back(m);
        if (IsPeriodSpec(*c))
            for (const char* g : c->GetAssociatedPaths()) work.push_back(g);
    }
    std::unordered_set<std::string_view> timed;
    while (!work.empty()) {
        std::string_view g = work.back();
        work.pop_back();
        if (!timed.insert(g).second) continue;
        auto it = members.find(g);
        if (it != members.end()) work.insert(work.end(), it->second.begin(), it->second.end());
    }
    // Nets a PERIOD covers: a PERIOD of its own, or a TNM_NET (TNM) into a timed group.
    std::unordered_set<const Ndm_PropertyHolder*> covered;
    for (const Cs_Constraint* c : active_) {
        const bool period = c->GetType() == Cs_Constraint_Period::Type();
        const bool named = c->GetType() == Cs_Constraint_TimingName::Type() && c->GetScope() == Cs_Scope::Net &&
                           (Is(c->GetAttribute(), "TNM_NET") || Is(c->GetAttribute(), "TNM")) &&
                           timed.count(Cs_DefinedGroup(*c));
        if (period || named)
            for (const Ndm_PropertyHolder* o : c->GetAssociatedDesignObjs()) covered.insert(o);
    }

    for (size_t i = 0; i < ports_.size(); ++i) {
        if (!reach[i].clock_pins) continue;
        ++summary_.clocks;
        bool is_covered = false;
        for (const Ndm_PropertyHolder* n : reach[i].nets) is_covered = is_covered || covered.count(n);
        if (is_covered) {
            ++summary_.clocks_covered;
            continue;
        }
        const char* name = ports_[i].pin->GetName();
        Ck_Finding f{Ck_Kind::ClockWithoutPeriod,
                     Port_Format("Input port '%s' drives %zu clock pin%s (the first: %s) and no PERIOD covers it.", name,
                                 reach[i].clock_pins, reach[i].clock_pins == 1 ? "" : "s",
                                 reach[i].first->GetFullName().c_str()),
                     {name},
                     {}};
        for (const Cs_Constraint* c : ports_[i].constraints) AddRef(f, c, name);
        Add(std::move(f));
    }
}

void Ck_BoardCheck::Groups() {
    if (!kinds_.Has(Ck_Kind::DanglingGroup) && !kinds_.Has(Ck_Kind::UnusedGroup)) return;
    Ck_OrderedGroups<std::string_view, const Cs_Constraint*> defined;
    std::unordered_set<std::string_view> used;
    for (const Cs_Constraint* c : active_) {
        std::string_view g = Cs_DefinedGroup(*c);
        if (!g.empty()) defined[g].push_back(c);
        if (NamesGroups(*c))
            for (const char* p : c->GetAssociatedPaths()) used.insert(p);
    }
    for (const Cs_Constraint* c : active_) {
        if (!NamesGroups(*c)) continue;
        std::unordered_set<std::string_view> named;
        for (const char* p : c->GetAssociatedPaths()) {
            if (defined.contains(p) || IsPredefinedGroup(p) || !named.insert(p).second) continue;
            Add({Ck_Kind::DanglingGroup,
                 Port_Format("Group '%s' is used but no TNM, TNM_NET or TIMEGRP defines it.", p),
                 {p},
                 {RefOf(c)}});
        }
    }
    for (auto& [group, by] : defined.groups()) {
        if (used.count(group)) continue;
        const std::string name(group);
        Ck_Finding f{Ck_Kind::UnusedGroup,
                     Port_Format("Group '%s' is defined but no TIMESPEC, TIMEGRP or OFFSET uses it.", name.c_str()),
                     {name},
                     {}};
        for (const Cs_Constraint* c : by) AddRef(f, c);
        Add(std::move(f));
    }
}
