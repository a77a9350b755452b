// Wildcard searches over the block hierarchy and the networks, and the bus-delimiter retry:
// the searches of the design database (host/design/ndm_lookup.h) with the annotator's
// messages.
#include "lookup/lookup_report.h"
#include "manager/lunmgr.h"

void Ta_LunMgr::find_qual_blocks(Ndm_Block* block, std::vector<Ndm_Block*>* results, char* pattern,
                                 unsigned char exact_case, unsigned char search_below_match,
                                 const Pr_Logical_ConstraintHandle* handle) {
    if (!results) return;
    auto report = LookupReport(handle);
    Ndm_Lookup::FindBlocks(block, *results, pattern, exact_case, search_below_match, report);
}

void Ta_LunMgr::find_qual_pins(Ndm_Block* block, std::vector<Ndm_Pin*>* results, char* inst_pattern,
                               char* pin_pattern, unsigned char exact_case,
                               const Pr_Logical_ConstraintHandle* handle) {
    if (!results) return;
    auto report = LookupReport(handle);
    Ndm_Lookup::FindPins(block, *results, inst_pattern, pin_pattern, exact_case, report);
}

void Ta_LunMgr::find_qual_sigs(std::vector<Ndm_Signal*>* results, char* pattern,
                               unsigned char exact_case, const Pr_Logical_ConstraintHandle* handle) {
    if (!results) return;
    auto report = LookupReport(handle);
    Ndm_Lookup::FindNetSignals(view, *results, pattern, exact_case, report);
}

void Ta_LunMgr::find_qual_sigs_hier(Ndm_Block* block, std::vector<Ndm_Signal*>* results, char* pattern,
                                    unsigned char exact_case, const Pr_Logical_ConstraintHandle* handle) {
    if (!results) return;
    auto report = LookupReport(handle);
    Ndm_Lookup::FindSignals(block, *results, pattern, exact_case, report);
}

void Ta_LunMgr::find_all_ram_qual_blocks(Ndm_Block* block, std::vector<Ndm_Block*>* results) {
    if (results) Ndm_Lookup::FindRamBlocks(block, *results);
}

bool Ta_LunMgr::change_bus_delimiters(char* name) { return Ndm_Lookup::NextBusDelimiters(name, tried_names); }
