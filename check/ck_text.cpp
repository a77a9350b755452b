#include "check/ck_text.h"

#include "check/ck_board_check.h"
#include "host/port/json_text.h"
#include "host/repository/cs_constraint.h"

namespace {

// Statements shown below a finding in text; the JSON line lists them all.
constexpr size_t kShownStatements = 10;

// The severity counts of a summary: errors, warnings, information.
struct Counts {
    size_t of[3] = {};
    size_t total = 0;
};

Counts CountsOf(const Ck_Summary& s) {
    Counts counts;
    for (int k = 0; k < kCk_KindCount; ++k) {
        counts.of[static_cast<int>(Ck_SeverityOf(static_cast<Ck_Kind>(k)))] += s.findings[k];
        counts.total += s.findings[k];
    }
    return counts;
}

std::string Plural(size_t n, const char* noun) { return std::to_string(n) + " " + noun + (n == 1 ? "" : "s"); }

// The repository's own messages name their statement already.
bool ShowsStatements(const Ck_Finding& f) {
    return f.kind != Ck_Kind::ParseError && f.kind != Ck_Kind::UnmatchedName;
}

std::string WhereOf(const Ck_Finding& f, const std::string& design) {
    return f.refs.empty() ? design : Ck_Where(f.refs.front());
}

void AppendString(std::string& out, const char* key, const std::string& value) {
    out += ",\"";
    out += key;
    out += "\":";
    Port_AppendJsonString(out, value);
}

void AppendCount(std::string& out, const char* key, size_t value) {
    out += ",\"";
    out += key;
    out += "\":" + std::to_string(value);
}

}  // namespace

std::string Ck_Where(const Ck_Ref& ref) {
    std::string where = ref.file;
    if (ref.line > 0) where += ":" + std::to_string(ref.line);
    return where;
}

std::string Ck_NameList(const std::vector<std::string>& names, size_t shown) {
    std::string text;
    for (size_t i = 0; i < names.size() && i < shown; ++i) text += (i ? ", " : "") + names[i];
    if (names.size() > shown) text += " and " + std::to_string(names.size() - shown) + " more";
    return text;
}

void Ck_WriteText(const Ck_BoardCheck& check, const std::string& design, std::string& out) {
    for (const Ck_Finding& f : check.findings()) {
        out += WhereOf(f, design) + ": " + Ck_SeverityWord(Ck_SeverityOf(f.kind)) + ": " + f.message + " [" +
               Ck_KindId(f.kind) + "]\n";
        if (!ShowsStatements(f)) continue;
        for (size_t i = 0; i < f.refs.size() && i < kShownStatements; ++i) {
            const Ck_Ref& r = f.refs[i];
            out += "  " + Ck_Where(r) + ": " + (r.constraint ? r.constraint->GetStatementText() : "");
            if (!r.object.empty()) out += "  (on " + r.object + ")";
            if (r.wins) out += "  (wins)";
            out += '\n';
        }
        if (f.refs.size() > kShownStatements)
            out += "  ... and " + Plural(f.refs.size() - kShownStatements, "more statement") + "\n";
    }
    const Ck_Summary& s = check.summary();
    const Counts counts = CountsOf(s);
    out += "summary: " + Plural(counts.total, "finding") + " (" + Plural(counts.of[0], "error") + ", " +
           Plural(counts.of[1], "warning") + ", " + std::to_string(counts.of[2]) + " info) in " +
           Plural(s.statements, "statement") + " of " + Plural(s.files, "file") + "\n";
    std::string kinds;
    for (int k = 0; k < kCk_KindCount; ++k)
        if (s.findings[k])
            kinds += (kinds.empty() ? "" : ", ") + std::string(Ck_KindId(static_cast<Ck_Kind>(k))) + " " +
                     std::to_string(s.findings[k]);
    if (!kinds.empty()) out += "  " + kinds + "\n";
    out += "  ports placed: " + std::to_string(s.ports_placed) + " of " + std::to_string(s.ports) +
           ", with an I/O standard: " + std::to_string(s.placed_with_iostandard) + " of " +
           std::to_string(s.ports_placed) + "\n";
    out += "  clocks covered by a PERIOD: " + std::to_string(s.clocks_covered) + " of " + std::to_string(s.clocks) +
           "\n";
}

void Ck_WriteJsonLines(const Ck_BoardCheck& check, const std::string& design, std::string& out) {
    for (const Ck_Finding& f : check.findings()) {
        out += '{';
        Ck_AppendKindJson(out, f.kind);
        AppendString(out, "file", f.refs.empty() ? design : std::string(f.refs.front().file));
        AppendCount(out, "line", f.refs.empty() ? 0 : static_cast<size_t>(f.refs.front().line));
        AppendString(out, "message", f.message);
        out += ",\"objects\":";
        Ck_AppendJsonNames(out, f.objects);
        out += ",\"statements\":[";
        for (size_t i = 0; i < f.refs.size(); ++i) {
            const Ck_Ref& r = f.refs[i];
            out += i ? ",{\"file\":" : "{\"file\":";
            Port_AppendJsonString(out, r.file);
            AppendCount(out, "line", static_cast<size_t>(r.line));
            out += ",\"statement\":";
            if (r.constraint)
                Port_AppendJsonString(out, r.constraint->GetStatementText());
            else
                out += "null";
            if (!r.object.empty()) AppendString(out, "object", r.object);
            if (r.wins) out += ",\"wins\":true";
            out += '}';
        }
        out += "]}\n";
    }
    out += "{\"summary\":";
    Ck_AppendSummaryJson(check.summary(), out);
    out += "}\n";
}

void Ck_AppendKindJson(std::string& out, Ck_Kind kind) {
    out += "\"kind\":\"";
    out += Ck_KindId(kind);
    out += "\",\"severity\":\"";
    out += Ck_SeverityWord(Ck_SeverityOf(kind));
    out += '"';
}

void Ck_AppendJsonNames(std::string& out, const std::vector<std::string>& names, size_t most) {
    out += '[';
    for (size_t i = 0; i < names.size() && i < most; ++i) {
        if (i) out += ',';
        Port_AppendJsonString(out, names[i]);
    }
    out += ']';
}

void Ck_AppendSummaryJson(const Ck_Summary& s, std::string& out) {
    const Counts counts = CountsOf(s);
    out += "{\"findings\":" + std::to_string(counts.total);
    AppendCount(out, "errors", counts.of[0]);
    AppendCount(out, "warnings", counts.of[1]);
    AppendCount(out, "info", counts.of[2]);
    out += ",\"kinds\":{";
    for (int k = 0; k < kCk_KindCount; ++k)
        out += (k ? ",\"" : "\"") + std::string(Ck_KindId(static_cast<Ck_Kind>(k))) + "\":" + std::to_string(s.findings[k]);
    out += '}';
    AppendCount(out, "statements", s.statements);
    AppendCount(out, "files", s.files);
    AppendCount(out, "ports", s.ports);
    AppendCount(out, "ports_placed", s.ports_placed);
    AppendCount(out, "placed_with_iostandard", s.placed_with_iostandard);
    AppendCount(out, "clocks", s.clocks);
    AppendCount(out, "clocks_covered", s.clocks_covered);
    out += '}';
}
