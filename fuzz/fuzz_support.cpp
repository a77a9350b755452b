#include "fuzz_support.h"

#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <sstream>

#include <simdjson.h>

#include "host/design/design_io.h"
#include "host/design/json_chunks.h"
#include "host/design/native_format.h"
#include "host/design/yosys_reader.h"
#include "host/port/msgman.h"

namespace lun_fuzz {
namespace {

struct Scratch {
    Scratch() {
        // The settings that change what the annotators do come from the input only.
        for (const char* name : {"ZEP_QUILLMAP_ALLOWUNMATCHEDUCF", "ZEP_QUILLMAP_BEST_EFFORT_UCF",
                                 "ZEP_QUILLMAP_SECOND_UCF_PASS", "LUN_MAX_CELLS"})
            ::unsetenv(name);
        ::setenv("LUN_DATA_DIR", LUN_SOURCE_DIR "/data", 1);
        std::string pattern = (std::filesystem::temp_directory_path() / "lun-fuzz-XXXXXX").string();
        if (!::mkdtemp(pattern.data())) Fail("scratch folder", pattern);
        dir = pattern;
    }
    ~Scratch() {
        std::error_code ec;
        std::filesystem::remove_all(dir, ec);
    }
    std::string dir;
};

Scratch& TheScratch() {
    static Scratch scratch;
    return scratch;
}

}  // namespace

std::string Path(const char* name) { return TheScratch().dir + "/" + name; }

std::string Write(const char* name, std::string_view bytes) {
    std::string path = Path(name);
    std::ofstream out(path, std::ios::binary | std::ios::trunc);
    out.write(bytes.data(), static_cast<std::streamsize>(bytes.size()));
    if (!out.flush()) Fail("writing the input", path);
    return path;
}

std::unique_ptr<Ndm_Design> ReadBothWays(const uint8_t* data, size_t size, const std::string& path,
                                         const std::function<std::unique_ptr<Ndm_Design>()>& read) {
    auto whole = read();
    const Ndm_JsonChunks::Sizes saved = Ndm_JsonChunks::GetSizes();
    Ndm_JsonChunks::GetSizes() = {0, 1 + size % 13};
    auto pieces = read();
    Ndm_JsonChunks::GetSizes() = saved;
    simdjson::dom::parser parser;
    if (parser.parse(reinterpret_cast<const char*>(data), size).error()) return whole;
    if (!whole != !pieces) Fail("a file read in pieces is taken or refused as read whole", path);
    if (whole) {
        const std::string a = Path("whole.design.json"), b = Path("pieces.design.json");
        if (!Ndm_WriteNative(*whole, a.c_str()) || !Ndm_WriteNative(*pieces, b.c_str()))
            Fail("saving a design read both ways", a);
        if (ReadAll(a) != ReadAll(b)) Fail("a file read in pieces gives the same design", a + " vs " + b);
    }
    return whole;
}

std::string ReadAll(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    return std::string(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
}

std::unique_ptr<Ndm_Design> Blinky() {
    // The netlist is read once; every copy comes from its native file, loaded as a host loads
    // it, so that all copies carry the same source stamp.
    static const std::string native = [] {
        Port_MsgCapture quiet;
        auto design = Ndm_ReadYosysJson(LUN_SOURCE_DIR "/examples/blinky/blinky.json", nullptr);
        if (!design) Fail("reading the example design", "examples/blinky/blinky.json");
        std::string path = Path("blinky.design.json");
        if (!Ndm_WriteNative(*design, path.c_str())) Fail("writing the example design", path);
        return path;
    }();
    auto design = Ndm_LoadDesign(native.c_str(), nullptr);
    if (!design) Fail("reading the example design back", native);
    return design;
}

void Fail(const char* what, const std::string& detail) {
    std::fprintf(stderr, "lun fuzz: %s failed: %s\n", what, detail.c_str());
    std::fflush(stderr);
    std::abort();
}

void FailReading(const char* what, const Port_MsgCapture& messages, const std::string& path) {
    Fail(what, messages.messages().empty() ? path : messages.messages().back().text);
}

}  // namespace lun_fuzz
