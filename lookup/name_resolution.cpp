// Resolution of wildcard-free names to blocks, signals and pins, exactly or through the
// case-insensitive fallback. Every lookup goes through the per-block name indexes of the
// design database, so a name costs the same in a block of ten children and of a million.
#include <algorithm>
#include <cstring>
#include <string>
#include <string_view>
#include <vector>

#include "lookup/case_notice.h"
#include "lookup/lookup_report.h"
#include "manager/lunmgr.h"

using lunfind::LineOf;
using lunfind::Msg;

namespace {

// Set when the case-fallback notice has been issued; shared by every annotator.
bool g_case_notice_issued = false;

// First n bytes of text equal name (ASCII case folded when fold); text holds at least n bytes.
bool SameBytes(const char* text, const char* name, size_t n, bool fold) {
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
            if (n < rest.size() && rest[n] == '/' && SameBytes(rest.data(), child->GetName(), n, fold))
                out.push_back(child);
        }
        return;
    }
    lengths.clear();
    block->GetBlockNameLengths(lengths);
    int groups = 0;
    for (uint32_t n : lengths) {
        if (n >= rest.size()) break;
        if (rest[n] != '/') continue;
        const size_t before = out.size();
        block->GetBlocksByName(rest.substr(0, n), fold, out);
        if (out.size() != before) ++groups;
    }
    if (groups > 1)
        std::sort(out.begin(), out.end(),
                  [](const Ndm_Block* a, const Ndm_Block* b) { return a->GetOrder() < b->GetOrder(); });
}

// The block named by path below and including block (see find_blk_hier). report(searched,
// found) is called for a result taken ignoring case. path need not be terminated.
template <class Report>
Ndm_Block* ResolvePath(Ndm_Block* block, std::string_view path, bool fold, Report&& report) {
    const char* own = block->GetName();
    const size_t n = std::strlen(own);
    if (path.size() < n || !SameBytes(path.data(), own, n, fold)) return nullptr;
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

// Reports a block taken ignoring case: the notice (through warn), then the INST message.
template <class Warn>
struct InstReport {
    Warn warn;
    const char* file;
    int line;
    void operator()(std::string_view searched, const Ndm_Block* found) const {
        warn();
        Msg(__LINE__).issueInfo(lunfind::kInstText, line, file, std::string(searched).c_str(),
                                found->GetFullName().c_str());
    }
};

}  // namespace

bool Ta_LunCaseNoticeIssued() { return g_case_notice_issued; }

void Ta_LunResetCaseNotice() { g_case_notice_issued = false; }

void Ta_LunMgr::case_warn() {
    if (g_case_notice_issued) return;
    g_case_notice_issued = true;
    Msg(__LINE__).issueInfo(
        "A case sensitive search for the INST, PAD, or NET element refered to by a constraint "
        "entry in '%s' that accompanies this design has failed, while a case insensitive search "
        "is in progress. The result of the case insenstive search will be used, but messages "
        "will accompany each and every use of a case insensitive result. Constraints are case "
        "sensitive with respect to user-specified identifiers, which includes names of logic "
        "elements in a design.\n",
        constraint_filename);
}

Ndm_Block* Ta_LunMgr::find_blk(Ndm_Block* block, const char* name, unsigned char exact_case,
                               const Pr_Logical_ConstraintHandle* handle) {
    if (!block) Msg(__LINE__).issueFatal(2, "NULL block argument\n");
    if (!name) Msg(__LINE__).issueFatal(2, "NULL name argument\n");
    if (block->GetNumBlocks() == 0) return nullptr;
    if (exact_case) return block->GetBlockByName(name);
    // The first child equal ignoring case ends the visit; it is silent when it is equal exactly.
    Ndm_Block* found = block->GetBlockByIName(name);
    if (!found || std::strcmp(found->GetName(), name) == 0) return found;
    case_warn();
    Msg(__LINE__).issueInfo(lunfind::kInstText, LineOf(handle), constraint_filename, name,
                            found->GetFullName().c_str());
    return found;
}

Ndm_Signal* Ta_LunMgr::find_sig(Ndm_Block* block, const char* name, unsigned char exact_case,
                                const Pr_Logical_ConstraintHandle* handle) {
    if (!block) Msg(__LINE__).issueFatal(2, "NULL block argument\n");
    if (!name) Msg(__LINE__).issueFatal(2, "NULL name argument\n");
    if (block->GetNumSignals() == 0) return nullptr;
    if (exact_case) return block->GetSignalByName(name);
    Ndm_Signal* found = block->GetSignalByIName(name);
    if (!found || std::strcmp(found->GetName(), name) == 0) return found;
    case_warn();
    Msg(__LINE__).issueInfo(lunfind::kNetText, LineOf(handle), constraint_filename, name,
                            found->GetFullName().c_str());
    return found;
}

// The path names block itself, then, after a "/", either a child whose whole name is the rest
// or a child whose name ends at a "/" of the rest, continued below that child. The children
// are tried in stored order; only those whose name is such a prefix of the rest can succeed,
// and those are found through the name index instead of visiting every child. The descent
// keeps its own stack, as paths can be very deep.
Ndm_Block* Ta_LunMgr::find_blk_hier(Ndm_Block* block, char* path, unsigned char exact_case,
                                    const Pr_Logical_ConstraintHandle* handle) {
    if (!path || !block) return nullptr;
    InstReport report{[this] { case_warn(); }, constraint_filename, LineOf(handle)};
    return ResolvePath(block, path, !exact_case, report);
}

// Splits from the last "/" towards the first: the longest instance path naming a block
// decides, and the signal is looked up there only. The instance part is a view of path, so
// no length limit applies.
Ndm_Signal* Ta_LunMgr::find_sig_hier(Ndm_Block* block, char* path, unsigned char exact_case,
                                     const Pr_Logical_ConstraintHandle* handle) {
    if (!path || !block) return nullptr;
    const std::string_view text(path);
    InstReport report{[this] { case_warn(); }, constraint_filename, LineOf(handle)};
    size_t cut = text.size();
    while (cut > 0) {
        const size_t slash = text.rfind('/', cut - 1);
        if (slash == std::string_view::npos || slash == 0) return nullptr;
        cut = slash;
        const std::string_view head = text.substr(0, cut);
        const char* sig_name = path + cut + 1;
        if (head == block->GetName())
            if (Ndm_Signal* sig = find_sig(block, sig_name, exact_case, handle)) return sig;
        if (Ndm_Block* owner = ResolvePath(block, head, !exact_case, report))
            return find_sig(owner, sig_name, exact_case, handle);
    }
    return nullptr;
}

Ndm_Pin* Ta_LunMgr::find_pin_hier(Ndm_Block* block, const char* path, unsigned char exact_case,
                                  const Pr_Logical_ConstraintHandle* handle) {
    if (!path || !block) return nullptr;
    // A pin of owner named name; in fallback mode found ignoring case and reported.
    auto pin_of = [&](Ndm_Block* owner, const char* name) -> Ndm_Pin* {
        if (exact_case) return owner->GetPinByName(name);
        Ndm_Pin* pin = owner->GetPinByIName(name);
        if (pin) {
            case_warn();
            Msg(__LINE__).issueInfo(lunfind::kPinText, LineOf(handle), constraint_filename, path,
                                    owner->GetFullName().c_str(), pin->GetName());
        }
        return pin;
    };
    if (Ndm_Pin* pin = pin_of(block, path)) return pin;

    const std::string_view text(path);
    InstReport report{[this] { case_warn(); }, constraint_filename, LineOf(handle)};
    size_t cut = text.size();
    while (cut > 0) {
        const size_t dot = text.rfind('.', cut - 1);
        if (dot == std::string_view::npos || dot == 0) return nullptr;
        cut = dot;
        const std::string_view head = text.substr(0, cut);
        const char* pin_name = path + cut + 1;
        if (head == block->GetName())
            if (Ndm_Pin* pin = pin_of(block, pin_name)) return pin;
        Ndm_Block* owner = ResolvePath(block, head, !exact_case, report);
        if (!owner) continue;
        // An exact pin name wins silently in either mode.
        if (Ndm_Pin* pin = owner->GetPinByName(pin_name)) return pin;
        return exact_case ? nullptr : pin_of(owner, pin_name);
    }
    return nullptr;
}
