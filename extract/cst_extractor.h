// CstExtractor: turns the CONFIG, TIMEGRP and TIMESPEC constraint blocks of a design back
// into constraint-file text (and then removes them from the design), and rewrites a few
// netlist-form properties into their constraint-file form.
#pragma once

#include <string>
#include <vector>

#include "host/design/ndm.h"
#include "host/design/ndm_property.h"
#include "host/port/stream.h"

class CstExtractor {
public:
    CstExtractor() = default;

    // Writes one section per constraint block (children before their parent, siblings in
    // stored order), then deletes those blocks. Returns constraints_written.
    bool Extract(Ndm_View* view, Port::Stream& out);

    // Rewrites SLEW, DELAYMODE, FIXED and the LOG_* style names on every block and network
    // of the view. Always true; an unexpected property stops the run with a fatal message
    // before anything is changed.
    bool NormalizeProperties(Ndm_View* view);

    // The same treatment for one property of a block or network.
    void NormalizeProperty(Ndm_PropertyHolder* holder, Ndm_Property* property);

    static bool IsBookkeepingProperty(const char* name);
    static bool IsAreaGroupAttribute(const char* name);

    // Set once a section for a constraint block has been started; never reset.
    bool constraints_written = false;

private:
    void ExtractBlocks(Ndm_Block* block, Port::Stream& out, std::vector<Ndm_Block*>& found);
    void WriteGlobalConstraints(Ndm_Block* block, Port::Stream& out);
    void WriteTimingGroups(Ndm_Block* block, Port::Stream& out);
    void WriteTimingConstraints(Ndm_Block* block, Port::Stream& out);
    // Shared body of the two timing sections.
    void WriteTimingLists(Ndm_Block* block, Port::Stream& out, const char* fatal_format,
                          bool timespec);

    static std::string FormatConfigLine(const char* name, const char* text);
    static std::string FormatSetLine(const char* name, const char* text);
    static std::string FormatAreaGroupLine(const char* name, const char* text);
    static std::string FormatTimegrpLine(const char* name, const char* text);
    static std::string FormatTimespecLine(const char* name, const char* text);
    static bool IsGroupStatementEntry(const char* name, const char* text);
    // Splits "name = value" at '=' into two trimmed pieces; fatal for any other shape.
    static void SplitAssignment(const char* name, const char* text, std::string& first,
                                std::string& second);

    void NormalizeBlockProperties(Ndm_Block* block);
    void NormalizeNetworkProperties(Ndm_View* view);
    // Treats every property of one holder; properties created on the way are met again.
    void NormalizeHolder(Ndm_PropertyHolder* holder);
    // The per-property treatment; true when the property was deleted.
    bool NormalizeOne(Ndm_PropertyHolder* holder, Ndm_Property* property);
    bool NormalizeIntegerProperty(Ndm_PropertyHolder* holder, Ndm_Property* property);
    bool NormalizeStringProperty(Ndm_PropertyHolder* holder, Ndm_Property* property);
    bool NormalizeBooleanProperty(Ndm_PropertyHolder* holder, Ndm_Property* property);

    // Dry run of the whole normalization: issues the fatal message the real run would stop
    // with, so that a failing run leaves the design untouched.
    void CheckNormalization(Ndm_View* view);
    void CheckHolder(Ndm_PropertyHolder* holder);
};
