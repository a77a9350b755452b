// Ta_LunPart: a light annotator that takes only the target part and the global CONFIG
// settings of a constraint file onto the design's CONFIG block; instance, net and pin
// statements contribute only their PART constraints and are never looked up.
#pragma once

#include "frame/lunbase.h"

class Ta_LunPart : public Ta_LunBase {
public:
    Ta_LunPart(const char* filename, CP_FILE_TYPE type, const char* filter_file);
    Ta_LunPart(const Ta_LunPart& other) = default;
    Ta_LunPart& operator=(const Ta_LunPart& other) = default;
    ~Ta_LunPart() override;

    bool cb_error(int line, int column, const char* value) override;
    bool cb_net(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_comp(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_pin(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) override;
    bool cb_config(const char* name, const char* value, const Pr_Logical_ConstraintHandle* handle) override;

private:
    // Stores one PART constraint; 1 and nothing done for any other constraint.
    unsigned char create_property(Pr_Logical_Constraint* constraint, const char* name,
                                  const Pr_Logical_ConstraintHandle* handle);
    // The PART constraints of one INST, NET or PIN statement.
    bool TakeParts(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle,
                   const char* trace, const char* entry);
};
