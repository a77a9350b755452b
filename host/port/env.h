// Environment access.
#pragma once

#include <string>

class Port_Env {
public:
    // Value of the variable, or null when it is not set (an empty value is "set").
    static const char* GetEnv(const char* name);
    // Folder of the shipped data files: $LUN_DATA_DIR when it is set and not empty, else the
    // data folder of the installation the loaded library belongs to (share/lun beside its lib
    // folder; the build tree has the same layout); empty when neither can be told.
    static std::string DataDir();
};
