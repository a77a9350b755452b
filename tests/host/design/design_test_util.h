// Helpers of the design tests: a scratch directory, whole-file access, a dump, and a thread
// with a small stack.
#pragma once

#include <pthread.h>
#include <unistd.h>

#include <atomic>
#include <filesystem>
#include <fstream>
#include <functional>
#include <sstream>
#include <string>

#include "host/design/dump.h"
#include "host/design/json_chunks.h"

namespace design_test {

// Reads large files in pieces of that many bytes while alive, whatever their size (0: small
// files are read whole, as usual). Pieces of a byte make every array and object a large one,
// cut at every comma.
class PieceSize {
public:
    explicit PieceSize(size_t piece) : saved_(Ndm_JsonChunks::GetSizes()) {
        if (piece) Ndm_JsonChunks::GetSizes() = {0, piece};
    }
    ~PieceSize() { Ndm_JsonChunks::GetSizes() = saved_; }
    PieceSize(const PieceSize&) = delete;
    PieceSize& operator=(const PieceSize&) = delete;

private:
    Ndm_JsonChunks::Sizes saved_;
};
inline constexpr size_t kPieceSizes[] = {0, 1, 6, 40};

class TempDir {
public:
    TempDir() {
        static std::atomic<int> counter{0};
        path_ = (std::filesystem::temp_directory_path() /
                 ("lun_design_" + std::to_string(::getpid()) + "_" + std::to_string(counter++)))
                    .string();
        std::filesystem::remove_all(path_);
        std::filesystem::create_directories(path_);
    }
    ~TempDir() {
        std::error_code ec;
        std::filesystem::remove_all(path_, ec);
    }
    TempDir(const TempDir&) = delete;
    TempDir& operator=(const TempDir&) = delete;
    std::string File(const std::string& name) const { return path_ + "/" + name; }
    std::string Write(const std::string& name, const std::string& text) const {
        std::ofstream(File(name), std::ios::binary) << text;
        return File(name);
    }
    const std::string& path() const { return path_; }

private:
    std::string path_;
};

inline std::string ReadAll(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

inline std::string DumpText(const Ndm_Design& design) {
    std::ostringstream out;
    Ndm_Dump(design, out);
    return out.str();
}

// Runs f on a thread whose stack holds only `bytes`: code that recurses once per level of an
// input overflows it at depths far below what the main thread's 8 MB would need. False when
// no such thread could be made.
inline bool OnSmallStack(size_t bytes, const std::function<void()>& f) {
    pthread_attr_t attr;
    pthread_attr_init(&attr);
    pthread_attr_setstacksize(&attr, bytes);
    pthread_t thread;
    auto run = [](void* arg) -> void* {
        (*static_cast<const std::function<void()>*>(arg))();
        return nullptr;
    };
    const bool made = pthread_create(&thread, &attr, run, const_cast<std::function<void()>*>(&f)) == 0;
    if (made) pthread_join(thread, nullptr);
    pthread_attr_destroy(&attr);
    return made;
}

}  // namespace design_test
