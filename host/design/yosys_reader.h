// Reader of netlists in the JSON form written by Yosys (write_json).
//
// The design is named after the top module and has one view, "EXPANDED", whose top block is
// named after the top module. Every cell becomes a block named after the cell; a cell whose
// type is a module of the file is expanded below its block. Every netname bit becomes a
// signal, every port bit a pin; connected signals across the hierarchy form networks.
// docs/design-database.md describes the mapping in detail (names, bit order, hidden nets).
#pragma once

#include <cstdint>
#include <memory>

#include "host/design/ndm.h"

// Instances a netlist may expand to unless told otherwise: a module instantiating another
// twice at each of 40 levels stands for 2^40 instances in a few kilobytes, so the expanded
// size is counted before anything is made, and a netlist beyond the limit is refused.
constexpr uint64_t kNdm_MaxCells = 100000000;

// The limit in force: the environment variable LUN_MAX_CELLS when it holds a positive number
// (else a warning), otherwise kNdm_MaxCells.
uint64_t Ndm_DefaultMaxCells();

// Reads path. top_module names the top module; when null, the module with a true "top"
// attribute is taken, else the only module no other module instantiates. max_cells limits the
// blocks of the expanded design (0: Ndm_DefaultMaxCells()); bits, signals and pins are limited
// to what 32-bit counts hold. On a failure that stops reading, one error message naming the file
// is issued; names that no object can carry (empty, holding a NUL byte, or repeated within a
// module) each get one and reading goes on, so that all are listed. Either way null is
// returned.
std::unique_ptr<Ndm_Design> Ndm_ReadYosysJson(const char* path, const char* top_module, uint64_t max_cells = 0);
