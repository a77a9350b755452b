// The repository file reader. Bit 0 of the first byte: the rest is the file (0), or groups of
// four bytes flip bytes of a file committed from the example (1): a 24-bit offset and the bits
// to flip. Bit 1: restore without the design bound. Bit 2: seal the file again, so that restoring
// trusts and decodes its damaged snapshot. A file restored is committed again, and that file must
// restore.
#include "fuzz/fuzz_support.h"
#include "host/port/msgman.h"
#include "host/repository/cs_mgr.h"
#include "host/repository/cs_rows.h"

namespace {

std::string Outcome(const Cs_ReturnCode& rc) {
    std::string text;
    for (const auto& status : rc) text += status->GetMessage() + " ";
    return text;
}

// The example's constraints committed for the example design.
const std::string& Committed() {
    static const std::string bytes = [] {
        Port_MsgCapture quiet;
        auto design = lun_fuzz::Blinky();
        Cs_ConstraintMgr mgr;
        mgr.SetDesign(design.get());
        mgr.LoadConstraints(LUN_SOURCE_DIR "/examples/blinky/blinky.ucf", Cs_ConstraintSyntax::UCF);
        const std::string path = lun_fuzz::Path("seed.qbcd");
        if (!mgr.Commit(path.c_str())) lun_fuzz::Fail("committing the example", path);
        return lun_fuzz::ReadAll(path);
    }();
    return bytes;
}

}  // namespace

int LunFuzzRepository(const uint8_t* data, size_t size) {
    if (size == 0) return 0;
    const std::string& seed = Committed();
    Port_MsgCapture quiet;
    std::string bytes;
    if (data[0] & 1) {
        bytes = seed;
        for (size_t i = 1; i + 4 <= size; i += 4) {
            const size_t at = (data[i] | data[i + 1] << 8 | data[i + 2] << 16) % bytes.size();
            bytes[at] = static_cast<char>(bytes[at] ^ data[i + 3]);
        }
    } else {
        bytes.assign(reinterpret_cast<const char*>(data) + 1, size - 1);
    }
    const std::string path = lun_fuzz::Write("input.qbcd", bytes);
    std::string error;
    if (data[0] & 4) Cs_Rows::SealFile(path, error);
    try {
        auto design = lun_fuzz::Blinky();
        const Ndm_Design* bound = (data[0] & 2) ? nullptr : design.get();
        Cs_ConstraintMgr mgr;
        mgr.SetDesign(bound);
        if (!mgr.Restore(path.c_str())) return 0;
        mgr.GetConstraints(Cs_ConstraintMgr::ALL);
        mgr.GetFindings();
        const std::string again = lun_fuzz::Path("again.qbcd");
        if (!mgr.Commit(again.c_str())) lun_fuzz::Fail("committing a restored repository", Outcome(mgr.GetStoreOutcome()));
        Cs_ConstraintMgr back;
        back.SetDesign(bound);
        if (!back.Restore(again.c_str())) lun_fuzz::Fail("restoring what was committed", Outcome(back.GetStoreOutcome()));
    } catch (const Port_FatalError&) {
    }
    return 0;
}
