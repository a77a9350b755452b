// Resolution of wildcard-free names to blocks, signals and pins, exactly or through the
// case-insensitive fallback: the lookups of the design database (host/design/ndm_lookup.h)
// with the annotator's messages.
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

lunfind::Report Ta_LunMgr::LookupReport(const Pr_Logical_ConstraintHandle* handle) {
    return lunfind::Report([this] { case_warn(); }, constraint_filename, handle);
}

Ndm_Block* Ta_LunMgr::find_blk(Ndm_Block* block, const char* name, unsigned char exact_case,
                               const Pr_Logical_ConstraintHandle* handle) {
    if (!block) Msg(__LINE__).issueFatal(2, "NULL block argument\n");
    if (!name) Msg(__LINE__).issueFatal(2, "NULL name argument\n");
    auto report = LookupReport(handle);
    return Ndm_Lookup::FindBlock(block, name, exact_case, report);
}

Ndm_Signal* Ta_LunMgr::find_sig(Ndm_Block* block, const char* name, unsigned char exact_case,
                                const Pr_Logical_ConstraintHandle* handle) {
    if (!block) Msg(__LINE__).issueFatal(2, "NULL block argument\n");
    if (!name) Msg(__LINE__).issueFatal(2, "NULL name argument\n");
    auto report = LookupReport(handle);
    return Ndm_Lookup::FindSignal(block, name, exact_case, report);
}

Ndm_Block* Ta_LunMgr::find_blk_hier(Ndm_Block* block, char* path, unsigned char exact_case,
                                    const Pr_Logical_ConstraintHandle* handle) {
    if (!path || !block) return nullptr;
    auto report = LookupReport(handle);
    return Ndm_Lookup::FindBlockPath(block, path, exact_case, report);
}

Ndm_Signal* Ta_LunMgr::find_sig_hier(Ndm_Block* block, char* path, unsigned char exact_case,
                                     const Pr_Logical_ConstraintHandle* handle) {
    auto report = LookupReport(handle);
    return Ndm_Lookup::FindSignalPath(block, path, exact_case, report);
}

Ndm_Pin* Ta_LunMgr::find_pin_hier(Ndm_Block* block, const char* path, unsigned char exact_case,
                                  const Pr_Logical_ConstraintHandle* handle) {
    auto report = LookupReport(handle);
    return Ndm_Lookup::FindPinPath(block, path, exact_case, report);
}
