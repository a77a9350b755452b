// Saving a file safely: every file the tools write (native designs, constraint text, dumps, the
// repository) goes through AtomicFile, so that a reader never sees half a file, a crash or a
// full disk never destroys the previous one, and what is replaced is only ever a regular file.
#pragma once

#include <string>

namespace Port {

// For tests: called at each step of a save ("open", "write", "sync", "rename", "close"); false
// makes that step fail as an I/O error would (a failed write as a full disk). Null by default.
using SaveFaultHook = bool (*)(const char* step);
void SetSaveFaultHook(SaveFaultHook hook);

// Whether two paths name one file (the same device and inode); false when either is missing.
bool SameFile(const std::string& a, const std::string& b);

// Writes a file under a temporary name in its target's directory and moves it into place on
// Commit: synced before and after the rename, with the mode of the file it replaces. A symbolic
// link is written through to the file it names. The target is refused, before anything is
// written, when it is not a regular file (a directory, a FIFO, a device), when it is read-only,
// or when it is a link to nothing. An uncommitted file is removed, also when the process is
// stopped by SIGINT or SIGTERM; temporaries left by a process that died otherwise are removed
// by the next save of the same target.
class AtomicFile {
public:
    // How the content gets into the temporary file: through Write, or by the caller itself
    // (a database engine), which then writes to temp_path().
    enum Content { kWrite, kByCaller };

    explicit AtomicFile(std::string path, Content content = kWrite);
    ~AtomicFile();
    AtomicFile(const AtomicFile&) = delete;
    AtomicFile& operator=(const AtomicFile&) = delete;

    // Appends bytes; false once anything failed.
    bool Write(const char* data, size_t size);
    bool Write(const std::string& text) { return Write(text.data(), text.size()); }
    // Flushes, syncs, closes and renames into place; on failure error() tells why.
    bool Commit();
    // Why the target was refused or the save failed ("" while all is well).
    const std::string& error() const { return error_; }
    // The temporary file's path (kByCaller: where the caller writes).
    const std::string& temp_path() const { return temp_; }

private:
    bool Fail(const std::string& what, int err);

    std::string path_;    // as given, for messages
    std::string target_;  // the file replaced: path_, or what its links name
    std::string temp_;
    int fd_ = -1;
    int slot_ = -1;  // entry in the list of temporaries removed on a signal
    std::string error_;
};

}  // namespace Port
