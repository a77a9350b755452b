// The part subcommand, and the part reading that annotate does before annotating a UCF.
#include <CLI/CLI.hpp>
#include <iostream>
#include <string>
#include <vector>

#include "extract/cst_extractor.h"
#include "host/design/ndm.h"
#include "host/port/msgman.h"
#include "host/port/ut_str.h"
#include "part/lunpart.h"
#include "quillmap/app.h"

namespace {

// The part reader as annotate runs it ahead of the manager over a UCF: it keeps only the PART
// (the manager passes over a UCF's PART and stores every other CONFIG setting itself), is
// silent about parse errors, which the manager reports, and warns when the PART constraint of
// an INST, NET or PIN statement replaces a different part read before.
class UcfPartReader : public Ta_LunPart {
public:
    using Ta_LunPart::Ta_LunPart;
    bool cb_config(const char* name, const char* value, const Pr_Logical_ConstraintHandle* handle) override {
        return UT_STR::ICompare(name, "PART") != 0 || Ta_LunPart::cb_config(name, value, handle);
    }
    bool cb_comp(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) override {
        return Watch(defn, handle, [&] { return Ta_LunPart::cb_comp(defn, handle); });
    }
    bool cb_net(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) override {
        return Watch(defn, handle, [&] { return Ta_LunPart::cb_net(defn, handle); });
    }
    bool cb_pin(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle) override {
        return Watch(defn, handle, [&] { return Ta_LunPart::cb_pin(defn, handle); });
    }
    bool cb_error(int, int, const char*) override { return true; }
    bool cb_syntax_error(int, int, const char*, const Pr_Logical_ConstraintHandle*) override { return true; }

private:
    std::string Part() {
        Ndm_Block* config = view && view->GetBlock() ? FindConstraintBlock(view->GetBlock(), "CONFIG") : nullptr;
        const Ndm_Property* part = config ? config->GetPropertyByName("PART") : nullptr;
        return part && part->GetValueString() ? part->GetValueString() : "";
    }
    // Statements without a PART constraint (nearly all) go straight through: looking for the
    // CONFIG block searches the hierarchy.
    template <class F>
    bool Watch(const Pr_Logical_ConstraintDefn& defn, const Pr_Logical_ConstraintHandle* handle, F&& handle_statement) {
        bool part = false;
        for (auto it = defn.begin_constraint(); it != defn.end_constraint(); ++it)
            part = part || ((*it)->get_type() == Pr_Logical_Constraint::STRING && UT_STR::Compare((*it)->get_name(), "PART") == 0);
        if (!part) return handle_statement();
        std::string before = Part();
        bool ok = handle_statement();
        std::string after = Part();
        if (!before.empty() && after != before)
            QuillmapMsg(__LINE__).issueWarning("Line %i in '%s': PART = %s replaces the part %s read before.\n",
                                       handle ? handle->getline() : 0, constraint_filename, after.c_str(),
                                       before.c_str());
        return ok;
    }
};

bool IsConfigBlock(const Ndm_Block* b) {
    const Ndm_Property* type = b->GetPropertyByName("TYPE");
    return type && type->GetValueString() && std::string(type->GetValueString()) == "CONFIG";
}

struct PartArgs {
    std::vector<std::string> files;
    std::string filter;
    bool ncf = false;
};

CP_FILE_TYPE KindOf(const std::string& path, bool force_ncf) {
    if (force_ncf) return CP_NCF;
    auto dot = path.rfind('.');
    std::string ext = dot == std::string::npos ? "" : path.substr(dot + 1);
    for (char& c : ext) c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return ext == "ncf" ? CP_NCF : CP_UCF;
}

// The settings of one CONFIG block as "NAME = value" lines: PART first, then the others in
// the order they were read.
std::vector<std::string> SettingLines(const Ndm_Block* config) {
    std::vector<std::string> lines;
    const Ndm_Property* part = config->GetPropertyByName("PART");
    if (part && part->GetValueString()) lines.push_back(std::string("PART = ") + part->GetValueString());
    for (const Ndm_Property* p : config->GetPropertyItr()) {
        std::string name = p->GetName();
        if (p == part || CstExtractor::IsBookkeepingProperty(name.c_str())) continue;
        if (p->GetType() == NDM_PROP_STRING_LIST) {
            for (const std::string& text : p->GetStrings()) lines.push_back(name + " = " + text);
        } else if (p->GetValueString()) {
            lines.push_back(name + " = " + p->GetValueString());
        } else if (p->GetType() == NDM_PROP_INT32) {
            lines.push_back(name + " = " + std::to_string(p->GetInt32()));
        }
    }
    return lines;
}

int RunPart(const PartArgs& args, const QuillmapOptions& options) {
    // Each file is read on its own, onto the CONFIG block of an otherwise empty design, so that
    // the settings of every file are shown (a UCF reader does not see an NCF's block).
    std::vector<QuillmapPartSource> parts;
    std::vector<std::string> out;
    for (const std::string& file : args.files) {
        Ndm_Design design("part");
        Ndm_View* view = design.CreateView("EXPANDED");
        Ndm_Block* top = view->CreateTopBlock("top");
        Ta_LunPart reader(file.c_str(), KindOf(file, args.ncf), args.filter.empty() ? nullptr : args.filter.c_str());
        if (options.debug) reader.set_debug_callbacks();
        reader.annotate(view);
        for (const Ndm_Block* b : top->GetBlockItr()) {
            if (!IsConfigBlock(b)) continue;
            const Ndm_Property* part = b->GetPropertyByName("PART");
            if (part && part->GetValueString()) parts.push_back({file, part->GetValueString()});
            for (const std::string& line : SettingLines(b))
                out.push_back(args.files.size() > 1 ? file + ": " + line : line);
        }
    }
    if (parts.empty()) QuillmapMsg(__LINE__).issueWarning("No PART setting found in the constraint files.\n");
    QuillmapWarnDifferentParts(parts, {});
    for (const std::string& line : out) std::cout << line << "\n";
    std::cout.flush();
    return kStatusOk;
}

}  // namespace

void QuillmapReadUcfPart(Ndm_View* view, const std::string& file, std::shared_ptr<const Pr_FileText> text,
                         const std::string& filter, bool debug) {
    UcfPartReader reader(file.c_str(), CP_UCF, filter.empty() ? nullptr : filter.c_str());
    reader.set_text(std::move(text));
    if (debug) reader.set_debug_callbacks();
    reader.annotate(view);
}

std::vector<std::pair<const Ndm_Block*, std::string>> QuillmapPartsOf(const Ndm_View* view) {
    std::vector<std::pair<const Ndm_Block*, std::string>> parts;
    if (!view || !view->GetBlock()) return parts;
    std::vector<const Ndm_Block*> stack{view->GetBlock()};
    while (!stack.empty()) {
        const Ndm_Block* b = stack.back();
        stack.pop_back();
        if (IsConfigBlock(b)) {
            const Ndm_Property* part = b->GetPropertyByName("PART");
            if (part && part->GetValueString()) parts.emplace_back(b, part->GetValueString());
        }
        auto children = b->GetBlockItr();
        for (size_t i = children.size(); i-- > 0;) stack.push_back(children[i]);
    }
    return parts;
}

void QuillmapWarnDifferentParts(const std::vector<QuillmapPartSource>& parts, const std::vector<std::string>& kept) {
    bool differ = false;
    for (const QuillmapPartSource& p : parts) differ = differ || p.part != parts.front().part;
    if (!differ) return;
    std::string list, after;
    for (const QuillmapPartSource& p : parts)
        list += (list.empty() ? "" : ", ") + ("PART = " + p.part + " in '" + p.source + "'");
    for (const std::string& part : kept) after += (after.empty() ? "" : ", ") + ("PART = " + part);
    if (kept.empty())
        QuillmapMsg(__LINE__).issueWarning("The constraint files name different parts: %s.\n", list.c_str());
    else
        QuillmapMsg(__LINE__).issueWarning("The constraint files name different parts: %s. The design keeps %s.\n",
                                   list.c_str(), after.c_str());
}

void AddPartCommand(CLI::App& app, QuillmapAction& run, const QuillmapOptions& options) {
    static PartArgs args;
    CLI::App* cmd = app.add_subcommand(
        "part",
        "Print the target part and the global CONFIG settings of constraint files, without a netlist.");
    cmd->footer(
        "\nOnly CONFIG NAME = value statements and the PART constraints of INST, NET and PIN\n"
        "statements are read (not PROHIBIT, VREF, timing or group statements); no design object\n"
        "is looked up. Each file is read on its own.\n"
        "Output: \"PART = <part>\" first, then one \"NAME = value\" line per other setting, in\n"
        "file order; with several files, the lines of each file in turn, each starting with the\n"
        "file name and \": \". A warning names every file and part when the files name different\n"
        "parts, and another says so when none names one. INTERNAL_VREF_BANKn and DCI_CASCADE\n"
        "settings are not kept. A second CONFIG PART in one file is a fatal error (exit status 2).\n"
        "Files ending in .ncf are read as netlist constraints files, others as user constraints\n"
        "files.");
    cmd->add_option("FILE", args.files, "Constraint files, read in the order given")->required();
    cmd->add_option("--filter", args.filter, "Property definition file (default: ucf.pfd from the data folder)");
    cmd->add_flag("--ncf", args.ncf, "Read every file as a netlist constraints file");
    cmd->callback([&run, &options] { run = [&options] { return RunPart(args, options); }; });
}
