// Files and directories.
#pragma once

#include <string>

#include "host/port/atomic_file.h"  // saving files, for the users of this header

namespace Port {

class File {
public:
    // True when something exists at path.
    static bool exist(const char* path);
    // Creates the directory (and its parents when parents is true); true on success.
    static bool mkdir(const char* path, bool parents);
};

}  // namespace Port
