// What the design-wide statements store on the constraint blocks: the names and value texts of
// timing entries (TIMESPEC and TIMEGRP blocks) and of the CONFIG block's settings. Shared by
// the annotator and the constraint repository, so that both store the same texts for the same
// statement. The arguments are those the parser hands to its callbacks.
#pragma once

#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "host/parser/pr_logical.h"

// A timing entry or a setting: its name and value text.
struct Pr_BlockEntry {
    std::string name;
    std::string value;
};

// Whether a name stored in these texts comes back the same from the constraint text written
// from them: the texts keep names unquoted, so a blank, ';', '#' or '"' in a name is lost.
bool Pr_NameReadsBack(std::string_view name);

// "RISING", "FALLING", "TRANSHI", "TRANSLO", "" for 4, null otherwise.
const char* Pr_EdgeText(PR_EDGE edge);

// ---- TIMESPEC statements: the value of the entry named after the statement

std::string Pr_PeriodText(const char* group, const char* reference, bool multiply, double value, bool is_time,
                          bool phase_plus, double phase, bool low, double duration, double percent,
                          const double* jitter, int priority);
// FROM/THRU/TO paths with a delay (points not empty).
std::string Pr_PathDelayText(bool has_from, bool has_to, const std::vector<const char*>& points,
                             const char* reference, bool multiply, double value, bool is_time, int priority,
                             bool datapathonly);
// Paths ignored, or "IGNORE" without points.
std::string Pr_IgnoreText(bool has_from, bool has_to, const std::vector<const char*>& points, int priority);
// The four OFFSET forms: global (group null) or of a group, for every register or (regs) for
// one group of them. A global offset is named "OFFSET", a group's TSO_<group>_<in|out>_<clock>
// with _<regs> after it.
Pr_BlockEntry Pr_OffsetEntry(const char* group, bool in, double time, const double* valid, bool before,
                             const char* clock, const char* regs, const char* level);
// TIMEGRP group AREA_GROUP = areagroup, an entry of the TIMESPEC block.
Pr_BlockEntry Pr_GroupAreaEntry(const char* group, const char* areagroup);

// ---- TIMEGRP definitions: the value of the entry named after the group (members not empty)

std::string Pr_TimeGroupText(const std::vector<std::pair<const char*, PR_EDGE>>& members,
                             const std::vector<const char*>& excluded);

// ---- CONFIG settings

// PROHIBIT and VREF: the sites joined by ", ".
std::string Pr_SiteListText(const std::vector<const char*>& sites);
std::string Pr_VoltageText(double volts);      // 1.200V
std::string Pr_TemperatureText(double celsius);  // 85.000C
// A bank reference voltage (INTERNAL_VREF_BANK..., any letter case): set on the block as
// written, without the property filter, replacing the same setting in any letter case.
bool Pr_IsBankVoltage(const char* name);
// DCI_CASCADE: the blank-separated words of value joined by ",".
std::string Pr_DciCascadeText(const char* value);

// ---- AREA_GROUP and SET attributes, kept on the CONFIG block as "<name> = <value>"

enum class Pr_AttributeRule {
    Attach,            // value is the text to attach under the attribute's name
    PassOver,          // nothing to attach (an RLOC_RANGE of a SET not of two values)
    NoName,            // an attribute without a name: nothing to attach
    UnknownAttribute,  // an attribute an area group does not have: nothing to attach
    Unsupported,       // a value kind the statement does not take: the statement stops
    BadCompression,    // a COMPRESSION outside 0 to 100: the statement stops
    BadMode,           // a mode value not allowed (value is it, upper-cased): the statement stops
};

struct Pr_AttributeText {
    Pr_AttributeRule rule = Pr_AttributeRule::PassOver;
    std::string value;
};

// Whether the attributes after one of this rule are left out.
bool Pr_StopsStatement(Pr_AttributeRule rule);
Pr_AttributeText Pr_AreaGroupText(const std::string& area, const Pr_Logical_Constraint& attribute);
Pr_AttributeText Pr_SetText(const std::string& set, const Pr_Logical_Constraint& attribute);
