// Annotate, save, read back, extract: what the annotator leaves on a design must survive the
// native file and come out of the extractor.
#include <sstream>

#include "extract/cst_extractor.h"
#include "fuzz/annotate_fuzz.h"
#include "fuzz/fuzz_support.h"
#include "host/design/native_format.h"
#include "host/port/msgman.h"
#include "host/port/stream.h"

int LunFuzzExtract(const uint8_t* data, size_t size) {
    Port_MsgCapture quiet;
    auto design = lun_fuzz::AnnotatedBlinky(data, size);
    if (!design) return 0;  // nothing to save
    const std::string path = lun_fuzz::Path("annotated.json");
    if (!Ndm_WriteNative(*design, path.c_str())) lun_fuzz::Fail("saving the annotated design", path);
    auto back = Ndm_ReadNative(path.c_str());
    if (!back) lun_fuzz::FailReading("reading the annotated design back", quiet, path);
    Ndm_View* view = back->GetWorkView();
    if (!view) lun_fuzz::Fail("finding the work view of the annotated design", path);
    try {
        CstExtractor extractor;
        extractor.NormalizeProperties(view);
        std::ostringstream text;
        Port::Stream stream(text);
        extractor.Extract(view, stream);
    } catch (const Port_FatalError&) {
    }
    return 0;
}
