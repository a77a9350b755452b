// The data of the HTML page: one JSON text the page's script reads.
#include "check/ck_html.h"

#include <unordered_map>

#include "check/ck_board_check.h"
#include "check/ck_text.h"
#include "host/design/ndm.h"
#include "host/port/atomic_file.h"
#include "host/port/json_text.h"
#include "host/repository/cs_constraint.h"

// The page around the data (ck_html_page.cpp).
extern const char* const kCk_PageHead;
extern const char* const kCk_PageTail;

namespace {

// Names listed per statement: the page shows the count and these.
constexpr size_t kNamesPerStatement = 50;

// Marks of a row the page filters on.
enum RowFlag { kUnmatched = 1, kOverride = 2, kClash = 4 };

// Inside <script>, a JSON text must not hold "</script" or "<!--": every <, > and & is written
// as its \u escape, which JSON reads back as the same character.
std::string ScriptSafe(const std::string& json) {
    std::string out;
    out.reserve(json.size() + json.size() / 16);
    for (char c : json) {
        switch (c) {
            case '<': out += "\\u003c"; break;
            case '>': out += "\\u003e"; break;
            case '&': out += "\\u0026"; break;
            default: out += c;
        }
    }
    return out;
}

class DataWriter {
public:
    DataWriter(const Ck_BoardCheck& check, const std::string& design) : check_(check), design_(design) {}

    std::string Json() {
        const auto& statements = check_.statements();
        for (size_t i = 0; i < statements.size(); ++i)
            for (const Cs_Constraint* c : statements[i].constraints) row_of_.emplace(c, i);
        std::vector<std::vector<size_t>> row_findings(statements.size());
        std::vector<int> flags(statements.size(), 0);
        const auto& findings = check_.findings();
        std::vector<std::vector<long>> rows_of_finding(findings.size());
        for (size_t f = 0; f < findings.size(); ++f)
            for (const Ck_Ref& r : findings[f].refs) {
                const long row = RowOf(r);
                rows_of_finding[f].push_back(row);
                if (row < 0) continue;
                auto& list = row_findings[row];
                if (list.empty() || list.back() != f) list.push_back(f);
                flags[row] |= FlagOf(findings[f].kind);
            }

        std::string out = "{\"design\":";
        Port_AppendJsonString(out, design_);
        out += ",\"files\":";
        Ck_AppendJsonNames(out, check_.files());
        out += ",\"summary\":";
        Ck_AppendSummaryJson(check_.summary(), out);
        out += ",\"rows\":[";
        std::string name;
        for (size_t i = 0; i < statements.size(); ++i) {
            const Ck_Statement& s = statements[i];
            out += i ? ",[" : "[";
            out += std::to_string(FileIndex(s.file)) + "," + std::to_string(s.line) + ",";
            Port_AppendJsonString(out, s.text);
            // What the statement resolved to: its first constraint of an object (they share one
            // lookup); -1 for a design-wide statement.
            const Cs_Constraint* object = nullptr;
            for (const Cs_Constraint* c : s.constraints)
                if (!c->IsAssociationExempt()) {
                    object = c;
                    break;
                }
            out += ",";
            if (!object) {
                out += "-1,[";
            } else {
                const auto& objects = object->GetAssociatedDesignObjs();
                out += std::to_string(objects.size()) + ",[";
                for (size_t k = 0; k < objects.size() && k < kNamesPerStatement; ++k) {
                    if (k) out += ',';
                    Port_AppendJsonString(out, objects[k]->GetFullName());
                }
            }
            out += "],[";
            for (size_t k = 0; k < row_findings[i].size(); ++k) out += (k ? "," : "") + std::to_string(row_findings[i][k]);
            out += "]," + std::to_string(flags[i]) + "]";
        }
        out += "],\"findings\":[";
        for (size_t f = 0; f < findings.size(); ++f) {
            const Ck_Finding& finding = findings[f];
            out += f ? ",{" : "{";
            Ck_AppendKindJson(out, finding.kind);
            out += ",\"message\":";
            Port_AppendJsonString(out, finding.message);
            out += ",\"refs\":[";
            for (size_t k = 0; k < finding.refs.size(); ++k) {
                const Ck_Ref& r = finding.refs[k];
                out += k ? ",[" : "[";
                out += std::to_string(rows_of_finding[f][k]) + ",";
                Port_AppendJsonString(out, Ck_Where(r));
                out += ",";
                Port_AppendJsonString(out, r.object);
                out += r.wins ? ",1]" : ",0]";
            }
            out += "]}";
        }
        out += "]}";
        return out;
    }

private:
    static int FlagOf(Ck_Kind kind) {
        switch (kind) {
            case Ck_Kind::UnmatchedName: return kUnmatched;
            case Ck_Kind::LocationOverride: return kOverride;
            case Ck_Kind::PinClash: return kClash;
            default: return 0;
        }
    }

    long FileIndex(const char* file) const {
        const auto& files = check_.files();
        for (size_t i = 0; i < files.size(); ++i)
            if (files[i] == file) return static_cast<long>(i);
        return -1;
    }

    // The row of a statement; a statement that cannot be read is found by its file and line.
    long RowOf(const Ck_Ref& r) {
        if (r.constraint) {
            auto it = row_of_.find(r.constraint);
            return it == row_of_.end() ? -1 : static_cast<long>(it->second);
        }
        if (by_line_.empty())
            for (size_t i = 0; i < check_.statements().size(); ++i)
                by_line_.emplace(Where(check_.statements()[i].file, check_.statements()[i].line), i);
        auto it = by_line_.find(Where(r.file, r.line));
        return it == by_line_.end() ? -1 : static_cast<long>(it->second);
    }

    static std::string Where(const char* file, int line) { return std::string(file) + '\n' + std::to_string(line); }

    const Ck_BoardCheck& check_;
    const std::string& design_;
    std::unordered_map<const Cs_Constraint*, size_t> row_of_;
    std::unordered_map<std::string, size_t> by_line_;
};

}  // namespace

std::string Ck_HtmlReport(const Ck_BoardCheck& check, const std::string& design) {
    return std::string(kCk_PageHead) + ScriptSafe(DataWriter(check, design).Json()) + kCk_PageTail;
}

bool Ck_WriteHtmlReport(const Ck_BoardCheck& check, const std::string& design, const std::string& path,
                        std::string& error) {
    Port::AtomicFile file(path);
    if (file.Write(Ck_HtmlReport(check, design)) && file.Commit()) return true;
    error = file.error();
    return false;
}
