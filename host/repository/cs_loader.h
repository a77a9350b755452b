// Reads a constraint file (or a text) into repository constraints: one per constraint of a
// statement, in file order, each with its file and line.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "host/parser/pr_logical.h"
#include "host/repository/cs_constraint.h"
#include "host/repository/cs_status.h"

class Cs_ConstraintMgr;

class Cs_Loader : public Pr_Logical_Parser {
public:
    // file names the source (null for a text of no file); mgr owns the texts.
    Cs_Loader(Cs_ConstraintMgr& mgr, const char* file, bool ucf);

    // Reads the file, or text when given; the constraints are in constraints(), the parse
    // statuses in outcome().
    void Read(std::shared_ptr<const Pr_FileText> text);
    std::vector<std::unique_ptr<Cs_Constraint>>& constraints() { return out_; }
    const Cs_ReturnCode& outcome() const { return outcome_; }

    bool cb_error(int line, int column, const char* value) override;
    bool cb_syntax_error(int line, int column, const char* text, const Handle* handle) override;
    bool cb_comment(const char* text, const Handle* handle) override;
    bool cb_enable(bool enable, const char* name, const Handle* handle) override;
    bool cb_areagroup(const Defn& defn, const Handle* handle) override;
    bool cb_net(const Defn& defn, const Handle* handle) override;
    bool cb_comp(const Defn& defn, const Handle* handle) override;
    bool cb_pin(const Defn& defn, const Handle* handle) override;
    bool cb_model(const Defn& defn, const Handle* handle) override;
    bool cb_set(const Defn& defn, const Handle* handle) override;
    bool cb_config(const char* name, const char* value, const Handle* handle) override;
    bool cb_begin_model(const char* name, const Handle* handle) override;
    bool cb_end_model(const Handle* handle) override;
    bool cb_prohibit(const std::vector<const char*>& sites, const Handle* handle) override;
    bool cb_vref(const std::vector<const char*>& sites, const Handle* handle) override;
    bool cb_offset(bool in, double time, const double* valid, bool before, const char* clock, const char* level,
                   const Handle* handle) override;
    bool cb_toffset(const char* group, bool in, double time, const double* valid, bool before, const char* clock,
                    const char* level, const Handle* handle) override;
    bool cb_roffset(bool in, double time, const double* valid, bool before, const char* clock, const char* regs,
                    const char* level, const Handle* handle) override;
    bool cb_troffset(const char* group, bool in, double time, const double* valid, bool before,
                     const char* clock, const char* regs, const char* level, const Handle* handle) override;
    bool cb_tspec_maxdelay(const char* name, bool has_from, bool has_to, const std::vector<const char*>& points,
                           const char* reference, bool multiply, double value, bool is_time, int priority,
                           bool datapathonly, const Handle* handle) override;
    bool cb_tspec_period(const char* name, const char* group, const char* reference, bool multiply, double value,
                         bool is_time, bool phase_plus, double phase, bool low, double duration, double percent,
                         const double* jitter, int priority, const Handle* handle) override;
    bool cb_tspec_tig(const char* name, bool has_from, bool has_to, const std::vector<const char*>& points,
                      int priority, const Handle* handle) override;
    bool cb_tspec_drop_spec(const char* name, const Handle* handle) override;
    bool cb_timegrp(const char* group, const std::vector<std::pair<const char*, PR_EDGE>>& members,
                    const std::vector<const char*>& excluded, const Handle* handle) override;
    bool cb_timegrp_areagroup(const char* group, const char* areagroup, const Handle* handle) override;
    bool cb_temperature(double celsius, const Handle* handle) override;
    bool cb_voltage(double volts, const Handle* handle) override;

private:
    template <class T>
    Cs_Constraint& Add(Cs_Scope scope, const char* target, const char* key, std::string_view value,
                       const Handle* handle, bool flag = false);
    Cs_Constraint& Add(const Cs_ConstraintType& type, Cs_Scope scope, const char* target, const char* key,
                       std::string_view value, const Handle* handle, bool flag = false);
    bool Objects(Cs_Scope scope, const Defn& defn, const Handle* handle);
    bool Attributes(Cs_Scope scope, const Defn& defn, const Handle* handle);
    void Invalid(int line, const std::string& message, const Handle* statement);
    // The statement's text, blanks folded, owned by the repository.
    const char* StatementText(const Handle* handle);
    // The statement's text after its first "=", blanks folded.
    std::string AfterEquals(const Handle* handle) const;
    Cs_Constraint& TimingEntry(const char* target, const char* key, const Handle* handle,
                               std::vector<const char*> groups);
    // The OFFSET forms: global (group null) or of a group, of every register or of regs.
    Cs_Constraint& Offset(const char* group, bool in, double time, const double* valid, bool before,
                          const char* clock, const char* regs, const char* level, const Handle* handle);
    // Records where the annotator stores c: on the block, as entry = stored.
    void Store(Cs_Constraint& c, Cs_Block block, std::string_view entry, std::string_view stored);
    // CONFIG settings and the other design-wide settings: one constraint of the given class,
    // stored on the CONFIG block as entry = stored.
    template <class T>
    void Setting(const char* key, std::string_view value, const char* entry, std::string_view stored,
                 const Handle* handle);

    Cs_ConstraintMgr& mgr_;
    const char* file_;  // interned, or null
    bool ucf_;
    std::vector<std::unique_ptr<Cs_Constraint>> out_;
    Cs_ReturnCode outcome_;
    std::string last_raw_;             // the statement text folded last
    const char* last_statement_ = "";  // and its folded form
};
