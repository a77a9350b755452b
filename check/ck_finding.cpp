#include "check/ck_finding.h"

namespace {

struct KindEntry {
    Ck_Kind kind;
    const char* id;
    Ck_Severity severity;
};
// In Ck_Kind order.
constexpr KindEntry kKinds[kCk_KindCount] = {
    {Ck_Kind::ParseError, "parse-error", Ck_Severity::Error},
    {Ck_Kind::PinClash, "pin-clash", Ck_Severity::Error},
    {Ck_Kind::DanglingGroup, "dangling-group", Ck_Severity::Error},
    {Ck_Kind::UnmatchedName, "unmatched-name", Ck_Severity::Warning},
    {Ck_Kind::LocationOverride, "location-override", Ck_Severity::Warning},
    {Ck_Kind::UnplacedPort, "unplaced-port", Ck_Severity::Warning},
    {Ck_Kind::ClockWithoutPeriod, "clock-without-period", Ck_Severity::Warning},
    {Ck_Kind::NoIoStandard, "no-iostandard", Ck_Severity::Info},
    {Ck_Kind::UnusedGroup, "unused-group", Ck_Severity::Info},
};

}  // namespace

const char* Ck_KindId(Ck_Kind kind) { return kKinds[static_cast<int>(kind)].id; }

Ck_Severity Ck_SeverityOf(Ck_Kind kind) { return kKinds[static_cast<int>(kind)].severity; }

bool Ck_KindFromId(std::string_view id, Ck_Kind& kind) {
    for (const KindEntry& e : kKinds)
        if (id == e.id) {
            kind = e.kind;
            return true;
        }
    return false;
}

const char* Ck_SeverityWord(Ck_Severity severity) {
    switch (severity) {
        case Ck_Severity::Error: return "error";
        case Ck_Severity::Warning: return "warning";
        case Ck_Severity::Info: return "info";
    }
    return "";
}
