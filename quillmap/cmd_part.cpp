// The part subcommand: reads the target part and the global settings of constraint files.
#include <CLI/CLI.hpp>
#include <iostream>
#include <string>
#include <vector>

#include "extract/cst_extractor.h"
#include "host/design/ndm.h"
#include "host/port/msgman.h"
#include "part/lunpart.h"
#include "quillmap/app.h"

namespace {

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

int RunPart(const PartArgs& args, const QuillmapOptions& options) {
    // The settings land on the CONFIG block of an otherwise empty design.
    Ndm_Design design("part");
    Ndm_View* view = design.CreateView("EXPANDED");
    Ndm_Block* top = view->CreateTopBlock("top");
    for (const std::string& file : args.files) {
        Ta_LunPart reader(file.c_str(), KindOf(file, args.ncf), args.filter.empty() ? nullptr : args.filter.c_str());
        if (options.debug) reader.set_debug_callbacks();
        reader.annotate(view);
    }
    const Ndm_Block* config = nullptr;
    for (const Ndm_Block* b : top->GetBlockItr()) {
        const Ndm_Property* type = b->GetPropertyByName("TYPE");
        if (type && type->GetValueString() && std::string(type->GetValueString()) == "CONFIG") config = b;
    }
    const Ndm_Property* part = config ? config->GetPropertyByName("PART") : nullptr;
    if (!part) {
        Port_MsgManData::createObject("Quillmap", "quillmap", __LINE__, "1.0")
            .issueWarning("No PART setting found in the constraint files.\n");
    }
    if (config) {
        // PART first, then every other setting in the order it was read.
        if (part && part->GetValueString()) std::cout << "PART = " << part->GetValueString() << "\n";
        for (const Ndm_Property* p : config->GetPropertyItr()) {
            std::string name = p->GetName();
            if (p == part || CstExtractor::IsBookkeepingProperty(name.c_str())) continue;
            if (p->GetType() == NDM_PROP_STRING_LIST) {
                for (const std::string& text : p->GetStrings()) std::cout << name << " = " << text << "\n";
            } else if (p->GetValueString()) {
                std::cout << name << " = " << p->GetValueString() << "\n";
            } else if (p->GetType() == NDM_PROP_INT32) {
                std::cout << name << " = " << p->GetInt32() << "\n";
            }
        }
    }
    std::cout.flush();
    return kStatusOk;
}

}  // namespace

void AddPartCommand(CLI::App& app, QuillmapAction& run, const QuillmapOptions& options) {
    static PartArgs args;
    CLI::App* cmd = app.add_subcommand(
        "part",
        "Print the target part and the global CONFIG settings of constraint files, without a netlist.");
    cmd->footer(
        "\nOnly CONFIG statements and the PART constraints of INST, NET and PIN statements are read;\n"
        "no design object is looked up. Output: \"PART = <part>\" first, then one \"NAME = value\"\n"
        "line per other setting, in file order. Settings of INTERNAL_VREF_BANKn and DCI_CASCADE are\n"
        "not kept. A second CONFIG PART is a fatal error (exit status 2). Files ending in .ncf are read\n"
        "as netlist constraints files, others as user constraints files.");
    cmd->add_option("FILE", args.files, "Constraint files, read in the order given")->required();
    cmd->add_option("--filter", args.filter, "Property definition file (default: ucf.pfd from the data folder)");
    cmd->add_flag("--ncf", args.ncf, "Read every file as a netlist constraints file");
    cmd->callback([&run, &options] { run = [&options] { return RunPart(args, options); }; });
}
