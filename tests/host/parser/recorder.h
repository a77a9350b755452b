// Test helpers: a parser that records every callback as one line of text, and temporary files.
#pragma once

#include <gtest/gtest.h>
#include <unistd.h>

#include <charconv>
#include <filesystem>
#include <fstream>
#include <string>
#include <type_traits>
#include <vector>

#include "host/parser/pr_logical.h"

namespace parser_test {

// One callback argument as text; null pointers read "null".
template <class T>
std::string str(const T& v) {
    using std::is_same_v;
    if constexpr (is_same_v<T, bool>) return v ? "true" : "false";
    if constexpr (is_same_v<T, int>) return std::to_string(v);
    if constexpr (is_same_v<T, const char*>) return v ? v : "null";
    if constexpr (is_same_v<T, std::string>) return v;
    if constexpr (is_same_v<T, const double*>) return v ? ">" + str(*v) : "null";
    if constexpr (is_same_v<T, double>) {
        char buf[64];
        return std::string(buf, std::to_chars(buf, buf + sizeof buf, v).ptr);
    }
    if constexpr (is_same_v<T, std::vector<const char*>>) {
        std::string out;
        for (std::size_t i = 0; i < v.size(); ++i) out += (i ? "," : "") + str(v[i]);
        return "(" + out + ")";
    }
}
inline std::string list(const char* const* b, const char* const* e) {
    return str(std::vector<const char*>(b, e));
}
inline std::string prio(int v) {
    return v == PR_NO_PRIORITY ? "NONE" : str(v);
}
// The arguments, formatted and separated by commas.
template <class... A>
std::string join(const A&... a) {
    std::string out;
    bool first = true;
    ((out += (first ? "" : ",") + str(a), first = false), ...);
    return out;
}

// Writes `text` to a fresh file that is removed again at the end of the scope.
class TempFile {
  public:
    explicit TempFile(const std::string& text) {
        static int counter = 0;
        path_ = (std::filesystem::temp_directory_path() /
                 ("lun_parser_" + str(int(::getpid())) + "_" + str(counter++) + ".ucf"))
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
    Call(std::string w, int l = 0, std::string a = {}) : what(w), line(l), ascii(a) {}
    std::string what;   // callback and arguments
    int line;           // handle line (cb_error: its line argument)
    std::string ascii;  // handle text (empty for cb_error)
};

// Records every callback; returns `answer` from each.
class Recorder : public Pr_Logical_Parser {
  public:
    explicit Recorder(const char* file) : Pr_Logical_Parser(file) {}

    std::vector<Call> calls;
    bool answer = true;
    using S = const char*;
    using H = const Handle*;
    using D = const Defn&;
    using P = const double*;
    using V = const std::vector<const char*>&;

    // Each constraint class adds its own fields after the name and type.
    static std::string record(const Pr_Logical_Constraint* c) {
        std::string out = join(c->get_name(), static_cast<int>(c->get_type()));
        if (auto* v = dynamic_cast<const Pr_Logical_StringConstraint*>(c))
            out += "," + str(v->get_value());
        if (auto* l = dynamic_cast<const Pr_Logical_StringListConstraint*>(c))
            out += "," + list(l->begin_value(), l->end_value());
        if (auto* i = dynamic_cast<const Pr_Logical_InitRangeConstraint*>(c))
            out += "," + join(list(i->begin_name(), i->end_name()), i->get_constraint_value());
        if (auto* o = dynamic_cast<const Pr_Logical_OffsetConstraint*>(c))
            out +=
                "," + join(o->isin(), o->gettime(), o->get_valid_field(), o->isbefore(),
                           o->getname(), o->gettgname(), o->has_high_low(), o->get_high_or_low());
        if (auto* q = dynamic_cast<const Pr_Logical_PeriodConstraint*>(c))
            out += "," + join(q->getperiod(), q->gethigh(), q->gethightime(), q->gethighpercent(),
                              q->get_input_jitter());
        return "(" + out + ")";
    }
    static std::string defn(const Pr_Logical_ConstraintDefn& d) {
        std::string out = str(d.get_object_name()) + ";";
        EXPECT_EQ(d.end_constraint() - d.begin_constraint(), d.num_constraints());
        for (auto it = d.begin_constraint(); it != d.end_constraint(); ++it)
            out += (it == d.begin_constraint() ? "" : ",") + record(*it);
        return out;
    }

    template <class... A>
    bool add(H h, S name, const A&... a) {
        calls.push_back(
            {name + ("(" + join(a...) + ")"), h ? h->getline() : 0, h ? h->return_ascii() : ""});
        return answer;
    }
    bool cb_error(int line, int column, S value) override {
        calls.push_back({"error(" + join(line, column, value) + ")", line, ""});
        return answer;
    }
    bool cb_syntax_error(int l, int c, S t, H h) override { return add(h, "syntax", l, c, t); }
    bool cb_comment(S t, H h) override { return add(h, "comment", t); }
    bool cb_enable(bool on, S name, H h) override { return add(h, "enable", on, name); }
    bool cb_areagroup(D d, H h) override { return add(h, "areagroup", defn(d)); }
    bool cb_net(D d, H h) override { return add(h, "net", defn(d)); }
    bool cb_comp(D d, H h) override { return add(h, "comp", defn(d)); }
    bool cb_pin(D d, H h) override { return add(h, "pin", defn(d)); }
    bool cb_model(D d, H h) override { return add(h, "model", defn(d)); }
    bool cb_set(D d, H h) override { return add(h, "set", defn(d)); }
    bool cb_config(S name, S value, H h) override { return add(h, "config", name, value); }
    bool cb_begin_model(S name, H h) override { return add(h, "begin_model", name); }
    bool cb_end_model(H h) override { return add(h, "end_model"); }
    bool cb_prohibit(V v, H h) override { return add(h, "prohibit", v); }
    bool cb_vref(V v, H h) override { return add(h, "vref", v); }
    bool cb_offset(bool in, double t, P valid, bool before, S clk, S lvl, H h) override {
        return add(h, "offset", in, t, valid, before, clk, lvl);
    }
    bool cb_toffset(S g, bool in, double t, P valid, bool before, S clk, S lvl, H h) override {
        return add(h, "toffset", g, in, t, valid, before, clk, lvl);
    }
    bool cb_roffset(bool in, double t, P valid, bool before, S clk, S regs, S lvl, H h) override {
        return add(h, "roffset", in, t, valid, before, clk, regs, lvl);
    }
    bool cb_troffset(S g, bool in, double t, P valid, bool before, S clk, S regs, S lvl,
                     H h) override {
        return add(h, "troffset", g, in, t, valid, before, clk, regs, lvl);
    }
    bool cb_tspec_maxdelay(S name, bool from, bool to, V points, S ref, bool mul, double value,
                           bool is_time, int pr, bool dpo, H h) override {
        return add(h, "maxdelay", name, from, to, points, ref, mul, value, is_time, prio(pr), dpo);
    }
    bool cb_tspec_period(S name, S group, S ref, bool mul, double value, bool is_time,
                         bool phase_plus, double phase, bool low, double duration, double percent,
                         P jitter, int pr, H h) override {
        return add(h, "period", name, group, ref, mul, value, is_time, phase_plus, phase, low,
                   duration, percent, jitter, prio(pr));
    }
    bool cb_tspec_tig(S name, bool from, bool to, V points, int pr, H h) override {
        return add(h, "tig", name, from, to, points, prio(pr));
    }
    bool cb_tspec_drop_spec(S name, H h) override { return add(h, "drop_spec", name); }
    bool cb_timegrp(S g, const std::vector<std::pair<S, PR_EDGE>>& members, V excluded,
                    H h) override {
        std::string m;
        for (const auto& [name, edge] : members)
            m += (m.empty() ? "(" : ",(") + join(name, static_cast<int>(edge)) + ")";
        return add(h, "timegrp", g, "(" + m + ")", excluded);
    }
    bool cb_timegrp_areagroup(S g, S a, H h) override { return add(h, "timegrp_areagroup", g, a); }
    bool cb_temperature(double c, H h) override { return add(h, "temperature", c); }
    bool cb_voltage(double v, H h) override { return add(h, "voltage", v); }
    bool cb_default(H h) override { return add(h, "default"); }
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
    return calls.size() == 1 ? calls[0].what : "calls: " + str(int(calls.size()));
}

}  // namespace parser_test
