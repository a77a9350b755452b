// Ta_LunMgr: the annotator for every kind of constraint statement. It resolves the names of
// INST, NET and PIN statements to design objects (exactly, ignoring case, with ".PAD" and
// bus-delimiter retries, with wildcards), turns each constraint into a typed property,
// stores TIMESPEC entries and global settings on constraint blocks, and reports names
// that match nothing through the unmatched-object policy.
#pragma once

#include <memory>
#include <initializer_list>
#include <string>
#include <utility>
#include <vector>

#include "frame/lunbase.h"
#include "host/design/ndm_lookup.h"
#include "lookup/lookup_report.h"
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
    bool cb_enable(bool enable, const char* name, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_areagroup(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_set(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_prohibit(const std::vector<const char*>& names, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_vref(const std::vector<const char*>& names, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_offset(bool in, double time, const double* valid, bool before, const char* clock,
                   const char* level, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_toffset(const char* group, bool in, double time, const double* valid, bool before,
                    const char* clock, const char* level, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_roffset(bool in, double time, const double* valid, bool before, const char* clock,
                    const char* regs, const char* level, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_troffset(const char* group, bool in, double time, const double* valid, bool before,
                     const char* clock, const char* regs, const char* level,
                     const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_tspec_maxdelay(const char* name, bool has_from, bool has_to, const std::vector<const char*>& points,
                           const char* reference, bool multiply, double value, bool is_time, int priority,
                           bool datapathonly, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_tspec_period(const char* name, const char* group, const char* reference, bool multiply,
                         double value, bool is_time, bool phase_plus, double phase, bool low, double duration,
                         double percent, const double* jitter, int priority,
                         const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_tspec_tig(const char* name, bool has_from, bool has_to, const std::vector<const char*>& points,
                      int priority, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_tspec_drop_spec(const char* name, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_timegrp(const char* group, const std::vector<std::pair<const char*, PR_EDGE>>& members,
                    const std::vector<const char*>& excluded, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_timegrp_areagroup(const char* group, const char* areagroup,
                              const Pr_Logical_ConstraintHandle* handle) override;
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
    // create_property with the constraint's plan made already: a statement plans each of its
    // constraints once, however many objects it names.
    unsigned char create_planned(Ndm_PropertyHolder* object, const struct Pr_PropertyPlan& plan,
                                 unsigned char* error_reported, const Pr_Logical_ConstraintHandle* handle);

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

    bool AttachOperatingCondition(const char* trace, const char* name, const std::string& value,
                                  const Pr_Logical_ConstraintHandle* handle);
    // Writes the trace line of a statement when tracing is on.
    void Trace(const char* format, const Pr_Logical_ConstraintHandle* handle) const;
    // Warns, with the statement's line, of each name that a timing entry stores but extracted
    // constraint text cannot give back (Pr_NameReadsBack).
    void WarnNamesLost(const Pr_Logical_ConstraintHandle* handle, std::initializer_list<const char*> names,
                       const std::vector<const char*>& more = {}) const;
    // Records one global or group offset entry, reporting a second entry of a generated name.
    void RecordOffset(const char* entry, const std::string& value, bool generated, bool with_line,
                      const Pr_Logical_ConstraintHandle* handle);

    // Which statement the unmatched-object policy is applied to.
    enum class ObjectKind { Inst, Net, Pin };
    // Message and result for a statement whose name matched nothing.
    bool ApplyUnmatchedPolicy(ObjectKind kind, const Pr_Logical_ConstraintDefn& defn, const char* name,
                              const Pr_Logical_ConstraintHandle* handle);

    // The messages of the lookups for one statement.
    lunfind::Report LookupReport(const Pr_Logical_ConstraintHandle* handle);
    // The lookup of a statement's object name with every retry, for the current view.
    Ndm_ObjectFinder& Finder();

    bool config_seen;
    bool allow_unmatched_locs;
    std::vector<Port::StringBase<char>> tried_names;
    unsigned char best_effort;
    Port::StringBase<char> identifier;

private:
    std::shared_ptr<Ndm_ObjectFinder> finder_;  // bound to finder_view_
    Ndm_View* finder_view_ = nullptr;
};
