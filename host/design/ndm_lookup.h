// Name lookups of the design database, as constraint statements name objects: hierarchical
// paths, wildcard patterns, the case-insensitive fallback and the other bus delimiters. The
// annotators and the constraint repository both resolve names through these, so that the two
// can never disagree; the annotators add their messages through Ndm_LookupReport.
#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <unordered_set>
#include <vector>

#include "host/design/ndm.h"
#include "host/port/string_base.h"

// Told of every result taken by a case-insensitive search (exact=false), with the texts the
// messages quote. The default does nothing.
class Ndm_LookupReport {
public:
    virtual ~Ndm_LookupReport() = default;
    // A block (INST) found for searched; full is its full name.
    virtual void Block(std::string_view searched, const std::string& full) {}
    // A signal or network (NET) found for searched; full is its full name.
    virtual void Signal(std::string_view searched, const std::string& full) {}
    // A pin found for path: its block's full name and its name.
    virtual void Pin(const char* path, const std::string& owner, const char* pin) {}
    // A pin found by the patterns: its block's full name and its name.
    virtual void WildPin(const char* inst_pattern, const char* pin_pattern, const std::string& owner,
                         const char* pin) {}
};

namespace Ndm_Lookup {

// A child block of block named name.
Ndm_Block* FindBlock(Ndm_Block* block, const char* name, bool exact, Ndm_LookupReport& report);
// A signal of block named name.
Ndm_Signal* FindSignal(Ndm_Block* block, const char* name, bool exact, Ndm_LookupReport& report);
// The block named by path, which starts with block's own name ("top/u1/u2").
Ndm_Block* FindBlockPath(Ndm_Block* block, std::string_view path, bool exact, Ndm_LookupReport& report);
// The signal named by path below block ("u1/u2/sig", the block's own name first).
Ndm_Signal* FindSignalPath(Ndm_Block* block, const char* path, bool exact, Ndm_LookupReport& report);
// The pin named by path: a pin of block itself, or "inst/path.pin" below it.
Ndm_Pin* FindPinPath(Ndm_Block* block, const char* path, bool exact, Ndm_LookupReport& report);

// Wildcard searches ("*", "?"), appending every match in pre-order, children in stored order.
// Blocks whose full name matches; below a match only when below is set.
void FindBlocks(Ndm_Block* block, std::vector<Ndm_Block*>& out, const char* pattern, bool exact, bool below,
                Ndm_LookupReport& report);
// Pins matching pin_pattern on blocks whose full name matches inst_pattern.
void FindPins(Ndm_Block* block, std::vector<Ndm_Pin*>& out, const char* inst_pattern, const char* pin_pattern,
              bool exact, Ndm_LookupReport& report);
// The top signals of the networks whose name matches.
void FindNetSignals(Ndm_View* view, std::vector<Ndm_Signal*>& out, const char* pattern, bool exact,
                    Ndm_LookupReport& report);
// Signals below block whose full name matches.
void FindSignals(Ndm_Block* block, std::vector<Ndm_Signal*>& out, const char* pattern, bool exact,
                 Ndm_LookupReport& report);
// Blocks whose string property SIMPRIMTYPE matches Q_RAMB4*.
void FindRamBlocks(Ndm_Block* block, std::vector<Ndm_Block*>& out);

// Rewrites the last bus subscript of name ("d(3)") to the next delimiter style, cycling
// ( [ < {; false when there is none or the new form was tried (tried gets each old form).
bool NextBusDelimiters(char* name, std::vector<Port::StringBase<char>>& tried);

}  // namespace Ndm_Lookup

// The whole lookup of the name of an INST, NET or PIN statement, with every retry in order:
// exact, ignoring case (unless case-sensitive), ".PAD" (INST in a UCF), then each other bus
// delimiter. Keeps what it learns about a view between statements.
class Ndm_ObjectFinder {
public:
    Ndm_ObjectFinder(Ndm_View* view, bool case_sensitive, bool ucf)
        : view_(view), case_sensitive_(case_sensitive), ucf_(ucf) {}
    void SetCaseSensitive(bool on) { case_sensitive_ = on; }

    // name is the statement's object name; working ends as the last form tried, as the
    // messages quote it.
    std::vector<Ndm_Block*> Instances(const char* name, std::string& working, Ndm_LookupReport& report);
    std::vector<Ndm_Signal*> Nets(const char* name, std::string& working, Ndm_LookupReport& report);
    std::vector<Ndm_Pin*> Pins(const char* name, std::string& working, Ndm_LookupReport& report);

    // The children of the top block that a PIN path can be found below, in stored order.
    std::vector<Ndm_Block*> PinSearchChildren(const char* path, bool ignore_case);

private:
    // Distinct pin names (exact and case-folded) of the children of the top block, made on the
    // first PIN statement that needs them; empty sets with unbounded mean "too many to keep".
    struct PinNames {
        const Ndm_Block* top = nullptr;
        std::unordered_set<std::string> exact, folded;
        bool unbounded = false;
    };

    Ndm_View* view_;
    bool case_sensitive_;
    bool ucf_;
    std::shared_ptr<PinNames> pin_names_;
};
