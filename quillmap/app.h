// The quillmap command line: global options, subcommands, exit status.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace CLI {
class App;
class Option;
}
class Ndm_Block;
class Ndm_Design;
class Ndm_View;
class Pr_FileText;
class Port_MsgManData;

// The message object of quillmap's own messages.
Port_MsgManData QuillmapMsg(int line);

// Exit statuses of quillmap.
enum QuillmapStatus { kStatusOk = 0, kStatusErrors = 1, kStatusFatal = 2 };

// Options shared by every subcommand.
struct QuillmapOptions {
    std::string messages = "text";  // "text" or "jsonl"
    bool debug = false;
    uint64_t max_cells = 0;  // 0: the library's default
};

// False, after an error naming both, when output (if given) is the same file as one of the
// inputs: quillmap never writes over what it reads.
bool QuillmapOutputIsNew(const std::string& output, const std::vector<std::string>& inputs);

// Reads a design file (Yosys JSON netlist or native design file); null after a message.
std::unique_ptr<Ndm_Design> QuillmapLoadDesign(const std::string& path, const std::string& top);
// The limit on the instances a netlist may expand to for every later load (the global option
// --max-cells); 0 leaves the library's default (LUN_MAX_CELLS, else 100,000,000).
void QuillmapSetMaxCells(uint64_t max_cells);

// The view the subcommands work on: EXPANDED, else the first view; null, after an error
// naming the file and what the view was wanted for ("annotate"), when there is none with a
// top block.
Ndm_View* QuillmapWorkView(Ndm_Design& design, const std::string& path, const char* purpose);

// A constraint file of the command line, and whether it is an NCF (else a UCF).
struct QuillmapConstraintFile {
    bool ncf;
    std::string path;
};
// What a subcommand reads: a design (DESIGN, --top) and constraint files (--ucf and --ncf, each
// repeatable).
class QuillmapInputs {
public:
    std::string design;
    std::string top;
    std::vector<std::string> ucf;
    std::vector<std::string> ncf;
    // Adds the options to cmd.
    void AddOptions(CLI::App* cmd);
    // The constraint files in the order they were given.
    std::vector<QuillmapConstraintFile> FilesInOrder() const;
    // The design and every constraint file, for QuillmapOutputIsNew.
    std::vector<std::string> Paths() const;

private:
    const CLI::App* cmd_ = nullptr;
    const CLI::Option* ucf_opt_ = nullptr;
    const CLI::Option* ncf_opt_ = nullptr;
};

// Each subcommand registers itself and sets run to its action, which returns an exit status.
using QuillmapAction = std::function<int()>;
void AddDesignCommands(CLI::App& app, QuillmapAction& run);
void AddAnnotateCommand(CLI::App& app, QuillmapAction& run, const QuillmapOptions& options);
void AddExtractCommand(CLI::App& app, QuillmapAction& run);
void AddPartCommand(CLI::App& app, QuillmapAction& run, const QuillmapOptions& options);
void AddCheckCommand(CLI::App& app, QuillmapAction& run);

// Part reading, shared by annotate and part (cmd_part.cpp).
// Runs the part reader over a UCF (its text read beforehand), keeping only its PART, as a host
// does before annotating.
void QuillmapReadUcfPart(Ndm_View* view, const std::string& file, std::shared_ptr<const Pr_FileText> text,
                         const std::string& filter, bool debug);
// The PART texts of the view's CONFIG blocks, in preorder of the blocks.
std::vector<std::pair<const Ndm_Block*, std::string>> QuillmapPartsOf(const Ndm_View* view);
// Where a part was named: a file (or design) and the part.
struct QuillmapPartSource {
    std::string source;
    std::string part;
};
// One warning naming every source when they name different parts, and the parts a design
// keeps in the end (none given: files read on their own).
void QuillmapWarnDifferentParts(const std::vector<QuillmapPartSource>& parts, const std::vector<std::string>& kept);

// The repository road of annotate (repository_road.cpp).
struct QuillmapRoadRequest {
    std::string design;
    std::string top;
    std::vector<std::string> ucf;  // in the order given
    bool has_ncf = false;
    std::string project;           // the project file; the repository lives beside it
    std::string drc;               // the DRC level for the run; empty: ZEP_QUILLMAP_CONSTRAINT_DRC
    bool allow_unmatched_io = false;
    bool allow_unmatched_maxdelay = false;
    std::string output;
    std::string file_road_options;  // options given that only the file road uses, for the message
};
// Runs the constraint files through the repository bridge by its mode; modes that do not use
// the repository run file_road, the annotators as without a project.
int QuillmapRepositoryRoad(const QuillmapRoadRequest& request, const std::function<int()>& file_road);
void AddRepoCommand(CLI::App& app, QuillmapAction& run);
// False, after an error, when a project file name does not end in a three-letter extension:
// the repository is kept in the folder named by the rest of it.
bool QuillmapProjectNameIsValid(const std::string& project);

int QuillmapMain(int argc, char** argv);
