// Message texts and helpers shared by the name resolution and the wildcard searches.
#pragma once

#include "host/parser/pr_logical.h"
#include "host/port/msgman.h"

namespace lunfind {

inline Port_MsgManData Msg(int line) {
    return Port_MsgManData::createObject("Quillmap", "lunfind", line, "1.0");
}

inline int LineOf(const Pr_Logical_ConstraintHandle* handle) { return handle ? handle->getline() : 0; }

inline constexpr const char* kInstText =
    "Line %i in '%s': Found case insensitive match for INST name '%s'. INST is '%s'.\n";
inline constexpr const char* kNetText =
    "Line %i in '%s': Found case insensitive match for NET name '%s'. NET is '%s'.\n";
inline constexpr const char* kPinText =
    "Line %i in '%s': Found case insensitive match for PIN name '%s'. PIN is '%s.%s'.\n";
inline constexpr const char* kWildPinText =
    "Line %i in '%s': Found case insensitive match for wild_carded PIN name '%s.%s'. INST is "
    "'%s.%s'.\n";

}  // namespace lunfind
