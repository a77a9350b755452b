// Temporary weak definitions of the name lookups, replaced by lookup/ at link time.
#include "manager/lunmgr.h"
#define WEAK __attribute__((weak))
WEAK Ndm_Block* Ta_LunMgr::find_blk(Ndm_Block*, const char*, unsigned char, const Pr_Logical_ConstraintHandle*) { return nullptr; }
WEAK Ndm_Signal* Ta_LunMgr::find_sig(Ndm_Block*, const char*, unsigned char, const Pr_Logical_ConstraintHandle*) { return nullptr; }
WEAK Ndm_Block* Ta_LunMgr::find_blk_hier(Ndm_Block*, char*, unsigned char, const Pr_Logical_ConstraintHandle*) { return nullptr; }
WEAK Ndm_Signal* Ta_LunMgr::find_sig_hier(Ndm_Block*, char*, unsigned char, const Pr_Logical_ConstraintHandle*) { return nullptr; }
WEAK Ndm_Pin* Ta_LunMgr::find_pin_hier(Ndm_Block*, const char*, unsigned char, const Pr_Logical_ConstraintHandle*) { return nullptr; }
WEAK void Ta_LunMgr::case_warn() {}
WEAK void Ta_LunMgr::find_qual_blocks(Ndm_Block*, std::vector<Ndm_Block*>*, char*, unsigned char, unsigned char, const Pr_Logical_ConstraintHandle*) {}
WEAK void Ta_LunMgr::find_qual_pins(Ndm_Block*, std::vector<Ndm_Pin*>*, char*, char*, unsigned char, const Pr_Logical_ConstraintHandle*) {}
WEAK void Ta_LunMgr::find_qual_sigs(std::vector<Ndm_Signal*>*, char*, unsigned char, const Pr_Logical_ConstraintHandle*) {}
WEAK void Ta_LunMgr::find_qual_sigs_hier(Ndm_Block*, std::vector<Ndm_Signal*>*, char*, unsigned char, const Pr_Logical_ConstraintHandle*) {}
WEAK void Ta_LunMgr::find_all_ram_qual_blocks(Ndm_Block*, std::vector<Ndm_Block*>*) {}
WEAK bool Ta_LunMgr::change_bus_delimiters(char*) { return false; }
