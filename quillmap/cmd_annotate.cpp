// The annotate subcommand: runs the constraint files over a design and saves the result.
#include <CLI/CLI.hpp>
#include <algorithm>
#include <string>
#include <vector>

#include "bridge/luncshelper.h"
#include "host/design/native_format.h"
#include "host/design/ndm.h"
#include "host/port/msgman.h"
#include "manager/lunmgr.h"
#include "quillmap/app.h"

namespace {

struct AnnotateArgs {
    QuillmapInputs in;
    std::string filter;
    bool case_sensitive = false;
    bool case_insensitive = false;
    bool second_pass = false;
    std::string best_effort;
    bool allow_unmatched_locs = false;
    std::string output;
    std::string project;
    std::string drc;
    bool allow_unmatched_maxdelay = false;
    CLI::Option* best_effort_opt = nullptr;
};

int RunFileRoad(const AnnotateArgs& args, const QuillmapOptions& options) {
    auto design = QuillmapLoadDesign(args.in.design, args.in.top);
    if (!design) return kStatusErrors;
    Ndm_View* view = QuillmapWorkView(*design, args.in.design, "annotate");
    if (!view) return kStatusErrors;
    // Which file named which part: the parts already in the design, then each file's new one.
    std::vector<QuillmapPartSource> parts;
    auto before = QuillmapPartsOf(view);
    for (const auto& [block, part] : before) parts.push_back({args.in.design, part});
    for (const QuillmapConstraintFile& file : args.in.FilesInOrder()) {
        const CP_FILE_TYPE kind = file.ncf ? CP_NCF : CP_UCF;
        // The file is read once and both readers parse that text, so a pipe works too; when it
        // cannot be read, the annotator reports it.
        std::shared_ptr<const Pr_FileText> text = Pr_FileText::Read(file.path.c_str());
        // A host learns the part of a UCF from the part reader (the manager passes over it);
        // in a second pass the first pass has stored it already.
        if (text && kind == CP_UCF && !args.second_pass)
            QuillmapReadUcfPart(view, file.path, text, args.filter, options.debug);
        Ta_LunMgr mgr(file.path.c_str(), kind, args.filter.empty() ? nullptr : args.filter.c_str());
        mgr.set_text(std::move(text));
        if (args.case_sensitive) mgr.set_case_sensitive(true);
        if (args.case_insensitive) mgr.set_case_sensitive(false);
        if (args.second_pass) mgr.set_second_pass(true);
        if (options.debug) mgr.set_debug_callbacks();
        if (args.best_effort_opt->count() > 0)
            mgr.set_best_effort(1, args.best_effort.empty() ? "DEFAULT" : args.best_effort.c_str());
        if (args.allow_unmatched_locs) mgr.AllowUnmatchedLocs();
        mgr.annotate(view);
        auto after = QuillmapPartsOf(view);
        for (const auto& entry : after)
            if (std::find(before.begin(), before.end(), entry) == before.end()) parts.push_back({file.path, entry.second});
        before = std::move(after);
    }
    std::vector<std::string> kept;
    for (const auto& entry : before) kept.push_back(entry.second);
    QuillmapWarnDifferentParts(parts, kept);
    if (!args.output.empty() && !Ndm_WriteNative(*design, args.output.c_str())) return kStatusErrors;
    return kStatusOk;
}

int RunAnnotate(const AnnotateArgs& args, const QuillmapOptions& options) {
    std::vector<std::string> inputs = args.in.Paths();
    inputs.push_back(args.filter);
    inputs.push_back(args.project);
    if (!args.project.empty()) inputs.push_back(Ta_LunCSHelper::RepositoryPath(args.project.c_str()).str());
    if (!QuillmapOutputIsNew(args.output, inputs)) return kStatusFatal;
    if (args.project.empty()) return RunFileRoad(args, options);
    std::string file_road_only;
    auto note = [&](bool given, const char* option) {
        if (given) file_road_only += (file_road_only.empty() ? "" : ", ") + std::string(option);
    };
    note(!args.filter.empty(), "--filter");
    note(args.case_sensitive, "--case-sensitive");
    note(args.case_insensitive, "--case-insensitive");
    note(args.second_pass, "--second-pass");
    note(args.best_effort_opt && args.best_effort_opt->count() > 0, "--best-effort");
    QuillmapRoadRequest request{args.in.design, args.in.top, args.in.ucf, !args.in.ncf.empty(),
                                args.project, args.drc, args.allow_unmatched_locs, args.allow_unmatched_maxdelay,
                                args.output, file_road_only};
    return QuillmapRepositoryRoad(request, [&] { return RunFileRoad(args, options); });
}

}  // namespace

void AddAnnotateCommand(CLI::App& app, QuillmapAction& run, const QuillmapOptions& options) {
    static AnnotateArgs args;
    CLI::App* cmd = app.add_subcommand(
        "annotate",
        "Annotate a design with the constraints of UCF and NCF files.\n"
        "The files are applied in the order given. Every INST, NET and PIN statement puts its\n"
        "constraints on the objects it names; TIMESPEC entries, groups and global\n"
        "settings go to constraint blocks. Unmatched names, illegal values and conflicts are\n"
        "reported with the file name and line.\n"
        "Before the annotator reads a UCF, the part reader takes its CONFIG PART (and the PART\n"
        "constraints of its INST, NET and PIN statements) onto the UCF's CONFIG block, so that the\n"
        "saved design carries the target part; an NCF's PART is stored by the annotator itself, on\n"
        "the first CONFIG block it finds (the UCF's, when a UCF came first), replacing a part there.\n"
        "When the files (or the design) name different parts, a warning names them all and the\n"
        "parts the design keeps; a second CONFIG PART in one UCF, or in a UCF annotated onto a\n"
        "design that holds a UCF part, is a fatal error. --second-pass reads no part.\n"
        "\n"
        "With --project, the UCF files go through the constraint repository, kept in the folder named\n"
        "by the project file without its extension plus \"_qdb\" (blinky.qpf: blinky_qdb/cst.qbcd).\n"
        "The environment variable ZEP_QUILLMAP_CS chooses what is done:\n"
        "  unset or 2  write-back: the files are read into the repository and checked, the attributes\n"
        "              it has no type for are attached, unmatched names and overrides are reported by\n"
        "              the DRC level, the repository file is written, and then its constraints are\n"
        "              written onto the design (which -o saves);\n"
        "  1           the same without the write-back: the repository file is the result;\n"
        "  0 or 3      the repository is not used: the files are annotated as without --project.\n"
        "A later run with the same project and the same files restores the repository instead of\n"
        "reading the files, and says so; a file changed since is read again and its findings\n"
        "reported. `quillmap repo PROJECT` lists what the repository holds. Another value of\n"
        "ZEP_QUILLMAP_CS or ZEP_QUILLMAP_CONSTRAINT_DRC is a fatal error (exit status 2) and nothing is\n"
        "written. See docs/repository-road.md.");
    args.in.AddOptions(cmd);
    cmd->add_option("--filter", args.filter,
                    "Property definition file (default: ucf.pfd from the data folder)");
    auto* cs = cmd->add_flag("--case-sensitive", args.case_sensitive,
                             "Names must match design names exactly (default for NCF files)");
    cmd->add_flag("--case-insensitive", args.case_insensitive,
                  "Fall back to a case-insensitive match, reporting each use (default for UCF files)")
        ->excludes(cs);
    cmd->add_flag("--second-pass", args.second_pass,
                  "Second pass over a UCF: objects annotated by the first pass are left alone and no\n"
                  "timing, group or CONFIG statement is recorded");
    args.best_effort_opt = cmd->add_flag("--best-effort{DEFAULT}", args.best_effort,
                                         "Pass over INST and NET names that match nothing without a\n"
                                         "message; --best-effort=ID labels the run (default DEFAULT)");
    cmd->add_flag("--allow-unmatched-locs,--aul", args.allow_unmatched_locs,
                  "Location constraints (LOC, IOSTANDARD, DRIVE, SLEW) on names that match nothing\n"
                  "give an information message instead of an error");
    cmd->add_option("-o,--output", args.output, "Save the annotated design as a native design file");
    cmd->add_option("--project", args.project,
                    "Project file (for example blinky.qpf): read the UCF files through the constraint\n"
                    "repository kept beside it (see above)");
    cmd->add_option("--drc", args.drc,
                    "With --project: how strictly findings are reported, NONE, WARN_ONLY, NORMAL or STRICT\n"
                    "(default: ZEP_QUILLMAP_CONSTRAINT_DRC, else NORMAL)")
        ->check(CLI::IsMember({"NONE", "WARN_ONLY", "NORMAL", "STRICT"}));
    cmd->add_flag("--allow-unmatched-maxdelay", args.allow_unmatched_maxdelay,
                  "With --project: a MAXDELAY on a name that matches nothing gives an information message");
    cmd->callback([&run, &options] { run = [&options] { return RunAnnotate(args, options); }; });
}
