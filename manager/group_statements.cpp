// Ta_LunMgr: TIMEGRP, TIMEGRP ... AREA_GROUP, AREA_GROUP, SET, PROHIBIT and VREF statements.
// Timing groups become entries of constraint blocks; the others become properties of the
// CONFIG block, through the property filter.
#include <string>

#include "host/port/msgman.h"
#include "host/port/ut_str.h"
#include "manager/lunmgr.h"
#include "manager/statement_messages.h"

using lunmgr::LineOf;
using lunmgr::Msg;
using lunmgr::TextOf;

namespace {
bool Is(const char* a, const char* b) { return UT_STR::Compare(a, b) == 0; }

std::string Join(const char* const* begin, const char* const* end, const char* separator) {
    std::string text;
    for (auto it = begin; it != end; ++it) {
        if (it != begin) text += separator;
        text += *it;
    }
    return text;
}

// Allowed upper-cased values of an area-group mode attribute and the message for others.
struct ModeRule {
    const char* attribute;
    std::initializer_list<const char*> allowed;
    const char* error;
};
const ModeRule kModeRules[] = {
    {"PLACE", {"OPEN", "CLOSED"}, "Line %i in '%s': %s is an unsupported PLACE value.\n"},
    {"GROUP", {"OPEN", "CLOSED"}, "Line %i in '%s': %s is an unsupported GROUP value.\n"},
    {"MODE", {"LOCKED", "INSULATED", "RECONFIG"}, "Line %i in '%s': %s is an unsupported MODE value.\n"},
    {"IMPLEMENT", {"FORCE", "PRESERVE", "AUTO"}, "Line %i in '%s': %s is an unsupported RECONFIG value.\n"},
};
}  // namespace

bool Ta_LunMgr::cb_timegrp(const char* group, const std::vector<std::pair<const char*, PR_EDGE>>& members,
                           const std::vector<const char*>& excluded, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::timegrp: Line %I: %s", handle);
    if (second_pass) return true;
    if (members.empty()) {
        Msg(__LINE__).issueError("Line %i in '%s': No groups defined for timegroup '%s'\n", LineOf(handle),
                                 constraint_filename, group);
        return false;
    }
    Ndm_Block* block = GetConstraintBlock("TIMEGRP");
    std::string text;
    for (const auto& [member, edge] : members) {
        if (const char* edge_text = GetEdgeString(edge)) {
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
    AttachTimeConstraint(group, text.c_str(), block);
    return true;
}

bool Ta_LunMgr::cb_timegrp_areagroup(const char* group, const char* areagroup,
                                     const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::timegrp_areagroup: Line %I:%s", handle);
    if (second_pass) return true;
    Ndm_Block* block = GetConstraintBlock("TIMESPEC");
    std::string text = std::string("TIMEGRP ") + group + " AREA_GROUP = " + areagroup;
    AttachTimeConstraint("TS_AREA_DEF", text.c_str(), block);
    return true;
}

bool Ta_LunMgr::cb_areagroup(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::area_group: Line: %I: %s", handle);
    if (second_pass) return true;
    Ndm_Block* block = GetConstraintBlock("CONFIG");
    const std::string area = defn.get_object_name();
    const int line = LineOf(handle);
    for (auto it = defn.begin_constraint(); it != defn.end_constraint(); ++it) {
        Pr_Logical_Constraint* c = *it;
        const char* attr = c->get_name();
        if (!attr || !*attr) {
            Msg(__LINE__).issueInternal("Constraint type for AREA_GROUP is unknown.");
            continue;
        }
        auto type = c->get_type();
        if (type != Pr_Logical_Constraint::STRING && type != Pr_Logical_Constraint::STRING_LIST_TYPE) {
            Msg(__LINE__).issueError("Line %i in '%s': Unsupported Constraint detected in entry.\n", line,
                                     constraint_filename);
            return false;
        }
        auto* list = dynamic_cast<Pr_Logical_StringListConstraint*>(c);
        if (list && Is(attr, "RANGE")) {
            std::string value = area + " = " + Join(list->begin_value(), list->end_value(), ",");
            AttachConstraint(attr, value.c_str(), block, handle);
            continue;
        }
        // The remaining attributes carry one text; a list of one text reads the same way.
        const char* text = nullptr;
        if (auto* s = dynamic_cast<Pr_Logical_StringConstraint*>(c)) text = s->get_value();
        if (list && list->num_values() > 0) text = *list->begin_value();
        if (Is(attr, "COMPRESSION")) {
            bool ok = false;
            int percent = UT_STR::StrToINT32(text, &ok);
            if (!ok || percent < 0 || percent > 100) {
                Msg(__LINE__).issueError(
                    "Line %i in '%s':  Compression values need to be within the 0-100 range.  Unsupported "
                    "compression value detected.\n",
                    line, constraint_filename);
                return false;
            }
            AttachConstraint(attr, Port_Format("%s = %i", area.c_str(), percent).c_str(), block, handle);
            continue;
        }
        const ModeRule* rule = nullptr;
        for (const ModeRule& r : kModeRules)
            if (Is(attr, r.attribute)) rule = &r;
        if (!rule) {
            Msg(__LINE__).issueError("Line %i in '%s': Unsupported AREA_GROUP attribute detected: '%s'\n", line,
                                     constraint_filename, attr);
            continue;
        }
        std::string upper = text ? text : "";
        UT_STR::Upper(upper.data());
        bool allowed = false;
        for (const char* value : rule->allowed) allowed = allowed || upper == value;
        if (!allowed) {
            Msg(__LINE__).issueError(rule->error, line, constraint_filename, upper.c_str());
            return false;
        }
        AttachConstraint(attr, (area + " = " + upper).c_str(), block, handle);
    }
    return true;
}

bool Ta_LunMgr::cb_set(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::set: Line %I: %s", handle);
    if (second_pass) return true;
    Ndm_Block* block = GetConstraintBlock("CONFIG");
    const std::string set = defn.get_object_name();
    bool result = true;
    for (auto it = defn.begin_constraint(); it != defn.end_constraint(); ++it) {
        Pr_Logical_Constraint* c = *it;
        const char* attr = c->get_name();
        if (!attr || !*attr) {
            Msg(__LINE__).issueInternal("Constraint type for SET is unknown.");
            continue;
        }
        if (auto* s = dynamic_cast<Pr_Logical_StringConstraint*>(c); s && c->get_type() == Pr_Logical_Constraint::STRING) {
            result = AttachConstraint(attr, (set + " = " + s->get_value()).c_str(), block, handle) != 0;
            continue;
        }
        auto* list = dynamic_cast<Pr_Logical_StringListConstraint*>(c);
        if (list && Is(attr, "RLOC_RANGE")) {
            if (list->num_values() == 2) {
                const char* const* v = list->begin_value();
                result = AttachConstraint("RLOC_RANGE", Port_Format("%s = %s:%s", set.c_str(), v[0], v[1]).c_str(),
                                          block, handle) != 0;
            }
            continue;
        }
        Msg(__LINE__).issueError("Line %i in '%s': Unsupported Constraint detected in entry\n", LineOf(handle),
                                 constraint_filename);
        return false;
    }
    return result;
}

bool Ta_LunMgr::cb_prohibit(const std::vector<const char*>& names, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::prohibit: Line %I: %s", handle);
    if (second_pass) return true;
    Ndm_Block* block = GetConstraintBlock("CONFIG");
    AttachConstraint("PROHIBIT", Join(names.data(), names.data() + names.size(), ", ").c_str(), block, handle);
    return true;
}

bool Ta_LunMgr::cb_vref(const std::vector<const char*>& names, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::vref: Line %I: %s", handle);
    if (second_pass) return true;
    Ndm_Block* block = GetConstraintBlock("CONFIG");
    AttachConstraint("VREF", Join(names.data(), names.data() + names.size(), ", ").c_str(), block, handle);
    return true;
}
