// Shared helpers of the test programs: scratch directories and small files.
#pragma once

#include <functional>
#include <memory>
#include <set>
#include <string>

#include "host/design/ndm.h"

namespace lun_test {

// Design "d" with the view EXPANDED and its top block "top", the scaffold of most tests.
struct TopDesign {
    TopDesign()
        : design(std::make_unique<Ndm_Design>("d")),
          view(design->CreateView("EXPANDED")),
          top(view->CreateTopBlock("top")) {}
    std::unique_ptr<Ndm_Design> design;
    Ndm_View* view;
    Ndm_Block* top;
};

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

// Text of a property for comparisons: a string as it is, the texts of a string list joined
// with " | ", the entries of a list as "name = text" joined with " | ", a number in decimal, a
// flag as true or false; "<none>" for a missing property.
std::string PropText(const Ndm_PropertyHolder* holder, const char* name);

// Every object a constraint can sit on: blocks that are not constraint blocks (the top block
// only with_top), pins, networks; in a stable order.
void ForEachObject(Ndm_View* view, const std::function<void(Ndm_PropertyHolder*)>& visit, bool with_top = true);

// The properties of those objects but the top block, as "full name: NAME text" (PropText), for
// the names that keep says yes to.
std::set<std::string> ObjectProperties(Ndm_View* view, const std::function<bool(const std::string&)>& keep);

// The properties of the whole view as "kind full name: NAME text" (PropText): the view's own,
// every block's (the top block and the constraint blocks too), every signal's, pin's and
// network's, for the names that keep says yes to.
std::set<std::string> DesignProperties(Ndm_View* view, const std::function<bool(const std::string&)>& keep);

// A UCF with every design-wide statement form: CONFIG settings, operating conditions,
// prohibited sites, reference pins, every TIMESPEC, ENABLE, DISABLE and OFFSET form, timing
// groups, area groups and sets.
extern const char* const kEveryDesignWideForm;

// Runs the built quillmap with args (a shell command line; redirections allowed).
int Quillmap(const std::string& args, std::string* out = nullptr, std::string* err = nullptr);

// Sets (or, with null, unsets) an environment variable until the end of the scope.
class ScopedEnv {
public:
    ScopedEnv(const char* name, const char* value);
    ~ScopedEnv();
    ScopedEnv(const ScopedEnv&) = delete;
    ScopedEnv& operator=(const ScopedEnv&) = delete;

private:
    const char* name_;
    std::string old_;
    bool had_ = false;
};

// How many times what occurs in text (overlapping occurrences counted).
size_t CountOf(const std::string& text, const std::string& what);

// Whole content of a file ("" when it cannot be read).
std::string ReadFile(const std::string& path);

// Runs a shell command; returns its exit status and puts stdout/stderr in the strings given.
int RunCommand(const std::string& command, std::string* out = nullptr, std::string* err = nullptr);

}  // namespace lun_test
