// Process-wide registry of shared objects, by key string. The registry does not own what it
// holds: whoever inserts an object deletes it after erasing it.
#pragma once

#include <stdexcept>
#include <string>

namespace Util {

class IllegalMethodCalledException : public std::logic_error {
public:
    explicit IllegalMethodCalledException(const std::string& what) : std::logic_error(what) {}
};

namespace Details {

class SharedResourceMgr {
public:
    // The object stored under key, or null.
    static void* find(const char* key);
    // Stores object under key, replacing what was there.
    static void insert(const char* key, void* object);
    // Drops the entry of key.
    static void erase(const char* key);
};

}  // namespace Details
}  // namespace Util
