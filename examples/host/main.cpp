// The shortest host of lun: loads a netlist, annotates it with a UCF and prints what the
// annotator attached to each object.
//   lun_host NETLIST.json FILE.ucf
#include <cstdio>
#include <string>

#include "host/design/design_io.h"
#include "host/port/msgman.h"
#include "host/port/version.h"
#include "manager/lunmgr.h"

namespace {

std::string ValueText(const Ndm_Property& p) {
    switch (p.GetType()) {
        case NDM_PROP_BOOL: return p.GetBool() ? "true" : "false";
        case NDM_PROP_INT32: return std::to_string(p.GetInt32());
        case NDM_PROP_FLOAT64: return std::to_string(p.GetFloat64());
        case NDM_PROP_STRING: return p.GetValueString();
        case NDM_PROP_STRING_LIST: {
            std::string text;
            for (const std::string& s : p.GetStrings()) text += (text.empty() ? "" : ", ") + s;
            return "[" + text + "]";
        }
        default: return "?";
    }
}

// A property, and the entries of a list (TIMESPEC and TIMEGRP entries) below it.
void PrintProperty(const Ndm_Property& p, int indent) {
    if (p.GetType() != NDM_PROP_LIST) {
        std::printf("%*s%s = %s\n", indent, "", p.GetName(), ValueText(p).c_str());
        return;
    }
    std::printf("%*s%s:\n", indent, "", p.GetName());
    for (const Ndm_Property* entry : p.GetListItr()) PrintProperty(*entry, indent + 2);
}

void Print(const char* kind, const Ndm_PropertyHolder& object) {
    if (object.GetNumProperties() == 0) return;
    std::printf("%s %s\n", kind, object.GetFullName().c_str());
    for (const Ndm_Property* p : object.GetPropertyItr()) PrintProperty(*p, 2);
}

void PrintBlocks(const Ndm_Block& block) {
    Print("block", block);
    for (const Ndm_Pin* pin : block.GetPinItr()) Print("pin", *pin);
    for (const Ndm_Block* child : block.GetBlockItr()) PrintBlocks(*child);
}

}  // namespace

int main(int argc, char** argv) {
    if (argc != 3) {
        std::fprintf(stderr, "usage: %s NETLIST.json FILE.ucf\n", argv[0]);
        return 2;
    }
    std::printf("lun %s\n", lun_version());
    // Loading and annotating report through the message manager (stderr by default).
    std::unique_ptr<Ndm_Design> design = Ndm_LoadDesign(argv[1], nullptr);
    if (!design) return 1;
    Ndm_View* view = design->GetWorkView();
    if (!view) return 1;

    // Null filter file: the shipped property definitions (ucf.pfd from the data folder).
    Ta_LunMgr annotator(argv[2], CP_UCF, nullptr);
    annotator.annotate(view);

    PrintBlocks(*view->GetBlock());
    for (const Ndm_Network* network : view->GetNetworkItr()) Print("network", *network);
    return Port_MsgManData::Count(Port_Severity::Error) > 0 ? 1 : 0;
}
