// The native design reader: what it takes is written, read back and written again, and both
// writes give the same bytes. Read in pieces, a valid file gives the same design.
#include "fuzz/fuzz_support.h"
#include "host/design/native_format.h"
#include "host/port/msgman.h"

int LunFuzzNative(const uint8_t* data, size_t size) {
    Port_MsgCapture quiet;
    const std::string path =
        lun_fuzz::Write("input.design.json", std::string_view(reinterpret_cast<const char*>(data), size));
    try {
        auto design = lun_fuzz::ReadBothWays(data, size, path, [&] { return Ndm_ReadNative(path.c_str()); });
        if (!design) return 0;
        const std::string first = lun_fuzz::Path("first.design.json");
        const std::string second = lun_fuzz::Path("second.design.json");
        if (!Ndm_WriteNative(*design, first.c_str())) lun_fuzz::Fail("writing a design read", first);
        auto back = Ndm_ReadNative(first.c_str());
        if (!back) lun_fuzz::FailReading("reading a written design back", quiet, first);
        if (!Ndm_WriteNative(*back, second.c_str())) lun_fuzz::Fail("writing a design read back", second);
        if (lun_fuzz::ReadAll(first) != lun_fuzz::ReadAll(second))
            lun_fuzz::Fail("writing a design read back gives the same bytes", first + " vs " + second);
    } catch (const Port_FatalError&) {
    }
    return 0;
}
