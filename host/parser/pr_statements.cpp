// Statement reader of the constraint-file parser, the statements: NET, INST, PIN and MODEL
// with their constraints, TIMESPEC, and the other statements.
#include "host/parser/pr_reader.h"

namespace pr_detail {

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
