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
    // What tells one state of a file from another: device, inode, size and modification time
    // ("" when it cannot be examined). Equal identities: the same file, not changed since.
    static std::string Identity(const char* path);
};

}  // namespace Port
