#include "host/parser/pr_block_texts.h"

#include <cstring>
#include <initializer_list>

#include "host/port/msgman.h"
#include "host/port/ut_str.h"

namespace {

constexpr int kNoPriority = 2147483647;

bool Is(const char* a, const char* b) { return std::strcmp(a, b) == 0; }

// Megahertz of a period given in picoseconds.
double Mhz(double period_ps) { return (1.0 / period_ps) * 1000000; }

// Path points as stored: keyword, the name in double quotes, one blank; a double quote inside
// a name becomes a backquote so that the quoting stays well formed.
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

// Allowed upper-cased values of an area-group mode attribute.
struct ModeRule {
    const char* attribute;
    std::initializer_list<const char*> allowed;
};
const ModeRule kModeRules[] = {
    {"PLACE", {"OPEN", "CLOSED"}},
    {"GROUP", {"OPEN", "CLOSED"}},
    {"MODE", {"LOCKED", "INSULATED", "RECONFIG"}},
    {"IMPLEMENT", {"FORCE", "PRESERVE", "AUTO"}},
};

Pr_AttributeText Rule(Pr_AttributeRule rule, std::string value = {}) { return {rule, std::move(value)}; }

}  // namespace

bool Pr_NameReadsBack(std::string_view name) {
    for (char c : name)
        if (c == ';' || c == '#' || c == '"' || c == ' ' || c == '\t' || c == '\n' || c == '\r') return false;
    return true;
}

const char* Pr_EdgeText(PR_EDGE edge) {
    static const char* const kEdges[] = {"RISING", "FALLING", "TRANSHI", "TRANSLO", ""};
    int i = static_cast<int>(edge);
    return (i >= 0 && i < 5) ? kEdges[i] : nullptr;
}

std::string Pr_PeriodText(const char* group, const char* reference, bool multiply, double value, bool is_time,
                          bool phase_plus, double phase, bool low, double duration, double percent,
                          const double* jitter, int priority) {
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
    return text;
}

std::string Pr_PathDelayText(bool has_from, bool has_to, const std::vector<const char*>& points,
                             const char* reference, bool multiply, double value, bool is_time, int priority,
                             bool datapathonly) {
    std::string text;
    AppendPoints(text, has_from, has_to, points);
    std::string number = Port_Format("%f", (is_time || reference) ? value : Mhz(value));
    if (reference)
        text += std::string(reference) + (multiply ? " * " : " / ") + number;
    else
        text += number + " " + (is_time ? "pS" : "MHz");
    if (datapathonly) text += " DATAPATHONLY";
    AppendPriority(text, priority);
    return text;
}

std::string Pr_IgnoreText(bool has_from, bool has_to, const std::vector<const char*>& points, int priority) {
    if (points.empty()) return "IGNORE";
    std::string text;
    AppendPoints(text, has_from, has_to, points);
    text += "TIG";
    AppendPriority(text, priority);
    return text;
}

Pr_BlockEntry Pr_OffsetEntry(const char* group, bool in, double time, const double* valid, bool before,
                             const char* clock, const char* regs, const char* level) {
    const char* direction = in ? "IN" : "OUT";
    std::string value = Port_Format("%s %f %s", direction, time, "pS");
    if (valid) value += Port_Format(" %s %f %s", "VALID", *valid, "pS");
    value += Port_Format(" %s %s", before ? "BEFORE" : "AFTER", clock);
    if (regs) value += Port_Format(" TIMEGRP %s", regs);
    if (level) value += Port_Format(" %s", level);
    if (!group) return {"OFFSET", value};
    std::string name = Port_Format("TSO_%s_%s_%s", group, in ? "in" : "out", clock);
    if (regs) name += Port_Format("_%s", regs);
    return {name, Port_Format("TIMEGRP %s OFFSET = ", group) + value};
}

Pr_BlockEntry Pr_GroupAreaEntry(const char* group, const char* areagroup) {
    return {"TS_AREA_DEF", std::string("TIMEGRP ") + group + " AREA_GROUP = " + areagroup};
}

std::string Pr_TimeGroupText(const std::vector<std::pair<const char*, PR_EDGE>>& members,
                             const std::vector<const char*>& excluded) {
    std::string text;
    for (const auto& [member, edge] : members) {
        if (const char* edge_text = Pr_EdgeText(edge)) {
            text += edge_text;
            text += ' ';
        }
        text += member;
        text += ' ';
    }
    if (!excluded.empty()) {
        text += " EXCEPT ";
        for (const char* name : excluded) {
            text += name;
            text += ' ';
        }
    }
    return text;
}

std::string Pr_SiteListText(const std::vector<const char*>& sites) {
    std::string text;
    for (size_t i = 0; i < sites.size(); ++i) (text += i ? ", " : "") += sites[i];
    return text;
}

std::string Pr_VoltageText(double volts) { return Port_Format("%0.3fV", volts); }
std::string Pr_TemperatureText(double celsius) { return Port_Format("%0.3fC", celsius); }

bool Pr_IsBankVoltage(const char* name) { return UT_STR::INCompare(name, "INTERNAL_VREF_BANK", 18) == 0; }

std::string Pr_DciCascadeText(const char* value) {
    std::string text;
    for (const char* p = value ? value : ""; *p;) {
        const char* end = std::strchr(p, ' ');
        if (!end) end = p + std::strlen(p);
        if (end > p) (text += text.empty() ? "" : ",").append(p, end);
        p = *end ? end + 1 : end;
    }
    return text;
}

bool Pr_StopsStatement(Pr_AttributeRule rule) {
    return rule == Pr_AttributeRule::Unsupported || rule == Pr_AttributeRule::BadCompression ||
           rule == Pr_AttributeRule::BadMode;
}

Pr_AttributeText Pr_AreaGroupText(const std::string& area, const Pr_Logical_Constraint& attribute) {
    const char* name = attribute.get_name();
    if (!name || !*name) return Rule(Pr_AttributeRule::NoName);
    auto type = attribute.get_type();
    if (type != Pr_Logical_Constraint::STRING && type != Pr_Logical_Constraint::STRING_LIST_TYPE)
        return Rule(Pr_AttributeRule::Unsupported);
    auto* list = dynamic_cast<const Pr_Logical_StringListConstraint*>(&attribute);
    if (list && Is(name, "RANGE")) {
        std::string value = area + " = ";
        for (auto it = list->begin_value(); it != list->end_value(); ++it)
            (value += it == list->begin_value() ? "" : ",") += *it;
        return Rule(Pr_AttributeRule::Attach, value);
    }
    // The remaining attributes carry one text; a list of one text reads the same way.
    const char* text = nullptr;
    if (auto* s = dynamic_cast<const Pr_Logical_StringConstraint*>(&attribute)) text = s->get_value();
    if (list && list->num_values() > 0) text = *list->begin_value();
    if (Is(name, "COMPRESSION")) {
        bool ok = false;
        int percent = UT_STR::StrToINT32(text, &ok);
        if (!ok || percent < 0 || percent > 100) return Rule(Pr_AttributeRule::BadCompression);
        return Rule(Pr_AttributeRule::Attach, Port_Format("%s = %i", area.c_str(), percent));
    }
    const ModeRule* rule = nullptr;
    for (const ModeRule& r : kModeRules)
        if (Is(name, r.attribute)) rule = &r;
    if (!rule) return Rule(Pr_AttributeRule::UnknownAttribute);
    std::string upper = text ? text : "";
    UT_STR::Upper(upper.data());
    for (const char* value : rule->allowed)
        if (upper == value) return Rule(Pr_AttributeRule::Attach, area + " = " + upper);
    return Rule(Pr_AttributeRule::BadMode, upper);
}

Pr_AttributeText Pr_SetText(const std::string& set, const Pr_Logical_Constraint& attribute) {
    const char* name = attribute.get_name();
    if (!name || !*name) return Rule(Pr_AttributeRule::NoName);
    if (auto* s = dynamic_cast<const Pr_Logical_StringConstraint*>(&attribute);
        s && attribute.get_type() == Pr_Logical_Constraint::STRING)
        return Rule(Pr_AttributeRule::Attach, set + " = " + s->get_value());
    auto* list = dynamic_cast<const Pr_Logical_StringListConstraint*>(&attribute);
    if (!list || !Is(name, "RLOC_RANGE")) return Rule(Pr_AttributeRule::Unsupported);
    if (list->num_values() != 2) return Rule(Pr_AttributeRule::PassOver);
    const char* const* v = list->begin_value();
    return Rule(Pr_AttributeRule::Attach, Port_Format("%s = %s:%s", set.c_str(), v[0], v[1]));
}
