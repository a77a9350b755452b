// Ta_LunMgr: INST, NET and PIN statements (name lookup with its retries, one property per
// constraint and object) and the policy for names that match nothing.
#include <algorithm>
#include <cstring>
#include <string>
#include <vector>

#include "host/port/env.h"
#include "host/port/msgman.h"
#include "host/port/ut_str.h"
#include "manager/lunmgr.h"
#include "manager/statement_messages.h"

using lunmgr::LineOf;
using lunmgr::Msg;
using lunmgr::TextOf;

namespace {


bool IsWildcard(const char* name) { return std::strchr(name, '*') || std::strchr(name, '?'); }

// A modifiable copy of a name for the lookups that take char*.
std::vector<char> Buffer(const std::string& text) { return std::vector<char>(text.c_str(), text.c_str() + text.size() + 1); }

// The statement's first keyword, or null.
const char* FirstKeyword(const Pr_Logical_ConstraintDefn& defn) {
    if (defn.num_constraints() == 0) return nullptr;
    const char* key = (*defn.begin_constraint())->get_name();
    return key && *key ? key : nullptr;
}

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
    std::sort(children.begin(), children.end(),
              [](const Ndm_Block* a, const Ndm_Block* b) { return a->GetOrder() < b->GetOrder(); });
    children.erase(std::unique(children.begin(), children.end()), children.end());
    return children;
}

const char* Keyword(const Pr_Logical_Constraint* c) {
    const char* key = c->get_name();
    return key && *key ? key : nullptr;
}
}  // namespace

std::vector<Ndm_Block*> Ta_LunMgr::PinSearchChildren(const char* path, bool ignore_case) {
    Ndm_Block* top = view->GetBlock();
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

bool Ta_LunMgr::ApplyUnmatchedPolicy(ObjectKind kind, const Pr_Logical_ConstraintDefn& defn, const char* name,
                                     const Pr_Logical_ConstraintHandle* handle) {
    int line = LineOf(handle);
    const bool tolerated = Port_Env::GetEnv("ZEP_QUILLMAP_ALLOWUNMATCHEDUCF") != nullptr;
    auto issue = [&](bool warn, const char* text) {
        if (warn)
            Msg(__LINE__).issueWarning(text, line, constraint_filename, name);
        else
            Msg(__LINE__).issueError(text, line, constraint_filename, name);
        return warn;
    };
    if (kind == ObjectKind::Pin) {
        if (best_effort) store_unmatched(handle);
        return issue(tolerated,
                     "Line %i in '%s': Could not find pin(s) '%s' in the design.  To suppress this error specify "
                     "the correct pin name or remove the constraint.\n");
    }
    if (best_effort) {
        store_unmatched(handle);
        return true;
    }
    bool inst = kind == ObjectKind::Inst;
    if (IsAnIOProp(FirstKeyword(defn))) {
        if (allow_unmatched_locs) {
            Msg(__LINE__).issueInfo(inst ? "Line %i in '%s': Could not find instance(s) '%s' in the design.  Since "
                                           "the -aul switch is set, the constraint will be ignored.\n"
                                         : "Line %i in '%s': Could not find net(s) '%s' in the design.  Since the "
                                           "-aul switch is set, the constraint will be ignored.\n",
                                    line, constraint_filename, name);
            return true;
        }
        return issue(tolerated, inst ? "Line %i in '%s': Could not find instance(s) '%s' in the design.  To "
                                       "suppress this error use the -aul switch, specify the correct instance "
                                       "name or remove the constraint.\n"
                                     : "Line %i in '%s': Could not find net(s) '%s' in the design.  To suppress "
                                       "this error use the -aul switch, specify the correct net name or remove "
                                       "the constraint.\n");
    }
    return issue(tolerated, inst ? "Line %i in '%s': Could not find instance(s) '%s' in the design.  To suppress "
                                   "this error specify the correct instance name or remove the constraint.\n"
                                 : "Line %i in '%s': Could not find net(s) '%s' in the design.  To suppress this "
                                   "error specify the correct net name or remove the constraint.\n");
}

bool Ta_LunMgr::cb_comp(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::comp: Line %I: %s", handle);
    if (defn.num_constraints() == 0) return true;
    Ndm_Block* top = view->GetBlock();
    const std::string top_name = top->GetName();
    std::vector<char> working = Buffer(defn.get_object_name());
    std::vector<Ndm_Block*> found;

    auto find_plain = [&](const char* name, unsigned char exact) {
        std::vector<char> path = Buffer(top_name + "/" + name);
        if (Ndm_Block* b = find_blk_hier(top, path.data(), exact, handle)) found.push_back(b);
    };
    auto find_wild = [&](const std::string& pattern, unsigned char exact, unsigned char below) {
        std::vector<char> buf = Buffer(pattern);
        find_qual_blocks(top, &found, buf.data(), exact, below, handle);
    };

    for (;;) {
        const char* w = working.data();
        const bool wild = IsWildcard(w);
        const size_t len = std::strlen(w);
        const unsigned char below = !(len > 0 && w[len - 1] == '/');
        if (std::strcmp(w, "/") == 0) {
            found.push_back(top);
        } else if (!wild) {
            find_plain(w, 1);
        } else {
            std::string pattern(w);
            if (!pattern.empty() && pattern.front() == '/') pattern.erase(0, 1);
            if (!pattern.empty() && pattern.back() == '/') pattern.pop_back();
            find_wild(pattern, 1, below);
        }
        if (found.empty() && !case_sensitive) {
            if (!wild) {
                find_plain(w, 0);
            } else {
                find_wild(w, 1, below);
                if (found.empty()) find_wild(w, 0, below);
            }
        }
        if (found.empty() && file_type == CP_UCF && std::strstr(w, ".PAD")) {
            std::string pad(w, len - 4);
            if (!IsWildcard(pad.c_str())) {
                find_plain(pad.c_str(), 1);
                if (found.empty()) find_plain(pad.c_str(), 0);
            } else {
                find_wild(pad, 1, below);
                if (found.empty()) find_wild(pad, 0, below);
            }
        }
        if (found.empty() && change_bus_delimiters(working.data())) continue;
        break;
    }
    tried_names.clear();
    if (found.empty()) return ApplyUnmatchedPolicy(ObjectKind::Inst, defn, working.data(), handle);

    for (Ndm_Block* block : found) {
        for (auto it = defn.begin_constraint(); it != defn.end_constraint(); ++it) {
            const char* keyword = Keyword(*it);
            if (!keyword) {
                Msg(__LINE__).issueInternal("Constraint type for INST is unknown.\n INST entry is '%s'.", TextOf(handle));
                break;
            }
            unsigned char error_reported = 0;
            if (!create_property(block, *it, keyword, &error_reported, handle)) return false;
        }
    }
    return true;
}

bool Ta_LunMgr::cb_net(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::net: Line %I: %s", handle);
    if (defn.num_constraints() == 0) return true;
    Ndm_Block* top = view->GetBlock();
    std::vector<char> working = Buffer(defn.get_object_name());
    std::vector<Ndm_Signal*> found;

    for (;;) {
        char* w = working.data();
        const bool wild = IsWildcard(w);
        const bool hier = std::strchr(w, '/') != nullptr;
        for (unsigned char exact = 1;; exact = 0) {
            if (!wild) {
                Ndm_Signal* sig = find_sig(top, w, exact, handle);
                if (!sig && hier) {
                    for (Ndm_Block* child : ChildrenNamedByPathPrefix(top, w, "/", !exact))
                        if ((sig = find_sig_hier(child, w, exact, handle))) break;
                }
                if (sig) found.push_back(sig);
            } else {
                find_qual_sigs(&found, w, exact, handle);
                if (found.empty() && hier) find_qual_sigs_hier(top, &found, w, exact, handle);
            }
            if (!exact || !found.empty() || case_sensitive) break;
        }
        if (found.empty() && change_bus_delimiters(w)) continue;
        break;
    }
    tried_names.clear();
    if (found.empty()) return ApplyUnmatchedPolicy(ObjectKind::Net, defn, working.data(), handle);

    for (Ndm_Signal* sig : found) {
        Ndm_PropertyHolder* holder = sig->GetNetwork();
        if (!holder) holder = sig;  // a signal outside every network carries its own constraints
        for (auto it = defn.begin_constraint(); it != defn.end_constraint(); ++it) {
            const char* keyword = Keyword(*it);
            if (!keyword) {
                Msg(__LINE__).issueInternal("Constraint type for NET is unknown. NET entry is '%s'.", TextOf(handle));
                break;
            }
            unsigned char error_reported = 0;
            if (!create_property(holder, *it, keyword, &error_reported, handle)) return false;
            std::string net_name = holder->GetFullName();
            std::string sig_name = sig->GetFullName();
            if (net_name != sig_name)
                Msg(__LINE__).issueInfo(
                    "Line %i in '%s': The constraint for NET '%s' is being attached to the equivalent NET '%s'.\n",
                    LineOf(handle), constraint_filename, sig_name.c_str(), net_name.c_str());
        }
    }
    return true;
}

bool Ta_LunMgr::cb_pin(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::pin: Line %I: %s", handle);
    if (defn.num_constraints() == 0) return true;
    Ndm_Block* top = view->GetBlock();
    std::vector<char> working = Buffer(defn.get_object_name());
    std::vector<Ndm_Pin*> found;

    for (;;) {
        char* w = working.data();
        const bool wild = IsWildcard(w);
        for (unsigned char exact = 1;; exact = 0) {
            if (!wild) {
                Ndm_Pin* pin = top->GetPinByName(w);
                if (!pin) {
                    for (Ndm_Block* child : PinSearchChildren(w, !exact))
                        if ((pin = find_pin_hier(child, w, exact, handle))) break;
                }
                if (pin) found.push_back(pin);
            } else {
                std::vector<char> rest = Buffer(w);
                std::vector<char> token(rest.size() < 2048 ? rest.size() : 2048);
                if (UT_STR::GetToken(rest.data(), token.data(), token.size(), "."))
                    find_qual_pins(top, &found, token.data(), rest.data(), exact, handle);
            }
            if (!exact || !found.empty() || case_sensitive) break;
        }
        if (found.empty() && change_bus_delimiters(w)) continue;
        break;
    }
    tried_names.clear();
    if (found.empty()) return ApplyUnmatchedPolicy(ObjectKind::Pin, defn, working.data(), handle);

    for (Ndm_Pin* pin : found) {
        for (auto it = defn.begin_constraint(); it != defn.end_constraint(); ++it) {
            const char* keyword = Keyword(*it);
            if (!keyword) {
                Msg(__LINE__).issueInternal("Constraint type for PIN is unknown. PIN entry is '%s'.", TextOf(handle));
                break;
            }
            unsigned char error_reported = 0;
            if (!create_property(pin, *it, keyword, &error_reported, handle)) return false;
        }
    }
    return true;
}
