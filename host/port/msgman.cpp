#include "host/port/msgman.h"

#include "host/port/json_text.h"

#include <array>
#include <cstring>

namespace {

struct MsgState {
    std::vector<std::shared_ptr<Port_MsgSink>> sinks;
    bool debug = false;
    std::array<int, 8> counts{};
};

MsgState& State() {
    static MsgState state;
    return state;
}

void Deliver(const Port_Message& message) {
    MsgState& state = State();
    if (message.severity != Port_Severity::Debug) ++state.counts[static_cast<int>(message.severity)];
    if (state.sinks.empty()) {
        static Port_TextSink fallback(stderr);
        fallback.Emit(message);
        return;
    }
    for (const auto& sink : state.sinks) sink->Emit(message);
}

const char* TextWord(Port_Severity severity) {
    switch (severity) {
        case Port_Severity::Info: return "INFO";
        case Port_Severity::Status: return "STATUS";
        case Port_Severity::Warning: return "WARNING";
        case Port_Severity::Error: return "ERROR";
        case Port_Severity::Internal: return "INTERNAL_ERROR";
        case Port_Severity::Fatal: return "FATAL_ERROR";
        case Port_Severity::UserFatal: return "USER_FATAL_ERROR";
        case Port_Severity::Debug: return "DEBUG";
    }
    return "?";
}

}  // namespace

const char* Port_SeverityKey(Port_Severity severity) {
    switch (severity) {
        case Port_Severity::Info: return "info";
        case Port_Severity::Status: return "status";
        case Port_Severity::Warning: return "warning";
        case Port_Severity::Error: return "error";
        case Port_Severity::Internal: return "internal_error";
        case Port_Severity::Fatal: return "fatal";
        case Port_Severity::UserFatal: return "user_fatal";
        case Port_Severity::Debug: return "debug";
    }
    return "?";
}

void Port_TextSink::Emit(const Port_Message& message) {
    std::string line = TextWord(message.severity);
    line += ':';
    line += message.module;
    if (message.has_code) line += ':' + std::to_string(message.code);
    line += " - ";
    line += message.text;
    if (line.empty() || line.back() != '\n') line += '\n';
    std::fwrite(line.data(), 1, line.size(), out_);
    std::fflush(out_);
}

void Port_JsonSink::Emit(const Port_Message& message) {
    std::string line = "{\"severity\":";
    Port_AppendJsonString(line, Port_SeverityKey(message.severity));
    line += ",\"program\":";
    Port_AppendJsonString(line, message.program);
    line += ",\"module\":";
    Port_AppendJsonString(line, message.module);
    if (message.has_code) line += ",\"code\":" + std::to_string(message.code);
    line += ",\"text\":";
    Port_AppendJsonString(line, message.text);
    line += "}\n";
    std::fwrite(line.data(), 1, line.size(), out_);
    std::fflush(out_);
}

std::string Port_VFormat(const char* format, va_list args) {
    if (!format) return std::string();
    // %I is the host's decimal integer directive; everything else is printf.
    std::string fmt;
    fmt.reserve(std::strlen(format));
    for (const char* p = format; *p; ++p) {
        fmt += *p;
        if (*p != '%') continue;
        ++p;
        // flags, width, precision and length stay as written
        while (*p && std::strchr("-+ #0123456789.*hlLqjzt", *p)) fmt += *p++;
        if (!*p) break;
        fmt += (*p == 'I') ? 'd' : *p;
    }
    va_list copy;
    va_copy(copy, args);
    char small[512];
    int n = std::vsnprintf(small, sizeof small, fmt.c_str(), copy);
    va_end(copy);
    if (n < 0) return std::string();
    if (static_cast<size_t>(n) < sizeof small) return std::string(small, static_cast<size_t>(n));
    std::string out(static_cast<size_t>(n) + 1, '\0');
    std::vsnprintf(out.data(), out.size(), fmt.c_str(), args);
    out.resize(static_cast<size_t>(n));
    return out;
}

std::string Port_Format(const char* format, ...) {
    va_list args;
    va_start(args, format);
    std::string out = Port_VFormat(format, args);
    va_end(args);
    return out;
}

Port_MsgManData Port_MsgManData::createObject(const char* program, const char* module, int line,
                                              const char* /*revision*/) {
    Port_MsgManData data;
    data.program_ = program ? program : "";
    data.module_ = module ? module : "";
    data.line_ = line;
    return data;
}

void Port_MsgManData::Issue(Port_Severity severity, bool has_code, int code, const char* format,
                            va_list args) const {
    Port_Message message;
    message.severity = severity;
    message.program = program_;
    message.module = module_;
    message.line = line_;
    message.has_code = has_code;
    message.code = code;
    message.text = Port_VFormat(format, args);
    Deliver(message);
}

#define LUN_ISSUE(severity)            \
    va_list args;                      \
    va_start(args, format);            \
    Issue(severity, false, 0, format, args); \
    va_end(args)

void Port_MsgManData::issueInfo(const char* format, ...) const { LUN_ISSUE(Port_Severity::Info); }
void Port_MsgManData::issueStatus(const char* format, ...) const { LUN_ISSUE(Port_Severity::Status); }
void Port_MsgManData::issueWarning(const char* format, ...) const { LUN_ISSUE(Port_Severity::Warning); }
void Port_MsgManData::issueError(const char* format, ...) const { LUN_ISSUE(Port_Severity::Error); }
void Port_MsgManData::issueInternal(const char* format, ...) const { LUN_ISSUE(Port_Severity::Internal); }
#undef LUN_ISSUE

void Port_MsgManData::issueFatal(int code, const char* format, ...) const {
    va_list args;
    va_start(args, format);
    std::string text = Port_VFormat(format, args);
    va_end(args);
    Port_Message message{Port_Severity::Fatal, program_, module_, line_, true, code, text};
    Deliver(message);
    throw Port_FatalError(code, false, text);
}

void Port_MsgManData::issueUserFatal(int code, const char* format, ...) const {
    va_list args;
    va_start(args, format);
    std::string text = Port_VFormat(format, args);
    va_end(args);
    Port_Message message{Port_Severity::UserFatal, program_, module_, line_, true, code, text};
    Deliver(message);
    throw Port_FatalError(code, true, text);
}

void Port_MsgManData::debugStub(const char* format, ...) {
    if (!State().debug) return;
    va_list args;
    va_start(args, format);
    Port_Message message;
    message.severity = Port_Severity::Debug;
    message.program = "Quillmap";
    message.module = "debug";
    message.text = Port_VFormat(format, args);
    va_end(args);
    Deliver(message);
}

void Port_MsgManData::AddSink(std::shared_ptr<Port_MsgSink> sink) {
    State().sinks.push_back(std::move(sink));
}
void Port_MsgManData::ClearSinks() { State().sinks.clear(); }
void Port_MsgManData::SetDebug(bool on) { State().debug = on; }
bool Port_MsgManData::DebugEnabled() { return State().debug; }
int Port_MsgManData::Count(Port_Severity severity) {
    return State().counts[static_cast<int>(severity)];
}
void Port_MsgManData::ResetCounts() { State().counts.fill(0); }

Port_MsgCapture::Port_MsgCapture(bool debug)
    : sink_(std::make_shared<Port_CaptureSink>()),
      saved_(State().sinks),
      saved_debug_(State().debug) {
    State().sinks.assign(1, sink_);
    State().debug = debug;
}

Port_MsgCapture::~Port_MsgCapture() {
    State().sinks = saved_;
    State().debug = saved_debug_;
}

std::vector<std::string> Port_MsgCapture::Texts(Port_Severity severity) const {
    std::vector<std::string> out;
    for (const auto& m : sink_->messages)
        if (m.severity == severity) out.push_back(m.text);
    return out;
}
