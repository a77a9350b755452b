// Message texts and helpers shared by the name resolution and the wildcard searches.
#pragma once

#include <functional>
#include <string>

#include "host/design/ndm_lookup.h"
#include "host/parser/pr_logical.h"
#include "host/port/msgman.h"

namespace lunfind {

inline Port_MsgManData Msg(int line) {
    return Port_MsgManData::createObject("Quillmap", "lunfind", line, "1.0");
}

inline int LineOf(const Pr_Logical_ConstraintHandle* handle) { return handle ? handle->getline() : 0; }

inline constexpr const char* kInstText =
    "Line %i in '%s': Found case insensitive match for INST name '%s'. INST is '%s'.\n";
inline constexpr const char* kNetText =
    "Line %i in '%s': Found case insensitive match for NET name '%s'. NET is '%s'.\n";
inline constexpr const char* kPinText =
    "Line %i in '%s': Found case insensitive match for PIN name '%s'. PIN is '%s.%s'.\n";
inline constexpr const char* kWildPinText =
    "Line %i in '%s': Found case insensitive match for wild_carded PIN name '%s.%s'. INST is "
    "'%s.%s'.\n";

// Turns the results of case-insensitive searches into the annotator's messages: the
// once-per-process notice (through warn), then one information message per result.
class Report : public Ndm_LookupReport {
public:
    Report(std::function<void()> warn, const char* file, const Pr_Logical_ConstraintHandle* handle)
        : warn_(std::move(warn)), file_(file), line_(LineOf(handle)) {}
    void Block(std::string_view searched, const std::string& full) override {
        warn_();
        Msg(__LINE__).issueInfo(kInstText, line_, file_, std::string(searched).c_str(), full.c_str());
    }
    void Signal(std::string_view searched, const std::string& full) override {
        warn_();
        Msg(__LINE__).issueInfo(kNetText, line_, file_, std::string(searched).c_str(), full.c_str());
    }
    void Pin(const char* path, const std::string& owner, const char* pin) override {
        warn_();
        Msg(__LINE__).issueInfo(kPinText, line_, file_, path, owner.c_str(), pin);
    }
    void WildPin(const char* inst_pattern, const char* pin_pattern, const std::string& owner,
                 const char* pin) override {
        warn_();
        Msg(__LINE__).issueInfo(kWildPinText, line_, file_, inst_pattern, pin_pattern, owner.c_str(), pin);
    }

private:
    std::function<void()> warn_;
    const char* file_;
    int line_;
};

}  // namespace lunfind
