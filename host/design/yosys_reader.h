// Reader of netlists in the JSON form written by Yosys (write_json).
//
// The design is named after the top module and has one view, "EXPANDED", whose top block is
// named after the top module. Every cell becomes a block named after the cell; a cell whose
// type is a module of the file is expanded below its block. Every netname bit becomes a
// signal, every port bit a pin; connected signals across the hierarchy form networks.
// docs/design-database.md describes the mapping in detail (names, bit order, hidden nets).
#pragma once

#include <memory>

#include "host/design/ndm.h"

// Reads path. top_module names the top module; when null, the module with a true "top"
// attribute is taken, else the only module no other module instantiates. On any failure one
// error message naming the file is issued and null is returned.
std::unique_ptr<Ndm_Design> Ndm_ReadYosysJson(const char* path, const char* top_module);
