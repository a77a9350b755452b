// Ta_LunMgr::create_property: one parsed constraint of an INST, NET or PIN statement as a
// typed property, with the value texts some keywords need and the keywords refused here.
#include <string>

#include "host/port/msgman.h"
#include "host/port/ut_str.h"
#include "manager/lunmgr.h"
#include "manager/statement_messages.h"

using lunmgr::LineOf;
using lunmgr::Msg;
using lunmgr::TextOf;

namespace {

bool Is(const char* keyword, const char* name) { return UT_STR::Compare(keyword, name) == 0; }

// printf-style text into a std::string (%f gives six decimals).
template <class... Args>
std::string Text(const char* format, Args... args) {
    return Port_Format(format, args...);
}
}  // namespace

unsigned char Ta_LunMgr::create_property(Ndm_PropertyHolder* object, Pr_Logical_Constraint* constraint,
                                         const char* name, unsigned char* error_reported,
                                         const Pr_Logical_ConstraintHandle* handle) {
    int line = handle ? handle->getline() : 0;
    switch (constraint->get_type()) {
        case Pr_Logical_Constraint::BASE:
            return AttachConstraint(constraint->get_name(), object, handle);

        case Pr_Logical_Constraint::STRING: {
            auto* c = dynamic_cast<Pr_Logical_StringConstraint*>(constraint);
            const char* keyword = constraint->get_name();
            const char* value = c ? c->get_value() : "";
            if (file_type == CP_UCF && Is(keyword, "PART")) return 1;
            if (Is(keyword, "MAXDELAY") || Is(keyword, "MAXSKEW"))
                return AttachConstraint(keyword, Text("%s pS", value).c_str(), object, handle);
            if (file_type == CP_UCF && Is(keyword, "DIVIDE1_BY")) {
                Msg(__LINE__).issueError(
                    "Line %i in '%s': DIVIDE_BY constraints are not supported in the ucf file. The ucf file "
                    "is processed after netlist expansion, which is when the DIVIDE_BY constraint is "
                    "operational. This constraint should be placed in the appropriate netlist or added to "
                    "a .ncf file.\n",
                    line, constraint_filename);
                if (error_reported) *error_reported = 1;
                return 0;
            }
            return AttachConstraint(keyword, value, object, handle);
        }

        case Pr_Logical_Constraint::STRING_LIST_TYPE: {
            auto* c = dynamic_cast<Pr_Logical_StringListConstraint*>(constraint);
            const char* keyword = constraint->get_name();
            int n = c ? c->num_values() : 0;
            const char* const* values = c ? c->begin_value() : nullptr;
            if (n <= 0) {
                if (!Is(keyword, "TIG")) return 0;
                // A valueless TIG is recorded directly: one more empty entry.
                Ndm_Property* tig = object->GetPropertyByName("TIG");
                if (!tig) tig = object->CreatePropertyStringList("TIG");
                tig->AddString("");
                return 1;
            }
            if (Is(keyword, "TNM") || Is(keyword, "TNM_NET")) {
                if (n == 2) return AttachConstraint(keyword, Text("%s : %s", values[0], values[1]).c_str(), object, handle);
                if (n == 1) return AttachConstraint(keyword, values[0], object, handle);
                Msg(__LINE__).issueInternal("Illegal TNM or TNM_NET value.\n");
                return AttachConstraint(keyword, name, object, handle);
            }
            if (Is(keyword, "RLOC_RANGE")) {
                if (n != 2) return 1;
                return AttachConstraint(keyword, Text("%s:%s", values[0], values[1]).c_str(), object, handle);
            }
            if (Is(keyword, "FEEDBACK")) {
                if (n != 3) return 1;
                return AttachConstraint(keyword, Text("%s %s %s", values[0], values[1], values[2]).c_str(),
                                        object, handle);
            }
            if (Is(keyword, "LOC") || Is(keyword, "PROHIBIT") || Is(keyword, "LOCK_PINS")) {
                std::string joined;
                for (int i = 0; i < n; ++i) {
                    if (i) joined += ',';
                    joined += values[i];
                }
                return AttachConstraint(keyword, joined.c_str(), object, handle);
            }
            if (Is(keyword, "RESERVED_SITES")) {
                Msg(__LINE__).issueError(
                    "Line %i in '%s': 'RESERVED_SITES' is no longer a vaild constraint name.  Please use the "
                    "LOC and PROHIBIT constraints to reserve or prohibit placement  in Modular Design.\n",
                    line, constraint_filename);
                if (error_reported) *error_reported = 1;
                return 0;
            }
            for (int i = 0; i < n; ++i)
                if (!AttachConstraint(keyword, values[i], object, handle)) return 0;
            return 1;
        }

        case Pr_Logical_Constraint::INIT_: {
            auto* c = dynamic_cast<Pr_Logical_InitRangeConstraint*>(constraint);
            if (!c) return 1;
            for (auto it = c->begin_name(); it != c->end_name(); ++it)
                if (!AttachConstraint(*it, c->get_constraint_value(), object, handle)) return 0;
            return 1;
        }

        case Pr_Logical_Constraint::OFFSET: {
            auto* c = dynamic_cast<Pr_Logical_OffsetConstraint*>(constraint);
            if (!c) return 0;
            std::string valid = c->get_valid_field() ? Text("VALID : %f %s : ", *c->get_valid_field(), "pS") : "";
            char* clock = AddQuotesToString(c->getname());
            std::string group = c->gettgname() ? Text(" : TIMEGRP %s", c->gettgname()) : "";
            std::string level = c->has_high_low() ? Text(" : %s", c->get_high_or_low()) : "";
            std::string value = Text("%s : %f %s : %s%s : %s%s%s", c->isin() ? "IN" : "OUT", c->gettime(), "pS",
                                     valid.c_str(), c->isbefore() ? "BEFORE" : "AFTER", clock, group.c_str(),
                                     level.c_str());
            delete[] clock;
            return AttachConstraint(name, value.c_str(), object, handle);
        }

        case Pr_Logical_Constraint::PERIOD: {
            auto* c = dynamic_cast<Pr_Logical_PeriodConstraint*>(constraint);
            if (!c) return 0;
            bool timed = c->gethightime() != 0.0;
            std::string jitter = c->get_input_jitter() ? Text(" INPUT_JITTER %f %s", *c->get_input_jitter(), "pS") : "";
            std::string value = Text("%f %s %s %f %s%s", c->getperiod(), "pS", c->gethigh() ? "LOW" : "HIGH",
                                     timed ? c->gethightime() : c->gethighpercent(), timed ? "pS" : "%",
                                     jitter.c_str());
            return AttachConstraint(name, value.c_str(), object, handle);
        }
    }
    Msg(__LINE__).issueFatal(2, "Unsupported Constraint detected\n");
}
