// Subcommands that read and write whole designs: dump and convert.
#include <CLI/CLI.hpp>
#include <cstdint>
#include <iostream>
#include <ostream>
#include <streambuf>

#include "extract/cst_extractor.h"
#include "host/design/design_io.h"
#include "host/design/dump.h"
#include "host/design/native_format.h"
#include "host/design/ndm.h"
#include "host/port/file.h"
#include "host/port/msgman.h"
#include "quillmap/app.h"

namespace {

struct DesignArgs {
    std::string design;
    std::string top;
    std::string output;
    bool normalize = false;
};

void AddDesignArgs(CLI::App* cmd, DesignArgs& args) {
    cmd->add_option("DESIGN", args.design, "Yosys JSON netlist or native design file")
        ->required();
    cmd->add_option("--top", args.top,
                    "Top module of a Yosys netlist (default: the module marked top)");
}

// An output stream buffer over an atomic file: a dump of any size passes through the
// dumper's own small buffer straight into the file.
class AtomicFileBuf : public std::streambuf {
public:
    explicit AtomicFileBuf(Port::AtomicFile& file) : file_(file) {}

protected:
    std::streamsize xsputn(const char* data, std::streamsize size) override {
        return file_.Write(data, static_cast<size_t>(size)) ? size : 0;
    }
    int_type overflow(int_type c) override {
        if (traits_type::eq_int_type(c, traits_type::eof())) return traits_type::not_eof(c);
        const char byte = traits_type::to_char_type(c);
        return file_.Write(&byte, 1) ? c : traits_type::eof();
    }

private:
    Port::AtomicFile& file_;
};

uint64_t g_max_cells = 0;  // --max-cells; 0: the library's default

}  // namespace

void QuillmapSetMaxCells(uint64_t max_cells) { g_max_cells = max_cells; }

std::unique_ptr<Ndm_Design> QuillmapLoadDesign(const std::string& path, const std::string& top) {
    return Ndm_LoadDesign(path.c_str(), top.empty() ? nullptr : top.c_str(), g_max_cells);
}

Ndm_View* QuillmapWorkView(Ndm_Design& design, const std::string& path, const char* purpose) {
    if (Ndm_View* view = design.GetWorkView()) return view;
    QuillmapMsg(__LINE__)
        .issueError("Design '%s' has no view to %s.\n", path.c_str(), purpose);
    return nullptr;
}

static void AddDumpCommand(CLI::App& app, QuillmapAction& run) {
    static DesignArgs args;
    CLI::App* cmd = app.add_subcommand(
        "dump",
        "Print a design's objects and properties in a stable text form.\n"
        "One object per line, indented by depth, with its full name: blocks with their type,\n"
        "signals, pins with direction and connected signal, then the networks with their\n"
        "signals; properties one level below their object as % \"NAME\" type value. Deeper\n"
        "than 32 levels lines stay at that indentation and names show .../ and their last 32\n"
        "levels, so the dump grows with the design. See docs/design-database.md.");
    AddDesignArgs(cmd, args);
    cmd->add_option("-o,--output", args.output, "Write the dump to this file instead of stdout");
    cmd->callback([&run] {
        run = [] {
            if (!QuillmapOutputIsNew(args.output, {args.design})) return static_cast<int>(kStatusFatal);
            auto design = QuillmapLoadDesign(args.design, args.top);
            if (!design) return static_cast<int>(kStatusErrors);
            if (args.output.empty()) {
                Ndm_Dump(*design, std::cout);
                std::cout.flush();
                return std::cout ? static_cast<int>(kStatusOk) : static_cast<int>(kStatusErrors);
            }
            Port::AtomicFile out(args.output);
            AtomicFileBuf buf(out);
            std::ostream text(&buf);
            Ndm_Dump(*design, text);
            if (!text || !out.Commit()) {
                QuillmapMsg(__LINE__)
                    .issueError("Could not write '%s': %s\n", args.output.c_str(), out.error().c_str());
                return static_cast<int>(kStatusErrors);
            }
            return static_cast<int>(kStatusOk);
        };
    });
}

static void AddConvertCommand(CLI::App& app, QuillmapAction& run) {
    static DesignArgs args;
    CLI::App* cmd = app.add_subcommand(
        "convert",
        "Save a design as a native design file.\n"
        "Reads a Yosys JSON netlist or a native design file and writes the native form, which keeps\n"
        "every property and constraint block (see docs/design-format.md).\n"
        "With --normalize, the properties of the blocks and networks of the view EXPANDED (else the\n"
        "first view) are first rewritten from their netlist form into their constraint-file form:\n"
        "an integer SLEW 80/20/10 becomes the text FAST/SLOW/QUIETIO, DELAYMODE 0 becomes the flag\n"
        "NODELAY, the flag FIXED becomes P, and the texts LOG_PICSPEC, LOG_PICSPEED, LOG_VENDOR,\n"
        "INITSTATE, VL_LEVEL are renamed PICSPEC, PICSPEED, VENDOR, INIT, LEVEL. Another SLEW value\n"
        "is a fatal error (exit status 2) and nothing is written. `quillmap dump` shows the result.");
    AddDesignArgs(cmd, args);
    cmd->add_option("-o,--output", args.output, "Native design file to write")->required();
    cmd->add_flag("--normalize", args.normalize,
                  "Rewrite netlist-form properties into their constraint-file form before saving");
    cmd->callback([&run] {
        run = [] {
            if (!QuillmapOutputIsNew(args.output, {args.design})) return static_cast<int>(kStatusFatal);
            auto design = QuillmapLoadDesign(args.design, args.top);
            if (!design) return static_cast<int>(kStatusErrors);
            if (args.normalize) {
                Ndm_View* view = QuillmapWorkView(*design, args.design, "normalize");
                if (!view) return static_cast<int>(kStatusErrors);
                CstExtractor().NormalizeProperties(view);
            }
            return Ndm_WriteNative(*design, args.output.c_str()) ? static_cast<int>(kStatusOk)
                                                                 : static_cast<int>(kStatusErrors);
        };
    });
}

void AddDesignCommands(CLI::App& app, QuillmapAction& run) {
    AddDumpCommand(app, run);
    AddConvertCommand(app, run);
}
