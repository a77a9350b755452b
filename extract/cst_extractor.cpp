#include "extract/cst_extractor.h"

#include <cstring>
#include <utility>

#include "host/parser/pr_block_texts.h"
#include "host/port/msgman.h"
#include "host/port/string_base.h"

namespace {

using PString = Port::StringBase<char>;

Port_MsgManData Msg(int line) {
    return Port_MsgManData::createObject("Quillmap", "CstExtractor", line, "1.0");
}

bool Equals(const char* a, const char* b) { return a && b && std::strcmp(a, b) == 0; }

bool InList(const char* name, const char* const* list, size_t count) {
    for (size_t i = 0; i < count; ++i)
        if (Equals(name, list[i])) return true;
    return false;
}

const char* const kBookkeeping[] = {"TYPE",     "UCF",          "NCF",     "TERMINAL",
                                    "FROM_UCF", "USER_VISIBLE", "FROM_NCF"};
const char* const kAreaGroupAttrs[] = {"RANGE", "COMPRESSION", "PLACE",
                                       "GROUP", "MODE",        "IMPLEMENT"};

// String properties renamed into their constraint-file names.
const std::pair<const char*, const char*> kRenames[] = {
    {"LOG_PICSPEC", "PICSPEC"}, {"LOG_PICSPEED", "PICSPEED"}, {"LOG_VENDOR", "VENDOR"},
    {"INITSTATE", "INIT"},      {"VL_LEVEL", "LEVEL"},
};

const char* RenameOf(const char* name) {
    for (const auto& [from, to] : kRenames)
        if (Equals(name, from)) return to;
    return nullptr;
}

// SLEW codes of the netlist and their words; null for an unknown code.
const char* SlewWord(int32_t code) {
    switch (code) {
        case 80: return "FAST";
        case 20: return "SLOW";
        case 10: return "QUIETIO";
        default: return nullptr;
    }
}

// Visits every block below and including root, children (in stored order) before their
// parent, with an explicit stack so that deep hierarchies cannot exhaust the call stack.
// The hierarchy must not change during the walk.
template <class Visit>
void ForEachBlockPostOrder(Ndm_Block* root, Visit&& visit) {
    if (!root) return;
    std::vector<std::pair<Ndm_Block*, size_t>> stack;
    stack.emplace_back(root, 0);
    while (!stack.empty()) {
        auto& [block, next] = stack.back();
        auto children = block->GetBlockItr();
        if (next < children.size()) {
            Ndm_Block* child = children[next++];
            stack.emplace_back(child, 0);  // may invalidate block/next; not used below
            continue;
        }
        Ndm_Block* done = block;
        stack.pop_back();
        visit(done);
    }
}

}  // namespace

bool CstExtractor::IsBookkeepingProperty(const char* name) {
    return InList(name, kBookkeeping, std::size(kBookkeeping));
}

bool CstExtractor::IsAreaGroupAttribute(const char* name) {
    return InList(name, kAreaGroupAttrs, std::size(kAreaGroupAttrs));
}

// ---------------------------------------------------------------------------------------
// Extraction

bool CstExtractor::Extract(Ndm_View* view, Port::Stream& out) {
    std::vector<Ndm_Block*> found;
    if (view && view->GetBlock()) ExtractBlocks(view->GetBlock(), out, found);
    // Only now that the whole walk succeeded is the design changed. Children come before
    // their parents in the list, so no block is deleted twice.
    for (Ndm_Block* block : found) {
        if (Ndm_Block* parent = block->GetParent()) parent->DeleteBlock(block);
    }
    return constraints_written;
}

void CstExtractor::ExtractBlocks(Ndm_Block* block, Port::Stream& out,
                                 std::vector<Ndm_Block*>& found) {
    ForEachBlockPostOrder(block, [&](Ndm_Block* b) {
        Ndm_Property* type = b->GetPropertyByName("TYPE");
        if (!type) return;
        const char* kind = type->GetValueString();
        if (Equals(kind, "CONFIG")) {
            WriteGlobalConstraints(b, out);
        } else if (Equals(kind, "TIMEGRP")) {
            WriteTimingGroups(b, out);
        } else if (Equals(kind, "TIMESPEC")) {
            WriteTimingConstraints(b, out);
        } else {
            return;
        }
        found.push_back(b);
    });
}

void CstExtractor::WriteGlobalConstraints(Ndm_Block* block, Port::Stream& out) {
    out << "// Global Constraints\n";
    constraints_written = true;
    for (Ndm_Property* prop : block->GetPropertyItr()) {
        const char* name = prop->GetName();
        if (IsBookkeepingProperty(name)) continue;
        switch (prop->GetType()) {
            case NDM_PROP_STRING:
                if (Equals(name, "RLOC_RANGE"))
                    out << FormatSetLine(name, prop->GetValueString());
                else
                    out << FormatConfigLine(name, prop->GetValueString());
                break;
            case NDM_PROP_INT32: {
                PString value;
                value.doFormat("%I", static_cast<int>(prop->GetInt32()));
                out << FormatConfigLine(name, value.c_str());
                break;
            }
            case NDM_PROP_STRING_LIST:
                for (const std::string& text : prop->GetStrings()) {
                    if (Equals(name, "RLOC_ORIGIN"))
                        out << FormatSetLine(name, text.c_str());
                    else if (IsAreaGroupAttribute(name))
                        out << FormatAreaGroupLine(name, text.c_str());
                    else
                        out << FormatConfigLine(name, text.c_str());
                }
                break;
            default:
                Msg(__LINE__).issueFatal(
                    2, "Unexpected property type found on CONFIG block for property %s.\n", name);
        }
    }
    out << "\n";
}

void CstExtractor::WriteTimingGroups(Ndm_Block* block, Port::Stream& out) {
    out << "// Timing Groups\n";
    constraints_written = true;
    WriteTimingLists(block, out, "Unexpected property type found on TIMEGRP block for property %s.\n",
                     false);
}

void CstExtractor::WriteTimingConstraints(Ndm_Block* block, Port::Stream& out) {
    out << "// Timing Constraints\n";
    constraints_written = true;
    WriteTimingLists(block, out, "Unexpected property type found on TIMESPEC block for property %s.\n",
                     true);
}

void CstExtractor::WriteTimingLists(Ndm_Block* block, Port::Stream& out,
                                    const char* fatal_format, bool timespec) {
    for (Ndm_Property* prop : block->GetPropertyItr()) {
        const char* name = prop->GetName();
        if (IsBookkeepingProperty(name)) continue;
        if (prop->GetType() != NDM_PROP_LIST) Msg(__LINE__).issueFatal(2, fatal_format, name);
        for (Ndm_Property* entry : prop->GetListItr()) {
            if (entry->GetType() != NDM_PROP_STRING) Msg(__LINE__).issueFatal(2, fatal_format, name);
            const std::string line = timespec ? FormatTimespecLine(entry->GetName(), entry->GetValueString())
                                              : FormatTimegrpLine(entry->GetName(), entry->GetValueString());
            // The stored texts keep names unquoted: a name holding a blank, ';', '#' or '"'
            // was warned of when it was annotated; say which statement it spoils.
            const std::string_view value = entry->GetValueString() ? entry->GetValueString() : "";
            const bool one_name = Equals(entry->GetName(), "ENABLE") || Equals(entry->GetName(), "DISABLE");
            if (!Pr_NameReadsBack(entry->GetName()) || value.find_first_of(";#") != std::string_view::npos ||
                (one_name && !Pr_NameReadsBack(value)))
                Msg(__LINE__).issueWarning("The statement '%s' will not read back as written: a name in it holds a "
                                           "blank, ';', '#' or '\"'.\n",
                                           line.substr(0, line.size() - 1).c_str());
            out << line;
        }
    }
    out << "\n";
}

std::string CstExtractor::FormatConfigLine(const char* name, const char* text) {
    std::string line;
    if (!Equals(name, "VOLTAGE") && !Equals(name, "SYSTEM_JITTER")) line = "CONFIG ";
    return line + name + " = " + text + " ;\n";
}

std::string CstExtractor::FormatTimegrpLine(const char* name, const char* text) {
    return std::string("TIMEGRP ") + name + " = " + text + " ;\n";
}

std::string CstExtractor::FormatTimespecLine(const char* name, const char* text) {
    if (Equals(name, "OFFSET") || Equals(name, "ENABLE") || Equals(name, "DISABLE"))
        return std::string(name) + " = " + text + " ;\n";
    if (IsGroupStatementEntry(name, text)) return std::string(text) + " ;\n";
    return std::string("TIMESPEC ") + name + " = " + text + " ;\n";
}

bool CstExtractor::IsGroupStatementEntry(const char* name, const char* text) {
    if (!name || std::strncmp(name, "TS", 2) != 0) return false;
    PString value(text);
    return value.GetIndexOfString("OFFSET") >= 0 || value.GetIndexOfString("AREA_GROUP") >= 0;
}

void CstExtractor::SplitAssignment(const char* name, const char* text, std::string& first,
                                   std::string& second) {
    // Every "=" divides, empty pieces included: "=s = v" and "ag = v=" are three pieces, not two.
    std::vector<PString> pieces = PString::Split(PString(text), "=", false, nullptr, nullptr);
    if (pieces.size() != 2) Msg(__LINE__).issueFatal(2, "Unexpected Value for %s\n", name);
    first = pieces[0].Trim(" \t").str();
    second = pieces[1].Trim(" \t").str();
}

std::string CstExtractor::FormatAreaGroupLine(const char* name, const char* text) {
    std::string first, second;
    SplitAssignment(name, text, first, second);
    return "AREA_GROUP " + first + " " + name + " = " + second + " ;\n";
}

std::string CstExtractor::FormatSetLine(const char* name, const char* text) {
    std::string first, second;
    SplitAssignment(name, text, first, second);
    return "SET " + first + " " + name + " = " + second + " ;\n";
}

// ---------------------------------------------------------------------------------------
// Normalization

bool CstExtractor::NormalizeProperties(Ndm_View* view) {
    if (!view) return true;
    CheckNormalization(view);
    NormalizeBlockProperties(view->GetBlock());
    NormalizeNetworkProperties(view);
    return true;
}

void CstExtractor::NormalizeProperty(Ndm_PropertyHolder* holder, Ndm_Property* property) {
    if (!holder || !property) return;
    for (Ndm_Property* p : holder->GetPropertyItr()) {
        if (p == property) {
            NormalizeOne(holder, property);
            return;
        }
    }
}

void CstExtractor::NormalizeBlockProperties(Ndm_Block* block) {
    ForEachBlockPostOrder(block, [this](Ndm_Block* b) { NormalizeHolder(b); });
}

void CstExtractor::NormalizeNetworkProperties(Ndm_View* view) {
    for (Ndm_Network* net : view->GetNetworkItr()) NormalizeHolder(net);
}

void CstExtractor::NormalizeHolder(Ndm_PropertyHolder* holder) {
    // A treated property that is deleted lets the following ones move up into its place;
    // new properties are appended (or take the place of a same-named one) and are met later.
    size_t i = 0;
    while (true) {
        auto props = holder->GetPropertyItr();
        if (i >= props.size()) break;
        if (!NormalizeOne(holder, props[i])) ++i;
    }
}

bool CstExtractor::NormalizeOne(Ndm_PropertyHolder* holder, Ndm_Property* property) {
    switch (property->GetType()) {
        case NDM_PROP_LIST:
        case NDM_PROP_STRING_LIST:
        case NDM_PROP_RESERVED:
            return false;
        case NDM_PROP_STRING: return NormalizeStringProperty(holder, property);
        case NDM_PROP_INT32: return NormalizeIntegerProperty(holder, property);
        case NDM_PROP_BOOL: return NormalizeBooleanProperty(holder, property);
        default:
            Msg(__LINE__).issueFatal(2, "Unexpected property type found on %s object for property %s.\n",
                                     holder->GetName(), property->GetName());
    }
}

bool CstExtractor::NormalizeStringProperty(Ndm_PropertyHolder* holder, Ndm_Property* property) {
    const char* to = RenameOf(property->GetName());
    if (!to) return false;
    std::string text = property->GetValueString();  // the old property dies first
    holder->DeleteProperty(property);
    holder->CreatePropertyString(to, text.c_str());
    return true;
}

bool CstExtractor::NormalizeIntegerProperty(Ndm_PropertyHolder* holder, Ndm_Property* property) {
    const char* name = property->GetName();
    int32_t value = property->GetInt32();
    if (Equals(name, "SLEW")) {
        const char* word = SlewWord(value);
        if (!word)
            Msg(__LINE__).issueFatal(2, "Unexpected SLEW property value %I found on %s.\n",
                                     static_cast<int>(value), holder->GetName());
        holder->DeleteProperty(property);
        holder->CreatePropertyString("SLEW", word);
        return true;
    }
    if (Equals(name, "DELAYMODE") && value == 0) {
        holder->DeleteProperty(property);
        holder->CreatePropertyBool("NODELAY", true);
        return true;
    }
    return false;
}

bool CstExtractor::NormalizeBooleanProperty(Ndm_PropertyHolder* holder, Ndm_Property* property) {
    if (!Equals(property->GetName(), "FIXED")) return false;
    bool value = property->GetBool();
    holder->DeleteProperty(property);
    holder->CreatePropertyBool("P", value);
    return true;
}

void CstExtractor::CheckNormalization(Ndm_View* view) {
    ForEachBlockPostOrder(view->GetBlock(), [this](Ndm_Block* b) { CheckHolder(b); });
    for (Ndm_Network* net : view->GetNetworkItr()) CheckHolder(net);
}

void CstExtractor::CheckHolder(Ndm_PropertyHolder* holder) {
    // Mirrors NormalizeHolder without changing anything. A property whose name an earlier
    // treatment creates would have been replaced by that new property before being met, and
    // new properties never fail, so such properties are passed over.
    std::vector<const char*> created;
    auto was_created = [&created](const char* name) {
        for (const char* c : created)
            if (Equals(c, name)) return true;
        return false;
    };
    for (Ndm_Property* prop : holder->GetPropertyItr()) {
        const char* name = prop->GetName();
        if (was_created(name)) continue;
        switch (prop->GetType()) {
            case NDM_PROP_LIST:
            case NDM_PROP_STRING_LIST:
            case NDM_PROP_RESERVED:
                break;
            case NDM_PROP_STRING:
                if (const char* to = RenameOf(name)) created.push_back(to);
                break;
            case NDM_PROP_INT32:
                if (Equals(name, "SLEW")) {
                    if (!SlewWord(prop->GetInt32()))
                        Msg(__LINE__).issueFatal(2, "Unexpected SLEW property value %I found on %s.\n",
                                                 static_cast<int>(prop->GetInt32()),
                                                 holder->GetName());
                    created.push_back("SLEW");
                } else if (Equals(name, "DELAYMODE") && prop->GetInt32() == 0) {
                    created.push_back("NODELAY");
                }
                break;
            case NDM_PROP_BOOL:
                if (Equals(name, "FIXED")) created.push_back("P");
                break;
            default:
                Msg(__LINE__).issueFatal(2, "Unexpected property type found on %s object for property %s.\n",
                                         holder->GetName(), name);
        }
    }
}
