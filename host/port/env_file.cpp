#include <dlfcn.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <cstdio>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <cwchar>
#include <filesystem>
#include <string>

#include "host/port/env.h"
#include "host/port/file.h"
#include "host/port/stream.h"

// The data folder relative to the folder of the library (set by the build from the install
// layout).
#ifndef LUN_DATA_FROM_LIB
#define LUN_DATA_FROM_LIB "../share/lun"
#endif

const char* Port_Env::GetEnv(const char* name) { return name ? std::getenv(name) : nullptr; }

std::string Port_Env::DataDir() {
    const char* env = GetEnv("LUN_DATA_DIR");
    if (env && *env) return env;
    // The file this object was loaded from: the shared library (or the program it is linked
    // into), found wherever it was installed or moved to.
    static const char anchor = 0;
    Dl_info info{};
    if (!::dladdr(&anchor, &info) || !info.dli_fname || !*info.dli_fname) return "";
    std::error_code ec;
    std::filesystem::path library = std::filesystem::weakly_canonical(info.dli_fname, ec);
    if (ec) return "";
    return (library.parent_path() / LUN_DATA_FROM_LIB).lexically_normal().string();
}

namespace Port {

bool File::exist(const char* path) {
    struct stat st;
    return path && ::stat(path, &st) == 0;
}

std::string File::Identity(const char* path) {
    struct stat st;
    if (!path || ::stat(path, &st) != 0) return {};
    return std::to_string(st.st_dev) + ":" + std::to_string(st.st_ino) + ":" + std::to_string(st.st_size) + ":" +
           std::to_string(st.st_mtim.tv_sec) + "." + std::to_string(st.st_mtim.tv_nsec);
}

bool File::mkdir(const char* path, bool parents) {
    if (!path || !*path) return false;
    if (parents) {
        std::string p(path);
        for (size_t i = 1; i < p.size(); ++i) {
            if (p[i] != '/') continue;
            std::string prefix = p.substr(0, i);
            if (!exist(prefix.c_str()) && ::mkdir(prefix.c_str(), 0777) != 0) return false;
        }
    }
    return ::mkdir(path, 0777) == 0 || (errno == EEXIST && parents);
}

char* wcstombs(const wchar_t* text) {
    if (!text) return nullptr;
    std::string out;
    for (const wchar_t* p = text; *p; ++p) {
        const auto c = static_cast<uint32_t>(*p);
        if (c <= 0xFF) {
            out += static_cast<char>(c);
        } else if (c < 0x800) {
            out += static_cast<char>(0xC0 | (c >> 6));
            out += static_cast<char>(0x80 | (c & 0x3F));
        } else if (c < 0x10000) {
            if (c >= 0xD800 && c <= 0xDFFF) return nullptr;
            out += static_cast<char>(0xE0 | (c >> 12));
            out += static_cast<char>(0x80 | ((c >> 6) & 0x3F));
            out += static_cast<char>(0x80 | (c & 0x3F));
        } else if (c <= 0x10FFFF) {
            out += static_cast<char>(0xF0 | (c >> 18));
            out += static_cast<char>(0x80 | ((c >> 12) & 0x3F));
            out += static_cast<char>(0x80 | ((c >> 6) & 0x3F));
            out += static_cast<char>(0x80 | (c & 0x3F));
        } else {
            return nullptr;
        }
    }
    char* copy = new char[out.size() + 1];
    std::memcpy(copy, out.data(), out.size() + 1);
    return copy;
}

}  // namespace Port
