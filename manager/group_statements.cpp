// Ta_LunMgr: TIMEGRP, TIMEGRP ... AREA_GROUP, AREA_GROUP, SET, PROHIBIT and VREF statements.
// Timing groups become entries of constraint blocks; the others become properties of the
// CONFIG block, through the property filter.
#include <string>

#include "host/parser/pr_block_texts.h"
#include "host/port/msgman.h"
#include "host/port/ut_str.h"
#include "manager/lunmgr.h"
#include "manager/statement_messages.h"

using lunmgr::LineOf;
using lunmgr::Msg;

namespace {
// The message for a value of an area-group mode attribute that it does not allow.
const char* ModeError(const char* attribute) {
    if (UT_STR::Compare(attribute, "PLACE") == 0) return "Line %i in '%s': %s is an unsupported PLACE value.\n";
    if (UT_STR::Compare(attribute, "GROUP") == 0) return "Line %i in '%s': %s is an unsupported GROUP value.\n";
    if (UT_STR::Compare(attribute, "MODE") == 0) return "Line %i in '%s': %s is an unsupported MODE value.\n";
    return "Line %i in '%s': %s is an unsupported RECONFIG value.\n";
}
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
    std::vector<const char*> names(excluded);
    for (const auto& [member, edge] : members) names.push_back(member);
    WarnNamesLost(handle, {group}, names);
    AttachTimeConstraint(group, Pr_TimeGroupText(members, excluded).c_str(), GetConstraintBlock("TIMEGRP"));
    return true;
}

bool Ta_LunMgr::cb_timegrp_areagroup(const char* group, const char* areagroup,
                                     const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::timegrp_areagroup: Line %I:%s", handle);
    if (second_pass) return true;
    WarnNamesLost(handle, {group, areagroup});
    Pr_BlockEntry entry = Pr_GroupAreaEntry(group, areagroup);
    AttachTimeConstraint(entry.name.c_str(), entry.value.c_str(), GetConstraintBlock("TIMESPEC"));
    return true;
}

bool Ta_LunMgr::cb_areagroup(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::area_group: Line: %I: %s", handle);
    if (second_pass) return true;
    Ndm_Block* block = GetConstraintBlock("CONFIG");
    const std::string area = defn.get_object_name();
    const int line = LineOf(handle);
    for (auto it = defn.begin_constraint(); it != defn.end_constraint(); ++it) {
        const char* attr = (*it)->get_name();
        Pr_AttributeText text = Pr_AreaGroupText(area, **it);
        switch (text.rule) {
            case Pr_AttributeRule::Attach: AttachConstraint(attr, text.value.c_str(), block, handle); break;
            case Pr_AttributeRule::NoName: Msg(__LINE__).issueInternal("Constraint type for AREA_GROUP is unknown."); break;
            case Pr_AttributeRule::Unsupported:
                Msg(__LINE__).issueError("Line %i in '%s': Unsupported Constraint detected in entry.\n", line,
                                         constraint_filename);
                return false;
            case Pr_AttributeRule::BadCompression:
                Msg(__LINE__).issueError(
                    "Line %i in '%s':  Compression values need to be within the 0-100 range.  Unsupported "
                    "compression value detected.\n",
                    line, constraint_filename);
                return false;
            case Pr_AttributeRule::UnknownAttribute:
                Msg(__LINE__).issueError("Line %i in '%s': Unsupported AREA_GROUP attribute detected: '%s'\n", line,
                                         constraint_filename, attr);
                break;
            case Pr_AttributeRule::BadMode:
                Msg(__LINE__).issueError(ModeError(attr), line, constraint_filename, text.value.c_str());
                return false;
            case Pr_AttributeRule::PassOver: break;
        }
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
        Pr_AttributeText text = Pr_SetText(set, **it);
        switch (text.rule) {
            case Pr_AttributeRule::Attach:
                result = AttachConstraint((*it)->get_name(), text.value.c_str(), block, handle) != 0;
                break;
            case Pr_AttributeRule::NoName: Msg(__LINE__).issueInternal("Constraint type for SET is unknown."); break;
            case Pr_AttributeRule::PassOver: break;
            default:
                Msg(__LINE__).issueError("Line %i in '%s': Unsupported Constraint detected in entry\n", LineOf(handle),
                                         constraint_filename);
                return false;
        }
    }
    return result;
}

bool Ta_LunMgr::cb_prohibit(const std::vector<const char*>& names, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::prohibit: Line %I: %s", handle);
    if (second_pass) return true;
    Ndm_Block* block = GetConstraintBlock("CONFIG");
    AttachConstraint("PROHIBIT", Pr_SiteListText(names).c_str(), block, handle);
    return true;
}

bool Ta_LunMgr::cb_vref(const std::vector<const char*>& names, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::vref: Line %I: %s", handle);
    if (second_pass) return true;
    Ndm_Block* block = GetConstraintBlock("CONFIG");
    AttachConstraint("VREF", Pr_SiteListText(names).c_str(), block, handle);
    return true;
}
