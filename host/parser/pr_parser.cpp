// Statement reader of the constraint-file parser: one pass over the file, one callback per
// statement and per comment line. Statement texts live in an arena that is rewound for every
// statement; records come from pools that are reused, so steady-state parsing allocates
// nothing.
#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cmath>
#include <cstring>

#include "host/parser/pr_lexer.h"
#include "host/parser/pr_logical.h"
#include "host/parser/pr_quantity.h"
#include "host/port/msgman.h"

namespace pr_detail {

namespace {

inline char upper(char c) {
    return c >= 'a' && c <= 'z' ? static_cast<char>(c - 32) : c;
}

// `a` equals the upper-case word `up` in any letter case.
bool ieq(std::string_view a, std::string_view up) {
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
constexpr std::string_view kStructural[] = {
    "PERIOD",     "FROM",   "THRU",         "TO",       "TIG",     "IGNORE",
    "DROP_SPEC",  "HIGH",   "LOW",          "IN",       "OUT",     "BEFORE",
    "AFTER",      "VALID",  "DATAPATHONLY", "PRIORITY", "PHASE",   "INPUT_JITTER",
    "EXCEPT",     "RISING", "FALLING",      "TRANSHI",  "TRANSLO", "TIMEGRP",
    "AREA_GROUP", "OFFSET", "MODEL",        "PROHIBIT", "VREF"};

bool structural_or_unit(std::string_view w) {
    if (find_unit(w)) return true;
    for (std::string_view s : kStructural)
        if (ieq(w, s)) return true;
    return false;
}

bool edge_of(const Token& t, PR_EDGE& edge) {
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

constexpr Rule kRules[] = {
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

}  // namespace

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

bool Reader::run() {
    for (;;) {
        switch (lexer_.between()) {
            case Lexer::Gap::End:
                return ok_ && !syntax_error_;
            case Lexer::Gap::CommentLine: {
                const int line = lexer_.state.line;
                lexer_.comment_line(comment_text_, comment_line_);
                handle_.assign(line, comment_line_);
                result(parser_.cb_comment(comment_text_.c_str(), &handle_));
                break;
            }
            case Lexer::Gap::Statement:
                statement();
                break;
        }
    }
}

void Reader::statement() {
    arena_.reset();
    bases_.used = strings_.used = lists_.used = 0;
    inits_.used = offsets_.used = periods_.used = 0;
    defn_.list_.clear();
    have_ = false;
    skip_colons_ = false;
    first_ = take();
    const bool done = first_.kind == Tok::Word && !first_.quoted ? dispatch() : fail(first_);
    if (!done) report();
}

bool Reader::dispatch() {
    const std::string_view w = first_.text;
    switch (upper(w[0])) {
        case 'N':
            if (ieq(w, "NET")) return object_statement(&Pr_Logical_Parser::cb_net);
            break;
        case 'I':
            if (ieq(w, "INST")) return object_statement(&Pr_Logical_Parser::cb_comp);
            break;
        case 'P':
            if (ieq(w, "PIN")) return object_statement(&Pr_Logical_Parser::cb_pin);
            if (ieq(w, "PROHIBIT"))
                return expect_eq() && site_list(&Pr_Logical_Parser::cb_prohibit);
            break;
        case 'M':
            if (ieq(w, "MODEL")) return object_statement(&Pr_Logical_Parser::cb_model);
            break;
        case 'T':
            if (ieq(w, "TIMESPEC")) return timespec();
            if (ieq(w, "TIMEGRP")) return timegrp();
            if (ieq(w, "TEMPERATURE")) return temperature_or_voltage(true);
            break;
        case 'O':
            if (ieq(w, "OFFSET")) return offset_statement();
            break;
        case 'E':
            if (ieq(w, "ENABLE")) return enable(true);
            if (ieq(w, "END")) {
                if (!expect_end()) return false;
                result(parser_.cb_end_model(&handle_));
                return true;
            }
            break;
        case 'D':
            if (ieq(w, "DISABLE")) return enable(false);
            break;
        case 'A':
            if (ieq(w, "AREA_GROUP")) return group_statement(true);
            break;
        case 'S':
            if (ieq(w, "SET")) return group_statement(false);
            if (ieq(w, "SYSTEM_JITTER")) {
                Token eq;
                return expect(Tok::Eq, eq) && raw_value(first_.text.data(), eq.end);
            }
            break;
        case 'C':
            if (ieq(w, "CONFIG")) return config();
            break;
        case 'V':
            if (ieq(w, "VREF")) return expect_eq() && site_list(&Pr_Logical_Parser::cb_vref);
            if (ieq(w, "VOLTAGE")) return temperature_or_voltage(false);
            break;
        case 'B':
            if (ieq(w, "BEGIN")) return begin_model();
            break;
        default:
            break;
    }
    return fail(first_);
}

// ---------------------------------------------------------------- failures

bool Reader::fail(const Token& t) {
    Failure& f = failure_;
    f = Failure{};
    f.line = t.line;
    f.col = t.col;
    f.from = t.after;
    switch (t.kind) {
        case Tok::Semi:
            f.text = ";";
            f.resume = Resume::AtSemicolon;
            f.end = t.end;
            break;
        case Tok::BadQuote:
            f.text = t.text.data();
            f.resume = Resume::NextLine;
            f.end = t.end;
            break;
        case Tok::End:  // the statement runs into the end of the file
            f.line = first_.line;
            f.col = first_.col;
            f.text = first_.text.data();
            f.resume = Resume::Eof;
            break;
        default:
            f.text = t.text.data();
            f.in_quote = t.in_quote;
            break;
    }
    return false;
}

bool Reader::fail_value_at(int line, int col, std::string_view text, const LexState& from) {
    failure_ = Failure{};
    failure_.value = true;
    failure_.line = line;
    failure_.col = col;
    failure_.text = text.data();
    failure_.from = from;
    return false;
}

bool Reader::fail_value(const Token& word, const Token* unit) {
    if (!unit) return fail_value_at(word.line, word.col, word.text, word.after);
    const std::size_t n = word.text.size() + 1 + unit->text.size();
    char* p = arena_.alloc(n + 1);
    std::memcpy(p, word.text.data(), word.text.size());
    p[word.text.size()] = ' ';
    std::memcpy(p + word.text.size() + 1, unit->text.data(), unit->text.size());
    p[n] = '\0';
    return fail_value_at(word.line, word.col, {p, n}, unit->after);
}

void Reader::report() {
    const Failure& f = failure_;
    lexer_.state = f.from;
    if (f.value) {
        // The statement's text, up to its ";", for readers that keep what they cannot read.
        lexer_.skip_to_semicolon();
        std::size_t stop = lexer_.state.pos;
        while (stop > first_.begin && (lexer_.data()[stop - 1] == '\n' || lexer_.data()[stop - 1] == '\r')) --stop;
        handle_.assign(first_.line, {lexer_.data() + first_.begin, stop > first_.begin ? stop - first_.begin : 0});
        parser_.failed_ = &handle_;
        result(parser_.cb_error(f.line, f.col, f.text));
        parser_.failed_ = nullptr;
        return;
    }
    std::size_t end = f.end;
    if (f.resume == Resume::SkipToSemicolon)
        end = lexer_.skip_to_semicolon(f.in_quote) ? lexer_.state.pos : lexer_.trimmed_end();
    else if (f.resume == Resume::Eof)
        end = lexer_.trimmed_end();
    if (end < first_.begin) end = first_.begin;
    handle_.assign(first_.line, {lexer_.data() + first_.begin, end - first_.begin});
    syntax_error_ = true;
    parser_.failed_ = &handle_;
    result(parser_.cb_syntax_error(f.line, f.col, f.text, &handle_));
    parser_.failed_ = nullptr;
}

// ---------------------------------------------------------------- quantities

bool Reader::quantity(const Token& w, Pos pos, Quantity& q) {
    const Rule& r = kRules[static_cast<int>(pos)];
    const std::uint8_t known = r.accept | r.reject;
    Number n;
    if (w.quoted || !split_number(w.text, n)) return fail_value(w, nullptr);

    const std::string_view suffix = w.text.substr(n.length);
    const Unit* unit = nullptr;
    Token unit_word;
    const Token* separate = nullptr;
    if (!suffix.empty()) {
        unit = find_unit(suffix);
        if (!unit || !(unit->family & known)) return fail_value(w, nullptr);
    } else {
        const Token& next = peek();
        if (next.kind == Tok::Word && !next.quoted) {
            const Unit* u = find_unit(next.text);
            if (u && (u->family & known)) {
                unit = u;
                unit_word = take();
                separate = &unit_word;
            }
        }
    }
    if (n.has_sign && !r.sign) return fail_value(w, separate);
    if (unit && (unit->family & r.reject)) return fail_value(w, separate);

    q.family = unit ? static_cast<std::uint8_t>(unit->family) : r.fallback;
    q.negative = n.negative;
    if (r.integer) {
        if (n.has_point) return fail_value(w, separate);
        long long v = 0;
        for (char c : n.int_digits) {
            v = v * 10 + (c - '0');
            if (v > 2147483648LL) return fail_value(w, separate);
        }
        if (n.negative) v = -v;
        if (v > 2147483647LL) return fail_value(w, separate);
        q.integer = static_cast<int>(v);
        q.value = static_cast<double>(v);
        q.magnitude = std::fabs(q.value);
        return true;
    }

    double m = 0;
    switch (q.family) {
        case kTime:
            shifted_digits(n, unit ? unit->shift : 3, scratch_);
            if (!decimal_to_double(scratch_, m)) return fail_value(w, separate);
            q.ps_text = arena_.copy(scratch_);
            break;
        case kFrequency: {
            shifted_digits(n, unit->shift, scratch_);
            double hz = 0;
            if (!decimal_to_double(scratch_, hz) || hz == 0) return fail_value(w, separate);
            m = 1.0e12 / hz;
            if (!std::isfinite(m)) return fail_value(w, separate);
            break;
        }
        case kPercent:
            shifted_digits(n, 0, scratch_);
            if (!decimal_to_double(scratch_, m) || !(m > 0 && m < 100))
                return fail_value(w, separate);
            break;
        case kTemperature: {
            shifted_digits(n, 0, scratch_);
            if (!decimal_to_double(scratch_, m)) return fail_value(w, separate);
            const double t = n.negative ? -m : m;
            const char scale = unit ? unit->scale : 'C';
            q.value = scale == 'F' ? ((t - 32.0) * 5.0) / 9.0 : scale == 'K' ? t - 273.15 : t;
            q.magnitude = std::fabs(q.value);
            return true;
        }
        case kVoltage:
            shifted_digits(n, unit ? unit->shift : 0, scratch_);
            if (!decimal_to_double(scratch_, m)) return fail_value(w, separate);
            break;
        default:
            shifted_digits(n, 0, scratch_);
            if (!decimal_to_double(scratch_, m)) return fail_value(w, separate);
            break;
    }
    q.magnitude = m;
    q.value = n.negative ? -m : m;
    return true;
}

// ---------------------------------------------------------------- NET, INST, PIN, MODEL

bool Reader::object_statement(ObjectCallback cb) {
    Token name;
    if (!expect_word(name)) return false;
    defn_.name_.assign(name.text.data(), name.text.size());
    Token t = take();
    if (t.kind != Tok::Semi) {
        for (;;) {
            if (t.kind != Tok::Word || t.quoted) return fail(t);
            if (!constraint(t)) return false;
            t = take();
            if (t.kind == Tok::Semi) break;
            if (t.kind != Tok::Bar) return fail(t);
            t = take();
        }
    }
    complete(t);
    result((parser_.*cb)(defn_, &handle_));
    return true;
}

// Reads `[= value]` after a key; on success the next token is '|' or ';'.
bool Reader::constraint(const Token& key) {
    const Token& next = peek();
    if (is_terminator(next)) {
        if (ieq(key.text, "TIG")) {
            defn_.list_.push_back(new_list(key.text));
        } else {
            auto* r = fresh(bases_);
            r->set_name(key.text);
            defn_.list_.push_back(r);
        }
        return true;
    }
    if (next.kind != Tok::Eq) return fail(take());
    take();
    const std::string_view k = key.text;
    const char* prefix = nullptr;
    int first = 0, last = 0;
    const bool init = Pr_Logical_InitRangeConstraint::parse_key(k, &prefix, &first, &last);
    if (init && first > last) return fail_value_at(key.line, key.col, key.text, key.after);
    if (is_terminator(peek())) return fail(take());

    if (ieq(k, "TNM") || ieq(k, "TNM_NET")) return tnm_value(key);
    if (ieq(k, "RLOC_RANGE")) return rloc_value(key);
    if (ieq(k, "FEEDBACK")) return feedback_value(key);
    if (init) return init_value(key);
    if (ieq(k, "MAXDELAY") || ieq(k, "MAXSKEW")) return delay_value(key);
    if (ieq(k, "OFFSET")) return offset_record(key);
    if (ieq(k, "PERIOD")) return period_record(key);
    return general_value(key);
}

// TNM values: g | q:g | q g | q : g.
bool Reader::tnm_value(const Token& key) {
    auto* rec = new_list(key.text);
    const Token a = take();
    if (a.kind != Tok::Word || is_colon(a)) return fail(a);
    if (is_terminator(peek())) {
        const std::size_t c = a.quoted ? std::string_view::npos : a.text.find(':');
        if (c == std::string_view::npos) {
            rec->add_value(a.text);
        } else if (c > 0 && c + 1 < a.text.size()) {
            rec->add_value(a.text.substr(0, c));
            rec->add_value(a.text.substr(c + 1));
        } else {
            return fail(a);
        }
    } else {
        Token b = take();
        if (b.kind != Tok::Word) return fail(b);
        if (is_colon(b)) {
            b = take();
            if (b.kind != Tok::Word || is_colon(b)) return fail(b);
        }
        if (!is_terminator(peek())) return fail(take());
        rec->add_value(a.text);
        rec->add_value(b.text);
    }
    defn_.list_.push_back(rec);
    return true;
}

// RLOC_RANGE values: a:b | a : b | a general list.
bool Reader::rloc_value(const Token& key) {
    auto* rec = new_list(key.text);
    const Token a = take();
    if (a.kind != Tok::Word) return fail(a);
    const Token& next = peek();
    if (is_terminator(next)) {
        const std::size_t c = a.quoted ? std::string_view::npos : a.text.find(':');
        if (c != std::string_view::npos && c > 0 && c + 1 < a.text.size()) {
            rec->add_value(a.text.substr(0, c));
            rec->add_value(a.text.substr(c + 1));
        } else {
            rec->add_value(a.text);
        }
    } else if (is_colon(next)) {
        const Token colon = take();
        const Token b = take();
        // Anything but `a : b` is a list whose first item has a second word: the ':'.
        if (b.kind != Tok::Word || !is_terminator(peek())) return fail(colon);
        rec->add_value(a.text);
        rec->add_value(b.text);
    } else if (!list_items(rec, a)) {
        return false;
    }
    defn_.list_.push_back(rec);
    return true;
}

// `first { , item }` up to '|' or ';', one word per item.
bool Reader::list_items(Pr_Logical_StringListConstraint* rec, const Token& first) {
    rec->add_value(first.text);
    for (;;) {
        const Token& next = peek();
        if (is_terminator(next)) return true;
        if (next.kind != Tok::Comma) return fail(take());
        take();
        const Token item = take();
        if (item.kind != Tok::Word) return fail(item);
        rec->add_value(item.text);
    }
}

bool Reader::general_value(const Token& key) {
    const Token a = take();
    if (a.kind != Tok::Word) return fail(a);
    const Token& next = peek();
    if (is_terminator(next)) {
        add_string(key.text, a.text);
        return true;
    }
    if (next.kind != Tok::Comma) return fail(take());
    auto* rec = new_list(key.text);
    if (!list_items(rec, a)) return false;
    defn_.list_.push_back(rec);
    return true;
}

bool Reader::feedback_value(const Token& key) {
    auto* rec = new_list(key.text);
    for (;;) {
        const Token& next = peek();
        if (is_terminator(next)) break;
        if (next.kind != Tok::Word) return fail(take());
        rec->add_value(take().text);
    }
    defn_.list_.push_back(rec);
    return true;
}

bool Reader::init_value(const Token& key) {
    const Token v = take();
    if (v.kind != Tok::Word) return fail(v);
    if (!is_terminator(peek())) return fail(take());
    auto* rec = fresh(inits_);
    rec->reset(key.text, v.text);
    defn_.list_.push_back(rec);
    return true;
}

bool Reader::delay_value(const Token& key) {
    const Token v = take();
    if (v.kind != Tok::Word) return fail(v);
    Quantity q;
    if (!quantity(v, Pos::PlainTime, q)) return false;
    if (!is_terminator(peek())) return fail(take());
    add_string(key.text, q.ps_text);
    return true;
}

bool Reader::offset_record(const Token& key) {
    OffsetBody b;
    if (!offset_body(b)) return false;
    if (!is_terminator(peek())) return fail(take());
    auto* r = fresh(offsets_);
    r->set_name(key.text);
    r->in_ = b.in;
    r->time_ = b.time;
    if (b.has_valid)
        r->valid_ = b.valid;
    else
        r->valid_.reset();
    r->before_ = b.before;
    r->clock_.assign(b.clock);
    r->has_tg_ = b.group != nullptr;
    r->tgname_.assign(b.group ? b.group : "");
    r->level_.assign(b.level ? b.level : "");
    defn_.list_.push_back(r);
    return true;
}

bool Reader::period_record(const Token& key) {
    skip_colons(true);
    const Token v = take();
    if (v.kind != Tok::Word) return fail(v);
    Quantity q;
    if (!quantity(v, Pos::PeriodValue, q)) return false;
    DutyJitter d;
    for (;;) {
        const Token& next = peek();
        if (!kw(next, "HIGH") && !kw(next, "LOW") && !kw(next, "INPUT_JITTER")) break;
        if (!duty_or_jitter(d)) return false;
    }
    skip_colons(false);
    if (!is_terminator(peek())) return fail(take());
    auto* r = fresh(periods_);
    r->set_name(key.text);
    r->period_ = q.value;
    r->low_ = d.low;
    r->hightime_ = d.duration;
    r->highpercent_ = d.percent;
    if (d.jitter_seen)
        r->jitter_ = d.jitter;
    else
        r->jitter_.reset();
    defn_.list_.push_back(r);
    return true;
}

// ( IN | OUT ) time [VALID time] ( BEFORE | AFTER ) clock [TIMEGRP name] [level]
bool Reader::offset_body(OffsetBody& b) {
    skip_colons(true);
    const Token dir = take();
    if (kw(dir, "IN"))
        b.in = true;
    else if (kw(dir, "OUT"))
        b.in = false;
    else
        return fail(dir);
    Quantity q;
    const Token t = take();
    if (t.kind != Tok::Word) return fail(t);
    if (!quantity(t, Pos::OffsetTime, q)) return false;
    b.time = q.value;
    if (kw(peek(), "VALID")) {
        take();
        const Token v = take();
        if (v.kind != Tok::Word) return fail(v);
        if (!quantity(v, Pos::PlainTime, q)) return false;
        b.has_valid = true;
        b.valid = q.value;
    }
    const Token edge = take();
    if (kw(edge, "BEFORE"))
        b.before = true;
    else if (kw(edge, "AFTER"))
        b.before = false;
    else
        return fail(edge);
    const Token clock = take();
    if (clock.kind != Tok::Word) return fail(clock);
    b.clock = clock.text.data();
    if (kw(peek(), "TIMEGRP")) {
        take();
        const Token g = take();
        if (g.kind != Tok::Word) return fail(g);
        b.group = g.text.data();
    }
    const Token& level = peek();
    for (const char* l : {"HIGH", "LOW", "RISING", "FALLING"}) {
        if (kw(level, l)) {
            b.level = l;
            take();
            break;
        }
    }
    skip_colons(false);
    return true;
}

// ( HIGH | LOW ) [figure] or INPUT_JITTER time; each at most once.
bool Reader::duty_or_jitter(DutyJitter& d) {
    const Token opt = take();
    Quantity q;
    if (kw(opt, "INPUT_JITTER")) {
        if (d.jitter_seen) return fail(opt);
        d.jitter_seen = true;
        const Token j = take();
        if (j.kind != Tok::Word) return fail(j);
        if (!quantity(j, Pos::PlainTime, q)) return false;
        d.jitter = q.value;
        return true;
    }
    if (d.duty_seen) return fail(opt);
    d.duty_seen = true;
    d.low = kw(opt, "LOW");
    if (looks_numeric(peek())) {
        const Token f = take();
        if (!quantity(f, Pos::Duty, q)) return false;
        if (q.family == kTime) {
            d.duration = q.value;
            d.percent = 0;
        } else {
            d.duration = 0;
            d.percent = q.value;
        }
    }
    return true;
}

// ---------------------------------------------------------------- TIMESPEC

bool Reader::timespec() {
    Token name;
    if (!expect_word(name) || !expect_eq()) return false;
    skip_colons(true);
    const Token body = take();
    if (kw(body, "PERIOD")) return ts_period(name.text.data());
    if (kw(body, "FROM") || kw(body, "THRU") || kw(body, "TO"))
        return ts_points(name.text.data(), body);
    if (kw(body, "TIG") || kw(body, "IGNORE")) {
        int prio = PR_NO_PRIORITY;
        bool seen = false;
        if (kw(peek(), "PRIORITY") && !priority(prio, seen)) return false;
        if (!expect_end()) return false;
        points_.clear();
        result(parser_.cb_tspec_tig(name.text.data(), false, false, points_, prio, &handle_));
        return true;
    }
    if (kw(body, "DROP_SPEC")) {
        if (!expect_end()) return false;
        result(parser_.cb_tspec_drop_spec(name.text.data(), &handle_));
        return true;
    }
    return fail(body);
}

// [FROM p] {THRU p} [TO p] then a value or TIG; `t` is the first point keyword.
bool Reader::ts_points(const char* name, Token t) {
    points_.clear();
    bool has_from = false, has_to = false;
    auto point = [&]() {
        const Token p = take();
        if (p.kind != Tok::Word) return fail(p);
        points_.push_back(p.text.data());
        t = take();
        return true;
    };
    if (kw(t, "FROM")) {
        has_from = true;
        if (!point()) return false;
    }
    while (kw(t, "THRU"))
        if (!point()) return false;
    if (kw(t, "TO")) {
        has_to = true;
        if (!point()) return false;
    }
    if (t.kind != Tok::Word) return fail(t);

    int prio = PR_NO_PRIORITY;
    bool prio_seen = false;
    if (kw(t, "TIG")) {
        if (kw(peek(), "PRIORITY") && !priority(prio, prio_seen)) return false;
        if (!expect_end()) return false;
        result(parser_.cb_tspec_tig(name, has_from, has_to, points_, prio, &handle_));
        return true;
    }
    TsValue v;
    if (!ts_value(t, v)) return false;
    bool datapathonly = false;
    for (;;) {
        const Token& next = peek();
        if (kw(next, "DATAPATHONLY")) {
            const Token d = take();
            if (datapathonly) return fail(d);
            datapathonly = true;
        } else if (kw(next, "PRIORITY")) {
            if (!priority(prio, prio_seen)) return false;
        } else {
            break;
        }
    }
    if (!expect_end()) return false;
    result(parser_.cb_tspec_maxdelay(name, has_from, has_to, points_, v.reference, v.multiply,
                                     v.value, v.is_time, prio, datapathonly, &handle_));
    return true;
}

bool Reader::ts_period(const char* name) {
    Token group;
    if (!expect_word(group)) return false;
    const Token t = take();
    if (t.kind != Tok::Word) return fail(t);
    TsValue v;
    if (!ts_value(t, v)) return false;

    bool phase_seen = false, prio_seen = false;
    bool phase_plus = true;
    double phase_ps = 0;
    int prio = PR_NO_PRIORITY;
    DutyJitter d;
    for (;;) {
        const Token& next = peek();
        if (kw(next, "PHASE")) {
            const Token p = take();
            if (!v.reference || phase_seen) return fail(p);
            phase_seen = true;
            if (!phase(phase_plus, phase_ps)) return false;
        } else if (kw(next, "HIGH") || kw(next, "LOW") || kw(next, "INPUT_JITTER")) {
            if (!duty_or_jitter(d)) return false;
        } else if (kw(next, "PRIORITY")) {
            if (!priority(prio, prio_seen)) return false;
        } else {
            break;
        }
    }
    if (!expect_end()) return false;
    result(parser_.cb_tspec_period(name, group.text.data(), v.reference, v.multiply, v.value,
                                   v.is_time, phase_plus, phase_ps, d.low, d.duration, d.percent,
                                   d.jitter_seen ? &d.jitter : nullptr, prio, &handle_));
    return true;
}

// A time or frequency, or a reference with an optional factor.
bool Reader::ts_value(const Token& t, TsValue& v) {
    if (looks_numeric(t)) {
        Quantity q;
        if (!quantity(t, Pos::PeriodValue, q)) return false;
        v.value = q.value;
        v.is_time = q.family != kFrequency;
        return true;
    }
    if (!t.quoted && structural_or_unit(t.text)) return fail(t);
    return reference(t, v);
}

bool Reader::reference(const Token& t, TsValue& v) {
    Token factor;
    bool has_factor = false;
    // The factor glued to an operator: a token for the rest of the word.
    auto rest_of = [](const Token& w, std::size_t at) {
        Token f = w;
        f.text = w.text.substr(at);
        f.col = w.col + static_cast<int>(at);
        f.begin = w.begin + at;
        return f;
    };
    if (t.text.empty()) return fail(t);  // ""
    v.reference = t.text.data();
    if (!t.quoted) {
        const std::size_t op = t.text.find_first_of("*/");
        if (op != std::string_view::npos) {
            if (op == 0) return fail(t);
            v.reference = arena_.copy(t.text.substr(0, op)).data();
            v.multiply = t.text[op] == '*';
            has_factor = true;
            if (op + 1 < t.text.size()) {
                factor = rest_of(t, op + 1);
            } else {
                factor = take();
                if (factor.kind != Tok::Word) return fail(factor);
            }
        }
    }
    if (!has_factor) {
        const Token& next = peek();
        if (next.kind == Tok::Word && !next.quoted && !next.text.empty() &&
            (next.text[0] == '*' || next.text[0] == '/')) {
            const Token o = take();
            v.multiply = o.text[0] == '*';
            has_factor = true;
            if (o.text.size() > 1) {
                factor = rest_of(o, 1);
            } else {
                factor = take();
                if (factor.kind != Tok::Word) return fail(factor);
            }
        }
    }
    if (has_factor) {
        Quantity q;
        if (!quantity(factor, Pos::Factor, q)) return false;
        v.value = q.value;
    }
    return true;
}

// PHASE [ + | - ] time: the sign from a sign word or from the time, not both.
bool Reader::phase(bool& plus, double& ps) {
    const Token s = take();
    if (s.kind != Tok::Word) return fail(s);
    Quantity q;
    if (!s.quoted && (s.text == "+" || s.text == "-")) {
        plus = s.text == "+";
        const Token t = take();
        if (t.kind != Tok::Word) return fail(t);
        if (!quantity(t, Pos::PlainTime, q)) return false;
    } else {
        if (!quantity(s, Pos::Phase, q)) return false;
        plus = !q.negative;
    }
    ps = q.magnitude;
    return true;
}

bool Reader::priority(int& out, bool& seen) {
    const Token p = take();
    if (seen) return fail(p);
    seen = true;
    const Token v = take();
    if (v.kind != Tok::Word) return fail(v);
    Quantity q;
    if (!quantity(v, Pos::Priority, q)) return false;
    out = q.integer;
    return true;
}

// ---------------------------------------------------------------- other statements

bool Reader::enable(bool on) {
    Token name;
    if (!expect_eq() || !expect_word(name) || !expect_end()) return false;
    result(parser_.cb_enable(on, name.text.data(), &handle_));
    return true;
}

bool Reader::offset_statement() {
    OffsetBody b;
    if (!expect_eq() || !offset_body(b) || !expect_end()) return false;
    if (b.group)
        result(parser_.cb_roffset(b.in, b.time, b.has_valid ? &b.valid : nullptr, b.before, b.clock,
                                  b.group, b.level, &handle_));
    else
        result(parser_.cb_offset(b.in, b.time, b.has_valid ? &b.valid : nullptr, b.before, b.clock,
                                 b.level, &handle_));
    return true;
}

bool Reader::timegrp() {
    Token group;
    if (!expect_word(group)) return false;
    const Token t = take();
    if (t.kind == Tok::Eq) return timegrp_members(group);
    if (kw(t, "OFFSET")) {
        OffsetBody b;
        if (!expect_eq() || !offset_body(b) || !expect_end()) return false;
        const double* valid = b.has_valid ? &b.valid : nullptr;
        if (b.group)
            result(parser_.cb_troffset(group.text.data(), b.in, b.time, valid, b.before, b.clock,
                                       b.group, b.level, &handle_));
        else
            result(parser_.cb_toffset(group.text.data(), b.in, b.time, valid, b.before, b.clock,
                                      b.level, &handle_));
        return true;
    }
    if (kw(t, "AREA_GROUP")) {
        Token area;
        if (!expect_eq() || !expect_word(area) || !expect_end()) return false;
        result(parser_.cb_timegrp_areagroup(group.text.data(), area.text.data(), &handle_));
        return true;
    }
    return fail(t);
}

// { [edge] member } [EXCEPT name { name }] ;
bool Reader::timegrp_members(const Token& group) {
    members_.clear();
    excluded_.clear();
    PR_EDGE edge = PR_NO_EDGE;
    Token t = take();
    for (;;) {
        if (t.kind == Tok::Semi) break;
        if (t.kind != Tok::Word) return fail(t);
        if (kw(t, "EXCEPT")) {
            t = take();
            do {
                if (t.kind != Tok::Word || kw(t, "EXCEPT") || edge_of(t, edge)) return fail(t);
                excluded_.push_back(t.text.data());
                t = take();
            } while (t.kind != Tok::Semi);
            break;
        }
        edge = PR_NO_EDGE;
        if (edge_of(t, edge)) {
            PR_EDGE ignored;
            t = take();
            if (t.kind != Tok::Word || kw(t, "EXCEPT") || edge_of(t, ignored)) return fail(t);
        }
        members_.emplace_back(t.text.data(), edge);
        t = take();
    }
    complete(t);
    result(parser_.cb_timegrp(group.text.data(), members_, excluded_, &handle_));
    return true;
}

// AREA_GROUP / SET: name key = value { | key = value } ;
bool Reader::group_statement(bool area_group) {
    Token name;
    if (!expect_word(name)) return false;
    defn_.name_.assign(name.text.data(), name.text.size());
    for (;;) {
        const Token key = take();
        if (key.kind != Tok::Word || key.quoted) return fail(key);
        if (!expect_eq()) return false;
        if (is_terminator(peek())) return fail(take());
        if (area_group && ieq(key.text, "RANGE")) {
            const Token first = take();
            if (first.kind != Tok::Word) return fail(first);
            auto* rec = new_list(key.text);
            if (!list_items(rec, first)) return false;
            defn_.list_.push_back(rec);
        } else if (!area_group && ieq(key.text, "RLOC_RANGE")) {
            if (!rloc_value(key)) return false;
        } else {
            const Token v = take();
            if (v.kind != Tok::Word) return fail(v);
            if (!is_terminator(peek())) return fail(take());
            add_string(key.text, v.text);
        }
        const Token sep = take();
        if (sep.kind == Tok::Semi) {
            complete(sep);
            break;
        }
        if (sep.kind != Tok::Bar) return fail(sep);
    }
    result(area_group ? parser_.cb_areagroup(defn_, &handle_) : parser_.cb_set(defn_, &handle_));
    return true;
}

bool Reader::config() {
    const Token t = take();
    if (kw(t, "PROHIBIT")) return expect_eq() && site_list(&Pr_Logical_Parser::cb_prohibit);
    if (kw(t, "VREF")) return expect_eq() && site_list(&Pr_Logical_Parser::cb_vref);
    if (t.kind != Tok::Word) return fail(t);
    Token eq;
    if (!expect(Tok::Eq, eq)) return false;
    return raw_value(t.text.data(), eq.end);
}

// word { , word } ;
bool Reader::site_list(ListCallback cb) {
    points_.clear();
    for (;;) {
        const Token w = take();
        if (w.kind != Tok::Word) return fail(w);
        points_.push_back(w.text.data());
        const Token sep = take();
        if (sep.kind == Tok::Semi) {
            complete(sep);
            break;
        }
        if (sep.kind != Tok::Comma) return fail(sep);
    }
    result((parser_.*cb)(points_, &handle_));
    return true;
}

// The source text from `from` up to the ';': comments and '"' removed, blanks trimmed.
bool Reader::raw_value(const char* name, std::size_t from) {
    const char* d = lexer_.data();
    raw_.clear();
    // Between tokens there are only blanks, line ends and comments.
    auto gap = [&](std::size_t a, std::size_t b) {
        while (a < b) {
            if (d[a] == '#' || d[a] == '/') {
                const void* lf = std::memchr(d + a, '\n', b - a);
                a = lf ? static_cast<std::size_t>(static_cast<const char*>(lf) - d) : b;
            } else {
                raw_.push_back(d[a++]);
            }
        }
    };
    std::size_t prev = from;
    Token t;
    for (;;) {
        t = take();
        if (t.kind != Tok::Word && t.kind != Tok::Semi && t.kind != Tok::Eq && t.kind != Tok::Bar &&
            t.kind != Tok::Comma)
            return fail(t);
        gap(prev, t.begin);
        if (t.kind == Tok::Semi) break;
        raw_.append(t.text.data(), t.text.size());
        prev = t.end;
    }
    constexpr std::string_view kTrim = " \t\r\n";
    const std::size_t a = raw_.find_first_not_of(kTrim);
    if (a == std::string::npos) return fail(t);
    raw_.erase(raw_.find_last_not_of(kTrim) + 1);
    raw_.erase(0, a);
    complete(t);
    result(parser_.cb_config(name, raw_.c_str(), &handle_));
    return true;
}

bool Reader::temperature_or_voltage(bool temperature) {
    Token v;
    Quantity q;
    if (!expect_eq() || !expect_word(v)) return false;
    if (!quantity(v, temperature ? Pos::Temperature : Pos::Voltage, q)) return false;
    if (!expect_end()) return false;
    result(temperature ? parser_.cb_temperature(q.value, &handle_)
                       : parser_.cb_voltage(q.value, &handle_));
    return true;
}

bool Reader::begin_model() {
    const Token m = take();
    if (!kw(m, "MODEL")) return fail(m);
    Token name;
    if (!expect_word(name) || !expect_end()) return false;
    result(parser_.cb_begin_model(name.text.data(), &handle_));
    return true;
}

}  // namespace pr_detail

// ---------------------------------------------------------------- Pr_Logical_Parser

namespace {

Port_MsgManData messages() {
    return Port_MsgManData::createObject("Quillmap", "parser", __LINE__, "1.0");
}

class FileDescriptor {
  public:
    explicit FileDescriptor(int fd) : fd_(fd) {}
    ~FileDescriptor() {
        if (fd_ >= 0) ::close(fd_);
    }
    FileDescriptor(const FileDescriptor&) = delete;
    FileDescriptor& operator=(const FileDescriptor&) = delete;
    int get() const { return fd_; }

  private:
    int fd_;
};

}  // namespace

Pr_FileText::~Pr_FileText() {
    if (mapped_) ::munmap(mapped_, size_);
}

Pr_FileText::ReadResult Pr_FileText::load(const char* name) {
    FileDescriptor fd(::open(name, O_RDONLY | O_CLOEXEC));
    if (fd.get() < 0) return ReadResult::CannotOpen;
    struct stat st {};
    if (::fstat(fd.get(), &st) != 0 || S_ISDIR(st.st_mode)) return ReadResult::CannotOpen;
    const bool regular = S_ISREG(st.st_mode);
    if (regular && static_cast<std::size_t>(st.st_size) >= kMapThreshold) {
        void* p = ::mmap(nullptr, static_cast<std::size_t>(st.st_size), PROT_READ,
                         MAP_PRIVATE | MAP_POPULATE, fd.get(), 0);
        if (p != MAP_FAILED) {
            ::madvise(p, static_cast<std::size_t>(st.st_size), MADV_SEQUENTIAL);
            mapped_ = p;
            size_ = static_cast<std::size_t>(st.st_size);
            return ReadResult::Ok;
        }
    }
    std::size_t capacity = 4096;
    if (regular && st.st_size > 0) capacity = static_cast<std::size_t>(st.st_size) + 1;
    buffer_ = std::make_unique_for_overwrite<char[]>(capacity);
    size_ = 0;
    for (;;) {
        if (size_ == capacity) {
            const std::size_t bigger = capacity * 2;
            auto grown = std::make_unique_for_overwrite<char[]>(bigger);
            std::memcpy(grown.get(), buffer_.get(), size_);
            buffer_ = std::move(grown);
            capacity = bigger;
        }
        const ssize_t n = ::read(fd.get(), buffer_.get() + size_, capacity - size_);
        if (n < 0) {
            if (errno == EINTR) continue;
            return ReadResult::CannotRead;
        }
        if (n == 0) return ReadResult::Ok;
        size_ += static_cast<std::size_t>(n);
    }
}

std::shared_ptr<const Pr_FileText> Pr_FileText::FromText(std::string_view text) {
    auto copy = std::shared_ptr<Pr_FileText>(new Pr_FileText());
    copy->buffer_ = std::make_unique_for_overwrite<char[]>(text.size() + 1);
    std::memcpy(copy->buffer_.get(), text.data(), text.size());
    copy->buffer_[text.size()] = '\0';
    copy->size_ = text.size();
    return copy;
}

std::shared_ptr<const Pr_FileText> Pr_FileText::Read(const char* name) {
    auto text = std::shared_ptr<Pr_FileText>(new Pr_FileText());
    if (!name || text->load(name) != ReadResult::Ok) return nullptr;
    return text;
}

Pr_Logical_Parser::Pr_Logical_Parser(const char* filename) : filename_(filename ? filename : "") {}
Pr_Logical_Parser::Pr_Logical_Parser(const Pr_Logical_Parser& other) = default;
Pr_Logical_Parser& Pr_Logical_Parser::operator=(const Pr_Logical_Parser& other) = default;
Pr_Logical_Parser::~Pr_Logical_Parser() = default;

bool Pr_Logical_Parser::parse() {
    if (text_) {
        pr_detail::Reader reader(*this, text_->data(), text_->size());
        return reader.run();
    }
    Pr_FileText text;
    switch (text.load(filename_.c_str())) {
        case Pr_FileText::ReadResult::CannotOpen:
            messages().issueError("Could not open constraint file '%s'.\n", filename_.c_str());
            return false;
        case Pr_FileText::ReadResult::CannotRead:
            messages().issueError("Could not read constraint file '%s'.\n", filename_.c_str());
            return false;
        case Pr_FileText::ReadResult::Ok:
            break;
    }
    pr_detail::Reader reader(*this, text.data(), text.size());
    return reader.run();
}

bool Pr_Logical_Parser::cb_error(int line, int column, const char* value) {
    messages().issueError("Line %i in '%s': The value '%s' at column %i cannot be read.\n", line,
                          filename_.c_str(), value, column);
    return false;
}

bool Pr_Logical_Parser::cb_syntax_error(int line, int column, const char* text, const Handle*) {
    messages().issueError("Line %i in '%s': Syntax error at column %i near '%s'.\n", line,
                          filename_.c_str(), column, text);
    return false;
}

bool Pr_Logical_Parser::cb_comment(const char*, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_enable(bool, const char*, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_areagroup(const Defn&, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_net(const Defn&, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_comp(const Defn&, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_pin(const Defn&, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_model(const Defn&, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_set(const Defn&, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_config(const char*, const char*, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_begin_model(const char*, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_end_model(const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_prohibit(const std::vector<const char*>&, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_vref(const std::vector<const char*>&, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_offset(bool, double, const double*, bool, const char*, const char*,
                                  const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_toffset(const char*, bool, double, const double*, bool, const char*,
                                   const char*, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_roffset(bool, double, const double*, bool, const char*, const char*,
                                   const char*, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_troffset(const char*, bool, double, const double*, bool, const char*,
                                    const char*, const char*, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_tspec_maxdelay(const char*, bool, bool, const std::vector<const char*>&,
                                          const char*, bool, double, bool, int, bool,
                                          const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_tspec_period(const char*, const char*, const char*, bool, double, bool,
                                        bool, double, bool, double, double, const double*, int,
                                        const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_tspec_tig(const char*, bool, bool, const std::vector<const char*>&, int,
                                     const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_tspec_drop_spec(const char*, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_timegrp(const char*, const std::vector<std::pair<const char*, PR_EDGE>>&,
                                   const std::vector<const char*>&, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_timegrp_areagroup(const char*, const char*, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_temperature(double, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_voltage(double, const Handle*) {
    return true;
}
bool Pr_Logical_Parser::cb_default(const Handle*) {
    return true;
}

bool Pr_Logical_Parser::dump() {
    Port_MsgManData::debugStub("Pr_Logical_Parser: constraint file '%s'\n", filename_.c_str());
    return true;
}

bool Pr_Logical_Parser::load(Pr_Logical_Parser& other) {
    if (&other != this) {
        filename_ = other.filename_;
        text_ = other.text_;
    }
    return true;
}

bool Pr_Logical_Parser::load(const char* filename) {
    filename_ = filename ? filename : "";
    text_.reset();
    return true;
}

bool Pr_Logical_Parser::write(const char*) const {
    return false;
}
