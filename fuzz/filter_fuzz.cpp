// The property-definition reader from arbitrary bytes; definitions it takes filter the first
// word of every line onto each kind of object.
#include <sstream>
#include <string>

#include "fuzz/fuzz_support.h"
#include "host/design/ndm.h"
#include "host/filter/prop_filter.h"
#include "host/port/msgman.h"

namespace {

// One object of every kind a definition names.
struct Objects {
    Objects() {
        Ndm_Block* top = view->CreateTopBlock("top");
        Ndm_Block* inst = top->CreateBlock("u1");
        Ndm_Block* config = top->CreateBlock("cfg");
        config->CreatePropertyString("TYPE", "CONFIG");
        Ndm_Block* timespec = top->CreateBlock("ts");
        timespec->CreatePropertyString("TYPE", "TIMESPEC");
        Ndm_Signal* signal = top->CreateSignal("s");
        Ndm_Network* network = view->CreateNetwork();
        network->AddSignal(signal);
        all = {inst, config, timespec, signal, network, inst->CreatePin("A")};
    }
    Ndm_Design design{"d"};
    Ndm_View* view = design.CreateView("EXPANDED");
    std::vector<Ndm_PropertyHolder*> all;
};

}  // namespace

int LunFuzzFilter(const uint8_t* data, size_t size) {
    Port_MsgCapture quiet;
    const std::string text(reinterpret_cast<const char*>(data), size);
    const std::string path = lun_fuzz::Write("fuzz.pfd", text);
    Ndh_PropInFilter::ForgetReadDefinitions();
    Ndh_PropInFilter filter(path.c_str(), nullptr);
    if (!filter.IsValid()) return 0;
    Objects objects;
    std::istringstream lines(text);
    std::string line;
    for (int n = 0; n < 64 && std::getline(lines, line); ++n) {
        std::string name;
        std::istringstream(line) >> name;
        if (name.empty()) continue;
        filter.CanonicalName(name.c_str());
        filter.KeepsEveryValue(name.c_str(), "net");
        for (Ndm_PropertyHolder* object : objects.all) {
            for (const char* value : {"1", "FALSE", "2.5", "x"}) {
                Ndm_Property* list = object->CreatePropertyList("_TempPropList");
                list->CreatePropertyString(name.c_str(), value);
                filter.FilterProp(list, object);
                object->DeleteProperty(list);
            }
        }
    }
    return 0;
}
