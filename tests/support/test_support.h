// Shared helpers of the test programs: scratch directories and small files.
#pragma once

#include <string>

namespace lun_test {

// A fresh directory under the system temporary directory, removed with the object.
class ScratchDir {
public:
    ScratchDir();
    ~ScratchDir();
    ScratchDir(const ScratchDir&) = delete;
    ScratchDir& operator=(const ScratchDir&) = delete;
    const std::string& path() const { return path_; }
    // Writes content to name inside the directory and returns the file's path.
    std::string Write(const std::string& name, const std::string& content) const;

private:
    std::string path_;
};

// Whole content of a file ("" when it cannot be read).
std::string ReadFile(const std::string& path);

// Runs a shell command; returns its exit status and puts stdout/stderr in the strings given.
int RunCommand(const std::string& command, std::string* out = nullptr, std::string* err = nullptr);

}  // namespace lun_test
