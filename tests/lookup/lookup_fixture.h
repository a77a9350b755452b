// Shared set-up of the lookup tests: an annotator that opens up the lookups and a design.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "host/design/ndm.h"
#include "host/port/msgman.h"
#include "lookup/case_notice.h"
#include "manager/lunmgr.h"

namespace lookup_test {

class Probe : public Ta_LunMgr {
public:
    explicit Probe(const char* file = "t.ucf") : Ta_LunMgr(file, CP_UCF, nullptr) {}
    using Ta_LunMgr::case_warn;
    using Ta_LunMgr::change_bus_delimiters;
    using Ta_LunMgr::find_all_ram_qual_blocks;
    using Ta_LunMgr::find_blk;
    using Ta_LunMgr::find_blk_hier;
    using Ta_LunMgr::find_pin_hier;
    using Ta_LunMgr::find_qual_blocks;
    using Ta_LunMgr::find_qual_pins;
    using Ta_LunMgr::find_qual_sigs;
    using Ta_LunMgr::find_qual_sigs_hier;
    using Ta_LunMgr::find_sig;
    using Ta_LunMgr::find_sig_hier;
    void SetView(Ndm_View* v) { view = v; }
    std::vector<Port::StringBase<char>>& Tried() { return tried_names; }
};

// A design with a top block named "top" in the view "EXPANDED".
struct Design {
    Ndm_Design design{"d"};
    Ndm_View* view = design.CreateView("EXPANDED");
    Ndm_Block* top = view->CreateTopBlock("top");
    // Adds n filler children so that the block's members go through the hash indexes.
    static void Pad(Ndm_Block* block, int n) {
        for (int i = 0; i < n; ++i) block->CreateBlock(("zz_fill" + std::to_string(i)).c_str());
    }
};

// Non-const path buffers for the char* interfaces.
inline std::vector<char> Buf(const std::string& text) {
    std::vector<char> out(text.begin(), text.end());
    out.push_back('\0');
    return out;
}

inline std::string Notice(const char* file) {
    return std::string("A case sensitive search for the INST, PAD, or NET element refered to by a "
                       "constraint entry in '") +
           file +
           "' that accompanies this design has failed, while a case insensitive search is in "
           "progress. The result of the case insenstive search will be used, but messages will "
           "accompany each and every use of a case insensitive result. Constraints are case "
           "sensitive with respect to user-specified identifiers, which includes names of logic "
           "elements in a design.\n";
}

}  // namespace lookup_test
