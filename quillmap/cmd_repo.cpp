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

// What one constraint resolved to and what overrides it: from the bound design, else from the
// names the repository was committed with.
struct Resolved {
    bool shown = false;  // not for design-wide constraints
    std::vector<std::string> objects;
    size_t count = 0;
    std::vector<std::pair<const Cs_Constraint*, std::string>> overrides;  // by, on which object ("": none)
};

Resolved ResolvedOf(const Cs_ConstraintMgr& mgr, const Cs_Constraint& c, size_t names) {
    Resolved r;
    r.shown = !c.IsAssociationExempt();
    const auto& objects = c.GetAssociatedDesignObjs();
    const Cs_ConstraintMgr::CommittedNames* committed = mgr.GetDesign() ? nullptr : mgr.GetCommittedNames(c);
    if (committed) {
        r.count = committed->objects.size();
        for (size_t i = 0; i < r.count && i < names; ++i) r.objects.push_back(committed->objects[i]);
        r.overrides = committed->overrides;
    } else {
        r.count = objects.size();
        for (size_t i = 0; i < r.count && i < names; ++i) r.objects.push_back(objects[i]->GetFullName());
    }
    for (const Cs_Conflict& k : c.GetConflicts())
        if (k.GetType() == Cs_Conflict::OVERRIDE && k.GetConflictingConstraint())
            r.overrides.emplace_back(k.GetConflictingConstraint(),
                                     k.GetDesignEntity() ? k.GetDesignEntity()->GetFullName() : std::string());
    return r;
}

std::string Where(const Cs_Constraint& c) {
    const Cs_SourceFile* source = c.GetSourceInfo()->GetSourceFile();
    if (!source || !source->GetFile()) return "(no file)";
    return std::string(source->GetFile()) + ":" + std::to_string(source->GetLine());
}

std::string Setting(const Cs_Constraint& c) {
    if (c.IsFlag() || !*c.GetValueText()) return c.GetAttribute();
    return std::string(c.GetAttribute()) + " = " + c.GetValueText();
}

void PrintText(const Cs_Constraint& c, const Resolved& r, std::string& out) {
    out += Where(c) + "  " + c.GetType().GetName() + "  " + Setting(c) + "  [" + c.GetStatementText() + "]";
    if (r.shown) {
        out += "  objects " + std::to_string(r.count);
        for (size_t i = 0; i < r.objects.size(); ++i) out += (i ? ", " : ": ") + r.objects[i];
        if (r.count > r.objects.size()) out += ", ...";
    }
    for (const auto& [by, object] : r.overrides) {
        out += "  overridden by " + (by ? Where(*by) : std::string("(unknown)"));
        if (!object.empty()) out += " on " + object;
    }
    out += '\n';
}

void AppendLocation(const Cs_Constraint* c, std::string& out) {
    const Cs_SourceFile* source = c ? c->GetSourceInfo()->GetSourceFile() : nullptr;
    out += "\"file\":";
    if (source && source->GetFile())
        Port_AppendJsonString(out, source->GetFile());
    else
        out += "null";
    out += ",\"line\":" + std::to_string(source ? source->GetLine() : 0);
}

void PrintJson(const Cs_Constraint& c, const Resolved& r, std::string& out) {
    out += '{';
    AppendLocation(&c, out);
    out += ",\"type\":";
    Port_AppendJsonString(out, c.GetType().GetName());
    out += ",\"attribute\":";
    Port_AppendJsonString(out, c.GetAttribute());
    out += ",\"value\":";
    Port_AppendJsonString(out, c.GetValueText());
    out += ",\"statement\":";
    Port_AppendJsonString(out, c.GetStatementText());
    if (r.shown) {
        out += ",\"object_count\":" + std::to_string(r.count) + ",\"objects\":[";
        for (size_t i = 0; i < r.objects.size(); ++i) {
            if (i) out += ',';
            Port_AppendJsonString(out, r.objects[i]);
        }
        out += ']';
    }
    out += ",\"overridden_by\":[";
    for (size_t i = 0; i < r.overrides.size(); ++i) {
        out += i ? ",{" : "{";
        AppendLocation(r.overrides[i].first, out);
        out += ",\"object\":";
        if (r.overrides[i].second.empty())
            out += "null";
        else
            Port_AppendJsonString(out, r.overrides[i].second);
        out += '}';
    }
    out += "]}\n";
}

int RunRepo(const RepoArgs& args) {
    auto msg = QuillmapMsg(__LINE__);
    if (!QuillmapProjectNameIsValid(args.project)) return kStatusFatal;
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
        const Resolved resolved = ResolvedOf(mgr, *c, args.names);
        if (args.format == "jsonl")
            PrintJson(*c, resolved, out);
        else
            PrintText(*c, resolved, out);
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
        "TYPE is the repository's class of the constraint (Locate, IOStandard, TimeSpec, ...; Unsupported\n"
        "for attributes kept as plain text), STATEMENT the statement it came from, blanks folded.\n"
        "A constraint of an INST, NET or PIN statement shows how many objects it resolved to and the\n"
        "full names of the first few (--names); design-wide constraints (timing, groups, CONFIG) show\n"
        "none. \"overridden by\" names each later statement that sets the same attribute to another\n"
        "value, and the object it does so on. With --design the names are resolved in that design;\n"
        "without it, they are those the repository resolved when it was last written.\n"
        "With --format jsonl each line is a JSON object with the fields file, line, type, attribute,\n"
        "value, statement, object_count and objects (not for design-wide constraints), and\n"
        "overridden_by (a list of objects with file, line and object).");
    cmd->add_option("PROJECT", args.project, "Project file given to annotate --project")->required();
    cmd->add_option("--design", args.design, "Yosys JSON netlist or native design file to resolve the names in");
    cmd->add_option("--top", args.top, "Top module of a Yosys netlist (default: the module marked top)");
    cmd->add_option("--format", args.format, "Output format")
        ->check(CLI::IsMember({"text", "jsonl"}))
        ->capture_default_str();
    cmd->add_option("--names", args.names, "How many object names to show per constraint")->capture_default_str();
    cmd->callback([&run] { run = [] { return RunRepo(args); }; });
}
