// The check subcommand: reads the constraint files into a repository bound to the design and
// lists the board mistakes the board check finds, as text or JSON lines, and as an HTML page.
#include <CLI/CLI.hpp>
#include <cstdio>
#include <string>
#include <vector>

#include "check/ck_board_check.h"
#include "check/ck_html.h"
#include "check/ck_text.h"
#include "host/design/ndm.h"
#include "host/port/msgman.h"
#include "host/repository/cs_mgr.h"
#include "quillmap/app.h"

namespace {

struct CheckArgs {
    QuillmapInputs in;
    std::string format = "text";
    std::string report;
    std::vector<std::string> disable;
};

int RunCheck(const CheckArgs& args) {
    if (!QuillmapOutputIsNew(args.report, args.in.Paths())) return kStatusFatal;
    const auto files = args.in.FilesInOrder();
    if (files.empty()) {
        QuillmapMsg(__LINE__).issueError("Give the constraint files to check with --ucf or --ncf.\n");
        return kStatusFatal;
    }
    Ck_KindSet kinds;
    for (const std::string& id : args.disable) {
        Ck_Kind kind;
        if (Ck_KindFromId(id, kind)) kinds.Remove(kind);
    }

    auto design = QuillmapLoadDesign(args.in.design, args.in.top);
    if (!design) return kStatusErrors;
    if (!QuillmapWorkView(*design, args.in.design, "check")) return kStatusErrors;
    Cs_ConstraintMgr mgr;
    mgr.SetDesign(design.get());
    // Every file is read, then the names are resolved once.
    mgr.SetBulkConstraintMode(true);
    bool unreadable = false;
    for (const QuillmapConstraintFile& file : files) {
        Cs_ReturnCode read = mgr.LoadConstraints(Port::StringBase<char>(file.path),
                                                 file.ncf ? Cs_ConstraintSyntax::NCF : Cs_ConstraintSyntax::UCF);
        for (const auto& status : read)
            if (status->GetID() == Cs_StatusID::FILE_ERROR) {
                status->Report();
                unreadable = true;
            }
    }
    if (unreadable) return kStatusErrors;
    mgr.SetBulkConstraintMode(false);

    Ck_BoardCheck check(mgr, kinds);
    check.Run();
    std::string out;
    if (args.format == "jsonl")
        Ck_WriteJsonLines(check, args.in.design, out);
    else
        Ck_WriteText(check, args.in.design, out);
    std::fwrite(out.data(), 1, out.size(), stdout);
    if (!args.report.empty()) {
        std::string error;
        if (!Ck_WriteHtmlReport(check, args.in.design, args.report, error)) {
            QuillmapMsg(__LINE__).issueError("Could not write '%s': %s\n", args.report.c_str(), error.c_str());
            return kStatusErrors;
        }
    }
    return check.HasErrors() ? kStatusErrors : kStatusOk;
}

std::vector<std::string> KindIds() {
    std::vector<std::string> ids;
    for (int k = 0; k < kCk_KindCount; ++k) ids.push_back(Ck_KindId(static_cast<Ck_Kind>(k)));
    return ids;
}

}  // namespace

void AddCheckCommand(CLI::App& app, QuillmapAction& run) {
    static CheckArgs args;
    CLI::App* cmd = app.add_subcommand(
        "check",
        "Find the board mistakes of constraint files that annotation does not report.\n"
        "The files are read in the order given into a constraint repository bound to the design,\n"
        "the names are resolved as annotate resolves them, and these findings are listed, each with\n"
        "the file and line of every statement involved and the design objects it is about:\n"
        "  error    pin-clash             one LOC site given to two different nets (or ports)\n"
        "  error    dangling-group        a TIMESPEC, TIMEGRP or OFFSET names a group that no TNM, TNM_NET\n"
        "                                 or TIMEGRP defines (FFS, PADS, RAMS and the other keyword\n"
        "                                 groups need no definition)\n"
        "  warning  location-override     one object given two different values of LOC, IOSTANDARD, DRIVE\n"
        "                                 or SLEW, or two of PULLUP, PULLDOWN, KEEPER; names the statement\n"
        "                                 that wins (the last)\n"
        "  warning  unplaced-port         top-level ports (one per bit) without LOC, counted and named\n"
        "  warning  clock-without-period  a top-level input whose net reaches the clock pin of a cell,\n"
        "                                 directly or through up to 4 buffers, with no PERIOD covering\n"
        "                                 it: neither a NET PERIOD nor a TNM_NET (or TNM) into a group\n"
        "                                 that a TIMESPEC PERIOD times (directly or inside a TIMEGRP)\n"
        "  info     no-iostandard         placed ports without IOSTANDARD, counted and named\n"
        "  info     unused-group          a group defined but used by no TIMESPEC, TIMEGRP or OFFSET\n"
        "The repository's own findings come with them, once per statement, in its own words:\n"
        "  error    parse-error           a statement that cannot be read\n"
        "  warning  unmatched-name        a statement that names nothing in the design\n"
        "Clock pins: pin C of the Yosys flip-flop cells ($_DFF_*, $_SDFF_*, $_DFFE_* and the other\n"
        "$_...DFF... cells), CLK of $dff, $adff, $sdff, $dffe and their kin and of $fsm, CLK, RD_CLK and\n"
        "WR_CLK of the $mem cells; on cells of other libraries an input named C, CK, CLK, CLOCK, CLKA,\n"
        "CLKB or ending in CLK. Buffers: $_BUF_ and cells whose type starts with BUF or IBUF, from an\n"
        "input named A, I, I0 or I1 to their outputs.\n"
        "Text output: one line per finding, \"WHERE: SEVERITY: MESSAGE [KIND]\", WHERE being the\n"
        "FILE:LINE of its first statement (the design file for findings about ports alone), the\n"
        "statements below it (at most 10), then a summary: findings by severity and kind, ports placed\n"
        "and with an I/O standard, clocks covered by a PERIOD.\n"
        "With --format jsonl each finding is a JSON object with the fields kind, severity, file, line,\n"
        "message, objects and statements (file, line, statement, object, and wins on the statement\n"
        "that wins); the last line is {\"summary\": {...}} with the counts.\n"
        "--report writes one HTML page, without any outside resource, that a browser opens: the\n"
        "findings with links to their statements, then each file's statements with their line, what\n"
        "they resolved to (click a row for the names) and their findings, with filters for unmatched\n"
        "names, overrides and clashes. Adding #s-FILE-LINE to its address (FILE counting the files\n"
        "from 0) opens at that statement, expanded.\n"
        "Exit status: 1 when an error-level finding exists (or the design or a file cannot be read),\n"
        "else 0; 2 for bad usage. See docs/check.md.");
    args.in.AddOptions(cmd);
    cmd->add_option("--format", args.format, "Output format")
        ->check(CLI::IsMember({"text", "jsonl"}))
        ->capture_default_str();
    cmd->add_option("--report", args.report, "Also write the findings and statements as an HTML page");
    cmd->add_option("--disable", args.disable, "Do not look for this kind of finding (repeatable)")
        ->check(CLI::IsMember(KindIds()));
    cmd->callback([&run] { run = [] { return RunCheck(args); }; });
}
