#include "host/port/atomic_file.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>

namespace Port {

namespace {

SaveFaultHook g_hook = nullptr;

bool Step(const char* step) { return !g_hook || g_hook(step); }

// The temporaries being written, removed by the signal handler: fixed storage, so that the
// handler only reads memory that is always there.
constexpr int kSlots = 16;
constexpr size_t kPathMax = 4096;
char g_temps[kSlots][kPathMax];
// 0 free, 1 taken while its path is written, 2 a temporary the handler removes.
std::atomic<int> g_state[kSlots];
static_assert(std::atomic<int>::is_always_lock_free, "the signal handler reads the slots");

void RemoveTemporaries(int sig) {
    for (int i = 0; i < kSlots; ++i)
        if (g_state[i].load() == 2) ::unlink(g_temps[i]);
    std::signal(sig, SIG_DFL);
    std::raise(sig);
}

void InstallHandlers() {
    static std::atomic<bool> installed{false};
    if (installed.exchange(true)) return;
    for (int sig : {SIGINT, SIGTERM}) {
        struct sigaction old {};
        if (::sigaction(sig, nullptr, &old) == 0 && old.sa_handler == SIG_DFL) std::signal(sig, RemoveTemporaries);
    }
}

int Register(const std::string& temp) {
    if (temp.size() >= kPathMax) return -1;
    for (int i = 0; i < kSlots; ++i) {
        int free = 0;
        if (!g_state[i].compare_exchange_strong(free, 1)) continue;
        std::memcpy(g_temps[i], temp.c_str(), temp.size() + 1);
        g_state[i].store(2);  // the path is complete before the handler may read it
        InstallHandlers();
        return i;
    }
    return -1;  // more saves at once than slots: this temporary is left to the next save
}

std::string DirectoryOf(const std::string& path) {
    size_t slash = path.rfind('/');
    return slash == std::string::npos ? "." : (slash == 0 ? "/" : path.substr(0, slash));
}

std::string NameOf(const std::string& path) {
    size_t slash = path.rfind('/');
    return slash == std::string::npos ? path : path.substr(slash + 1);
}

// This machine's name, in temporaries' names: a process is known gone only on its own machine.
std::string HostName() {
    char host[256] = {};
    if (::gethostname(host, sizeof host - 1) != 0 || !*host) return "host";
    std::string name(host);
    for (char& c : name)
        if (c == '/' || c == '.') c = '_';
    return name;
}

// Temporaries are named ".NAME.HOST.PID.partial" beside NAME; those of this machine's
// processes that are gone are leftovers of a crash.
void RemoveStaleTemporaries(const std::string& dir, const std::string& name) {
    DIR* d = ::opendir(dir.c_str());
    if (!d) return;
    const std::string prefix = "." + name + "." + HostName() + ".";
    while (dirent* e = ::readdir(d)) {
        std::string entry = e->d_name;
        if (entry.size() <= prefix.size() + 8 || entry.compare(0, prefix.size(), prefix) != 0 ||
            entry.compare(entry.size() - 8, 8, ".partial") != 0)
            continue;
        std::string digits = entry.substr(prefix.size(), entry.size() - prefix.size() - 8);
        if (digits.empty() || digits.find_first_not_of("0123456789") != std::string::npos) continue;
        long pid = std::strtol(digits.c_str(), nullptr, 10);
        if (pid > 0 && ::kill(static_cast<pid_t>(pid), 0) != 0 && errno == ESRCH) ::unlink((dir + "/" + entry).c_str());
    }
    ::closedir(d);
}

void SyncDirectory(const std::string& dir) {
    int fd = ::open(dir.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (fd < 0) return;
    ::fsync(fd);
    ::close(fd);
}

}  // namespace

void SetSaveFaultHook(SaveFaultHook hook) { g_hook = hook; }

bool SameFile(const std::string& a, const std::string& b) {
    struct stat x {}, y {};
    return ::stat(a.c_str(), &x) == 0 && ::stat(b.c_str(), &y) == 0 && x.st_dev == y.st_dev && x.st_ino == y.st_ino;
}

AtomicFile::AtomicFile(std::string path, Content content) : path_(std::move(path)), target_(path_) {
    struct stat st {};
    mode_t mode = 0;
    if (::lstat(path_.c_str(), &st) == 0) {
        if (S_ISLNK(st.st_mode)) {
            char* real = ::realpath(path_.c_str(), nullptr);
            if (!real) {
                if (errno == ENOENT)
                    error_ = "'" + path_ + "' is a symbolic link to nothing";
                else
                    Fail("cannot follow the symbolic link '" + path_ + "'", errno);
                return;
            }
            target_ = real;
            std::free(real);
            if (::stat(target_.c_str(), &st) != 0) {
                Fail("cannot examine '" + target_ + "'", errno);
                return;
            }
        }
        if (!S_ISREG(st.st_mode)) {
            error_ = "'" + path_ + "' is not a regular file";
            return;
        }
        if ((st.st_mode & (S_IWUSR | S_IWGRP | S_IWOTH)) == 0 || ::access(target_.c_str(), W_OK) != 0) {
            error_ = "'" + path_ + "' is read-only";
            return;
        }
        mode = st.st_mode & 07777;
    } else if (errno != ENOENT) {
        Fail("cannot examine '" + path_ + "'", errno);
        return;
    }
    const std::string dir = DirectoryOf(target_), name = NameOf(target_);
    RemoveStaleTemporaries(dir, name);
    temp_ = dir + "/." + name + "." + HostName() + "." + std::to_string(::getpid()) + ".partial";
    slot_ = Register(temp_);
    if (!Step("open")) {
        Fail("cannot create '" + temp_ + "'", EIO);
        return;
    }
    fd_ = ::open(temp_.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0666);
    if (fd_ < 0) {
        Fail("cannot create '" + temp_ + "'", errno);
        return;
    }
    // The file replaced keeps its mode, a private file stays private.
    if (mode && ::fchmod(fd_, mode) != 0) Fail("cannot set the mode of '" + temp_ + "'", errno);
    if (content == kByCaller) {
        ::close(fd_);
        fd_ = -1;
    }
}

AtomicFile::~AtomicFile() {
    if (fd_ >= 0) ::close(fd_);
    if (!temp_.empty()) ::unlink(temp_.c_str());
    if (slot_ >= 0) g_state[slot_].store(0);
}

bool AtomicFile::Fail(const std::string& what, int err) {
    if (error_.empty()) error_ = what + ": " + std::strerror(err);
    return false;
}

bool AtomicFile::Write(const char* data, size_t size) {
    if (!error_.empty() || fd_ < 0) return false;
    if (size && !Step("write")) return Fail("cannot write '" + temp_ + "'", ENOSPC);
    while (size > 0) {
        ssize_t n = ::write(fd_, data, size);
        if (n < 0 && errno == EINTR) continue;
        if (n <= 0) return Fail("cannot write '" + temp_ + "'", n < 0 ? errno : ENOSPC);
        data += n;
        size -= static_cast<size_t>(n);
    }
    return true;
}

bool AtomicFile::Commit() {
    if (!error_.empty() || temp_.empty()) return false;
    int fd = fd_ >= 0 ? fd_ : ::open(temp_.c_str(), O_RDONLY | O_CLOEXEC);
    fd_ = -1;
    if (fd < 0) return Fail("cannot open '" + temp_ + "'", errno);
    int sync_errno = Step("sync") ? (::fsync(fd) == 0 ? 0 : errno) : EIO;
    int close_errno = ::close(fd) == 0 ? 0 : errno;
    if (!Step("close")) close_errno = EIO;
    if (sync_errno) return Fail("cannot sync '" + temp_ + "'", sync_errno);
    if (close_errno) return Fail("cannot close '" + temp_ + "'", close_errno);
    if (!Step("rename")) return Fail("cannot move the new file into place as '" + target_ + "'", EIO);
    if (::rename(temp_.c_str(), target_.c_str()) != 0)
        return Fail("cannot move the new file into place as '" + target_ + "'", errno);
    SyncDirectory(DirectoryOf(target_));
    if (slot_ >= 0) g_state[slot_].store(0);
    slot_ = -1;
    temp_.clear();
    return true;
}

}  // namespace Port
