// The quillmap command line: global options, subcommands, exit status.
#pragma once

#include <functional>
#include <memory>
#include <string>

namespace CLI {
class App;
}
class Ndm_Design;
class Ndm_View;

// Exit statuses of quillmap.
enum QuillmapStatus { kStatusOk = 0, kStatusErrors = 1, kStatusFatal = 2 };

// Options shared by every subcommand.
struct QuillmapOptions {
    std::string messages = "text";  // "text" or "jsonl"
    bool debug = false;
};

// Reads a design file (Yosys JSON netlist or native design file); null after a message.
std::unique_ptr<Ndm_Design> QuillmapLoadDesign(const std::string& path, const std::string& top);

// The view the subcommands work on: EXPANDED, else the first view; null, after an error
// naming the file and what the view was wanted for ("annotate"), when there is none with a
// top block.
Ndm_View* QuillmapWorkView(Ndm_Design& design, const std::string& path, const char* purpose);

// Each subcommand registers itself and sets run to its action, which returns an exit status.
using QuillmapAction = std::function<int()>;
void AddDesignCommands(CLI::App& app, QuillmapAction& run);
void AddAnnotateCommand(CLI::App& app, QuillmapAction& run, const QuillmapOptions& options);
void AddExtractCommand(CLI::App& app, QuillmapAction& run);
void AddPartCommand(CLI::App& app, QuillmapAction& run, const QuillmapOptions& options);

int QuillmapMain(int argc, char** argv);
