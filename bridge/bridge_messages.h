// The message object of the repository bridge and the texts more than one member issues.
#pragma once

#include "host/port/msgman.h"

namespace luncshelper {

inline Port_MsgManData Msg(int line) { return Port_MsgManData::createObject("Quillmap", "luncshelper", line, "1.0"); }

// The buffer-type errors: with the instance (name, file kind, file, line, file kind) and
// without it (file kind, file, line, file kind).
inline constexpr const char kBufferTypeOnInstance[] =
    "BUFFER_TYPE attribute on AUTOBUF instance <%s> is being modified in %s file %s on line number %i.  This "
    "functionality is not supported in this release of OVI.  It is suggested to remove this line from the %s file "
    "and modify the source code accordingly to modify the buffer spec"
    "ification if needed.\n";
inline constexpr const char kBufferType[] =
    "BUFFER_TYPE attribute on AUTOBUF instance is being modified in %s file %s on line number %i.  This "
    "functionality is not supported in this release of OVI.  It is suggested to remove this line from the %s file "
    "and modify the source code accordingly to modify the buffer spec"
    "ification if needed.\n";

}  // namespace luncshelper
