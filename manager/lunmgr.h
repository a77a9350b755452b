// Ta_LunMgr: the annotator for every kind of constraint statement. It resolves the names of
// INST, NET and PIN statements to design objects (exactly, ignoring case, with ".PAD" and
// bus-delimiter retries, with wildcards), turns each constraint into a typed property,
// stores timing specifications and global settings on constraint blocks, and reports names
// that match nothing through the unmatched-object policy.
#pragma once

#include <vector>

#include "frame/lunbase.h"
#include "host/port/string_base.h"

class Ta_LunMgr : public Ta_LunBase {
public:
    Ta_LunMgr(const char* filename, CP_FILE_TYPE type, const char* filter_file);
    Ta_LunMgr(const Ta_LunMgr& other) = default;
    Ta_LunMgr& operator=(const Ta_LunMgr& other) = default;
    ~Ta_LunMgr() override;

    // Best-effort mode: INST and NET names that match nothing are passed over silently.
    void set_best_effort(unsigned char on, Port::StringBase<char> id);
    unsigned char get_best_effort() const { return best_effort; }
    Port::StringBase<char> get_identifier() const { return identifier; }
    // Location constraints on names that match nothing become information messages.
    unsigned char AllowUnmatchedLocs();
    // True for the I/O constraint names LOC, IOSTANDARD, DRIVE and SLEW (case-sensitive).
    bool IsAnIOProp(const char* name);
    // Writes the unmatched-line trace of a statement to the debug channel.
    void store_unmatched(const Pr_Logical_ConstraintHandle* handle);

    // Statement handlers, in the parser's callback order.
    bool cb_error(int line, int column, const char* value) override;
    bool cb_net(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_comp(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_pin(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_model(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_config(const char* name, const char* value, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_begin_model(const char* name, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_end_model(const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_temperature(double celsius, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_voltage(double volts, const Pr_Logical_ConstraintHandle* handle) override;

protected:
    // Global settings: DCI_CASCADE words joined with ",".
    unsigned char DCI_Cascade_Hack(Ndm_Block* block, const char* value,
                                   const Pr_Logical_ConstraintHandle* handle);
    // One parsed constraint of an INST, NET or PIN statement as a property on object.
    unsigned char create_property(Ndm_PropertyHolder* object, Pr_Logical_Constraint* constraint,
                                  const char* name, unsigned char* error_reported,
                                  const Pr_Logical_ConstraintHandle* handle);

    // Name resolution (exact_case false: the case-insensitive fallback, reported per use).
    Ndm_Block* find_blk(Ndm_Block* block, const char* name, unsigned char exact_case,
                        const Pr_Logical_ConstraintHandle* handle);
    Ndm_Signal* find_sig(Ndm_Block* block, const char* name, unsigned char exact_case,
                         const Pr_Logical_ConstraintHandle* handle);
    Ndm_Block* find_blk_hier(Ndm_Block* block, char* path, unsigned char exact_case,
                             const Pr_Logical_ConstraintHandle* handle);
    Ndm_Signal* find_sig_hier(Ndm_Block* block, char* path, unsigned char exact_case,
                              const Pr_Logical_ConstraintHandle* handle);
    Ndm_Pin* find_pin_hier(Ndm_Block* block, const char* path, unsigned char exact_case,
                           const Pr_Logical_ConstraintHandle* handle);
    // Issues the case-fallback notice once per process.
    void case_warn();

    // Wildcard searches: append every match, in visiting order.
    void find_qual_blocks(Ndm_Block* block, std::vector<Ndm_Block*>* results, char* pattern,
                          unsigned char exact_case, unsigned char search_below_match,
                          const Pr_Logical_ConstraintHandle* handle);
    void find_qual_pins(Ndm_Block* block, std::vector<Ndm_Pin*>* results, char* inst_pattern,
                        char* pin_pattern, unsigned char exact_case,
                        const Pr_Logical_ConstraintHandle* handle);
    void find_qual_sigs(std::vector<Ndm_Signal*>* results, char* pattern, unsigned char exact_case,
                        const Pr_Logical_ConstraintHandle* handle);
    void find_qual_sigs_hier(Ndm_Block* block, std::vector<Ndm_Signal*>* results, char* pattern,
                             unsigned char exact_case, const Pr_Logical_ConstraintHandle* handle);
    void find_all_ram_qual_blocks(Ndm_Block* block, std::vector<Ndm_Block*>* results);
    // Rewrites the last bus subscript of name to the next delimiter style; false when there
    // is none or every style was tried.
    bool change_bus_delimiters(char* name);

    // Which statement the unmatched-object policy is applied to.
    enum class ObjectKind { Inst, Net, Pin };
    // Message and result for a statement whose name matched nothing.
    bool ApplyUnmatchedPolicy(ObjectKind kind, const Pr_Logical_ConstraintDefn& defn, const char* name,
                              const Pr_Logical_ConstraintHandle* handle);

    bool config_seen;
    bool allow_unmatched_locs;
    std::vector<Port::StringBase<char>> tried_names;
    unsigned char best_effort;
    Port::StringBase<char> identifier;
};
