// An ordered group of file names handed from the host to the library.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

class Util_FNameGroup {
public:
    // Appends a file name.
    void add_fname(const char* name) { names_.emplace_back(name ? name : ""); }
    // The name at index, or null past the end.
    const char* get_fname(uint16_t index) const {
        return index < names_.size() ? names_[index].c_str() : nullptr;
    }
    int num_fnames() const { return static_cast<int>(names_.size()); }

private:
    std::vector<std::string> names_;
};
