// Constraint text through the whole annotator over the example design.
#include "fuzz/annotate_fuzz.h"

#include <string_view>

#include "fuzz/fuzz_support.h"
#include "host/port/msgman.h"
#include "manager/lunmgr.h"

namespace lun_fuzz {

std::unique_ptr<Ndm_Design> AnnotatedBlinky(const uint8_t* data, size_t size) {
    if (size == 0) return nullptr;
    auto design = Blinky();
    const uint8_t options = data[0];
    const CP_FILE_TYPE kind = (options & 1) ? CP_NCF : CP_UCF;
    Ta_LunMgr mgr(kind == CP_NCF ? "fuzz.ncf" : "fuzz.ucf", kind, nullptr);
    mgr.set_text(Pr_FileText::FromText(std::string_view(reinterpret_cast<const char*>(data) + 1, size - 1)));
    if (options & 2) mgr.set_case_sensitive((options & 4) != 0);
    if (options & 8) mgr.set_second_pass(true);
    if (options & 16) mgr.set_best_effort(1, "DEFAULT");
    if (options & 32) mgr.AllowUnmatchedLocs();
    try {
        mgr.annotate(design->GetWorkView());
    } catch (const Port_FatalError&) {
        return nullptr;
    }
    return design;
}

}  // namespace lun_fuzz

int LunFuzzAnnotate(const uint8_t* data, size_t size) {
    Port_MsgCapture quiet;
    lun_fuzz::AnnotatedBlinky(data, size);
    return 0;
}
