#include "host/design/ndm_lookup.h"

#include <algorithm>
#include <cstring>
#include <utility>

#include "host/filter/prop_filter.h"
#include "host/port/ut_str.h"

namespace {

// First n bytes of text equal name (ASCII case folded when fold); text holds at least n bytes.
bool SamePrefix(const char* text, const char* name, size_t n, bool fold) {
    if (n == 0) return true;  // either may then be null (an empty view)
    if (!fold) return std::memcmp(text, name, n) == 0;
    for (size_t i = 0; i < n; ++i) {
        unsigned char a = static_cast<unsigned char>(text[i]);
        unsigned char b = static_cast<unsigned char>(name[i]);
        if (a >= 'A' && a <= 'Z') a = static_cast<unsigned char>(a + 32);
        if (b >= 'A' && b <= 'Z') b = static_cast<unsigned char>(b + 32);
        if (a != b) return false;
    }
    return true;
}

// Appends the children of block named by the part of text before one of its "/" (exactly, or
// ignoring case); returns how many different lengths matched. Only the "/" positions at which
// some child name ends are looked up.
int AddNamedBeforeSlash(const Ndm_Block* block, std::string_view text, bool fold, std::vector<uint32_t>& lengths,
                        std::vector<Ndm_Block*>& out) {
    lengths.clear();
    block->GetBlockNameLengths(lengths);
    int groups = 0;
    for (uint32_t n : lengths) {
        if (n >= text.size()) break;
        if (text[n] != '/') continue;
        const size_t before = out.size();
        block->GetBlocksByName(text.substr(0, n), fold, out);
        if (out.size() != before) ++groups;
    }
    return groups;
}

// Blocks of several name groups back into stored order.
void SortByOrder(std::vector<Ndm_Block*>& blocks) {
    std::sort(blocks.begin(), blocks.end(),
              [](const Ndm_Block* a, const Ndm_Block* b) { return a->GetOrder() < b->GetOrder(); });
}

// Children of block that can continue a path whose remainder below block is rest: those whose
// name is the part of rest before one of its "/" (exactly, or ignoring case), in stored order.
// Only the "/" positions at which some child name ends are looked up.
void PathCandidates(const Ndm_Block* block, std::string_view rest, bool fold,
                    std::vector<uint32_t>& lengths, std::vector<Ndm_Block*>& out) {
    out.clear();
    const int count = block->GetNumBlocks();
    if (count == 0) return;
    if (count <= 8) {
        for (Ndm_Block* child : block->GetBlockItr()) {
            size_t n = std::strlen(child->GetName());
            if (n < rest.size() && rest[n] == '/' && SamePrefix(rest.data(), child->GetName(), n, fold))
                out.push_back(child);
        }
        return;
    }
    if (AddNamedBeforeSlash(block, rest, fold, lengths, out) > 1) SortByOrder(out);
}

// The block named by path below and including block (see find_blk_hier). report(searched,
// found) is called for a result taken ignoring case. path need not be terminated.
template <class Report>
Ndm_Block* ResolvePath(Ndm_Block* block, std::string_view path, bool fold, Report&& report) {
    const char* own = block->GetName();
    const size_t n = std::strlen(own);
    if (path.size() < n || !SamePrefix(path.data(), own, n, fold)) return nullptr;
    if (path.size() == n) {
        // Reported in fallback mode even when the names are equal.
        if (fold) report(path, block);
        return block;
    }
    if (path[n] != '/') return nullptr;

    struct Frame {
        size_t rest;  // offset in path of the text below the frame's block
        std::vector<Ndm_Block*> candidates;
        size_t next = 0;
    };
    std::vector<Frame> stack;
    std::vector<Ndm_Block*> same;
    std::vector<uint32_t> lengths;
    // A child named by the whole rest wins; otherwise the candidates are recorded for the walk.
    auto enter = [&](Ndm_Block* at, size_t rest) -> Ndm_Block* {
        if (at->GetNumBlocks() == 0) return nullptr;
        const std::string_view name = path.substr(rest);
        same.clear();
        at->GetBlocksByName(name, fold, same);
        if (!same.empty()) {
            Ndm_Block* hit = same.front();
            if (fold && name != hit->GetName()) report(name, hit);
            return hit;
        }
        Frame frame{rest, {}, 0};
        PathCandidates(at, name, fold, lengths, frame.candidates);
        if (!frame.candidates.empty()) stack.push_back(std::move(frame));
        return nullptr;
    };
    if (Ndm_Block* hit = enter(block, n + 1)) return hit;
    while (!stack.empty()) {
        Frame& top = stack.back();
        if (top.next == top.candidates.size()) {
            stack.pop_back();
            continue;
        }
        Ndm_Block* child = top.candidates[top.next++];
        const size_t rest = top.rest + std::strlen(child->GetName()) + 1;
        if (Ndm_Block* hit = enter(child, rest)) return hit;
    }
    return nullptr;
}

bool Matches(const char* text, const char* pattern, bool fold) {
    return (fold ? UT_STR::IMatch(text, pattern) : UT_STR::Match(text, pattern)) != 0;
}

std::string_view LiteralPrefix(const char* pattern) {
    return std::string_view(pattern, std::strcspn(pattern, "*?"));
}

// How names that start with base can relate to the literal prefix lit.
enum class Reach {
    None,  // none of them starts with lit
    All,   // base starts with lit: all of them do
    Some,  // lit starts with base; rem is what follows base in lit
};

Reach Relate(std::string_view base, std::string_view lit, bool fold, std::string_view* rem) {
    const size_t common = std::min(base.size(), lit.size());
    if (!SamePrefix(base.data(), lit.data(), common, fold)) return Reach::None;
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
    groups += AddNamedBeforeSlash(block, rem, fold, lengths, out);
    if (groups > 1) SortByOrder(out);
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

// Calls take(signal, full name) for every signal below and including root that keep accepts
// and whose full name matches pattern, blocks in pre-order, signals in stored order.
template <class Keep, class Take>
void ForEachMatchingSignal(Ndm_Block* root, const char* pattern, bool fold, Keep&& keep, Take&& take) {
    const std::string_view lit = LiteralPrefix(pattern);
    std::vector<Ndm_Signal*> picked;
    std::string full;
    Walk(root, lit, fold, [&](Ndm_Block* b, const std::string& block_name) {
        if (b->GetNumSignals() == 0) return true;
        // A signal's full name is its block's full name, "/", its name (just its name when the
        // block's full name is empty).
        full = block_name;
        if (!full.empty()) full += '/';
        const size_t base_len = full.size();
        std::string_view rem;
        auto visit = [&](Ndm_Signal* sig) {
            if (!keep(sig)) return;
            full.resize(base_len);
            full += sig->GetName();
            if (Matches(full.c_str(), pattern, fold)) take(sig, std::as_const(full));
        };
        switch (Relate(full, lit, fold, &rem)) {
            case Reach::None: return true;
            case Reach::All:
                for (Ndm_Signal* sig : b->GetSignalItr()) visit(sig);
                break;
            case Reach::Some:
                picked.clear();
                b->GetSignalsByPrefix(rem, fold, picked);
                for (Ndm_Signal* sig : picked) visit(sig);
                break;
        }
        return true;
    });
}

bool IsWildcard(const char* name) { return std::strchr(name, '*') || std::strchr(name, '?'); }

// A modifiable copy of a name for the lookups that rewrite it.
std::vector<char> Buffer(const std::string& text) { return std::vector<char>(text.c_str(), text.c_str() + text.size() + 1); }

// ASCII letters in lower case.
std::string Folded(std::string text) {
    for (char& c : text)
        if (c >= 'A' && c <= 'Z') c = static_cast<char>(c + 32);
    return text;
}

// The children of top named by the text of path before one of the separator characters
// (ignoring case when asked), in stored order. A hierarchical search for path can only start
// from one of these, so trying them alone gives the same first match as trying every child.
std::vector<Ndm_Block*> ChildrenNamedByPathPrefix(const Ndm_Block* top, std::string_view path,
                                                  const char* separators, bool ignore_case) {
    std::vector<Ndm_Block*> children;
    for (size_t cut = path.find_first_of(separators); cut != std::string_view::npos;
         cut = path.find_first_of(separators, cut + 1))
        top->GetBlocksByName(path.substr(0, cut), ignore_case, children);
    SortByOrder(children);
    children.erase(std::unique(children.begin(), children.end()), children.end());
    return children;
}

}  // namespace

namespace Ndm_Lookup {

Ndm_Block* FindBlock(Ndm_Block* block, const char* name, bool exact, Ndm_LookupReport& report) {
    if (!block || !name || block->GetNumBlocks() == 0) return nullptr;
    if (exact) return block->GetBlockByName(name);
    // The first child equal ignoring case ends the visit; it is silent when it is equal exactly.
    Ndm_Block* found = block->GetBlockByIName(name);
    if (found && std::strcmp(found->GetName(), name) != 0) report.Block(name, found->GetFullName());
    return found;
}

Ndm_Signal* FindSignal(Ndm_Block* block, const char* name, bool exact, Ndm_LookupReport& report) {
    if (!block || !name || block->GetNumSignals() == 0) return nullptr;
    if (exact) return block->GetSignalByName(name);
    Ndm_Signal* found = block->GetSignalByIName(name);
    if (found && std::strcmp(found->GetName(), name) != 0) report.Signal(name, found->GetFullName());
    return found;
}

// The path names block itself, then, after a "/", either a child whose whole name is the rest
// or a child whose name ends at a "/" of the rest, continued below that child. The children
// are tried in stored order; only those whose name is such a prefix of the rest can succeed,
// and those are found through the name index instead of visiting every child. The descent
// keeps its own stack, as paths can be very deep.
Ndm_Block* FindBlockPath(Ndm_Block* block, std::string_view path, bool exact, Ndm_LookupReport& report) {
    if (!block) return nullptr;
    return ResolvePath(block, path, !exact, [&](std::string_view searched, const Ndm_Block* found) {
        report.Block(searched, found->GetFullName());
    });
}

// Splits from the last "/" towards the first: the longest instance path naming a block
// decides, and the signal is looked up there only.
Ndm_Signal* FindSignalPath(Ndm_Block* block, const char* path, bool exact, Ndm_LookupReport& report) {
    if (!path || !block) return nullptr;
    const std::string_view text(path);
    size_t cut = text.size();
    while (cut > 0) {
        const size_t slash = text.rfind('/', cut - 1);
        if (slash == std::string_view::npos || slash == 0) return nullptr;
        cut = slash;
        const std::string_view head = text.substr(0, cut);
        const char* sig_name = path + cut + 1;
        if (head == block->GetName())
            if (Ndm_Signal* sig = FindSignal(block, sig_name, exact, report)) return sig;
        if (Ndm_Block* owner = FindBlockPath(block, head, exact, report)) return FindSignal(owner, sig_name, exact, report);
    }
    return nullptr;
}

Ndm_Pin* FindPinPath(Ndm_Block* block, const char* path, bool exact, Ndm_LookupReport& report) {
    if (!path || !block) return nullptr;
    // A pin of owner named name; in fallback mode found ignoring case and reported.
    auto pin_of = [&](Ndm_Block* owner, const char* name) -> Ndm_Pin* {
        if (exact) return owner->GetPinByName(name);
        Ndm_Pin* pin = owner->GetPinByIName(name);
        if (pin) report.Pin(path, owner->GetFullName(), pin->GetName());
        return pin;
    };
    if (Ndm_Pin* pin = pin_of(block, path)) return pin;
    const std::string_view text(path);
    size_t cut = text.size();
    while (cut > 0) {
        const size_t dot = text.rfind('.', cut - 1);
        if (dot == std::string_view::npos || dot == 0) return nullptr;
        cut = dot;
        const std::string_view head = text.substr(0, cut);
        const char* pin_name = path + cut + 1;
        if (head == block->GetName())
            if (Ndm_Pin* pin = pin_of(block, pin_name)) return pin;
        Ndm_Block* owner = FindBlockPath(block, head, exact, report);
        if (!owner) continue;
        // An exact pin name wins silently in either mode.
        if (Ndm_Pin* pin = owner->GetPinByName(pin_name)) return pin;
        return exact ? nullptr : pin_of(owner, pin_name);
    }
    return nullptr;
}

void FindBlocks(Ndm_Block* block, std::vector<Ndm_Block*>& out, const char* pattern, bool exact, bool below,
                Ndm_LookupReport& report) {
    if (!block || !pattern) return;
    const bool fold = !exact;
    Walk(block, LiteralPrefix(pattern), fold, [&](Ndm_Block* b, const std::string& full) {
        if (!Matches(full.c_str(), pattern, fold)) return true;
        out.push_back(b);
        if (fold) report.Block(pattern, full);
        // The top block's empty full name does not end the search.
        return below || UT_STR::IMatch(full.c_str(), "") != 0;
    });
}

void FindPins(Ndm_Block* block, std::vector<Ndm_Pin*>& out, const char* inst_pattern, const char* pin_pattern,
              bool exact, Ndm_LookupReport& report) {
    if (!block || !inst_pattern || !pin_pattern) return;
    const bool fold = !exact;
    Walk(block, LiteralPrefix(inst_pattern), fold, [&](Ndm_Block* b, const std::string& full) {
        if (!Matches(full.c_str(), inst_pattern, fold)) return true;
        for (Ndm_Pin* pin : b->GetPinItr()) {
            if (!Matches(pin->GetName(), pin_pattern, fold)) continue;
            out.push_back(pin);
            if (fold) report.WildPin(inst_pattern, pin_pattern, full, pin->GetName());
        }
        return true;
    });
}

// A network's name is its top signal's full name, so the networks whose name matches are
// those whose top signal's full name matches: the walk below the top block finds them without
// making the name of every network. They are handed out in network order.
void FindNetSignals(Ndm_View* view, std::vector<Ndm_Signal*>& out, const char* pattern, bool exact,
                    Ndm_LookupReport& report) {
    if (!view || !view->GetBlock() || !pattern) return;
    const bool fold = !exact;
    std::vector<std::pair<Ndm_Signal*, std::string>> found;
    ForEachMatchingSignal(
        view->GetBlock(), pattern, fold,
        [](const Ndm_Signal* sig) { return sig->GetNetwork() && sig->GetNetwork()->GetTopSignal() == sig; },
        [&](Ndm_Signal* sig, const std::string& full) { found.emplace_back(sig, fold ? full : std::string()); });
    std::stable_sort(found.begin(), found.end(), [](const auto& a, const auto& b) {
        return a.first->GetNetwork()->GetOrder() < b.first->GetNetwork()->GetOrder();
    });
    for (const auto& [sig, full] : found) {
        if (fold) report.Signal(pattern, full);
        out.push_back(sig);
    }
}

void FindSignals(Ndm_Block* block, std::vector<Ndm_Signal*>& out, const char* pattern, bool exact,
                 Ndm_LookupReport& report) {
    if (!block || !pattern) return;
    const bool fold = !exact;
    ForEachMatchingSignal(
        block, pattern, fold, [](const Ndm_Signal*) { return true; },
        [&](Ndm_Signal* sig, const std::string& full) {
            out.push_back(sig);
            if (fold) report.Signal(pattern, full);
        });
}

void FindRamBlocks(Ndm_Block* block, std::vector<Ndm_Block*>& out) {
    if (!block) return;
    Walk(block, std::string_view(), false, [&](Ndm_Block* b, const std::string&) {
        const char* type = Ndh_PropUtil::GetStringProp(b, "SIMPRIMTYPE");
        if (type && UT_STR::Match(type, "Q_RAMB4*")) out.push_back(b);
        return true;
    });
}

bool NextBusDelimiters(char* name, std::vector<Port::StringBase<char>>& tried) {
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
    tried.emplace_back(name);
    const int next = (kind + 1) % 4;
    name[close] = kClosers[next];
    name[open] = kOpeners[next];
    for (const Port::StringBase<char>& t : tried)
        if (UT_STR::Compare(t.c_str(), name) == 0) return false;
    return true;
}

}  // namespace Ndm_Lookup

std::vector<Ndm_Block*> Ndm_ObjectFinder::Instances(const char* name, std::string& working,
                                                     Ndm_LookupReport& report) {
    using namespace Ndm_Lookup;
    std::vector<Ndm_Block*> found;
    Ndm_Block* top = view_->GetBlock();
    const std::string top_name = top->GetName();
    std::vector<char> w = Buffer(name ? name : "");
    std::vector<Port::StringBase<char>> tried;
    // Instance names are written below the top block, without its name.
    auto find_plain = [&](const char* n, bool exact) {
        if (Ndm_Block* b = FindBlockPath(top, top_name + "/" + n, exact, report)) found.push_back(b);
    };
    for (;;) {
        const char* text = w.data();
        const bool wild = IsWildcard(text);
        const size_t len = std::strlen(text);
        const bool below = !(len > 0 && text[len - 1] == '/');
        if (std::strcmp(text, "/") == 0) {
            found.push_back(top);
        } else if (!wild) {
            find_plain(text, true);
        } else {
            std::string pattern(text);
            if (!pattern.empty() && pattern.front() == '/') pattern.erase(0, 1);
            if (!pattern.empty() && pattern.back() == '/') pattern.pop_back();
            FindBlocks(top, found, pattern.c_str(), true, below, report);
        }
        if (found.empty() && !case_sensitive_) {
            if (!wild) {
                find_plain(text, false);
            } else {
                FindBlocks(top, found, text, true, below, report);
                if (found.empty()) FindBlocks(top, found, text, false, below, report);
            }
        }
        if (found.empty() && ucf_ && std::strstr(text, ".PAD")) {
            std::string pad(text, len - 4);
            if (!IsWildcard(pad.c_str())) {
                find_plain(pad.c_str(), true);
                if (found.empty()) find_plain(pad.c_str(), false);
            } else {
                FindBlocks(top, found, pad.c_str(), true, below, report);
                if (found.empty()) FindBlocks(top, found, pad.c_str(), false, below, report);
            }
        }
        if (found.empty() && NextBusDelimiters(w.data(), tried)) continue;
        break;
    }
    working = w.data();
    return found;
}

namespace {

// The NET and PIN lookups: attempt(text, exact, found) exactly, then, unless case-sensitive,
// ignoring case; then again with each other bus delimiter, until something is found.
template <class T, class Attempt>
std::vector<T*> Retry(const char* name, bool case_sensitive, std::string& working, Attempt&& attempt) {
    std::vector<T*> found;
    std::vector<char> w = Buffer(name ? name : "");
    std::vector<Port::StringBase<char>> tried;
    do {
        for (bool exact = true;; exact = false) {
            attempt(w.data(), exact, found);
            if (!exact || !found.empty() || case_sensitive) break;
        }
    } while (found.empty() && Ndm_Lookup::NextBusDelimiters(w.data(), tried));
    working = w.data();
    return found;
}

}  // namespace

std::vector<Ndm_Signal*> Ndm_ObjectFinder::Nets(const char* name, std::string& working, Ndm_LookupReport& report) {
    using namespace Ndm_Lookup;
    Ndm_Block* top = view_->GetBlock();
    return Retry<Ndm_Signal>(name, case_sensitive_, working, [&](char* text, bool exact, std::vector<Ndm_Signal*>& found) {
        const bool hier = std::strchr(text, '/') != nullptr;
        if (!IsWildcard(text)) {
            Ndm_Signal* sig = FindSignal(top, text, exact, report);
            if (!sig && hier) {
                for (Ndm_Block* child : ChildrenNamedByPathPrefix(top, text, "/", !exact))
                    if ((sig = FindSignalPath(child, text, exact, report))) break;
            }
            if (sig) found.push_back(sig);
        } else {
            FindNetSignals(view_, found, text, exact, report);
            if (found.empty() && hier) FindSignals(top, found, text, exact, report);
        }
    });
}

std::vector<Ndm_Pin*> Ndm_ObjectFinder::Pins(const char* name, std::string& working, Ndm_LookupReport& report) {
    using namespace Ndm_Lookup;
    Ndm_Block* top = view_->GetBlock();
    return Retry<Ndm_Pin>(name, case_sensitive_, working, [&](char* text, bool exact, std::vector<Ndm_Pin*>& found) {
        if (!IsWildcard(text)) {
            Ndm_Pin* pin = top->GetPinByName(text);
            if (!pin) {
                for (Ndm_Block* child : PinSearchChildren(text, !exact))
                    if ((pin = FindPinPath(child, text, exact, report))) break;
            }
            if (pin) found.push_back(pin);
        } else {
            std::vector<char> rest = Buffer(text);
            std::vector<char> token(rest.size() < 2048 ? rest.size() : 2048);
            if (UT_STR::GetToken(rest.data(), token.data(), token.size(), "."))
                FindPins(top, found, token.data(), rest.data(), exact, report);
        }
    });
}

std::vector<Ndm_Block*> Ndm_ObjectFinder::PinSearchChildren(const char* path, bool ignore_case) {
    Ndm_Block* top = view_->GetBlock();
    auto all = [&] { return std::vector<Ndm_Block*>(top->GetBlockItr().begin(), top->GetBlockItr().end()); };
    if (top->GetNumBlocks() <= 64) return all();
    constexpr size_t kMaxNames = 100000;
    if (!pin_names_ || pin_names_->top != top) {
        pin_names_ = std::make_shared<PinNames>();
        pin_names_->top = top;
        for (Ndm_Block* child : top->GetBlockItr()) {
            for (Ndm_Pin* pin : child->GetPinItr()) {
                pin_names_->exact.insert(pin->GetName());
                pin_names_->folded.insert(Folded(pin->GetName()));
            }
            if (pin_names_->exact.size() > kMaxNames) {
                pin_names_->unbounded = true;
                pin_names_->exact.clear();
                pin_names_->folded.clear();
                break;
            }
        }
    }
    // A child's pin named by the whole path can be on any child.
    std::string key = ignore_case ? Folded(path) : std::string(path);
    if (pin_names_->unbounded || (ignore_case ? pin_names_->folded : pin_names_->exact).count(key)) return all();
    // Otherwise the search starts from a child named by the path up to a "/" or a ".".
    return ChildrenNamedByPathPrefix(top, path, "/.", ignore_case);
}
