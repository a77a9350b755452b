// Outcomes of constraint-repository operations: statuses and the return code that lists them.
//
// Every operation of Cs_ConstraintMgr that can find something answers a Cs_ReturnCode, the
// statuses it found in order. A status has an identifier, a severity, a message number and a
// one-line message naming the file and line it is about (docs/repository.md lists them).
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "host/repository/cs_constraint.h"

class Cs_Constraint;
class Cs_SourceFile;

enum class Cs_StatusID : int {
    FILE_ERROR = 1,                // a constraint file cannot be read
    PARSE_ERROR = 2,               // a statement the parser cannot read
    NO_DESIGN_MATCH = 3,           // a constraint names no object of the bound design
    NO_RESOLVED_ASSOCIATIONS = 4,  // a constraint found nothing it refers to (see the numbers)
    REPOSITORY_ERROR = 5,          // the repository file cannot be written or read back
};

class Cs_Status {
public:
    // INFO is used for findings that need no action, ERROR for those that fail an operation.
    enum SEVERITY { INFO = 0, WARNING = 1, ERROR = 2 };

    Cs_Status(Cs_StatusID id, SEVERITY severity, int number, std::string message);
    virtual ~Cs_Status();

    Cs_StatusID GetID() const { return id_; }
    SEVERITY GetSeverity() const { return severity_; }
    void SetSeverity(SEVERITY severity) { severity_ = severity; }
    // The number of the message (docs/repository.md).
    int GetLocalizedMsgNum() const { return number_; }
    // The message as a wide text: each byte of the message is one character (0 to 255), so
    // that Port::wcstombs gives the bytes back.
    std::wstring GetLocalizedMsg() const;
    // The message as bytes.
    const std::string& GetMessage() const { return message_; }
    // Issues the message through the message manager (program "Quillmap", module
    // "repository") with the status's severity; a parse error is located by its file and line.
    void Report() const;
    // A copy, owned by the caller.
    virtual Cs_Status* Clone() const;

protected:
    // The line Report issues, without its line end.
    virtual std::string ReportText() const { return message_; }

private:
    Cs_StatusID id_;
    SEVERITY severity_;
    int number_;
    std::string message_;
};

// A statement the parser could not read, or a file that could not be read.
class Cs_Status_Parse : public Cs_Status {
public:
    Cs_Status_Parse(Cs_StatusID id, int number, std::string message, std::string file, int line);
    ~Cs_Status_Parse() override;
    // Where: the file and the statement's line (0 for a whole file).
    const Cs_SourceFile* GetSourceFile() const { return &source_; }
    Cs_Status* Clone() const override;

protected:
    std::string ReportText() const override;

private:
    std::shared_ptr<const std::string> file_;  // shared by copies, so source_ stays valid in them
    Cs_SourceFile source_;
};

// A finding about one constraint (no design match, no associations).
class Cs_Status_Resolution : public Cs_Status {
public:
    Cs_Status_Resolution(Cs_StatusID id, SEVERITY severity, int number, std::string message,
                         const Cs_Constraint* constraint);
    const Cs_Constraint* GetConstraint() const { return constraint_; }
    Cs_Status* Clone() const override;

private:
    const Cs_Constraint* constraint_;
};

// The statuses of one operation, in the order they were found. Copies share the statuses.
class Cs_ReturnCode {
public:
    using Statuses = std::vector<std::shared_ptr<Cs_Status>>;

    Cs_ReturnCode() = default;
    // True when no status has the severity ERROR: the operation did what it was asked.
    explicit operator bool() const;
    // The same as the truth value.
    bool Successful() const { return static_cast<bool>(*this); }
    // Statuses that are not the plain information of a normal run (severity WARNING or ERROR).
    int GetUnexpectedCount() const;
    Cs_ReturnCode GetUnexpectedStatusObjs() const;
    // Reports every status, in order.
    void Report() const;

    void Add(std::shared_ptr<Cs_Status> status) { statuses_.push_back(std::move(status)); }
    void Append(const Cs_ReturnCode& other);
    Statuses::const_iterator begin() const { return statuses_.begin(); }
    Statuses::const_iterator end() const { return statuses_.end(); }
    size_t size() const { return statuses_.size(); }
    bool empty() const { return statuses_.empty(); }

private:
    Statuses statuses_;
};
