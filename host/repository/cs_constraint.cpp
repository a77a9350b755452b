#include "host/repository/cs_constraint.h"

#include <cstring>

#include "host/port/msgman.h"
#include "host/repository/cs_rows.h"

#define LUN_CS_TYPE(Name)                                  \
    const Cs_ConstraintType& Cs_Constraint_##Name::Type() { \
        static const Cs_ConstraintType type(#Name);          \
        return type;                                         \
    }
LUN_CS_TYPE(Locate)
LUN_CS_TYPE(IOStandard)
LUN_CS_TYPE(Drive)
LUN_CS_TYPE(Slew)
LUN_CS_TYPE(MaxDelay)
LUN_CS_TYPE(TimingName)
LUN_CS_TYPE(Period)
LUN_CS_TYPE(Offset)
LUN_CS_TYPE(TimeSpec)
LUN_CS_TYPE(TimeGrp)
LUN_CS_TYPE(Prohibit)
LUN_CS_TYPE(AreaGroup)
LUN_CS_TYPE(Set)
LUN_CS_TYPE(Global)
LUN_CS_TYPE(Comment)
LUN_CS_TYPE(Stepping)
LUN_CS_TYPE(Unsupported)
#undef LUN_CS_TYPE

namespace {

// Every typed class, for the factory and the repository file (whose tables store type names and
// whose snapshot stores their numbers here: append new classes at the end).
template <class T>
std::unique_ptr<Cs_Constraint> Make() {
    return std::make_unique<T>();
}
struct TypeEntry {
    const Cs_ConstraintType& (*type)();
    std::unique_ptr<Cs_Constraint> (*make)();
};
const TypeEntry kTypes[] = {
    {&Cs_Constraint_Locate::Type, &Make<Cs_Constraint_Locate>},
    {&Cs_Constraint_IOStandard::Type, &Make<Cs_Constraint_IOStandard>},
    {&Cs_Constraint_Drive::Type, &Make<Cs_Constraint_Drive>},
    {&Cs_Constraint_Slew::Type, &Make<Cs_Constraint_Slew>},
    {&Cs_Constraint_MaxDelay::Type, &Make<Cs_Constraint_MaxDelay>},
    {&Cs_Constraint_TimingName::Type, &Make<Cs_Constraint_TimingName>},
    {&Cs_Constraint_Period::Type, &Make<Cs_Constraint_Period>},
    {&Cs_Constraint_Offset::Type, &Make<Cs_Constraint_Offset>},
    {&Cs_Constraint_TimeSpec::Type, &Make<Cs_Constraint_TimeSpec>},
    {&Cs_Constraint_TimeGrp::Type, &Make<Cs_Constraint_TimeGrp>},
    {&Cs_Constraint_Prohibit::Type, &Make<Cs_Constraint_Prohibit>},
    {&Cs_Constraint_AreaGroup::Type, &Make<Cs_Constraint_AreaGroup>},
    {&Cs_Constraint_Set::Type, &Make<Cs_Constraint_Set>},
    {&Cs_Constraint_Global::Type, &Make<Cs_Constraint_Global>},
    {&Cs_Constraint_Comment::Type, &Make<Cs_Constraint_Comment>},
    {&Cs_Constraint_Stepping::Type, &Make<Cs_Constraint_Stepping>},
    {&Cs_Constraint_Unsupported::Type, &Make<Cs_Constraint_Unsupported>},
};

}  // namespace

std::unique_ptr<Cs_Constraint> Cs_MakeConstraint(const Cs_ConstraintType& type) {
    for (const TypeEntry& e : kTypes)
        if (e.type() == type) return e.make();
    return nullptr;
}

int Cs_Rows::TypeNumber(const Cs_ConstraintType& type) {
    for (size_t i = 0; i < std::size(kTypes); ++i)
        if (kTypes[i].type() == type) return static_cast<int>(i);
    return -1;
}

const Cs_ConstraintType* Cs_Rows::TypeAt(int64_t number) {
    return number >= 0 && static_cast<size_t>(number) < std::size(kTypes) ? &kTypes[number].type() : nullptr;
}

const Cs_ConstraintType* Cs_FindConstraintType(const char* name) {
    for (const TypeEntry& e : kTypes)
        if (name && std::strcmp(e.type().GetName(), name) == 0) return &e.type();
    return nullptr;
}

const char* Cs_ScopeWord(Cs_Scope scope) {
    switch (scope) {
        case Cs_Scope::Instance: return "INST";
        case Cs_Scope::Net: return "NET";
        case Cs_Scope::Pin: return "PIN";
        case Cs_Scope::Design: return "CONFIG";
        case Cs_Scope::TimeSpec: return "TIMESPEC";
        case Cs_Scope::TimeGroup: return "TIMEGRP";
        case Cs_Scope::AreaGroup: return "AREA_GROUP";
        case Cs_Scope::Set: return "SET";
        case Cs_Scope::Comment: return "#";
    }
    return "";
}

const char* Cs_BlockWord(Cs_Block block) {
    switch (block) {
        case Cs_Block::TimeSpec: return "TIMESPEC";
        case Cs_Block::TimeGroup: return "TIMEGRP";
        case Cs_Block::Config: return "CONFIG";
        case Cs_Block::None: break;
    }
    return "";
}

const Cs_Constraint::Extra Cs_Constraint::kNone{};

Cs_Constraint::~Cs_Constraint() = default;

std::string Cs_Constraint::GetMsgName() const {
    std::string text;
    switch (scope_) {
        case Cs_Scope::Instance:
        case Cs_Scope::Net:
        case Cs_Scope::Pin:
            text = std::string(Cs_ScopeWord(scope_)) + " \"" + target_ + "\" " + key_;
            if (!flag_) text += std::string(" = ") + value_;
            break;
        default:
            text = *statement_ ? statement_ : std::string(key_) + " = " + value_;
    }
    constexpr size_t kMax = 100;
    if (text.size() > kMax) text = text.substr(0, kMax - 3) + "...";
    const Cs_SourceFile* where = source_.GetSourceFile();
    if (where) text += Port_Format(" (%s line %d)", where->GetFile(), where->GetLine());
    return text;
}

std::string_view Cs_DefinedGroup(const Cs_Constraint& c) {
    if (c.GetType() == Cs_Constraint_TimingName::Type()) {
        std::string_view value = c.GetValueText();
        size_t colon = value.rfind(" : ");
        return colon == std::string_view::npos ? value : value.substr(colon + 3);
    }
    if (c.GetType() == Cs_Constraint_TimeGrp::Type() && std::strcmp(c.GetAttribute(), "AREA_GROUP") != 0)
        return c.GetTarget();
    return {};
}

bool Cs_Constraint::IsAssociationExempt() const {
    switch (scope_) {
        case Cs_Scope::Instance:
        case Cs_Scope::Net:
        case Cs_Scope::Pin: return false;
        default: return true;
    }
}
