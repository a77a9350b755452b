// The native design file: a JSON file holding a whole design database losslessly (names,
// hierarchy, connectivity, networks and every property). docs/design-format.md describes it.
#pragma once

#include <memory>

#include "host/design/ndm.h"

// Writes design to path (through a temporary file renamed into place). On failure one error
// message naming the file is issued and false is returned.
bool Ndm_WriteNative(const Ndm_Design& design, const char* path);

// Reads a native design file; on failure one error message naming the file (and the byte
// offset for malformed input) is issued and null is returned.
std::unique_ptr<Ndm_Design> Ndm_ReadNative(const char* path);

// True when the text starts like a native design file (its "format" marker comes first).
bool Ndm_IsNativeText(const char* text, size_t size);
