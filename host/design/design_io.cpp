#include "host/design/design_io.h"


#include "host/design/json_input.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <string>

#include "host/design/native_format.h"
#include "host/design/yosys_reader.h"
#include "host/port/file.h"
#include "host/port/msgman.h"

namespace {

using Ndm_JsonInput::Msg;

}  // namespace

std::unique_ptr<Ndm_Design> Ndm_LoadDesign(const char* path, const char* top_module, uint64_t max_cells) {
    if (!path) return nullptr;
    // The marker is the first member of a native file, so the head of the file tells.
    char head[512];
    size_t got = 0;
    if (FILE* f = std::fopen(path, "rb")) {
        got = std::fread(head, 1, sizeof head, f);
        std::fclose(f);
    } else {
        Msg().issueError("%s", Port_Format("Cannot read design file '%s': %s.", path, std::strerror(errno)).c_str());
        return nullptr;
    }
    // The file as it was before it was read (a change while reading makes a new stamp).
    const std::string identity = Port::File::Identity(path);
    auto stamp = [&](std::unique_ptr<Ndm_Design> design) {
        if (design && !identity.empty())
            design->SetSourceStamp(identity + ":" + design->GetName());  // the top module chosen counts too
        return design;
    };
    if (!Ndm_IsNativeText(head, got)) return stamp(Ndm_ReadYosysJson(path, top_module, max_cells));
    auto design = stamp(Ndm_ReadNative(path));
    if (design && top_module && std::strcmp(design->GetName(), top_module) != 0) {
        Msg().issueError("%s", Port_Format("Design file '%s' holds design '%s', not '%s'.", path,
                                           design->GetName(), top_module)
                                   .c_str());
        return nullptr;
    }
    return design;
}
