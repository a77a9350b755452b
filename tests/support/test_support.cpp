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

namespace {
std::string ValueText(const Ndm_Property* p) {
    switch (p->GetType()) {
        case NDM_PROP_STRING: return p->GetValueString();
        case NDM_PROP_INT32: return std::to_string(p->GetInt32());
        case NDM_PROP_BOOL: return p->GetBool() ? "true" : "false";
        case NDM_PROP_STRING_LIST: {
            std::string text;
            for (const std::string& s : p->GetStrings()) text += (text.empty() ? "" : " | ") + s;
            return text;
        }
        case NDM_PROP_LIST: {
            std::string text;
            for (const Ndm_Property* e : p->GetListItr())
                text += (text.empty() ? "" : " | ") + std::string(e->GetName()) + " = " + ValueText(e);
            return text;
        }
        default: return "<" + std::string(Ndm_PropTypeName(p->GetType())) + ">";
    }
}
}  // namespace

std::string PropText(const Ndm_PropertyHolder* holder, const char* name) {
    const Ndm_Property* p = holder ? holder->GetPropertyByName(name) : nullptr;
    return p ? ValueText(p) : "<none>";
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

namespace {
void AddProperties(const std::string& label, const Ndm_PropertyHolder* o,
                   const std::function<bool(const std::string&)>& keep, std::set<std::string>& out) {
    for (const Ndm_Property* p : o->GetPropertyItr())
        if (keep(p->GetName())) out.insert(label + ": " + p->GetName() + " " + PropText(o, p->GetName()));
}
}  // namespace

std::set<std::string> ObjectProperties(Ndm_View* view, const std::function<bool(const std::string&)>& keep) {
    std::set<std::string> out;
    ForEachObject(view, [&](Ndm_PropertyHolder* o) { AddProperties(o->GetFullName(), o, keep, out); }, false);
    return out;
}

std::set<std::string> DesignProperties(Ndm_View* view, const std::function<bool(const std::string&)>& keep) {
    std::set<std::string> out;
    AddProperties("view", view, keep, out);
    std::vector<Ndm_Block*> stack{view->GetBlock()};
    while (!stack.empty()) {
        Ndm_Block* b = stack.back();
        stack.pop_back();
        AddProperties("block " + b->GetFullName(), b, keep, out);
        for (Ndm_Signal* s : b->GetSignalItr()) AddProperties("signal " + s->GetFullName(), s, keep, out);
        for (Ndm_Pin* p : b->GetPinItr()) AddProperties("pin " + p->GetFullName(), p, keep, out);
        for (Ndm_Block* c : b->GetBlockItr()) stack.push_back(c);
    }
    for (Ndm_Network* n : view->GetNetworkItr()) AddProperties(std::string("network ") + n->GetName(), n, keep, out);
    return out;
}

const char* const kEveryDesignWideForm =
    "CONFIG PART = qx100-fg256-2;\nCONFIG STEPPING = ES;\n"
    "CONFIG DCI_CASCADE = \"1 3  5\";\nCONFIG INTERNAL_VREF_BANK2 = 0.9;\n"
    "VOLTAGE = 1.2 V;\nTEMPERATURE = 85 C;\n"
    "PROHIBIT = SITE_C0, SITE_C1;\nVREF = P20, P21;\n"
    "TIMESPEC TS_clk = PERIOD clk_grp 10 ns HIGH 50%;\n"
    "TIMESPEC TS_clk2 = PERIOD clk2_grp TS_clk * 2 PHASE + 2.5 ns HIGH 50% PRIORITY 1;\n"
    "TIMESPEC TS_fast = PERIOD fast_grp 250MHz LOW 2 ns INPUT_JITTER 100 ps;\n"
    "TIMESPEC TS_s = PERIOD s_grp 8 ns LOW 4 ns;\n"
    "TIMESPEC TS_ab = FROM grpA TO grpB 5 ns DATAPATHONLY PRIORITY 2;\n"
    "TIMESPEC TS_abc = FROM grpA THRU grpB TO grpC TS_1 / 2;\n"
    "TIMESPEC TS_f = FROM grpA TO grpB 200 MHz;\n"
    "TIMESPEC TS_tig = FROM grpA TO grpB TIG PRIORITY 3;\n"
    "TIMESPEC TS_ign = TIG;\nTIMESPEC TS_old = DROP_SPEC;\n"
    "ENABLE = TS_clk;\nDISABLE = TS_old;\n"
    "OFFSET = IN 2 ns BEFORE clk;\n"
    "OFFSET = OUT 3 ns VALID 1 ns AFTER clk TIMEGRP regs HIGH;\n"
    "TIMEGRP data OFFSET = IN 2 ns BEFORE clk;\n"
    "TIMEGRP data OFFSET = OUT 2.5 ns AFTER clk TIMEGRP regs;\n"
    "TIMEGRP fast = RISING ffs FFS(u1/*) EXCEPT slow;\n"
    "TIMEGRP both = grpA FALLING grpB;\n"
    "TIMEGRP tg1 AREA_GROUP = ag1;\n"
    "AREA_GROUP ag1 RANGE = SITE_A0:SITE_A7, SITE_B0:SITE_B3 | PLACE = closed | COMPRESSION = 50;\n"
    "AREA_GROUP ag2 RANGE = SITE_C0:SITE_C9 | GROUP = open | MODE = reconfig | IMPLEMENT = auto;\n"
    "SET set1 RLOC_RANGE = X0Y0:X3Y3 | RLOC_ORIGIN = X0Y0;\n";

int Quillmap(const std::string& args, std::string* out, std::string* err) {
    return RunCommand("(" + std::string(QUILLMAP_EXE) + " " + args + ")", out, err);  // args may redirect
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

size_t CountOf(const std::string& text, const std::string& what) {
    size_t n = 0;
    for (size_t at = text.find(what); at != std::string::npos; at = text.find(what, at + 1)) ++n;
    return n;
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
