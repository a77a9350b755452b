// What one parsed constraint of an INST, NET or PIN statement becomes as properties: the
// property names and value texts, in the order they are attached, or the rule that refuses or
// passes over the constraint. Shared by the annotator and the constraint repository, so that
// both give the same properties for the same statement.
#pragma once

#include <string>
#include <vector>

#include "host/parser/pr_logical.h"

enum class Pr_PropertyRule {
    Attach,         // attach texts in order, stopping at the first refusal
    PassOver,       // nothing to attach; the constraint counts as handled (PART in a UCF, a
                    // RLOC_RANGE not of two values, a FEEDBACK not of three)
    Nothing,        // a valueless list other than TIG: nothing attached, the constraint fails
    ValuelessTig,   // TIG without values: one more empty text in the TIG string list
    DivideBy,       // DIVIDE1_BY in a UCF: refused with its message
    ReservedSites,  // RESERVED_SITES: refused with its message
    IllegalTnm,     // TNM or TNM_NET with three or more values: texts holds the fallback
    Unsupported,    // a constraint kind outside 0 to 5
};

struct Pr_PropertyText {
    std::string name;
    std::string value;
    bool flag = false;  // a boolean property named name (a keyword without value)
};

struct Pr_PropertyPlan {
    Pr_PropertyRule rule = Pr_PropertyRule::Attach;
    std::vector<Pr_PropertyText> texts;
};

// The plan for constraint; name names the properties of offset and period constraints (the
// caller passes the constraint's keyword), ucf tells the file kind.
Pr_PropertyPlan Pr_PlanProperties(const Pr_Logical_Constraint& constraint, const char* name, bool ucf);
