// Placeholder until the design commands land.
#include "quillmap/app.h"
void AddDesignCommands(CLI::App&, QuillmapAction&) {}
