// Loading a design from either of its file forms.
#pragma once

#include <cstdint>
#include <memory>

#include "host/design/ndm.h"

// Loads a native design file (told apart by its "format": "lun-design" marker) or else a
// Yosys JSON netlist. top_module chooses the top module of a netlist (null: found from the
// file); for a native file it must be null or name the stored design. max_cells limits the
// instances a netlist may expand to (0: Ndm_DefaultMaxCells(), see yosys_reader.h). On failure
// an error message naming the file is issued and null is returned.
std::unique_ptr<Ndm_Design> Ndm_LoadDesign(const char* path, const char* top_module, uint64_t max_cells = 0);
