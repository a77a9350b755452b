#include "host/parser/pr_property_texts.h"

#include <cstring>

#include "host/port/msgman.h"

namespace {

bool Is(const char* keyword, const char* name) { return std::strcmp(keyword, name) == 0; }

Pr_PropertyPlan Texts(Pr_PropertyRule rule, std::vector<Pr_PropertyText> texts = {}) {
    return Pr_PropertyPlan{rule, std::move(texts)};
}

Pr_PropertyPlan One(const char* name, std::string value) {
    return Texts(Pr_PropertyRule::Attach, {Pr_PropertyText{name, std::move(value)}});
}

}  // namespace

Pr_PropertyPlan Pr_PlanProperties(const Pr_Logical_Constraint& constraint, const char* name, bool ucf) {
    const char* keyword = constraint.get_name();
    switch (constraint.get_type()) {
        case Pr_Logical_Constraint::BASE:
            return Texts(Pr_PropertyRule::Attach, {Pr_PropertyText{keyword, "", true}});

        case Pr_Logical_Constraint::STRING: {
            auto* c = dynamic_cast<const Pr_Logical_StringConstraint*>(&constraint);
            const char* value = c ? c->get_value() : "";
            if (ucf && Is(keyword, "PART")) return Texts(Pr_PropertyRule::PassOver);
            if (Is(keyword, "MAXDELAY") || Is(keyword, "MAXSKEW")) return One(keyword, Port_Format("%s pS", value));
            if (ucf && Is(keyword, "DIVIDE1_BY")) return Texts(Pr_PropertyRule::DivideBy);
            return One(keyword, value);
        }

        case Pr_Logical_Constraint::STRING_LIST_TYPE: {
            auto* c = dynamic_cast<const Pr_Logical_StringListConstraint*>(&constraint);
            int n = c ? c->num_values() : 0;
            const char* const* values = c ? c->begin_value() : nullptr;
            if (n <= 0) return Texts(Is(keyword, "TIG") ? Pr_PropertyRule::ValuelessTig : Pr_PropertyRule::Nothing);
            if (Is(keyword, "TNM") || Is(keyword, "TNM_NET")) {
                if (n == 2) return One(keyword, Port_Format("%s : %s", values[0], values[1]));
                if (n == 1) return One(keyword, values[0]);
                return Texts(Pr_PropertyRule::IllegalTnm, {Pr_PropertyText{keyword, name}});
            }
            if (Is(keyword, "RLOC_RANGE"))
                return n == 2 ? One(keyword, Port_Format("%s:%s", values[0], values[1])) : Texts(Pr_PropertyRule::PassOver);
            if (Is(keyword, "FEEDBACK"))
                return n == 3 ? One(keyword, Port_Format("%s %s %s", values[0], values[1], values[2]))
                              : Texts(Pr_PropertyRule::PassOver);
            if (Is(keyword, "LOC") || Is(keyword, "PROHIBIT") || Is(keyword, "LOCK_PINS")) {
                std::string joined;
                for (int i = 0; i < n; ++i) (joined += i ? "," : "") += values[i];
                return One(keyword, joined);
            }
            if (Is(keyword, "RESERVED_SITES")) return Texts(Pr_PropertyRule::ReservedSites);
            Pr_PropertyPlan plan;
            for (int i = 0; i < n; ++i) plan.texts.push_back({keyword, values[i]});
            return plan;
        }

        case Pr_Logical_Constraint::INIT_: {
            Pr_PropertyPlan plan;
            if (auto* c = dynamic_cast<const Pr_Logical_InitRangeConstraint*>(&constraint))
                for (auto it = c->begin_name(); it != c->end_name(); ++it)
                    plan.texts.push_back({*it, c->get_constraint_value()});
            return plan;
        }

        case Pr_Logical_Constraint::OFFSET: {
            auto* c = dynamic_cast<const Pr_Logical_OffsetConstraint*>(&constraint);
            if (!c) return Texts(Pr_PropertyRule::Nothing);
            std::string valid =
                c->get_valid_field() ? Port_Format("VALID : %f %s : ", *c->get_valid_field(), "pS") : "";
            std::string clock = Port_Format("\"%s\"", c->getname());
            std::string group = c->gettgname() ? Port_Format(" : TIMEGRP %s", c->gettgname()) : "";
            std::string level = c->has_high_low() ? Port_Format(" : %s", c->get_high_or_low()) : "";
            return One(name, Port_Format("%s : %f %s : %s%s : %s%s%s", c->isin() ? "IN" : "OUT", c->gettime(), "pS",
                                         valid.c_str(), c->isbefore() ? "BEFORE" : "AFTER", clock.c_str(),
                                         group.c_str(), level.c_str()));
        }

        case Pr_Logical_Constraint::PERIOD: {
            auto* c = dynamic_cast<const Pr_Logical_PeriodConstraint*>(&constraint);
            if (!c) return Texts(Pr_PropertyRule::Nothing);
            bool timed = c->gethightime() != 0.0;
            std::string jitter =
                c->get_input_jitter() ? Port_Format(" INPUT_JITTER %f %s", *c->get_input_jitter(), "pS") : "";
            return One(name, Port_Format("%f %s %s %f %s%s", c->getperiod(), "pS", c->gethigh() ? "LOW" : "HIGH",
                                         timed ? c->gethightime() : c->gethighpercent(), timed ? "pS" : "%",
                                         jitter.c_str()));
        }
    }
    return Texts(Pr_PropertyRule::Unsupported);
}
