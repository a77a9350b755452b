// Ta_LunCSHelper: the repository's constraints written back onto the netlist, and constraint
// properties of the netlist taken into the repository.
#include "bridge/luncshelper.h"
#include "host/design/ndm.h"
#include "host/port/msgman.h"

bool Ta_LunCSHelper::WriteConstraintsToNgd(bool expanded) {
    Port_MsgManData::debugStub(expanded ? "Writing Constraints back to the ngd...\n"
                                        : "Writing Constraints back to the ngc...\n");
    Ndm_View* view = m_design ? m_design->GetViewByName(expanded ? "EXPANDED" : "SOURCE") : nullptr;
    if (!view) {
        Port_MsgManData::debugStub("No view...");
        return true;  // a region over no view has nothing to receive the constraints
    }
    Cs_DesignRegion_View region(view);
    if (m_cmgr) Port_MsgManData::debugStub("m_cmgr is non-null\n");
    m_cmgr->WriteConstraintProps(region);
    return true;
}

void Ta_LunCSHelper::WriteConstraintProps(Ndm_View* view) {
    Port_MsgManData::debugStub("Ta_LunCSHelper Write Constraint Props\n");
    Cs_ReturnCode outcome = m_cmgr->WriteConstraintProps(Cs_DesignRegion_View(view));
    if (outcome) outcome.GetUnexpectedStatusObjs().Report();
}

void Ta_LunCSHelper::ReplaceConstraintFromProps(Ndm_View* view, bool deleteProperties) {
    Port_MsgManData::debugStub("Ta_LunCSHelper::ReplaceConstraintFromProps\n");
    Cs_ConstraintMgr::PropReplaceResults results = m_cmgr->ReplaceConstraintsFromProps(Cs_DesignRegion_View(view));
    Port_MsgManData::debugStub("Done\n");
    if (!deleteProperties) return;
    for (Ndm_Property* p : results.ConstraintProperties()) {
        Ndm_PropertyHolder* owner = p->GetOwner();
        Port_MsgManData::debugStub("Deleting property %s on %s since this constraint is now in the repo\n",
                                   p->GetName(), owner->GetName());
        owner->DeleteProperty(p);
    }
}
