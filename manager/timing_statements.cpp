// Ta_LunMgr: TIMESPEC statements (periods, path delays, timing ignores, dropped
// timing entries) and ENABLE/DISABLE, stored as entries of the TIMESPEC constraint block.
#include "host/parser/pr_block_texts.h"
#include "host/port/msgman.h"
#include "manager/lunmgr.h"
#include "manager/statement_messages.h"

void Ta_LunMgr::Trace(const char* format, const Pr_Logical_ConstraintHandle* handle) const {
    if (debug_callbacks) Port_MsgManData::debugStub(format, lunmgr::LineOf(handle), lunmgr::TextOf(handle));
}

void Ta_LunMgr::WarnNamesLost(const Pr_Logical_ConstraintHandle* handle, std::initializer_list<const char*> names,
                              const std::vector<const char*>& more) const {
    auto warn = [&](const char* name) {
        if (name && !Pr_NameReadsBack(name))
            lunmgr::Msg(__LINE__).issueWarning(
                "Line %i in '%s': The name '%s' holds a blank, ';', '#' or '\"'. It is stored as written, but "
                "constraint text extracted from the design will not give it back.\n",
                lunmgr::LineOf(handle), constraint_filename, name);
    };
    for (const char* name : names) warn(name);
    for (const char* name : more) warn(name);
}

bool Ta_LunMgr::cb_tspec_period(const char* name, const char* group, const char* reference, bool multiply,
                                double value, bool is_time, bool phase_plus, double phase, bool low,
                                double duration, double percent, const double* jitter, int priority,
                                const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::period: Line %I: %s", handle);
    if (second_pass) return true;
    WarnNamesLost(handle, {name, group, reference});
    AttachTimeConstraint(name,
                         Pr_PeriodText(group, reference, multiply, value, is_time, phase_plus, phase, low, duration,
                                       percent, jitter, priority)
                             .c_str(),
                         GetConstraintBlock("TIMESPEC"));
    return true;
}

bool Ta_LunMgr::cb_tspec_maxdelay(const char* name, bool has_from, bool has_to,
                                  const std::vector<const char*>& points, const char* reference, bool multiply,
                                  double value, bool is_time, int priority, bool datapathonly,
                                  const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::maxdelay: Line %I: %s", handle);
    if (second_pass) return true;
    if (points.empty()) {
        lunmgr::Msg(__LINE__).issueInternal("No paths defined for timespec '%s'\n", name);
        return false;
    }
    WarnNamesLost(handle, {name, reference}, points);
    AttachTimeConstraint(
        name,
        Pr_PathDelayText(has_from, has_to, points, reference, multiply, value, is_time, priority, datapathonly).c_str(),
        GetConstraintBlock("TIMESPEC"));
    return true;
}

bool Ta_LunMgr::cb_tspec_tig(const char* name, bool has_from, bool has_to, const std::vector<const char*>& points,
                             int priority, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::tig: Line %I: %s", handle);
    if (second_pass) return true;
    WarnNamesLost(handle, {name}, points);
    AttachTimeConstraint(name, Pr_IgnoreText(has_from, has_to, points, priority).c_str(),
                         GetConstraintBlock("TIMESPEC"));
    return true;
}

bool Ta_LunMgr::cb_tspec_drop_spec(const char* name, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::drop_spec: Line %I: %s", handle);
    if (second_pass) return true;
    WarnNamesLost(handle, {name});
    AttachTimeConstraint(name, "DROP_SPEC", GetConstraintBlock("TIMESPEC"));
    return true;
}

bool Ta_LunMgr::cb_enable(bool enable, const char* name, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::enable disable: Line: %I: %s", handle);
    if (second_pass) return true;
    WarnNamesLost(handle, {name});
    AttachTimeConstraint(enable ? "ENABLE" : "DISABLE", name, GetConstraintBlock("TIMESPEC"));
    return true;
}
