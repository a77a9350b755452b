// The native design reader: what it takes is written, read back and written again, and both
// writes give the same bytes. Read in pieces of a few bytes (every array and object then a
// large one, cut at every few commas), the file gives the same design, or is refused.
#include "fuzz/fuzz_support.h"
#include "host/design/json_chunks.h"
#include "host/design/native_format.h"
#include "host/port/msgman.h"

int LunFuzzNative(const uint8_t* data, size_t size) {
    Port_MsgCapture quiet;
    const std::string path =
        lun_fuzz::Write("input.design.json", std::string_view(reinterpret_cast<const char*>(data), size));
    try {
        auto design = Ndm_ReadNative(path.c_str());
        const Ndm_JsonChunks::Sizes saved = Ndm_JsonChunks::GetSizes();
        Ndm_JsonChunks::GetSizes() = {0, 1 + size % 13};
        auto pieces = Ndm_ReadNative(path.c_str());
        Ndm_JsonChunks::GetSizes() = saved;
        if (pieces && !design) lun_fuzz::Fail("a file refused whole is refused in pieces", path);
        if (!design) return 0;
        const std::string first = lun_fuzz::Path("first.design.json");
        const std::string second = lun_fuzz::Path("second.design.json");
        if (pieces) {
            if (!Ndm_WriteNative(*pieces, second.c_str())) lun_fuzz::Fail("writing a design read in pieces", second);
        }
        if (!Ndm_WriteNative(*design, first.c_str())) lun_fuzz::Fail("writing a design read", first);
        if (pieces && lun_fuzz::ReadAll(first) != lun_fuzz::ReadAll(second))
            lun_fuzz::Fail("a file read in pieces gives the same design", first + " vs " + second);
        auto back = Ndm_ReadNative(first.c_str());
        if (!back) lun_fuzz::FailReading("reading a written design back", quiet, first);
        if (!Ndm_WriteNative(*back, second.c_str())) lun_fuzz::Fail("writing a design read back", second);
        if (lun_fuzz::ReadAll(first) != lun_fuzz::ReadAll(second))
            lun_fuzz::Fail("writing a design read back gives the same bytes", first + " vs " + second);
    } catch (const Port_FatalError&) {
    }
    return 0;
}
