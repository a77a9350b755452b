#include "host/repository/cs_status.h"

#include "host/port/msgman.h"
#include "host/repository/cs_constraint.h"

Cs_Status::Cs_Status(Cs_StatusID id, SEVERITY severity, int number, std::string message)
    : id_(id), severity_(severity), number_(number), message_(std::move(message)) {}

Cs_Status::~Cs_Status() = default;

std::wstring Cs_Status::GetLocalizedMsg() const {
    std::wstring wide;
    wide.reserve(message_.size());
    for (char c : message_) wide += static_cast<wchar_t>(static_cast<unsigned char>(c));
    return wide;
}

void Cs_Status::Report() const {
    Port_MsgManData msg = Port_MsgManData::createObject("Quillmap", "repository", __LINE__, "1.0");
    std::string text = ReportText() + "\n";
    switch (severity_) {
        case INFO: msg.issueInfo("%s", text.c_str()); break;
        case WARNING: msg.issueWarning("%s", text.c_str()); break;
        case ERROR: msg.issueError("%s", text.c_str()); break;
    }
}

Cs_Status* Cs_Status::Clone() const { return new Cs_Status(*this); }

Cs_Status_Parse::Cs_Status_Parse(Cs_StatusID id, int number, std::string message, std::string file, int line)
    : Cs_Status(id, ERROR, number, std::move(message)),
      file_(std::make_shared<const std::string>(std::move(file))),
      source_(file_->c_str(), line) {}

Cs_Status_Parse::~Cs_Status_Parse() = default;

Cs_Status* Cs_Status_Parse::Clone() const { return new Cs_Status_Parse(*this); }

std::string Cs_Status_Parse::ReportText() const {
    if (GetID() != Cs_StatusID::PARSE_ERROR) return GetMessage();
    return Port_Format("Line %d in '%s': %s", source_.GetLine(), file_->c_str(), GetMessage().c_str());
}

Cs_Status_Resolution::Cs_Status_Resolution(Cs_StatusID id, SEVERITY severity, int number, std::string message,
                                           const Cs_Constraint* constraint)
    : Cs_Status(id, severity, number, std::move(message)), constraint_(constraint) {}

Cs_Status* Cs_Status_Resolution::Clone() const { return new Cs_Status_Resolution(*this); }

Cs_ReturnCode::operator bool() const {
    for (const auto& s : statuses_)
        if (s->GetSeverity() == Cs_Status::ERROR) return false;
    return true;
}

int Cs_ReturnCode::GetUnexpectedCount() const {
    int n = 0;
    for (const auto& s : statuses_) n += s->GetSeverity() != Cs_Status::INFO;
    return n;
}

Cs_ReturnCode Cs_ReturnCode::GetUnexpectedStatusObjs() const {
    Cs_ReturnCode out;
    for (const auto& s : statuses_)
        if (s->GetSeverity() != Cs_Status::INFO) out.Add(s);
    return out;
}

void Cs_ReturnCode::Report() const {
    for (const auto& s : statuses_) s->Report();
}

void Cs_ReturnCode::Append(const Cs_ReturnCode& other) {
    statuses_.insert(statuses_.end(), other.statuses_.begin(), other.statuses_.end());
}
