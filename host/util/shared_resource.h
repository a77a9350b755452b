// Process-wide registry of shared objects, by key string. The registry does not own what it
// holds: whoever inserts an object deletes it after erasing it.
#pragma once

#include <stdexcept>
#include <string>

namespace Util {

// Thrown when a member is called where it must not be; carries who threw it and where.
class IllegalMethodCalledException : public std::logic_error {
public:
    explicit IllegalMethodCalledException(const std::string& what) : std::logic_error(what) {}
    IllegalMethodCalledException(const std::string& program, const std::string& file, const std::string& revision,
                                 int line, const std::string& message)
        : std::logic_error(message), program_(program), file_(file), revision_(revision), line_(line) {}
    const std::string& program() const { return program_; }
    const std::string& file() const { return file_; }
    const std::string& revision() const { return revision_; }
    int line() const { return line_; }

private:
    std::string program_, file_, revision_;
    int line_ = 0;
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
