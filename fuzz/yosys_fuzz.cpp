// The netlist reader from arbitrary bytes; a netlist it takes must survive the native file. Read
// in pieces, a valid netlist gives the same design.
#include "fuzz/fuzz_support.h"
#include "host/design/native_format.h"
#include "host/design/yosys_reader.h"
#include "host/port/msgman.h"

int LunFuzzYosys(const uint8_t* data, size_t size) {
    Port_MsgCapture quiet;
    const std::string path =
        lun_fuzz::Write("netlist.json", std::string_view(reinterpret_cast<const char*>(data), size));
    try {
        // A small limit: expansion is counted before anything is made, so it is tested as well.
        auto design = lun_fuzz::ReadBothWays(data, size, path,
                                             [&] { return Ndm_ReadYosysJson(path.c_str(), nullptr, 100000); });
        if (!design) return 0;
        const std::string native = lun_fuzz::Path("netlist.design.json");
        if (!Ndm_WriteNative(*design, native.c_str())) lun_fuzz::Fail("saving a netlist read", native);
        if (!Ndm_ReadNative(native.c_str()))
            lun_fuzz::FailReading("reading a saved netlist back", quiet, native);
    } catch (const Port_FatalError&) {
    }
    return 0;
}
