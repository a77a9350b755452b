// Test helpers: a parser that records every callback as one line of text, and temporary files.
#pragma once

#include <gtest/gtest.h>
#include <unistd.h>

#include <charconv>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "host/parser/pr_logical.h"

namespace parser_test {

inline std::string num(double v) {
    char buf[64];
    auto r = std::to_chars(buf, buf + sizeof buf, v);
    return std::string(buf, r.ptr);
}
inline std::string b(bool v) {
    return v ? "true" : "false";
}
inline std::string s(const char* t) {
    return t ? t : "null";
}
inline std::string p(const double* v) {
    return v ? ">" + num(*v) : "null";
}
inline std::string prio(int v) {
    return v == PR_NO_PRIORITY ? "NONE" : std::to_string(v);
}
inline std::string list(const std::vector<const char*>& v) {
    std::string out = "(";
    for (std::size_t i = 0; i < v.size(); ++i) out += (i ? "," : "") + s(v[i]);
    return out + ")";
}
inline std::string list(const char* const* b, const char* const* e) {
    return list(std::vector<const char*>(b, e));
}

// Writes `text` to a fresh file that is removed again at the end of the scope.
class TempFile {
  public:
    explicit TempFile(const std::string& text) {
        static int counter = 0;
        path_ =
            (std::filesystem::temp_directory_path() / ("lun_parser_" + std::to_string(::getpid()) +
                                                       "_" + std::to_string(counter++) + ".ucf"))
                .string();
        std::ofstream(path_, std::ios::binary) << text;
    }
    ~TempFile() { std::filesystem::remove(path_); }
    TempFile(const TempFile&) = delete;
    TempFile& operator=(const TempFile&) = delete;
    const char* path() const { return path_.c_str(); }

  private:
    std::string path_;
};

struct Call {
    std::string what;   // callback and arguments
    int line = 0;       // handle line (cb_error: its line argument)
    std::string ascii;  // handle text (empty for cb_error)
};

// Records every callback; returns `answer` from each.
class Recorder : public Pr_Logical_Parser {
  public:
    explicit Recorder(const char* file) : Pr_Logical_Parser(file) {}

    std::vector<Call> calls;
    bool answer = true;

    std::vector<std::string> whats() const {
        std::vector<std::string> out;
        for (const Call& c : calls) out.push_back(c.what);
        return out;
    }

    static std::string record(const Pr_Logical_Constraint* c) {
        std::string out = "(" + s(c->get_name()) + "," + std::to_string(c->get_type());
        switch (c->get_type()) {
            case Pr_Logical_Constraint::STRING:
                out += "," + s(dynamic_cast<const Pr_Logical_StringConstraint*>(c)->get_value());
                break;
            case Pr_Logical_Constraint::STRING_LIST_TYPE: {
                auto* l = dynamic_cast<const Pr_Logical_StringListConstraint*>(c);
                out += "," + list(l->begin_value(), l->end_value());
                break;
            }
            case Pr_Logical_Constraint::INIT_: {
                auto* i = dynamic_cast<const Pr_Logical_InitRangeConstraint*>(c);
                out +=
                    "," + list(i->begin_name(), i->end_name()) + "," + s(i->get_constraint_value());
                break;
            }
            case Pr_Logical_Constraint::OFFSET: {
                auto* o = dynamic_cast<const Pr_Logical_OffsetConstraint*>(c);
                out += "," + b(o->isin()) + "," + num(o->gettime()) + "," +
                       p(o->get_valid_field()) + "," + b(o->isbefore()) + "," + s(o->getname()) +
                       "," + s(o->gettgname()) + "," + b(o->has_high_low()) + "," +
                       s(o->get_high_or_low());
                break;
            }
            case Pr_Logical_Constraint::PERIOD: {
                auto* q = dynamic_cast<const Pr_Logical_PeriodConstraint*>(c);
                out += "," + num(q->getperiod()) + "," + b(q->gethigh()) + "," +
                       num(q->gethightime()) + "," + num(q->gethighpercent()) + "," +
                       p(q->get_input_jitter());
                break;
            }
            default:
                break;
        }
        return out + ")";
    }

    static std::string defn(const Pr_Logical_ConstraintDefn& d) {
        std::string out = s(d.get_object_name()) + ";";
        EXPECT_EQ(d.end_constraint() - d.begin_constraint(), d.num_constraints());
        for (auto it = d.begin_constraint(); it != d.end_constraint(); ++it)
            out += (it == d.begin_constraint() ? "" : ",") + record(*it);
        return out;
    }

    bool add(const std::string& what, const Handle* h) {
        calls.push_back({what, h ? h->getline() : 0, h ? h->return_ascii() : ""});
        return answer;
    }

    bool cb_error(int line, int column, const char* value) override {
        calls.push_back(
            {"error(" + std::to_string(line) + "," + std::to_string(column) + "," + s(value) + ")",
             line, ""});
        return answer;
    }
    bool cb_syntax_error(int line, int column, const char* text, const Handle* h) override {
        return add(
            "syntax(" + std::to_string(line) + "," + std::to_string(column) + "," + s(text) + ")",
            h);
    }
    bool cb_comment(const char* text, const Handle* h) override {
        return add("comment(" + s(text) + ")", h);
    }
    bool cb_enable(bool on, const char* name, const Handle* h) override {
        return add("enable(" + b(on) + "," + s(name) + ")", h);
    }
    bool cb_areagroup(const Defn& d, const Handle* h) override {
        return add("areagroup(" + defn(d) + ")", h);
    }
    bool cb_net(const Defn& d, const Handle* h) override { return add("net(" + defn(d) + ")", h); }
    bool cb_comp(const Defn& d, const Handle* h) override {
        return add("comp(" + defn(d) + ")", h);
    }
    bool cb_pin(const Defn& d, const Handle* h) override { return add("pin(" + defn(d) + ")", h); }
    bool cb_model(const Defn& d, const Handle* h) override {
        return add("model(" + defn(d) + ")", h);
    }
    bool cb_set(const Defn& d, const Handle* h) override { return add("set(" + defn(d) + ")", h); }
    bool cb_config(const char* name, const char* value, const Handle* h) override {
        return add("config(" + s(name) + "," + s(value) + ")", h);
    }
    bool cb_begin_model(const char* name, const Handle* h) override {
        return add("begin_model(" + s(name) + ")", h);
    }
    bool cb_end_model(const Handle* h) override { return add("end_model()", h); }
    bool cb_prohibit(const std::vector<const char*>& v, const Handle* h) override {
        return add("prohibit(" + list(v) + ")", h);
    }
    bool cb_vref(const std::vector<const char*>& v, const Handle* h) override {
        return add("vref(" + list(v) + ")", h);
    }
    bool cb_offset(bool in, double t, const double* valid, bool before, const char* clock,
                   const char* level, const Handle* h) override {
        return add("offset(" + b(in) + "," + num(t) + "," + p(valid) + "," + b(before) + "," +
                       s(clock) + "," + s(level) + ")",
                   h);
    }
    bool cb_toffset(const char* g, bool in, double t, const double* valid, bool before,
                    const char* clock, const char* level, const Handle* h) override {
        return add("toffset(" + s(g) + "," + b(in) + "," + num(t) + "," + p(valid) + "," +
                       b(before) + "," + s(clock) + "," + s(level) + ")",
                   h);
    }
    bool cb_roffset(bool in, double t, const double* valid, bool before, const char* clock,
                    const char* regs, const char* level, const Handle* h) override {
        return add("roffset(" + b(in) + "," + num(t) + "," + p(valid) + "," + b(before) + "," +
                       s(clock) + "," + s(regs) + "," + s(level) + ")",
                   h);
    }
    bool cb_troffset(const char* g, bool in, double t, const double* valid, bool before,
                     const char* clock, const char* regs, const char* level,
                     const Handle* h) override {
        return add("troffset(" + s(g) + "," + b(in) + "," + num(t) + "," + p(valid) + "," +
                       b(before) + "," + s(clock) + "," + s(regs) + "," + s(level) + ")",
                   h);
    }
    bool cb_tspec_maxdelay(const char* name, bool from, bool to,
                           const std::vector<const char*>& points, const char* ref, bool mul,
                           double value, bool is_time, int pr, bool dpo, const Handle* h) override {
        return add("maxdelay(" + s(name) + "," + b(from) + "," + b(to) + "," + list(points) + "," +
                       s(ref) + "," + b(mul) + "," + num(value) + "," + b(is_time) + "," +
                       prio(pr) + "," + b(dpo) + ")",
                   h);
    }
    bool cb_tspec_period(const char* name, const char* group, const char* ref, bool mul,
                         double value, bool is_time, bool phase_plus, double phase, bool low,
                         double duration, double percent, const double* jitter, int pr,
                         const Handle* h) override {
        return add("period(" + s(name) + "," + s(group) + "," + s(ref) + "," + b(mul) + "," +
                       num(value) + "," + b(is_time) + "," + b(phase_plus) + "," + num(phase) +
                       "," + b(low) + "," + num(duration) + "," + num(percent) + "," + p(jitter) +
                       "," + prio(pr) + ")",
                   h);
    }
    bool cb_tspec_tig(const char* name, bool from, bool to, const std::vector<const char*>& points,
                      int pr, const Handle* h) override {
        return add("tig(" + s(name) + "," + b(from) + "," + b(to) + "," + list(points) + "," +
                       prio(pr) + ")",
                   h);
    }
    bool cb_tspec_drop_spec(const char* name, const Handle* h) override {
        return add("drop_spec(" + s(name) + ")", h);
    }
    bool cb_timegrp(const char* g, const std::vector<std::pair<const char*, PR_EDGE>>& members,
                    const std::vector<const char*>& excluded, const Handle* h) override {
        std::string m = "(";
        for (std::size_t i = 0; i < members.size(); ++i)
            m += (i ? "," : "") + std::string("(") + s(members[i].first) + "," +
                 std::to_string(members[i].second) + ")";
        return add("timegrp(" + s(g) + "," + m + ")," + list(excluded) + ")", h);
    }
    bool cb_timegrp_areagroup(const char* g, const char* a, const Handle* h) override {
        return add("timegrp_areagroup(" + s(g) + "," + s(a) + ")", h);
    }
    bool cb_temperature(double c, const Handle* h) override {
        return add("temperature(" + num(c) + ")", h);
    }
    bool cb_voltage(double v, const Handle* h) override {
        return add("voltage(" + num(v) + ")", h);
    }
    bool cb_default(const Handle* h) override { return add("default()", h); }
};

// Parses `text` and returns what was recorded; `result` gets parse()'s answer.
inline std::vector<Call> parse_text(const std::string& text, bool* result = nullptr) {
    TempFile file(text);
    Recorder r(file.path());
    const bool ok = r.parse();
    if (result) *result = ok;
    return r.calls;
}

// The single callback of a one-statement file.
inline std::string one(const std::string& statement) {
    const auto calls = parse_text(statement + "\n");
    if (calls.size() != 1) return "calls: " + std::to_string(calls.size());
    return calls[0].what;
}

}  // namespace parser_test
