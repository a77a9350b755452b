// Wildcard searches over the block hierarchy and the networks, and the bus-delimiter retry.
//
// A pattern can only match names that start with its literal prefix (the text before the
// first "*" or "?"), so the hierarchy walk enters only the subtrees whose full names can
// start with it: below a block it takes the children whose name starts with the rest of the
// prefix, or whose name and a "/" begin it, both found through the name indexes of the
// design database. The walk still visits in pre-order with children in stored order, so the
// results and messages come in the same order as from a walk over every block.
#include <algorithm>
#include <cstring>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "host/filter/prop_filter.h"
#include "host/port/ut_str.h"
#include "lookup/lookup_report.h"
#include "manager/lunmgr.h"

using lunfind::LineOf;
using lunfind::Msg;

namespace {

bool Matches(const char* text, const char* pattern, bool fold) {
    return (fold ? UT_STR::IMatch(text, pattern) : UT_STR::Match(text, pattern)) != 0;
}

std::string_view LiteralPrefix(const char* pattern) {
    return std::string_view(pattern, std::strcspn(pattern, "*?"));
}

bool SameBytes(std::string_view a, std::string_view b, size_t n, bool fold) {
    for (size_t i = 0; i < n; ++i) {
        unsigned char x = static_cast<unsigned char>(a[i]);
        unsigned char y = static_cast<unsigned char>(b[i]);
        if (fold) {
            if (x >= 'A' && x <= 'Z') x = static_cast<unsigned char>(x + 32);
            if (y >= 'A' && y <= 'Z') y = static_cast<unsigned char>(y + 32);
        }
        if (x != y) return false;
    }
    return true;
}

// How names that start with base can relate to the literal prefix lit.
enum class Reach {
    None,  // none of them starts with lit
    All,   // base starts with lit: all of them do
    Some,  // lit starts with base; rem is what follows base in lit
};

Reach Relate(std::string_view base, std::string_view lit, bool fold, std::string_view* rem) {
    const size_t common = std::min(base.size(), lit.size());
    if (!SameBytes(base, lit, common, fold)) return Reach::None;
    if (lit.size() <= base.size()) return Reach::All;
    *rem = lit.substr(base.size());
    return Reach::Some;
}

// Children of block below which a full name can start with base + rem (base being the text
// that the full names of block's children start with), in stored order: those whose name
// starts with rem, and those whose name followed by "/" begins rem. Below the top block,
// children with the empty name are kept as well: their full name is empty, so their signals'
// full names are the bare signal names.
void Narrow(const Ndm_Block* block, std::string_view rem, bool fold, std::vector<Ndm_Block*>& out) {
    out.clear();
    block->GetBlocksByPrefix(rem, fold, out);
    int groups = out.empty() ? 0 : 1;
    if (!block->GetParent() && rem.front() != '/') {
        const size_t before = out.size();
        block->GetBlocksByName(std::string_view(""), false, out);
        if (out.size() != before) ++groups;
    }
    std::vector<uint32_t> lengths;
    block->GetBlockNameLengths(lengths);
    for (uint32_t n : lengths) {
        if (n >= rem.size()) break;
        if (rem[n] != '/') continue;
        const size_t before = out.size();
        block->GetBlocksByName(rem.substr(0, n), fold, out);
        if (out.size() != before) ++groups;
    }
    if (groups > 1)
        std::sort(out.begin(), out.end(),
                  [](const Ndm_Block* a, const Ndm_Block* b) { return a->GetOrder() < b->GetOrder(); });
}

// Pre-order walk from root, children in stored order, over the blocks whose full name or
// whose descendants' full names can start with lit. visit(block, full_name) returns whether
// to go on below the block. Uses its own stack: hierarchies can be very deep.
template <class Visit>
void Walk(Ndm_Block* root, std::string_view lit, bool fold, Visit&& visit) {
    struct Frame {
        Ndm_Block* block;
        bool whole;                      // every child, else the picked ones
        std::vector<Ndm_Block*> picked;
        size_t next;
        size_t base_len;                 // length of the children's common name start
    };
    std::vector<Frame> stack;
    std::string name = root->GetFullName();
    // Pushes the children of block worth visiting; name holds block's full name.
    auto open = [&](Ndm_Block* block) {
        if (block->GetNumBlocks() == 0) return;
        if (block->GetParent()) name += '/';
        Frame frame{block, true, {}, 0, name.size()};
        std::string_view rem;
        switch (Relate(name, lit, fold, &rem)) {
            case Reach::None: return;
            case Reach::All: break;
            case Reach::Some:
                frame.whole = false;
                Narrow(block, rem, fold, frame.picked);
                if (frame.picked.empty()) return;
                break;
        }
        stack.push_back(std::move(frame));
    };
    if (visit(root, std::as_const(name))) open(root);
    while (!stack.empty()) {
        Frame& frame = stack.back();
        const size_t count = frame.whole ? static_cast<size_t>(frame.block->GetNumBlocks())
                                         : frame.picked.size();
        if (frame.next == count) {
            stack.pop_back();
            continue;
        }
        Ndm_Block* child = frame.whole ? frame.block->GetBlockItr()[frame.next] : frame.picked[frame.next];
        ++frame.next;
        name.resize(frame.base_len);
        name += child->GetName();
        if (visit(child, std::as_const(name))) open(child);
    }
}

}  // namespace

void Ta_LunMgr::find_qual_blocks(Ndm_Block* block, std::vector<Ndm_Block*>* results, char* pattern,
                                 unsigned char exact_case, unsigned char search_below_match,
                                 const Pr_Logical_ConstraintHandle* handle) {
    if (!block || !results || !pattern) return;
    const bool fold = !exact_case;
    Walk(block, LiteralPrefix(pattern), fold, [&](Ndm_Block* b, const std::string& full) {
        if (!Matches(full.c_str(), pattern, fold)) return true;
        results->push_back(b);
        if (fold) {
            case_warn();
            Msg(__LINE__).issueInfo(lunfind::kInstText, LineOf(handle), constraint_filename, pattern,
                                    full.c_str());
        }
        // The top block's empty full name does not end the search.
        return search_below_match || UT_STR::IMatch(full.c_str(), "") != 0;
    });
}

void Ta_LunMgr::find_qual_pins(Ndm_Block* block, std::vector<Ndm_Pin*>* results, char* inst_pattern,
                               char* pin_pattern, unsigned char exact_case,
                               const Pr_Logical_ConstraintHandle* handle) {
    if (!block || !results || !inst_pattern || !pin_pattern) return;
    const bool fold = !exact_case;
    Walk(block, LiteralPrefix(inst_pattern), fold, [&](Ndm_Block* b, const std::string& full) {
        if (!Matches(full.c_str(), inst_pattern, fold)) return true;
        for (Ndm_Pin* pin : b->GetPinItr()) {
            if (!Matches(pin->GetName(), pin_pattern, fold)) continue;
            results->push_back(pin);
            if (fold) {
                case_warn();
                Msg(__LINE__).issueInfo(lunfind::kWildPinText, LineOf(handle), constraint_filename,
                                        inst_pattern, pin_pattern, full.c_str(), pin->GetName());
            }
        }
        return true;
    });
}

void Ta_LunMgr::find_qual_sigs(std::vector<Ndm_Signal*>* results, char* pattern,
                               unsigned char exact_case, const Pr_Logical_ConstraintHandle* handle) {
    if (!results || !pattern || !view) return;
    const bool fold = !exact_case;
    // Only networks whose name starts with the literal prefix can match; the view hands them
    // out in network order.
    std::vector<Ndm_Network*> nets;
    view->GetNetworksByPrefix(LiteralPrefix(pattern), fold, nets);
    for (Ndm_Network* net : nets) {
        const char* name = net->GetName();
        if (!Matches(name, pattern, fold)) continue;
        if (fold) {
            case_warn();
            Msg(__LINE__).issueInfo(lunfind::kNetText, LineOf(handle), constraint_filename, pattern, name);
        }
        results->push_back(net->GetTopSignal());
    }
}

void Ta_LunMgr::find_qual_sigs_hier(Ndm_Block* block, std::vector<Ndm_Signal*>* results, char* pattern,
                                    unsigned char exact_case, const Pr_Logical_ConstraintHandle* handle) {
    if (!block || !results || !pattern) return;
    const bool fold = !exact_case;
    const std::string_view lit = LiteralPrefix(pattern);
    std::vector<Ndm_Signal*> picked;
    std::string full;
    Walk(block, lit, fold, [&](Ndm_Block* b, const std::string& block_name) {
        if (b->GetNumSignals() == 0) return true;
        // A signal's full name is its block's full name, "/", its name (just its name when the
        // block's full name is empty).
        full = block_name;
        if (!full.empty()) full += '/';
        const size_t base_len = full.size();
        std::string_view rem;
        std::span<Ndm_Signal* const> signals;
        switch (Relate(full, lit, fold, &rem)) {
            case Reach::None: return true;
            case Reach::All: signals = b->GetSignalItr(); break;
            case Reach::Some:
                picked.clear();
                b->GetSignalsByPrefix(rem, fold, picked);
                signals = picked;
                break;
        }
        for (Ndm_Signal* sig : signals) {
            full.resize(base_len);
            full += sig->GetName();
            if (!Matches(full.c_str(), pattern, fold)) continue;
            results->push_back(sig);
            if (fold) {
                case_warn();
                Msg(__LINE__).issueInfo(lunfind::kNetText, LineOf(handle), constraint_filename, pattern,
                                        full.c_str());
            }
        }
        return true;
    });
}

void Ta_LunMgr::find_all_ram_qual_blocks(Ndm_Block* block, std::vector<Ndm_Block*>* results) {
    if (!block || !results) return;
    Walk(block, std::string_view(), false, [&](Ndm_Block* b, const std::string&) {
        const char* type = Ndh_PropUtil::GetStringProp(b, "SIMPRIMTYPE");
        if (type && UT_STR::Match(type, "Q_RAMB4*")) results->push_back(b);
        return true;
    });
}

bool Ta_LunMgr::change_bus_delimiters(char* name) {
    static constexpr char kOpeners[] = "([<{";
    static constexpr char kClosers[] = ")]>}";
    if (!name) return false;
    const size_t len = std::strlen(name);
    if (len < 2) return false;
    // The rightmost closing delimiter (from the last character down to the second) decides.
    size_t close = 0;
    int kind = -1;
    for (size_t i = len - 1; i >= 1 && kind < 0; --i) {
        if (const char* hit = std::strchr(kClosers, name[i])) {
            close = i;
            kind = static_cast<int>(hit - kClosers);
        }
    }
    if (kind < 0) return false;
    size_t open = close;
    while (open > 0 && name[open - 1] != kOpeners[kind]) --open;
    if (open == 0) return false;
    --open;
    tried_names.emplace_back(name);
    const int next = (kind + 1) % 4;
    name[close] = kClosers[next];
    name[open] = kOpeners[next];
    for (const Port::StringBase<char>& tried : tried_names)
        if (UT_STR::Compare(tried.c_str(), name) == 0) return false;
    return true;
}
