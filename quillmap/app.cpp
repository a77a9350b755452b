#include "quillmap/app.h"

#include <CLI/CLI.hpp>
#include <cstdio>
#include <exception>

#include "host/port/msgman.h"

#ifndef LUN_VERSION
#define LUN_VERSION "0.0.0"
#endif

namespace {

const char* kDescription =
    "quillmap reads a synthesized netlist (Yosys JSON) or a native design file, annotates it\n"
    "with the constraints of UCF/NCF constraint files, and saves the annotated design.\n"
    "\n"
    "Exit status: 0 when no error was issued, 1 when errors were issued, 2 for a fatal\n"
    "error or bad usage.";

}  // namespace

int QuillmapMain(int argc, char** argv) {
    CLI::App app{kDescription, "quillmap"};
    app.set_version_flag("--version", std::string("quillmap ") + LUN_VERSION);
    app.require_subcommand(1);
    app.fallthrough();

    QuillmapOptions options;
    app.add_option("--messages", options.messages, "Message format on stderr")
        ->check(CLI::IsMember({"text", "jsonl"}))
        ->capture_default_str();
    app.add_flag("--debug", options.debug, "Show the debug channel (trace lines)");
    app.add_option("--max-cells", options.max_cells,
                   "Refuse a netlist that expands to more instances than this (default: LUN_MAX_CELLS, else "
                   "100000000)")
        ->check(CLI::PositiveNumber);

    QuillmapAction run;
    AddAnnotateCommand(app, run, options);
    AddPartCommand(app, run, options);
    AddDesignCommands(app, run);
    AddExtractCommand(app, run);
    AddRepoCommand(app, run);

    // The top-level list shows the first line of each description; the rest belongs to the
    // subcommand's own help.
    for (CLI::App* sub : app.get_subcommands({})) {
        std::string text = sub->get_description();
        size_t cut = text.find('\n');
        if (cut == std::string::npos) continue;
        std::string footer = sub->get_footer();
        sub->description(text.substr(0, cut));
        sub->footer("\n" + text.substr(cut + 1) + (footer.empty() ? "" : "\n" + footer));
    }

    try {
        app.parse(argc, argv);
    } catch (const CLI::ParseError& e) {
        int rc = app.exit(e);
        return rc == 0 ? kStatusOk : kStatusFatal;
    }

    if (options.messages == "jsonl") Port_MsgManData::AddSink(std::make_shared<Port_JsonSink>(stderr));
    Port_MsgManData::SetDebug(options.debug);
    QuillmapSetMaxCells(options.max_cells);

    try {
        int status = run ? run() : kStatusFatal;
        // An internal error is an error the library found in its own state: it counts as one.
        if (status == kStatusOk && (Port_MsgManData::Count(Port_Severity::Error) > 0 ||
                                    Port_MsgManData::Count(Port_Severity::Internal) > 0))
            status = kStatusErrors;
        return status;
    } catch (const Port_FatalError&) {
        return kStatusFatal;  // the message was delivered when it was issued
    } catch (const std::bad_alloc&) {
        std::fputs("FATAL_ERROR:quillmap - out of memory\n", stderr);
        return kStatusFatal;
    }
}
