// Shared helpers of the test programs.
#include "support/test_support.h"

#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <sstream>

namespace lun_test {

ScratchDir::ScratchDir() {
    static std::atomic<int> counter{0};
    auto dir = std::filesystem::temp_directory_path() /
               ("lun_test_" + std::to_string(getpid()) + "_" + std::to_string(counter++));
    std::filesystem::remove_all(dir);
    std::filesystem::create_directories(dir);
    path_ = dir.string();
}

ScratchDir::~ScratchDir() {
    std::error_code ec;
    std::filesystem::remove_all(path_, ec);
}

std::string PropText(const Ndm_PropertyHolder* holder, const char* name) {
    const Ndm_Property* p = holder ? holder->GetPropertyByName(name) : nullptr;
    if (!p) return "<none>";
    switch (p->GetType()) {
        case NDM_PROP_STRING: return p->GetValueString();
        case NDM_PROP_INT32: return std::to_string(p->GetInt32());
        case NDM_PROP_STRING_LIST: {
            std::string text;
            for (const std::string& s : p->GetStrings()) text += (text.empty() ? "" : " | ") + s;
            return text;
        }
        default: return "<" + std::string(Ndm_PropTypeName(p->GetType())) + ">";
    }
}

void ForEachObject(Ndm_View* view, const std::function<void(Ndm_PropertyHolder*)>& visit, bool with_top) {
    std::vector<Ndm_Block*> stack{view->GetBlock()};
    while (!stack.empty()) {
        Ndm_Block* b = stack.back();
        stack.pop_back();
        if (b->GetPropertyByName("TYPE")) continue;  // a constraint block
        if (b->GetParent() || with_top) visit(b);
        for (Ndm_Pin* p : b->GetPinItr()) visit(p);
        for (Ndm_Block* c : b->GetBlockItr()) stack.push_back(c);
    }
    for (Ndm_Network* n : view->GetNetworkItr()) visit(n);
}

std::set<std::string> ObjectProperties(Ndm_View* view, const std::function<bool(const std::string&)>& keep) {
    std::set<std::string> out;
    ForEachObject(view, [&](Ndm_PropertyHolder* o) {
        for (const Ndm_Property* p : o->GetPropertyItr())
            if (keep(p->GetName())) out.insert(o->GetFullName() + ": " + p->GetName() + " " + PropText(o, p->GetName()));
    }, false);
    return out;
}

int Quillmap(const std::string& args, std::string* out, std::string* err) {
    return RunCommand(std::string(QUILLMAP_EXE) + " " + args, out, err);
}

ScopedEnv::ScopedEnv(const char* name, const char* value) : name_(name) {
    if (const char* old = ::getenv(name)) {
        old_ = old;
        had_ = true;
    }
    if (value)
        ::setenv(name, value, 1);
    else
        ::unsetenv(name);
}

ScopedEnv::~ScopedEnv() {
    if (had_)
        ::setenv(name_, old_.c_str(), 1);
    else
        ::unsetenv(name_);
}

std::string ScratchDir::Write(const std::string& name, const std::string& content) const {
    std::string file = path_ + "/" + name;
    std::ofstream out(file, std::ios::binary);
    out << content;
    return file;
}

std::string ReadFile(const std::string& path) {
    std::ifstream in(path, std::ios::binary);
    std::ostringstream text;
    text << in.rdbuf();
    return text.str();
}

int RunCommand(const std::string& command, std::string* out, std::string* err) {
    ScratchDir dir;
    std::string full = command + " >" + dir.path() + "/out 2>" + dir.path() + "/err";
    int status = std::system(full.c_str());
    if (out) *out = ReadFile(dir.path() + "/out");
    if (err) *err = ReadFile(dir.path() + "/err");
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
}

}  // namespace lun_test
