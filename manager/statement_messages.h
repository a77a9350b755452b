// Message helpers shared by the manager's statement handlers.
#pragma once

#include "host/parser/pr_logical.h"
#include "host/port/msgman.h"

namespace lunmgr {

// A message object of the manager, issued from the given source line.
inline Port_MsgManData Msg(int line) { return Port_MsgManData::createObject("Quillmap", "lunmgr", line, "1.0"); }
// Line number and source text of a statement (0 and "" without a handle).
inline int LineOf(const Pr_Logical_ConstraintHandle* handle) { return handle ? handle->getline() : 0; }
inline const char* TextOf(const Pr_Logical_ConstraintHandle* handle) { return handle ? handle->return_ascii() : ""; }

}  // namespace lunmgr
