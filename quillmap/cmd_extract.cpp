// The extract subcommand: writes a design's constraint blocks back as constraint text.
#include <CLI/CLI.hpp>
#include <iostream>
#include <sstream>
#include <string>

#include "extract/cst_extractor.h"
#include "host/design/ndm.h"
#include "host/port/file.h"
#include "host/port/msgman.h"
#include "host/port/stream.h"
#include "quillmap/app.h"

namespace {

struct ExtractArgs {
    std::string design;
    std::string top;
    std::string output;
};

int RunExtract(const ExtractArgs& args) {
    if (!QuillmapOutputIsNew(args.output, {args.design})) return kStatusFatal;
    auto design = QuillmapLoadDesign(args.design, args.top);
    if (!design) return kStatusErrors;
    Ndm_View* view = QuillmapWorkView(*design, args.design, "extract from");
    if (!view) return kStatusErrors;

    // The text is collected first so that a fatal error leaves neither a partial output file
    // nor partial output on stdout.
    CstExtractor extractor;
    std::ostringstream text;
    Port::Stream stream(text);
    extractor.Extract(view, stream);

    if (args.output.empty()) {
        std::cout << text.str();
        std::cout.flush();
        return std::cout ? kStatusOk : kStatusErrors;
    }
    Port::AtomicFile out(args.output);
    if (!out.Write(text.str()) || !out.Commit()) {
        QuillmapMsg(__LINE__).issueError("Could not write '%s': %s\n", args.output.c_str(), out.error().c_str());
        return kStatusErrors;
    }
    return kStatusOk;
}

}  // namespace

void AddExtractCommand(CLI::App& app, QuillmapAction& run) {
    static ExtractArgs args;
    CLI::App* cmd = app.add_subcommand(
        "extract",
        "Write the constraint blocks of a design as constraint-file text.\n"
        "The blocks of the view EXPANDED (else the first view) are written to stdout or to the -o file.\n"
        "Blocks are visited depth first, the children of a block (in stored order) before the\n"
        "block itself; each CONFIG, TIMEGRP and TIMESPEC block gives one section: a header line\n"
        "(\"// Global Constraints\", \"// Timing Groups\" or \"// Timing Constraints\"), one\n"
        "statement per line ending in \" ;\", and an empty line. Constraints attached to\n"
        "instances, nets and pins are not written.\n"
        "The written blocks are then deleted from the design in memory only; the input file\n"
        "is never modified. To rewrite netlist-form properties (SLEW codes and the like) into\n"
        "their constraint-file form, use `quillmap convert --normalize`.\n"
        "A fatal error (an unexpected property type or value) writes nothing and exits with\n"
        "status 2. See docs/extraction.md.");
    cmd->add_option("DESIGN", args.design, "Yosys JSON netlist or native design file")->required();
    cmd->add_option("--top", args.top, "Top module of a Yosys netlist (default: the module marked top)");
    cmd->add_option("-o,--output", args.output, "Write the constraint text to this file instead of stdout");
    cmd->callback([&run] { run = [] { return RunExtract(args); }; });
}
