#include "part/lunpart.h"

#include "host/parser/pr_block_texts.h"
#include "host/port/msgman.h"
#include "host/port/ut_str.h"

namespace {
Port_MsgManData Msg(int line) { return Port_MsgManData::createObject("Quillmap", "lunpart", line, "1.0"); }
const char* TextOf(const Pr_Logical_ConstraintHandle* handle) { return handle ? handle->return_ascii() : ""; }

// The value of a string constraint named exactly PART, or null.
const char* PartValue(Pr_Logical_Constraint* c) {
    if (c->get_type() != Pr_Logical_Constraint::STRING || UT_STR::Compare(c->get_name(), "PART") != 0)
        return nullptr;
    auto* s = dynamic_cast<Pr_Logical_StringConstraint*>(c);
    return s ? s->get_value() : nullptr;
}
}  // namespace

Ta_LunPart::Ta_LunPart(const char* filename, CP_FILE_TYPE type, const char* filter_file)
    : Ta_LunBase(filename, type, filter_file) {
    file_from_csttrans = false;
}

Ta_LunPart::~Ta_LunPart() = default;

bool Ta_LunPart::cb_config(const char* name, const char* value, const Pr_Logical_ConstraintHandle* handle) {
    if (debug_callbacks) Port_MsgManData::debugStub("CONFIG::config: %s", TextOf(handle));
    Ndm_Block* block = GetConstraintBlock("CONFIG");
    if (Ndm_Property* part = block->GetPropertyByName("PART"); part && UT_STR::ICompare(name, "PART") == 0) {
        const char* first = part->GetValueString();
        Msg(__LINE__).issueUserFatal(
            2,
            "Second \"CONFIG PART\" statement found in %s. First \"PART\" value found was %s, second \"PART\" "
            "value is %s. Please remove one of the \"CONFIG PART\" statements from the %s file.\n",
            constraint_filename, first ? first : "NONE", value, constraint_filename);
    }
    if (Pr_IsBankVoltage(name)) return true;
    if (UT_STR::ICompare(name, "DCI_CASCADE") == 0) return true;
    return AttachConstraint(name, value, block, handle) != 0;
}

unsigned char Ta_LunPart::create_property(Pr_Logical_Constraint* constraint, const char* /*name*/,
                                          const Pr_Logical_ConstraintHandle* handle) {
    const char* value = PartValue(constraint);
    if (!value) return 1;
    return AttachConstraint("PART", value, GetConstraintBlock("CONFIG"), handle);
}

bool Ta_LunPart::TakeParts(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle,
                           const char* trace, const char* entry) {
    if (debug_callbacks) Port_MsgManData::debugStub(trace, TextOf(handle));
    for (auto it = defn.begin_constraint(); it != defn.end_constraint(); ++it) {
        if (!PartValue(*it)) continue;
        if (!create_property(*it, (*it)->get_name(), handle)) {
            Msg(__LINE__).issueStatus("Constraint property %s not generated\n", (*it)->get_name());
            Msg(__LINE__).issueStatus(entry, TextOf(handle));
        }
    }
    return true;
}

bool Ta_LunPart::cb_comp(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) {
    return TakeParts(defn, handle, "PART::comp: %s", "INST entry is %s\n");
}

bool Ta_LunPart::cb_net(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) {
    return TakeParts(defn, handle, "PART::net: %s", "NET entry is %s");
}

bool Ta_LunPart::cb_pin(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) {
    return TakeParts(defn, handle, "PART::pin: %s", "PIN entry is %s\n");
}

bool Ta_LunPart::cb_error(int line, int column, const char* value) {
    Msg(__LINE__).issueError(
        "Line %i in '%s': A parsing error has occurred while reading the constraint file. The value '%s' at "
        "column %d is invalid.\n",
        line, constraint_filename, value, column);
    return true;
}
