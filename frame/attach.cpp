// Ta_LunBase: attaching constraints through the property filter, the verdict messages and the
// record of which constraint names came from which kind of file.
#include "frame/lunbase.h"
#include "host/filter/prop_attach.h"
#include "host/port/msgman.h"
#include "host/port/ut_str.h"

namespace {
const char* kNewObj = "TA_LUN_NEW_OBJ";
const char* kFromUcf = "FROM_UCF";
const char* kFromNcf = "FROM_NCF";
}  // namespace

template <class MakeEntry>
unsigned char Ta_LunBase::Attach(const char* name, Ndm_PropertyHolder* object,
                                 const Pr_Logical_ConstraintHandle* handle, MakeEntry make_entry) {
    if (!object) return 0;
    // Second pass over a UCF: objects the first pass annotated are left alone.
    if (second_pass && !object->GetPropertyByName(kNewObj)) {
        if (object->GetPropertyByName(kFromUcf)) return 1;
        object->CreatePropertyBool(kNewObj);
    }
    if (!prop_filter) prop_filter = new Ndh_PropInFilter(filter_filename ? filter_filename : "ucf.pfd", nullptr);
    Ndh_PropFiltResult result = Ndh_FilterOnto(*prop_filter, object, make_entry);
    if (!ConstraintDRC(result, name, handle)) return 0;
    AddConstraintToList(name, object);
    return 1;
}

unsigned char Ta_LunBase::AttachConstraint(const char* name, const char* value,
                                           Ndm_PropertyHolder* object,
                                           const Pr_Logical_ConstraintHandle* handle) {
    return Attach(name, object, handle,
                  [&](Ndm_Property* list) { list->CreatePropertyString(name, value); });
}

unsigned char Ta_LunBase::AttachConstraint(const char* name, Ndm_PropertyHolder* object,
                                           const Pr_Logical_ConstraintHandle* handle) {
    return Attach(name, object, handle, [&](Ndm_Property* list) { list->CreatePropertyBool(name); });
}

unsigned char Ta_LunBase::AttachConstraint(const char* name, int value, Ndm_PropertyHolder* object,
                                           const Pr_Logical_ConstraintHandle* handle) {
    return Attach(name, object, handle,
                  [&](Ndm_Property* list) { list->CreatePropertyInt32(name, value); });
}

unsigned char Ta_LunBase::AttachConstraint(const char* name, double value, Ndm_PropertyHolder* object,
                                           const Pr_Logical_ConstraintHandle* handle) {
    return Attach(name, object, handle,
                  [&](Ndm_Property* list) { list->CreatePropertyFloat64(name, value); });
}

unsigned char Ta_LunBase::ConstraintDRC(const Ndh_PropFiltResult& result, const char* name,
                                        const Pr_Logical_ConstraintHandle* handle) {
    return Ta_LunReportVerdict(result, name, constraint_filename, handle ? handle->getline() : 0, "lunbase");
}

unsigned char Ta_LunReportVerdict(const Ndh_PropFiltResult& result, const char* name, const char* file, int line,
                                  const char* module) {
    auto Msg = [module](int at) { return Port_MsgManData::createObject("Quillmap", module, at, "1.0"); };
    if (result.Succeed()) return 1;
    if (result.BadPropName()) {
        Msg(__LINE__).issueError("Line %i in '%s': '%s' is an invalid constraint name.\n", line, file, name);
        return 0;
    }
    if (result.InhibitedFalseBool()) {
        Port_MsgManData::debugStub(
            "Line %i in '%s': '%s' not attached becauase it specified as a boolean property and  "
            "has a false value.\n",
            line, file, name);
        if (result.DeletedTrueBool())
            Port_MsgManData::debugStub(
                "'%s' also already existed on this object, so the property filter removed it.\n", name);
        return 1;
    }
    if (result.BadDataType()) {
        Msg(__LINE__).issueWarning(
            "Line %i in '%s': Invalid constraint value type for '%s'.  Make sure the syntax for this "
            "constraint is consistent with what is specified in the Constraints Guide.  This "
            "constraint will be ignored.\n",
            line, file, name);
        return 1;
    }
    Port_MsgManData::debugStub(
        "Line %i in '%s':  constraint '%s' failed for some unknown reason.  Make sure there isn't a "
        "problem.  This constraint will be ignored.\n",
        line, file, name);
    return 1;
}

unsigned char Ta_LunBase::AddConstraintToList(const char* name, Ndm_PropertyHolder* object) {
    const char* list_name = file_type == CP_UCF ? kFromUcf : file_type == CP_NCF ? kFromNcf : nullptr;
    if (!list_name || !object) return 1;
    Ndh_RecordConstraintName(object, list_name, name);
    return 1;
}

unsigned char Ta_LunBase::AlreadyAnnotated(const char* /*name*/, Ndm_PropertyHolder* object) {
    if (!second_pass || !object || object->GetPropertyByName(kNewObj)) return 0;
    if (object->GetPropertyByName(kFromUcf)) return 1;
    object->CreatePropertyBool(kNewObj);
    return 0;
}

char* Ta_LunBase::AddQuotesToString(const char* text) { return zepform("\"%s\"", text ? text : ""); }
