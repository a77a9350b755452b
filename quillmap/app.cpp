#include "quillmap/app.h"

#include <CLI/CLI.hpp>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <iostream>
#include <exception>

#include "host/port/atomic_file.h"
#include "host/port/msgman.h"
#include "host/port/version.h"

namespace {

const char* kDescription =
    "quillmap reads a synthesized netlist (Yosys JSON) or a native design file, annotates it\n"
    "with the constraints of UCF/NCF constraint files, and saves the annotated design.\n"
    "\n"
    "Exit status: 0 when no error was issued, 1 when errors were issued, 2 for a fatal\n"
    "error or bad usage.";

}  // namespace

Port_MsgManData QuillmapMsg(int line) {
    return Port_MsgManData::createObject("Quillmap", "quillmap", line, "1.0");
}

bool QuillmapOutputIsNew(const std::string& output, const std::vector<std::string>& inputs) {
    if (output.empty()) return true;
    for (const std::string& input : inputs) {
        if (input.empty() || !Port::SameFile(output, input)) continue;
        QuillmapMsg(__LINE__)
            .issueError("The output file '%s' is the input file '%s': give another output file.\n", output.c_str(),
                        input.c_str());
        return false;
    }
    return true;
}

void QuillmapInputs::AddOptions(CLI::App* cmd) {
    cmd_ = cmd;
    cmd->add_option("DESIGN", design, "Yosys JSON netlist or native design file")->required();
    cmd->add_option("--top", top, "Top module of a Yosys netlist (default: the module marked top)");
    ucf_opt_ = cmd->add_option("--ucf", ucf, "User constraints file (repeatable)");
    ncf_opt_ = cmd->add_option("--ncf", ncf, "Netlist constraints file (repeatable)");
}

std::vector<QuillmapConstraintFile> QuillmapInputs::FilesInOrder() const {
    std::vector<QuillmapConstraintFile> files;
    size_t u = 0, n = 0;
    for (const CLI::Option* opt : cmd_->parse_order()) {
        if (opt == ucf_opt_ && u < ucf.size()) files.push_back({false, ucf[u++]});
        if (opt == ncf_opt_ && n < ncf.size()) files.push_back({true, ncf[n++]});
    }
    return files;
}

std::vector<std::string> QuillmapInputs::Paths() const {
    std::vector<std::string> paths{design};
    paths.insert(paths.end(), ucf.begin(), ucf.end());
    paths.insert(paths.end(), ncf.begin(), ncf.end());
    return paths;
}

bool QuillmapProjectNameIsValid(const std::string& project) {
    bool ok = project.size() >= 5 && project[project.size() - 4] == '.' && project[project.size() - 5] != '/';
    for (size_t i = project.size() - 3; ok && i < project.size(); ++i) ok = project[i] != '.' && project[i] != '/';
    if (!ok)
        QuillmapMsg(__LINE__)
            .issueError("The project file name '%s' must end in a three-letter extension such as .qpf: the "
                        "constraint repository is kept in the folder named by the rest of it.\n",
                        project.c_str());
    return ok;
}

int QuillmapMain(int argc, char** argv) {
    CLI::App app{kDescription, "quillmap"};
    // The tool's version is the one it was built as; the library's is the one it loaded.
    app.set_version_flag("--version", std::string("quillmap ") + LUN_VERSION + " (liblun " + lun_version() + ")");
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
    AddCheckCommand(app, run);
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
        // Output lost on a full device or a closed pipe is an error the user must see.
        std::cout.flush();
        // The reason: the final flush's, else what the failed write left.
        const int earlier = errno;
        errno = 0;
        const bool flushed = std::fflush(stdout) == 0;
        const int why = !flushed && errno ? errno : (earlier ? earlier : EIO);
        if (!flushed || std::ferror(stdout) || !std::cout) {
            QuillmapMsg(__LINE__)
                .issueError("Cannot write to the standard output: %s.\n", std::strerror(why));
            if (status == kStatusOk) status = kStatusErrors;
        }
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
