// Ta_LunMgr: TIMESPEC statements (periods, path delays, timing ignores, dropped
// specifications) and ENABLE/DISABLE, stored as entries of the TIMESPEC constraint block.
#include <string>

#include "host/port/msgman.h"
#include "manager/lunmgr.h"
#include "manager/statement_messages.h"

namespace {
constexpr int kNoPriority = 2147483647;

// Megahertz of a period given in picoseconds.
double Mhz(double period_ps) { return (1.0 / period_ps) * 1000000; }

// Path points as written back: keyword, the name in double quotes, one blank; a double quote
// inside a name becomes a backquote so that the quoting stays well formed.
void AppendPoints(std::string& text, bool has_from, bool has_to, const std::vector<const char*>& points) {
    const size_t n = points.size();
    for (size_t i = 0; i < n; ++i) {
        text += (i == 0 && has_from) ? "FROM " : (i == n - 1 && has_to) ? "TO " : "THRU ";
        text += '"';
        for (const char* p = points[i] ? points[i] : ""; *p; ++p) text += (*p == '"') ? '`' : *p;
        text += "\" ";
    }
}

void AppendPriority(std::string& text, int priority) {
    if (priority != kNoPriority) text += " PRIORITY" + Port_Format(" %d", priority);
}
}  // namespace

void Ta_LunMgr::Trace(const char* format, const Pr_Logical_ConstraintHandle* handle) const {
    if (debug_callbacks) Port_MsgManData::debugStub(format, lunmgr::LineOf(handle), lunmgr::TextOf(handle));
}

bool Ta_LunMgr::cb_tspec_period(const char* name, const char* group, const char* reference, bool multiply,
                                double value, bool is_time, bool phase_plus, double phase, bool low,
                                double duration, double percent, const double* jitter, int priority,
                                const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::period: Line %I: %s", handle);
    if (second_pass) return true;
    Ndm_Block* block = GetConstraintBlock("TIMESPEC");
    std::string text = Port_Format("PERIOD \"%s\" ", group);
    const double number = is_time ? value : Mhz(value);
    if (reference) {
        text += reference;
        if (value != 0) text += (multiply ? " * " : " / ") + Port_Format("%f", number);
        if (phase != 0)
            text += std::string(" PHASE") + (phase_plus ? " + " : " - ") + Port_Format("%f", phase) + " " +
                    (is_time ? "pS" : "MHz");
    } else {
        text += Port_Format("%f", number) + " " + (is_time ? "pS" : "MHz");
    }
    text += low ? " LOW " : " HIGH ";
    text += percent != 0 ? Port_Format("%f", percent) + " %" : Port_Format("%f", duration) + " pS";
    if (jitter) text += " INPUT_JITTER " + Port_Format(" %f", *jitter) + " pS";
    AppendPriority(text, priority);
    AttachTimeConstraint(name, text.c_str(), block);
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
    Ndm_Block* block = GetConstraintBlock("TIMESPEC");
    std::string text;
    AppendPoints(text, has_from, has_to, points);
    std::string number = Port_Format("%f", (is_time || reference) ? value : Mhz(value));
    if (reference)
        text += std::string(reference) + (multiply ? " * " : " / ") + number;
    else
        text += number + " " + (is_time ? "pS" : "MHz");
    if (datapathonly) text += " DATAPATHONLY";
    AppendPriority(text, priority);
    AttachTimeConstraint(name, text.c_str(), block);
    return true;
}

bool Ta_LunMgr::cb_tspec_tig(const char* name, bool has_from, bool has_to, const std::vector<const char*>& points,
                             int priority, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::tig: Line %I: %s", handle);
    if (second_pass) return true;
    Ndm_Block* block = GetConstraintBlock("TIMESPEC");
    if (points.empty()) {
        AttachTimeConstraint(name, "IGNORE", block);
        return true;
    }
    std::string text;
    AppendPoints(text, has_from, has_to, points);
    text += "TIG";
    AppendPriority(text, priority);
    AttachTimeConstraint(name, text.c_str(), block);
    return true;
}

bool Ta_LunMgr::cb_tspec_drop_spec(const char* name, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::drop_spec: Line %I: %s", handle);
    if (second_pass) return true;
    AttachTimeConstraint(name, "DROP_SPEC", GetConstraintBlock("TIMESPEC"));
    return true;
}

bool Ta_LunMgr::cb_enable(bool enable, const char* name, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::enable disable: Line: %I: %s", handle);
    if (second_pass) return true;
    AttachTimeConstraint(enable ? "ENABLE" : "DISABLE", name, GetConstraintBlock("TIMESPEC"));
    return true;
}
