// The repo subcommand: what a project's constraint repository holds, one constraint per line,
// with where it was read, what it resolved to and what overrides it.
#include <CLI/CLI.hpp>
#include <cstdio>
#include <string>

#include "bridge/luncshelper.h"
#include "host/design/ndm.h"
#include "host/port/file.h"
#include "host/port/json_text.h"
#include "host/port/msgman.h"
#include "quillmap/app.h"

namespace {

struct RepoArgs {
    std::string project;
    std::string design;
    std::string top;
    std::string format = "text";
    size_t names = 3;
};

std::string Where(const Cs_Constraint& c) {
    const Cs_SourceFile* source = c.GetSourceInfo()->GetSourceFile();
    if (!source || !source->GetFile()) return "(no file)";
    return std::string(source->GetFile()) + ":" + std::to_string(source->GetLine());
}

std::string Setting(const Cs_Constraint& c) {
    if (c.IsFlag() || !*c.GetValueText()) return c.GetAttribute();
    return std::string(c.GetAttribute()) + " = " + c.GetValueText();
}

void PrintText(const Cs_Constraint& c, const RepoArgs& args, bool bound, std::string& out) {
    out += Where(c) + "  " + c.GetType().GetName() + "  " + Setting(c) + "  [" + c.GetStatementText() + "]";
    const auto& objects = c.GetAssociatedDesignObjs();
    if (bound && !c.IsAssociationExempt()) {
        out += "  objects " + std::to_string(objects.size());
        for (size_t i = 0; i < objects.size() && i < args.names; ++i)
            out += (i ? ", " : ": ") + objects[i]->GetFullName();
        if (objects.size() > args.names) out += ", ...";
    }
    for (const Cs_Conflict& k : c.GetConflicts()) {
        if (k.GetType() != Cs_Conflict::OVERRIDE || !k.GetConflictingConstraint()) continue;
        out += "  overridden by " + Where(*k.GetConflictingConstraint());
        if (k.GetDesignEntity()) out += " on " + k.GetDesignEntity()->GetFullName();
    }
    out += '\n';
}

void PrintJson(const Cs_Constraint& c, const RepoArgs& args, bool bound, std::string& out) {
    const Cs_SourceFile* source = c.GetSourceInfo()->GetSourceFile();
    out += "{\"file\":";
    if (source && source->GetFile())
        Port_AppendJsonString(out, source->GetFile());
    else
        out += "null";
    out += ",\"line\":" + std::to_string(source ? source->GetLine() : 0) + ",\"type\":";
    Port_AppendJsonString(out, c.GetType().GetName());
    out += ",\"attribute\":";
    Port_AppendJsonString(out, c.GetAttribute());
    out += ",\"value\":";
    Port_AppendJsonString(out, c.GetValueText());
    out += ",\"statement\":";
    Port_AppendJsonString(out, c.GetStatementText());
    if (bound && !c.IsAssociationExempt()) {
        const auto& objects = c.GetAssociatedDesignObjs();
        out += ",\"object_count\":" + std::to_string(objects.size()) + ",\"objects\":[";
        for (size_t i = 0; i < objects.size() && i < args.names; ++i) {
            if (i) out += ',';
            Port_AppendJsonString(out, objects[i]->GetFullName());
        }
        out += ']';
    }
    out += ",\"overridden_by\":[";
    bool first = true;
    for (const Cs_Conflict& k : c.GetConflicts()) {
        const Cs_Constraint* by = k.GetConflictingConstraint();
        if (k.GetType() != Cs_Conflict::OVERRIDE || !by) continue;
        const Cs_SourceFile* at = by->GetSourceInfo()->GetSourceFile();
        out += first ? "{\"file\":" : ",{\"file\":";
        first = false;
        if (at && at->GetFile())
            Port_AppendJsonString(out, at->GetFile());
        else
            out += "null";
        out += ",\"line\":" + std::to_string(at ? at->GetLine() : 0) + ",\"object\":";
        if (k.GetDesignEntity())
            Port_AppendJsonString(out, k.GetDesignEntity()->GetFullName());
        else
            out += "null";
        out += '}';
    }
    out += "]}\n";
}

int RunRepo(const RepoArgs& args) {
    auto msg = Port_MsgManData::createObject("Quillmap", "quillmap", __LINE__, "1.0");
    const std::string path = Ta_LunCSHelper::RepositoryPath(Port::StringBase<char>(args.project)).str();
    if (!Port::File::exist(path.c_str())) {
        msg.issueError("Project '%s' has no constraint repository: '%s' does not exist.\n", args.project.c_str(),
                       path.c_str());
        return kStatusErrors;
    }
    std::unique_ptr<Ndm_Design> design;
    Cs_ConstraintMgr mgr;
    if (!args.design.empty()) {
        design = QuillmapLoadDesign(args.design, args.top);
        if (!design) return kStatusErrors;
        if (!QuillmapWorkView(*design, args.design, "list the constraints on")) return kStatusErrors;
        mgr.SetDesign(design.get());
    }
    Cs_ReturnCode restored = mgr.Restore(Port::StringBase<char>(path));
    if (!restored) {
        restored.Report();
        return kStatusErrors;
    }
    std::string out;
    for (const Cs_Constraint* c : mgr.GetConstraints(Cs_ConstraintMgr::ACTIVE)) {
        if (args.format == "jsonl")
            PrintJson(*c, args, design != nullptr, out);
        else
            PrintText(*c, args, design != nullptr, out);
        if (out.size() > (1 << 16)) {
            std::fwrite(out.data(), 1, out.size(), stdout);
            out.clear();
        }
    }
    std::fwrite(out.data(), 1, out.size(), stdout);
    return std::fflush(stdout) == 0 ? kStatusOk : kStatusErrors;
}

}  // namespace

void AddRepoCommand(CLI::App& app, QuillmapAction& run) {
    static RepoArgs args;
    CLI::App* cmd = app.add_subcommand(
        "repo",
        "List what a project's constraint repository holds.\n"
        "One constraint per line, in the order of the files and lines it was read from:\n"
        "  FILE:LINE  TYPE  ATTRIBUTE = VALUE  [STATEMENT]  objects N: NAME, ...  overridden by FILE:LINE on OBJECT\n"
        "TYPE is the repository's class of the constraint (Locate, IOStandard, TimeSpec, ...; Unsupported for\n"
        "attributes kept as plain text), STATEMENT the statement it came from with its blanks folded.\n"
        "With --design the repository is bound to the design, and each constraint of an INST, NET or PIN\n"
        "statement shows how many objects it resolved to and the full names of the first few; design-wide\n"
        "constraints (timing, groups, CONFIG) show none. \"overridden by\" names each later statement that\n"
        "sets the same attribute to another value, and the object it does so on. Without --design, only\n"
        "design-wide overrides are shown. With --format jsonl each line is a JSON object with the fields\n"
        "file, line, type, attribute, value, statement, object_count and objects (with --design), and\n"
        "overridden_by (a list of file, line, object).");
    cmd->add_option("PROJECT", args.project, "Project file given to annotate --project")->required();
    cmd->add_option("--design", args.design, "Yosys JSON netlist or native design file to resolve the names in");
    cmd->add_option("--top", args.top, "Top module of a Yosys netlist (default: the module marked top)");
    cmd->add_option("--format", args.format, "Output format")
        ->check(CLI::IsMember({"text", "jsonl"}))
        ->capture_default_str();
    cmd->add_option("--names", args.names, "How many object names to show per constraint")->capture_default_str();
    cmd->callback([&run] { run = [] { return RunRepo(args); }; });
}
