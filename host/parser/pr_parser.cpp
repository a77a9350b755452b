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

#include "host/parser/pr_reader.h"

namespace pr_detail {

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
