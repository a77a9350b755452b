#include "host/repository/cs_loader.h"

#include <cstring>

#include "host/parser/pr_block_texts.h"
#include "host/parser/pr_property_texts.h"
#include "host/port/msgman.h"
#include "host/repository/cs_mgr.h"

namespace {

bool Is(const char* a, const char* b) { return std::strcmp(a, b) == 0; }

// Runs of blanks, tabs and line ends as one blank; no blank at either end; no final ";".
std::string Folded(std::string_view text) {
    std::string out;
    bool blank = false;
    for (char c : text) {
        if (c == ' ' || c == '\t' || c == '\n' || c == '\r') {
            blank = !out.empty();
            continue;
        }
        if (blank) out += ' ';
        blank = false;
        out += c;
    }
    while (!out.empty() && (out.back() == ';' || out.back() == ' ')) out.pop_back();
    return out;
}

// The typed class of an attribute of an INST, NET or PIN statement.
const Cs_ConstraintType& ObjectType(const char* key) {
    if (Is(key, "LOC")) return Cs_Constraint_Locate::Type();
    if (Is(key, "IOSTANDARD")) return Cs_Constraint_IOStandard::Type();
    if (Is(key, "DRIVE")) return Cs_Constraint_Drive::Type();
    if (Is(key, "SLEW")) return Cs_Constraint_Slew::Type();
    if (Is(key, "MAXDELAY")) return Cs_Constraint_MaxDelay::Type();
    if (Is(key, "TNM") || Is(key, "TNM_NET") || Is(key, "TPSYNC") || Is(key, "TPTHRU"))
        return Cs_Constraint_TimingName::Type();
    if (Is(key, "PERIOD")) return Cs_Constraint_Period::Type();
    if (Is(key, "OFFSET")) return Cs_Constraint_Offset::Type();
    if (Is(key, "PROHIBIT")) return Cs_Constraint_Prohibit::Type();
    if (Is(key, "AREA_GROUP")) return Cs_Constraint_AreaGroup::Type();
    return Cs_Constraint_Unsupported::Type();
}

}  // namespace

// One factory for every class: the constraint objects differ only in their type.
std::unique_ptr<Cs_Constraint> Cs_MakeConstraint(const Cs_ConstraintType& type);

Cs_Loader::Cs_Loader(Cs_ConstraintMgr& mgr, const char* file, bool ucf)
    : Pr_Logical_Parser(file), mgr_(mgr), file_(file ? mgr.Text(file) : nullptr), ucf_(ucf) {}

void Cs_Loader::Read(std::shared_ptr<const Pr_FileText> text) {
    set_text(std::move(text));
    parse();
}

Cs_Constraint& Cs_Loader::Add(const Cs_ConstraintType& type, Cs_Scope scope, const char* target, const char* key,
                              std::string_view value, const Handle* handle, bool flag) {
    std::unique_ptr<Cs_Constraint> c = Cs_MakeConstraint(type);
    c->scope_ = scope;
    c->flag_ = flag;
    c->target_ = mgr_.Text(target ? target : "");
    c->key_ = mgr_.Text(key ? key : "");
    c->value_ = mgr_.Text(value);
    c->statement_ = StatementText(handle);
    c->source_ = Cs_ConstraintSourceInfo(Cs_SourceFile(file_, handle ? handle->getline() : 0));
    out_.push_back(std::move(c));
    return *out_.back();
}

template <class T>
Cs_Constraint& Cs_Loader::Add(Cs_Scope scope, const char* target, const char* key, std::string_view value,
                              const Handle* handle, bool flag) {
    return Add(T::Type(), scope, target, key, value, handle, flag);
}

void Cs_Loader::Store(Cs_Constraint& c, Cs_Block block, std::string_view entry, std::string_view stored) {
    c.block_ = block;
    if (entry.empty() && stored.empty()) return;
    c.More().entry = mgr_.Text(entry);
    c.More().stored = mgr_.Text(stored);
}

template <class T>
void Cs_Loader::Setting(const char* key, std::string_view value, const char* entry, std::string_view stored,
                        const Handle* handle) {
    Store(Add<T>(Cs_Scope::Design, "", key, value, handle), Cs_Block::Config, entry, stored);
}

const char* Cs_Loader::StatementText(const Handle* handle) {
    // The constraints of one statement come one after the other: fold its text once.
    const char* raw = handle ? handle->return_ascii() : "";
    if (raw != last_raw_) {
        last_raw_ = raw;
        last_statement_ = mgr_.Text(Folded(raw));
    }
    return last_statement_;
}

std::string Cs_Loader::AfterEquals(const Handle* handle) const {
    std::string text = handle ? Folded(handle->return_ascii()) : std::string();
    size_t eq = text.find('=');
    if (eq == std::string::npos) return text;
    size_t from = text.find_first_not_of(' ', eq + 1);
    return from == std::string::npos ? std::string() : text.substr(from);
}

void Cs_Loader::Invalid(int line, const std::string& message, const Handle* statement) {
    const Handle* h = statement ? statement : failed_statement();
    Cs_Constraint& c =
        Add<Cs_Constraint_Unsupported>(Cs_Scope::Design, "", "INVALID_CONSTRAINT:", StatementText(h), h);
    if (!h) c.source_ = Cs_ConstraintSourceInfo(Cs_SourceFile(file_, line));
    outcome_.Add(std::make_shared<Cs_Status_Parse>(Cs_StatusID::PARSE_ERROR, 10, message,
                                                   file_ ? file_ : "", line));
}

bool Cs_Loader::cb_error(int line, int column, const char* value) {
    Invalid(line, Port_Format("The value '%s' at column %d cannot be read.", value, column), nullptr);
    return true;
}

bool Cs_Loader::cb_syntax_error(int line, int column, const char* text, const Handle* handle) {
    Invalid(line, Port_Format("Syntax error at column %d near '%s'.", column, text), handle);
    return true;
}

bool Cs_Loader::cb_comment(const char* text, const Handle* handle) {
    Add<Cs_Constraint_Comment>(Cs_Scope::Comment, "", "", text ? text : "", handle);
    return true;
}

bool Cs_Loader::cb_enable(bool enable, const char* name, const Handle* handle) {
    const char* key = enable ? "ENABLE" : "DISABLE";
    Cs_Constraint& c = Add<Cs_Constraint_TimeSpec>(Cs_Scope::TimeSpec, "", key, name, handle);
    c.More().paths = {mgr_.Text(name)};
    Store(c, Cs_Block::TimeSpec, key, name);
    return true;
}

// INST, NET and PIN: the properties the annotator would attach, one constraint each.
bool Cs_Loader::Objects(Cs_Scope scope, const Defn& defn, const Handle* handle) {
    const char* target = defn.get_object_name();
    for (auto it = defn.begin_constraint(); it != defn.end_constraint(); ++it) {
        const Pr_Logical_Constraint& c = **it;
        const char* key = c.get_name();
        if (c.get_type() == Pr_Logical_Constraint::INIT_) {
            // A range stays one attribute, as written; write-back expands it.
            auto* range = dynamic_cast<const Pr_Logical_InitRangeConstraint*>(&c);
            Add<Cs_Constraint_Unsupported>(scope, target, key, range ? range->get_constraint_value() : "", handle);
            continue;
        }
        if (c.get_type() == Pr_Logical_Constraint::STRING && Is(key, "PART")) {
            auto* s = dynamic_cast<const Pr_Logical_StringConstraint*>(&c);
            const char* part = s ? s->get_value() : "";
            Cs_Constraint& k = Add<Cs_Constraint_Unsupported>(scope, target, "PART", part, handle);
            // A UCF's part is the design's, whatever statement names it.
            if (ucf_) Store(k, Cs_Block::Config, "PART", part);
            continue;
        }
        Pr_PropertyPlan plan = Pr_PlanProperties(c, key, ucf_);
        switch (plan.rule) {
            case Pr_PropertyRule::ValuelessTig:
                Add<Cs_Constraint_Unsupported>(scope, target, "TIG", "", handle, true);
                continue;
            case Pr_PropertyRule::DivideBy:
            case Pr_PropertyRule::ReservedSites:
                // Kept as written; the annotators refuse them with their own message.
                Add<Cs_Constraint_Unsupported>(scope, target, key, "", handle);
                continue;
            case Pr_PropertyRule::Attach:
            case Pr_PropertyRule::IllegalTnm:
                break;
            default:
                continue;
        }
        for (const Pr_PropertyText& p : plan.texts) {
            const char* name = p.name.c_str();
            Add(ObjectType(name), scope, target, name, p.value, handle, p.flag);
        }
    }
    return true;
}

bool Cs_Loader::cb_comp(const Defn& defn, const Handle* handle) { return Objects(Cs_Scope::Instance, defn, handle); }
bool Cs_Loader::cb_net(const Defn& defn, const Handle* handle) { return Objects(Cs_Scope::Net, defn, handle); }
bool Cs_Loader::cb_pin(const Defn& defn, const Handle* handle) { return Objects(Cs_Scope::Pin, defn, handle); }

// AREA_GROUP and SET attributes: one constraint per value, as object statements give them; the
// first value of an attribute carries what the CONFIG block keeps of the whole attribute
// ("<name> = <value>"), unless the annotator refuses it or an attribute before it.
bool Cs_Loader::Attributes(Cs_Scope scope, const Defn& defn, const Handle* handle) {
    const char* target = defn.get_object_name();
    bool stopped = false;
    for (auto it = defn.begin_constraint(); it != defn.end_constraint(); ++it) {
        const char* name = (*it)->get_name();
        Pr_AttributeText stored;
        if (!stopped) stored = scope == Cs_Scope::Set ? Pr_SetText(target, **it) : Pr_AreaGroupText(target, **it);
        stopped = stopped || Pr_StopsStatement(stored.rule);
        const bool attach = stored.rule == Pr_AttributeRule::Attach;
        Pr_PropertyPlan plan = Pr_PlanProperties(**it, name, ucf_);
        if (plan.texts.empty() && attach)  // a value the object statements pass over
            plan.texts.push_back({name, stored.value.substr(std::strlen(target) + 3)});
        for (size_t i = 0; i < plan.texts.size(); ++i) {
            const Pr_PropertyText& p = plan.texts[i];
            Cs_Constraint& c = Add(scope == Cs_Scope::Set ? Cs_Constraint_Set::Type() : Cs_Constraint_AreaGroup::Type(),
                                   scope, target, p.name.c_str(), p.value, handle, p.flag);
            if (i == 0 && attach) Store(c, Cs_Block::Config, name, stored.value);
        }
    }
    return true;
}

bool Cs_Loader::cb_areagroup(const Defn& defn, const Handle* handle) {
    return Attributes(Cs_Scope::AreaGroup, defn, handle);
}
bool Cs_Loader::cb_set(const Defn& defn, const Handle* handle) { return Attributes(Cs_Scope::Set, defn, handle); }

bool Cs_Loader::cb_model(const Defn&, const Handle* handle) {
    Invalid(handle ? handle->getline() : 0, "MODEL statements are not allowed in constraint files.", handle);
    return true;
}
bool Cs_Loader::cb_begin_model(const char*, const Handle* handle) {
    Invalid(handle ? handle->getline() : 0, "BEGIN MODEL statements are not allowed in constraint files.", handle);
    return true;
}
bool Cs_Loader::cb_end_model(const Handle* handle) {
    Invalid(handle ? handle->getline() : 0, "END statements are not allowed in constraint files.", handle);
    return true;
}

bool Cs_Loader::cb_config(const char* name, const char* value, const Handle* handle) {
    auto is = [name](const char* word) {
        return Port::StringBase<char>(name).Compare(word, Port::StringBase<char>::IGNORE_CASE) == 0;
    };
    if (is("PART"))
        Setting<Cs_Constraint_Unsupported>("PART", value, "PART", value, handle);
    else if (is("STEPPING"))
        Setting<Cs_Constraint_Stepping>("STEPPING", value, "STEPPING", value, handle);
    else if (is("DCI_CASCADE"))
        Setting<Cs_Constraint_Global>(name, value, "DCI_CASCADE", Pr_DciCascadeText(value), handle);
    else
        Setting<Cs_Constraint_Global>(name, value, name, value, handle);
    return true;
}

bool Cs_Loader::cb_prohibit(const std::vector<const char*>& sites, const Handle* handle) {
    std::string text = Pr_SiteListText(sites);
    Setting<Cs_Constraint_Prohibit>("PROHIBIT", text, "PROHIBIT", text, handle);
    return true;
}

bool Cs_Loader::cb_vref(const std::vector<const char*>& sites, const Handle* handle) {
    std::string text = Pr_SiteListText(sites);
    Setting<Cs_Constraint_Global>("VREF", text, "VREF", text, handle);
    return true;
}

bool Cs_Loader::cb_temperature(double celsius, const Handle* handle) {
    std::string text = Pr_TemperatureText(celsius);
    Setting<Cs_Constraint_Global>("TEMPERATURE", text, "TEMPERATURE", text, handle);
    return true;
}

bool Cs_Loader::cb_voltage(double volts, const Handle* handle) {
    std::string text = Pr_VoltageText(volts);
    Setting<Cs_Constraint_Global>("VOLTAGE", text, "VOLTAGE", text, handle);
    return true;
}

// A timing entry: the statement's text after "=" is its value; the group names it refers to
// are its paths.
Cs_Constraint& Cs_Loader::TimingEntry(const char* target, const char* key, const Handle* handle,
                                      std::vector<const char*> groups) {
    Cs_Constraint& c = Add<Cs_Constraint_TimeSpec>(Cs_Scope::TimeSpec, target, key, AfterEquals(handle), handle);
    for (const char* g : groups)
        if (g && *g) c.More().paths.push_back(mgr_.Text(g));
    return c;
}

// The OFFSET forms, named as the annotator names their timing entries.
Cs_Constraint& Cs_Loader::Offset(const char* group, bool in, double time, const double* valid, bool before,
                                 const char* clock, const char* regs, const char* level, const Handle* handle) {
    Pr_BlockEntry entry = Pr_OffsetEntry(group, in, time, valid, before, clock, regs, level);
    Cs_Constraint& c = Add<Cs_Constraint_Offset>(Cs_Scope::TimeSpec, group ? group : "", entry.name.c_str(),
                                                 AfterEquals(handle), handle);
    Store(c, Cs_Block::TimeSpec, entry.name, entry.value);
    for (const char* g : {group, regs})
        if (g) c.More().paths.push_back(mgr_.Text(g));
    return c;
}

bool Cs_Loader::cb_offset(bool in, double time, const double* valid, bool before, const char* clock,
                          const char* level, const Handle* handle) {
    Offset(nullptr, in, time, valid, before, clock, nullptr, level, handle);
    return true;
}

bool Cs_Loader::cb_roffset(bool in, double time, const double* valid, bool before, const char* clock,
                           const char* regs, const char* level, const Handle* handle) {
    Offset(nullptr, in, time, valid, before, clock, regs, level, handle);
    return true;
}

bool Cs_Loader::cb_toffset(const char* group, bool in, double time, const double* valid, bool before,
                           const char* clock, const char* level, const Handle* handle) {
    Offset(group, in, time, valid, before, clock, nullptr, level, handle);
    return true;
}

bool Cs_Loader::cb_troffset(const char* group, bool in, double time, const double* valid, bool before,
                            const char* clock, const char* regs, const char* level, const Handle* handle) {
    Offset(group, in, time, valid, before, clock, regs, level, handle);
    return true;
}

bool Cs_Loader::cb_tspec_maxdelay(const char* name, bool has_from, bool has_to,
                                  const std::vector<const char*>& points, const char* reference, bool multiply,
                                  double value, bool is_time, int priority, bool datapathonly, const Handle* handle) {
    Cs_Constraint& c = TimingEntry(name, name, handle, points);
    if (!points.empty())  // the annotator refuses a delay of no path
        Store(c, Cs_Block::TimeSpec, name,
              Pr_PathDelayText(has_from, has_to, points, reference, multiply, value, is_time, priority, datapathonly));
    return true;
}

bool Cs_Loader::cb_tspec_period(const char* name, const char* group, const char* reference, bool multiply,
                                double value, bool is_time, bool phase_plus, double phase, bool low, double duration,
                                double percent, const double* jitter, int priority, const Handle* handle) {
    Store(TimingEntry(name, name, handle, {group}), Cs_Block::TimeSpec, name,
          Pr_PeriodText(group, reference, multiply, value, is_time, phase_plus, phase, low, duration, percent, jitter,
                        priority));
    return true;
}

bool Cs_Loader::cb_tspec_tig(const char* name, bool has_from, bool has_to, const std::vector<const char*>& points,
                             int priority, const Handle* handle) {
    Store(TimingEntry(name, name, handle, points), Cs_Block::TimeSpec, name,
          Pr_IgnoreText(has_from, has_to, points, priority));
    return true;
}

bool Cs_Loader::cb_tspec_drop_spec(const char* name, const Handle* handle) {
    Store(TimingEntry(name, name, handle, {}), Cs_Block::TimeSpec, name, "DROP_SPEC");
    return true;
}

bool Cs_Loader::cb_timegrp(const char* group, const std::vector<std::pair<const char*, PR_EDGE>>& members,
                           const std::vector<const char*>& excluded, const Handle* handle) {
    Cs_Constraint& c = Add<Cs_Constraint_TimeGrp>(Cs_Scope::TimeGroup, group, group, AfterEquals(handle), handle);
    for (const auto& m : members) c.More().paths.push_back(mgr_.Text(m.first));
    for (const char* x : excluded) c.More().paths.push_back(mgr_.Text(x));
    if (!members.empty())  // the annotator refuses a group of no members
        Store(c, Cs_Block::TimeGroup, group, Pr_TimeGroupText(members, excluded));
    return true;
}

bool Cs_Loader::cb_timegrp_areagroup(const char* group, const char* areagroup, const Handle* handle) {
    Cs_Constraint& c = Add<Cs_Constraint_TimeGrp>(Cs_Scope::TimeGroup, group, "AREA_GROUP", areagroup, handle);
    c.More().paths.push_back(mgr_.Text(group));
    Pr_BlockEntry entry = Pr_GroupAreaEntry(group, areagroup);
    Store(c, Cs_Block::TimeSpec, entry.name, entry.value);
    return true;
}
