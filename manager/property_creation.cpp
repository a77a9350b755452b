// Ta_LunMgr::create_property: one parsed constraint of an INST, NET or PIN statement as a
// typed property, with the value texts some keywords need and the keywords refused here.
#include <string>

#include "host/port/msgman.h"
#include "host/parser/pr_property_texts.h"
#include "manager/lunmgr.h"
#include "manager/statement_messages.h"

using lunmgr::LineOf;
using lunmgr::Msg;

unsigned char Ta_LunMgr::create_property(Ndm_PropertyHolder* object, Pr_Logical_Constraint* constraint,
                                         const char* name, unsigned char* error_reported,
                                         const Pr_Logical_ConstraintHandle* handle) {
    return create_planned(object, Pr_PlanProperties(*constraint, name, file_type == CP_UCF), error_reported, handle);
}

unsigned char Ta_LunMgr::create_planned(Ndm_PropertyHolder* object, const Pr_PropertyPlan& plan,
                                        unsigned char* error_reported, const Pr_Logical_ConstraintHandle* handle) {
    int line = handle ? handle->getline() : 0;
    switch (plan.rule) {
        case Pr_PropertyRule::PassOver: return 1;
        case Pr_PropertyRule::Nothing: return 0;
        case Pr_PropertyRule::ValuelessTig: {
            // A valueless TIG is recorded directly: one more empty entry.
            Ndm_Property* tig = object->GetPropertyByName("TIG");
            if (!tig) tig = object->CreatePropertyStringList("TIG");
            tig->AddString("");
            return 1;
        }
        case Pr_PropertyRule::DivideBy:
            Msg(__LINE__).issueError(
                "Line %i in '%s': DIVIDE_BY constraints are not supported in the ucf file. The ucf file "
                "is processed after netlist expansion, which is when the DIVIDE_BY constraint is "
                "operational. This constraint should be placed in the appropriate netlist or added to "
                "a .ncf file.\n",
                line, constraint_filename);
            if (error_reported) *error_reported = 1;
            return 0;
        case Pr_PropertyRule::ReservedSites:
            Msg(__LINE__).issueError(
                "Line %i in '%s': 'RESERVED_SITES' is no longer a vaild constraint name.  Please use the "
                "LOC and PROHIBIT constraints to reserve or prohibit placement  in Modular Design.\n",
                line, constraint_filename);
            if (error_reported) *error_reported = 1;
            return 0;
        case Pr_PropertyRule::IllegalTnm:
            Msg(__LINE__).issueInternal("Illegal TNM or TNM_NET value.\n");
            break;
        case Pr_PropertyRule::Unsupported:
            Msg(__LINE__).issueFatal(2, "Unsupported Constraint detected\n");
        case Pr_PropertyRule::Attach:
            break;
    }
    for (const Pr_PropertyText& p : plan.texts) {
        unsigned char ok = p.flag ? AttachConstraint(p.name.c_str(), object, handle)
                                  : AttachConstraint(p.name.c_str(), p.value.c_str(), object, handle);
        if (!ok) return 0;
    }
    return 1;
}
