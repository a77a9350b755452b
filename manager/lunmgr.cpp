// Ta_LunMgr: options, the unmatched-line trace, global settings (CONFIG, voltage,
// temperature), model statements and unreadable values.
#include "manager/lunmgr.h"
#include "manager/statement_messages.h"

#include <string>

#include "host/design/ndm_constraint_blocks.h"
#include "host/parser/pr_block_texts.h"
#include "host/port/env.h"
#include "host/port/msgman.h"
#include "host/port/ut_str.h"

using lunmgr::LineOf;
using lunmgr::Msg;
using lunmgr::TextOf;

Ta_LunMgr::Ta_LunMgr(const char* filename, CP_FILE_TYPE type, const char* filter_file)
    : Ta_LunBase(filename, type, filter_file),
      config_seen(false),
      allow_unmatched_locs(false),
      best_effort(0) {
    if (Port_Env::GetEnv("ZEP_QUILLMAP_BEST_EFFORT_UCF")) {
        best_effort = 1;
        identifier = "DEFAULT";
    }
}

Ta_LunMgr::~Ta_LunMgr() = default;

void Ta_LunMgr::set_best_effort(unsigned char on, Port::StringBase<char> id) {
    best_effort = on;
    identifier = std::move(id);
}

unsigned char Ta_LunMgr::AllowUnmatchedLocs() {
    allow_unmatched_locs = true;
    return 1;
}

bool Ta_LunMgr::IsAnIOProp(const char* name) {
    if (!name) return false;
    for (const char* io : {"LOC", "IOSTANDARD", "DRIVE", "SLEW"})
        if (UT_STR::Compare(name, io) == 0) return true;
    return false;
}

void Ta_LunMgr::store_unmatched(const Pr_Logical_ConstraintHandle* handle) {
    Port_MsgManData::debugStub("Unmatched ucf constraint line: Line %I: %s", LineOf(handle), TextOf(handle));
}

bool Ta_LunMgr::cb_config(const char* name, const char* value, const Pr_Logical_ConstraintHandle* handle) {
    Trace("MGR::config: Line: %I: %s", handle);
    if (second_pass) return true;
    bool is_part = UT_STR::ICompare(name, "PART") == 0;
    // A UCF's part is read by the part reader, not here.
    if (file_type == CP_UCF && is_part) return true;
    Ndm_Block* block = GetConstraintBlock("CONFIG");
    if (!config_seen || !is_part) {
        config_seen = true;
    } else if (Ndm_Property* part = block->GetPropertyByName("PART")) {
        const char* first = part->GetValueString();
        Msg(__LINE__).issueUserFatal(
            2,
            "Second \"CONFIG PART\" statement found in %s. First \"PART\" value found was %s, second "
            "\"PART\" value is %s. Please remove one of the \"CONFIG PART\" statements from the %s file.\n",
            constraint_filename, first ? first : "NONE", value, constraint_filename);
    }
    if (Pr_IsBankVoltage(name)) {
        Ndm_ReplaceSetting(block, name, value);
        return true;
    }
    if (UT_STR::ICompare(name, "DCI_CASCADE") == 0) return DCI_Cascade_Hack(block, value, handle) != 0;
    return AttachConstraint(name, value, block, handle) != 0;
}

unsigned char Ta_LunMgr::DCI_Cascade_Hack(Ndm_Block* block, const char* value,
                                          const Pr_Logical_ConstraintHandle* handle) {
    std::string joined = Pr_DciCascadeText(value);
    if (joined.empty()) Port_MsgManData::debugStub("Unable to extract substrings for DCI_CASCADE\n");
    AttachConstraint("DCI_CASCADE", joined.c_str(), block, handle);
    return 1;
}

// Voltage and temperature settings: the value with three decimals and its unit letter on the
// CONFIG block, whatever the filter says of it.
bool Ta_LunMgr::AttachOperatingCondition(const char* trace, const char* name, const std::string& value,
                                         const Pr_Logical_ConstraintHandle* handle) {
    Trace(trace, handle);
    if (second_pass) return true;
    Ndm_Block* block = GetConstraintBlock("CONFIG");
    AttachConstraint(name, value.c_str(), block, handle);
    return true;
}

bool Ta_LunMgr::cb_voltage(double volts, const Pr_Logical_ConstraintHandle* handle) {
    return AttachOperatingCondition("MGR::Voltage: Line %I: %s", "VOLTAGE", Pr_VoltageText(volts), handle);
}

bool Ta_LunMgr::cb_temperature(double celsius, const Pr_Logical_ConstraintHandle* handle) {
    return AttachOperatingCondition("MGR::temperature: Line %I: %s", "TEMPERATURE", Pr_TemperatureText(celsius),
                                    handle);
}

bool Ta_LunMgr::cb_model(const Pr_Logical_ConstraintDefn&, const Pr_Logical_ConstraintHandle* handle) {
    Msg(__LINE__).issueError("Line %i in '%s':  MODEL constraints are not allowed in UCF or NCF files.\n",
                             LineOf(handle), constraint_filename);
    return false;
}

bool Ta_LunMgr::cb_begin_model(const char*, const Pr_Logical_ConstraintHandle* handle) {
    Msg(__LINE__).issueError("Line %i '%s':  BEGIN MODEL constraints are not allowed in UCF or NCF files.\n",
                             LineOf(handle), constraint_filename);
    return false;
}

bool Ta_LunMgr::cb_end_model(const Pr_Logical_ConstraintHandle* handle) {
    Msg(__LINE__).issueError(
        "Line %i '%s':  END constraints used to end the MODEL scope are not supported UCF or NCF files.\n",
        LineOf(handle), constraint_filename);
    return false;
}

bool Ta_LunMgr::cb_error(int line, int column, const char* value) {
    Msg(__LINE__).issueError(
        "Line %i in '%s': A parsing error occured while reading the constraint file.  The value '%s' at  "
        "column %d is invalid.\n",
        line, constraint_filename, value, column);
    return false;
}
