// Stable text form of a whole design, for tests, diffs and debugging: one object per line,
// indented by depth, its properties on the lines below it. docs/design-database.md describes
// the form.
#pragma once

#include <ostream>

#include "host/design/ndm.h"

void Ndm_Dump(const Ndm_Design& design, std::ostream& out);
