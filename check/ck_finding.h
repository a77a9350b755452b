// What the board check finds: the kinds of mistakes, each with a stable identifier and a fixed
// severity, and one finding with the statements and design objects it is about.
// docs/check.md describes every kind and its rule.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

class Cs_Constraint;

// In the order findings are listed: errors, then warnings, then information.
enum class Ck_Kind : uint8_t {
    ParseError,          // the repository cannot read a file or a statement
    PinClash,            // one site given to two different nets or ports
    DanglingGroup,       // a timing statement names a group nobody defines
    UnmatchedName,       // a statement names nothing in the design
    LocationOverride,    // one object given two values of LOC, IOSTANDARD, DRIVE, SLEW or pull
    UnplacedPort,        // top-level ports without LOC
    ClockWithoutPeriod,  // a clock input no PERIOD covers
    NoIoStandard,        // placed ports without IOSTANDARD
    UnusedGroup,         // a group nobody uses
};
constexpr int kCk_KindCount = 9;

enum class Ck_Severity : uint8_t { Error, Warning, Info };

// The stable identifier ("pin-clash", ...), used in JSON lines and by --disable.
const char* Ck_KindId(Ck_Kind kind);
// The kind of an identifier; false for an unknown one.
bool Ck_KindFromId(std::string_view id, Ck_Kind& kind);
Ck_Severity Ck_SeverityOf(Ck_Kind kind);
// "error", "warning", "info".
const char* Ck_SeverityWord(Ck_Severity severity);

// A statement a finding is about: where it is, the constraint (null for a file that cannot be
// read), and the design object it concerns there ("" when none).
struct Ck_Ref {
    const char* file = "";
    int line = 0;
    const Cs_Constraint* constraint = nullptr;
    std::string object;
    bool wins = false;  // the statement that takes effect (location overrides)
};

struct Ck_Finding {
    Ck_Kind kind;
    std::string message;               // one line, no line end
    std::vector<std::string> objects;  // design objects or groups concerned, full names
    std::vector<Ck_Ref> refs;          // statements involved, in file order
};

// Which kinds are looked for.
class Ck_KindSet {
public:
    Ck_KindSet() : bits_((1u << kCk_KindCount) - 1) {}
    bool Has(Ck_Kind kind) const { return bits_ & Bit(kind); }
    void Remove(Ck_Kind kind) { bits_ &= ~Bit(kind); }

private:
    static uint32_t Bit(Ck_Kind kind) { return 1u << static_cast<int>(kind); }
    uint32_t bits_;
};

// The counts the summary shows besides the findings.
struct Ck_Summary {
    size_t findings[kCk_KindCount] = {};
    size_t ports = 0;               // top-level port bits
    size_t ports_placed = 0;        // with a LOC
    size_t placed_with_iostandard = 0;
    size_t clocks = 0;              // top-level inputs reaching a clock pin
    size_t clocks_covered = 0;      // of those, covered by a PERIOD
    size_t statements = 0;          // statements read (comments left out)
    size_t files = 0;
};
