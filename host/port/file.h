// Files and directories.
#pragma once

#include <string>

namespace Port {

class File {
public:
    // True when something exists at path.
    static bool exist(const char* path);
    // Creates the directory (and its parents when parents is true); true on success.
    static bool mkdir(const char* path, bool parents);
};

// Writes a file under a temporary name beside its target and renames it into place on
// Commit, so a reader never sees a half-written file; an uncommitted file is removed.
class AtomicFile {
public:
    explicit AtomicFile(std::string path);
    ~AtomicFile();
    AtomicFile(const AtomicFile&) = delete;
    AtomicFile& operator=(const AtomicFile&) = delete;
    // Appends bytes; false once any write failed.
    bool Write(const char* data, size_t size);
    bool Write(const std::string& text) { return Write(text.data(), text.size()); }
    // Flushes, closes and renames into place; on failure errors() tells why.
    bool Commit();
    const std::string& error() const { return error_; }

private:
    std::string path_;
    std::string temp_;
    void* file_ = nullptr;  // FILE*
    std::string error_;
};

}  // namespace Port
