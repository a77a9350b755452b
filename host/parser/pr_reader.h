// The statement reader of the constraint-file parser (internal to host/parser): the token
// helpers, the records it fills and the Reader class. pr_parser.cpp holds the pass over the file,
// failures and quantities; pr_statements.cpp the statements.
#pragma once

#include <cmath>
#include <cstring>

#include "host/parser/pr_lexer.h"
#include "host/parser/pr_logical.h"
#include "host/parser/pr_quantity.h"
#include "host/port/msgman.h"

namespace pr_detail {

inline char upper(char c) {
    return c >= 'a' && c <= 'z' ? static_cast<char>(c - 32) : c;
}

// `a` equals the upper-case word `up` in any letter case.
inline bool ieq(std::string_view a, std::string_view up) {
    if (a.size() != up.size()) return false;
    for (std::size_t i = 0; i < a.size(); ++i)
        if (upper(a[i]) != up[i]) return false;
    return true;
}

// An unquoted word equal to `up` in any letter case.
inline bool kw(const Token& t, std::string_view up) {
    return t.kind == Tok::Word && !t.quoted && ieq(t.text, up);
}

inline bool is_colon(const Token& t) {
    return t.kind == Tok::Word && !t.quoted && t.text.size() == 1 && t.text[0] == ':';
}

inline bool is_terminator(const Token& t) {
    return t.kind == Tok::Bar || t.kind == Tok::Semi;
}

inline bool looks_numeric(const Token& t) {
    return t.kind == Tok::Word && !t.quoted && numeric_looking(t.text);
}

// Words that may not stand as a TIMESPEC reference name.
inline constexpr std::string_view kStructural[] = {
    "PERIOD",     "FROM",   "THRU",         "TO",       "TIG",     "IGNORE",
    "DROP_SPEC",  "HIGH",   "LOW",          "IN",       "OUT",     "BEFORE",
    "AFTER",      "VALID",  "DATAPATHONLY", "PRIORITY", "PHASE",   "INPUT_JITTER",
    "EXCEPT",     "RISING", "FALLING",      "TRANSHI",  "TRANSLO", "TIMEGRP",
    "AREA_GROUP", "OFFSET", "MODEL",        "PROHIBIT", "VREF"};

inline bool structural_or_unit(std::string_view w) {
    if (find_unit(w)) return true;
    for (std::string_view s : kStructural)
        if (ieq(w, s)) return true;
    return false;
}

inline bool edge_of(const Token& t, PR_EDGE& edge) {
    if (t.kind != Tok::Word || t.quoted) return false;
    if (ieq(t.text, "RISING"))
        edge = PR_RISING;
    else if (ieq(t.text, "FALLING"))
        edge = PR_FALLING;
    else if (ieq(t.text, "TRANSHI"))
        edge = PR_TRANSHI;
    else if (ieq(t.text, "TRANSLO"))
        edge = PR_TRANSLO;
    else
        return false;
    return true;
}

// Where a quantity stands decides which units it takes and whether it may carry a sign.
enum class Pos : std::uint8_t {
    PeriodValue,  // PERIOD values and path delays: time or frequency
    OffsetTime,
    PlainTime,  // VALID, INPUT_JITTER, MAXDELAY, MAXSKEW, a PHASE time after a sign word
    Phase,
    Duty,
    Temperature,
    Voltage,
    Factor,
    Priority
};

struct Rule {
    std::uint8_t accept;
    std::uint8_t reject;
    std::uint8_t fallback;  // family without unit
    bool sign;
    bool integer;
};

inline constexpr Rule kRules[] = {
    {kTime | kFrequency, kPercent, kTime, false, false},
    {kTime, kFrequency | kPercent, kTime, true, false},
    {kTime, kFrequency | kPercent, kTime, false, false},
    {kTime, kFrequency | kPercent, kTime, true, false},
    {kTime | kPercent, kFrequency, kPercent, false, false},
    {kTemperature, kTime | kFrequency | kPercent | kVoltage, kTemperature, true, false},
    {kVoltage, kTime | kFrequency | kPercent | kTemperature, kVoltage, false, false},
    {0, kAllFamilies, kPlain, false, false},
    {0, kAllFamilies, kPlain, true, true},
};

struct Quantity {
    std::uint8_t family = kPlain;
    bool negative = false;
    double value = 0;      // signed
    double magnitude = 0;  // without the written sign
    int integer = 0;
    std::string_view ps_text;  // times: picoseconds as decimal text
};

struct OffsetBody {
    bool in = true;
    double time = 0;
    bool has_valid = false;
    double valid = 0;
    bool before = true;
    const char* clock = "";
    const char* group = nullptr;
    const char* level = nullptr;
};

struct DutyJitter {
    bool duty_seen = false;
    bool low = false;
    double duration = 0;
    double percent = 50;
    bool jitter_seen = false;
    double jitter = 0;
};

struct TsValue {
    const char* reference = nullptr;
    bool multiply = true;
    double value = 0;
    bool is_time = true;
};

template <class T>
struct Pool {
    std::vector<std::unique_ptr<T>> items;
    std::size_t used = 0;
};

class Reader {
  public:
    Reader(Pr_Logical_Parser& parser, const char* data, std::size_t size)
        : parser_(parser), lexer_(data, size) {}

    bool run();

  private:
    using Handle = Pr_Logical_ConstraintHandle;
    using Defn = Pr_Logical_ConstraintDefn;
    using ObjectCallback = bool (Pr_Logical_Parser::*)(const Defn&, const Handle*);
    using ListCallback = bool (Pr_Logical_Parser::*)(const std::vector<const char*>&,
                                                     const Handle*);

    enum class Resume : std::uint8_t { SkipToSemicolon, AtSemicolon, NextLine, Eof };
    struct Failure {
        bool value = false;     // cb_error rather than cb_syntax_error
        bool in_quote = false;  // resume inside a quoted section
        int line = 0;
        int col = 0;
        const char* text = "";
        Resume resume = Resume::SkipToSemicolon;
        LexState from;        // where reading resumes (before skipping)
        std::size_t end = 0;  // statement end for AtSemicolon and NextLine
    };

    // ---- tokens
    const Token& peek() {
        if (!have_) {
            do lexer_.next(cur_, arena_);
            while (skip_colons_ && is_colon(cur_));
            have_ = true;
        }
        return cur_;
    }
    Token take() {
        peek();
        have_ = false;
        return cur_;
    }
    // Inside offset, period and TIMESPEC bodies a lone ':' word is passed over.
    void skip_colons(bool on) {
        skip_colons_ = on;
        if (on && have_ && is_colon(cur_)) have_ = false;
    }

    // ---- outcome
    bool fail(const Token& t);
    bool fail_value(const Token& word, const Token* unit);
    bool fail_value_at(int line, int col, std::string_view text, const LexState& from);
    void report();
    void complete(const Token& semicolon) {
        handle_.assign(first_.line, {lexer_.data() + first_.begin, semicolon.end - first_.begin});
    }
    void result(bool ok) {
        if (!ok) ok_ = false;
    }
    bool expect(Tok kind, Token& out) {
        out = take();
        return out.kind == kind || fail(out);
    }
    bool expect_eq() {
        Token t;
        return expect(Tok::Eq, t);
    }
    bool expect_word(Token& out) { return expect(Tok::Word, out); }
    bool expect_end() {
        Token t;
        if (!expect(Tok::Semi, t)) return false;
        complete(t);
        return true;
    }

    // ---- records
    template <class T>
    T* fresh(Pool<T>& pool) {
        if (pool.used == pool.items.size()) pool.items.push_back(std::unique_ptr<T>(new T()));
        return pool.items[pool.used++].get();
    }
    Pr_Logical_StringListConstraint* new_list(std::string_view key) {
        auto* r = fresh(lists_);
        r->reset(key);
        return r;
    }
    void add_string(std::string_view key, std::string_view value) {
        auto* r = fresh(strings_);
        r->reset(key, value);
        defn_.list_.push_back(r);
    }

    // ---- statements
    void statement();
    bool dispatch();
    bool object_statement(ObjectCallback cb);
    bool constraint(const Token& key);
    bool tnm_value(const Token& key);
    bool rloc_value(const Token& key);
    bool list_items(Pr_Logical_StringListConstraint* rec, const Token& first);
    bool general_value(const Token& key);
    bool feedback_value(const Token& key);
    bool init_value(const Token& key);
    bool delay_value(const Token& key);
    bool offset_record(const Token& key);
    bool period_record(const Token& key);
    bool offset_body(OffsetBody& b);
    bool duty_or_jitter(DutyJitter& d);
    bool timespec();
    bool ts_points(const char* name, Token t);
    bool ts_period(const char* name);
    bool ts_value(const Token& t, TsValue& v);
    bool reference(const Token& t, TsValue& v);
    bool phase(bool& plus, double& ps);
    bool priority(int& out, bool& seen);
    bool enable(bool on);
    bool offset_statement();
    bool timegrp();
    bool timegrp_members(const Token& group);
    bool group_statement(bool area_group);
    bool config();
    bool site_list(ListCallback cb);
    bool raw_value(const char* name, std::size_t from);
    bool temperature_or_voltage(bool temperature);
    bool begin_model();

    bool quantity(const Token& w, Pos pos, Quantity& q);

    Pr_Logical_Parser& parser_;
    Lexer lexer_;
    Arena arena_;
    Token cur_;
    bool have_ = false;
    bool skip_colons_ = false;
    Token first_;
    Failure failure_;
    bool ok_ = true;
    bool syntax_error_ = false;

    Handle handle_;
    Defn defn_;
    Pool<Pr_Logical_Constraint> bases_;
    Pool<Pr_Logical_StringConstraint> strings_;
    Pool<Pr_Logical_StringListConstraint> lists_;
    Pool<Pr_Logical_InitRangeConstraint> inits_;
    Pool<Pr_Logical_OffsetConstraint> offsets_;
    Pool<Pr_Logical_PeriodConstraint> periods_;
    std::vector<const char*> points_;
    std::vector<std::pair<const char*, PR_EDGE>> members_;
    std::vector<const char*> excluded_;
    std::string scratch_;
    std::string raw_;
    std::string comment_text_;
    std::string comment_line_;
};

}  // namespace pr_detail
