// Message manager: every message of the library and the tool goes through here.
//
// A message object is made per source module with createObject(program, module, line,
// revision); its issue* members format printf-style (with %I as a decimal integer) and hand
// the message to every installed sink. With no sink installed, messages go to stderr as text.
// A fatal or user-fatal message is delivered first and then thrown as Port_FatalError, which
// the host tool catches at its top to exit with status 2.
#pragma once

#include <cstdarg>
#include <cstdio>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

enum class Port_Severity { Info, Status, Warning, Error, Internal, Fatal, UserFatal, Debug };

// Key of a severity in JSON output: "info", "status", "warning", "error", "internal_error",
// "fatal", "user_fatal", "debug".
const char* Port_SeverityKey(Port_Severity severity);

// One issued message.
struct Port_Message {
    Port_Severity severity = Port_Severity::Info;
    std::string program;
    std::string module;
    int line = 0;         // source line of the issuing code
    bool has_code = false;
    int code = 0;
    std::string text;     // formatted text exactly as issued, line end included
};

// Receiver of messages.
class Port_MsgSink {
public:
    virtual ~Port_MsgSink() = default;
    // Delivers one message.
    virtual void Emit(const Port_Message& message) = 0;
};

// Human-readable lines: "ERROR:lunbase - text" (with ":code" after the module when given).
class Port_TextSink : public Port_MsgSink {
public:
    explicit Port_TextSink(FILE* out) : out_(out) {}
    void Emit(const Port_Message& message) override;

private:
    FILE* out_;
};

// One JSON object per line with "severity", "program", "module", "code" (when given), "text".
class Port_JsonSink : public Port_MsgSink {
public:
    explicit Port_JsonSink(FILE* out) : out_(out) {}
    void Emit(const Port_Message& message) override;

private:
    FILE* out_;
};

// Keeps every message; for tests and for hosts that post-process messages.
class Port_CaptureSink : public Port_MsgSink {
public:
    void Emit(const Port_Message& message) override { messages.push_back(message); }
    std::vector<Port_Message> messages;
};

// Thrown after a fatal or user-fatal message has been delivered.
class Port_FatalError : public std::runtime_error {
public:
    Port_FatalError(int code, bool user, const std::string& text)
        : std::runtime_error(text), code_(code), user_(user) {}
    int code() const { return code_; }
    bool user() const { return user_; }

private:
    int code_;
    bool user_;
};

class Port_MsgManData {
public:
    // A message object for one source module.
    static Port_MsgManData createObject(const char* program, const char* module, int line,
                                        const char* revision);

    void issueInfo(const char* format, ...) const;
    void issueStatus(const char* format, ...) const;
    void issueWarning(const char* format, ...) const;
    void issueError(const char* format, ...) const;
    void issueInternal(const char* format, ...) const;
    // Delivers the message, then throws Port_FatalError.
    [[noreturn]] void issueFatal(int code, const char* format, ...) const;
    [[noreturn]] void issueUserFatal(int code, const char* format, ...) const;

    // Debug channel: delivered (as severity Debug) only while debugging is switched on.
    static void debugStub(const char* format, ...);

    // Process-wide set-up.
    static void AddSink(std::shared_ptr<Port_MsgSink> sink);  // replaces the stderr default
    static void ClearSinks();                                  // back to the stderr default
    static void SetDebug(bool on);
    static bool DebugEnabled();
    static int Count(Port_Severity severity);  // messages issued since the last ResetCounts
    static void ResetCounts();

    const std::string& program() const { return program_; }
    const std::string& module() const { return module_; }

private:
    void Issue(Port_Severity severity, bool has_code, int code, const char* format,
               va_list args) const;

    std::string program_;
    std::string module_;
    int line_ = 0;
};

// Formats printf-style into a string; %I is a decimal integer (an int argument).
std::string Port_VFormat(const char* format, va_list args);
std::string Port_Format(const char* format, ...);

// RAII: installs a capturing sink (replacing the others) and restores the previous set-up.
class Port_MsgCapture {
public:
    explicit Port_MsgCapture(bool debug = false);
    ~Port_MsgCapture();
    Port_MsgCapture(const Port_MsgCapture&) = delete;
    Port_MsgCapture& operator=(const Port_MsgCapture&) = delete;
    const std::vector<Port_Message>& messages() const { return sink_->messages; }
    // Texts of the messages of one severity, in order.
    std::vector<std::string> Texts(Port_Severity severity) const;
    void Clear() { sink_->messages.clear(); }

private:
    std::shared_ptr<Port_CaptureSink> sink_;
    std::vector<std::shared_ptr<Port_MsgSink>> saved_;
    bool saved_debug_;
};
