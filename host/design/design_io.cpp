#include "host/design/design_io.h"

#include <sys/stat.h>

#include "host/design/json_input.h"

#include <cerrno>
#include <cstdio>
#include <cstring>
#include <string>

#include "host/design/native_format.h"
#include "host/design/yosys_reader.h"
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
    struct stat st {};
    const bool known = ::stat(path, &st) == 0 && S_ISREG(st.st_mode);
    auto stamp = [&](std::unique_ptr<Ndm_Design> design) {
        if (design && known)
            design->SetSourceStamp(Port_Format("%llu:%llu:%lld:%lld.%09ld:", static_cast<unsigned long long>(st.st_dev),
                                               static_cast<unsigned long long>(st.st_ino),
                                               static_cast<long long>(st.st_size),
                                               static_cast<long long>(st.st_mtim.tv_sec), st.st_mtim.tv_nsec) +
                                   design->GetName());  // the top module chosen counts too
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
