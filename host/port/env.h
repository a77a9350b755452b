// Environment access.
#pragma once

class Port_Env {
public:
    // Value of the variable, or null when it is not set (an empty value is "set").
    static const char* GetEnv(const char* name);
};
