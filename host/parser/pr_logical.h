// Constraint-file parser: statement records and the callback interface.
//
// Pr_Logical_Parser reads one constraint file (UCF or NCF) and calls one virtual callback
// per statement and per comment line, in file order. Every text, vector, record and handle
// handed to a callback is valid only until that callback returns.
#pragma once

#include <initializer_list>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace pr_detail {
class Reader;

// An array of NUL-terminated texts kept in one buffer; begin()/end() give `const char*`s.
// Clearing keeps the capacity, so a reused list allocates nothing once warmed up.
class TextList {
  public:
    TextList() = default;
    TextList(const TextList& other);
    TextList& operator=(const TextList& other);
    TextList(TextList&& other) noexcept;
    TextList& operator=(TextList&& other) noexcept;
    ~TextList() = default;

    void clear();
    void add(std::string_view text);
    int size() const { return static_cast<int>(ptrs_.size()); }
    const char* const* begin() const { return ptrs_.data(); }
    const char* const* end() const { return ptrs_.data() + ptrs_.size(); }

  private:
    void relink();

    std::string buf_;
    std::vector<std::size_t> offsets_;
    std::vector<const char*> ptrs_;
};
}  // namespace pr_detail

// Where a statement (or comment line) came from.
class Pr_Logical_ConstraintHandle {
  public:
    Pr_Logical_ConstraintHandle() = default;
    Pr_Logical_ConstraintHandle(int line, const char* text)
        : line_(line), text_(text ? text : "") {}

    // Line of the statement's first token, from 1.
    int getline() const { return line_; }
    // The statement's source text as written.
    const char* return_ascii() const { return text_.c_str(); }

    void assign(int line, std::string_view text) {
        line_ = line;
        text_.assign(text.data(), text.size());
    }

  private:
    int line_ = 0;
    std::string text_;
};

// One constraint of a NET, INST, PIN, MODEL, AREA_GROUP or SET statement.
class Pr_Logical_Constraint {
  public:
    enum Pr_Logical_ConstraintType {
        BASE = 0,
        STRING = 1,
        STRING_LIST_TYPE = 2,
        INIT_ = 3,
        OFFSET = 4,
        PERIOD = 5
    };

    explicit Pr_Logical_Constraint(Pr_Logical_ConstraintType type = BASE, const char* name = "")
        : type_(type), name_(name ? name : "") {}
    virtual ~Pr_Logical_Constraint();

    Pr_Logical_ConstraintType get_type() const { return type_; }
    // The key exactly as written.
    const char* get_name() const { return name_.c_str(); }

  protected:
    void set_name(std::string_view name) { name_.assign(name.data(), name.size()); }

  private:
    friend class pr_detail::Reader;
    Pr_Logical_ConstraintType type_;
    std::string name_;
};

using Pr_Logical_ConstraintType = Pr_Logical_Constraint::Pr_Logical_ConstraintType;

// Kind 1: key = value.
class Pr_Logical_StringConstraint : public Pr_Logical_Constraint {
  public:
    explicit Pr_Logical_StringConstraint(const char* name = "", const char* value = "")
        : Pr_Logical_Constraint(STRING, name), value_(value ? value : "") {}

    const char* get_value() const { return value_.c_str(); }

  private:
    friend class pr_detail::Reader;
    void reset(std::string_view name, std::string_view value) {
        set_name(name);
        value_.assign(value.data(), value.size());
    }
    std::string value_;
};

// Kind 2: key with a list of values (possibly none).
class Pr_Logical_StringListConstraint : public Pr_Logical_Constraint {
  public:
    explicit Pr_Logical_StringListConstraint(const char* name = "",
                                             std::initializer_list<const char*> values = {})
        : Pr_Logical_Constraint(STRING_LIST_TYPE, name) {
        for (const char* v : values) add_value(v ? v : "");
    }

    void add_value(std::string_view value) { values_.add(value); }

    int num_values() const { return values_.size(); }
    const char* const* begin_value() const { return values_.begin(); }
    const char* const* end_value() const { return values_.end(); }

  private:
    friend class pr_detail::Reader;
    void reset(std::string_view name) {
        set_name(name);
        values_.clear();
    }
    pr_detail::TextList values_;
};

// Kind 3: INIT_hh..hh / INITP_hh..hh = value, one property name per number of the range.
class Pr_Logical_InitRangeConstraint : public Pr_Logical_Constraint {
  public:
    // Expands the names from `name`: a key of the exact form INIT_hh..hh or INITP_hh..hh
    // (any letter case) with an ascending or single-number range gives INIT_ (or INITP_)
    // followed by each number as two upper-case hexadecimal digits; any other key, or a
    // reversed range, gives no names.
    Pr_Logical_InitRangeConstraint(Pr_Logical_ConstraintType type, const char* name,
                                   const char* value);

    const char* get_constraint_value() const { return value_.c_str(); }
    int num_names() const { return names_.size(); }
    const char* const* begin_name() const { return names_.begin(); }
    const char* const* end_name() const { return names_.end(); }

    // Recognises an initialisation-range key; on success gives the upper-case prefix
    // ("INIT_" or "INITP_") and the two numbers as written (first may exceed last).
    static bool parse_key(std::string_view key, const char** prefix, int* first, int* last);

  private:
    friend class pr_detail::Reader;
    Pr_Logical_InitRangeConstraint() : Pr_Logical_InitRangeConstraint(INIT_, "", "") {}
    void reset(std::string_view name, std::string_view value);
    void expand();

    std::string value_;
    pr_detail::TextList names_;
};

// Kind 4: OFFSET = ( IN | OUT ) time [VALID time] ( BEFORE | AFTER ) clock [TIMEGRP g] [level].
class Pr_Logical_OffsetConstraint : public Pr_Logical_Constraint {
  public:
    // `valid`, `tgname` and `level` may be null (absent).
    Pr_Logical_OffsetConstraint(const char* name, bool in, double time, const double* valid,
                                bool before, const char* clock, const char* tgname,
                                const char* level);

    bool isin() const { return in_; }
    double gettime() const { return time_; }
    const double* get_valid_field() const { return valid_ ? &*valid_ : nullptr; }
    bool isbefore() const { return before_; }
    const char* getname() const { return clock_.c_str(); }
    const char* gettgname() const { return has_tg_ ? tgname_.c_str() : nullptr; }
    bool has_high_low() const { return !level_.empty(); }
    // The level word in upper case, or the empty text.
    const char* get_high_or_low() const { return level_.c_str(); }

  private:
    friend class pr_detail::Reader;
    Pr_Logical_OffsetConstraint()
        : Pr_Logical_OffsetConstraint("", true, 0, nullptr, true, "", nullptr, nullptr) {}

    bool in_ = true;
    double time_ = 0;
    std::optional<double> valid_;
    bool before_ = true;
    std::string clock_;
    bool has_tg_ = false;
    std::string tgname_;
    std::string level_;
};

// Kind 5: PERIOD = value { ( HIGH | LOW ) [figure] | INPUT_JITTER time }.
class Pr_Logical_PeriodConstraint : public Pr_Logical_Constraint {
  public:
    // `jitter` may be null (absent).
    Pr_Logical_PeriodConstraint(const char* name, double period, bool low, double hightime,
                                double highpercent, const double* jitter);

    double getperiod() const { return period_; }
    // True when LOW is written.
    bool gethigh() const { return low_; }
    double gethightime() const { return hightime_; }
    double gethighpercent() const { return highpercent_; }
    const double* get_input_jitter() const { return jitter_ ? &*jitter_ : nullptr; }

  private:
    friend class pr_detail::Reader;
    Pr_Logical_PeriodConstraint() : Pr_Logical_PeriodConstraint("", 0, false, 0, 50, nullptr) {}

    double period_ = 0;
    bool low_ = false;
    double hightime_ = 0;
    double highpercent_ = 50;
    std::optional<double> jitter_;
};

// The object of a statement and its constraints in written order.
class Pr_Logical_ConstraintDefn {
  public:
    explicit Pr_Logical_ConstraintDefn(const char* object_name = "")
        : name_(object_name ? object_name : "") {}
    Pr_Logical_ConstraintDefn(const Pr_Logical_ConstraintDefn&) = delete;
    Pr_Logical_ConstraintDefn& operator=(const Pr_Logical_ConstraintDefn&) = delete;

    // Appends a constraint that this definition owns.
    void add_constraint(std::unique_ptr<Pr_Logical_Constraint> constraint) {
        list_.push_back(constraint.get());
        owned_.push_back(std::move(constraint));
    }

    const char* get_object_name() const { return name_.c_str(); }
    int num_constraints() const { return static_cast<int>(list_.size()); }
    Pr_Logical_Constraint* const* begin_constraint() const { return list_.data(); }
    Pr_Logical_Constraint* const* end_constraint() const { return list_.data() + list_.size(); }

  private:
    friend class pr_detail::Reader;
    std::string name_;
    std::vector<Pr_Logical_Constraint*> list_;
    std::vector<std::unique_ptr<Pr_Logical_Constraint>> owned_;
};

// Edge of a timing-group member.
enum PR_EDGE {
    PR_RISING = 0,
    PR_FALLING = 1,
    PR_TRANSHI = 2,
    PR_TRANSLO = 3,
    PR_EDGE_NONE_TEXT = 4,  // an edge whose name is the empty text; never produced by parsing
    PR_NO_EDGE = 5          // no edge written
};

// Priority value meaning "no priority".
inline constexpr int PR_NO_PRIORITY = 2147483647;

// The whole text of a constraint file, read once: large regular files are mapped, others
// (pipes, terminals, process substitutions) read into memory. A parser given one with set_text
// parses it instead of opening its file again, so two readers of one file can share a stream
// that can be read only once.
class Pr_FileText {
  public:
    // The text of the named file, or null when it cannot be opened or read.
    static std::shared_ptr<const Pr_FileText> Read(const char* name);
    // A copy of text, as if read from a file.
    static std::shared_ptr<const Pr_FileText> FromText(std::string_view text);
    ~Pr_FileText();
    Pr_FileText(const Pr_FileText&) = delete;
    Pr_FileText& operator=(const Pr_FileText&) = delete;

    const char* data() const { return mapped_ ? static_cast<const char*>(mapped_) : buffer_.get(); }
    std::size_t size() const { return size_; }

  private:
    friend class Pr_Logical_Parser;
    enum class ReadResult { Ok, CannotOpen, CannotRead };
    Pr_FileText() = default;
    ReadResult load(const char* name);

    static constexpr std::size_t kMapThreshold = 1 << 20;
    void* mapped_ = nullptr;
    std::unique_ptr<char[]> buffer_;
    std::size_t size_ = 0;
};

class Pr_Logical_Parser {
  public:
    // Binds the parser to a file; a null name is allowed (parse() then reports it cannot open).
    explicit Pr_Logical_Parser(const char* filename);
    Pr_Logical_Parser(const Pr_Logical_Parser& other);
    Pr_Logical_Parser& operator=(const Pr_Logical_Parser& other);

    using Handle = Pr_Logical_ConstraintHandle;
    using Defn = Pr_Logical_ConstraintDefn;

    virtual ~Pr_Logical_Parser();
    virtual bool cb_error(int line, int column, const char* value);
    virtual bool cb_syntax_error(int line, int column, const char* text, const Handle* handle);
    virtual bool cb_comment(const char* text, const Handle* handle);
    virtual bool cb_enable(bool enable, const char* name, const Handle* handle);
    virtual bool cb_areagroup(const Defn& defn, const Handle* handle);
    virtual bool cb_net(const Defn& defn, const Handle* handle);
    virtual bool cb_comp(const Defn& defn, const Handle* handle);
    virtual bool cb_pin(const Defn& defn, const Handle* handle);
    virtual bool cb_model(const Defn& defn, const Handle* handle);
    virtual bool cb_set(const Defn& defn, const Handle* handle);
    virtual bool cb_config(const char* name, const char* value, const Handle* handle);
    virtual bool cb_begin_model(const char* name, const Handle* handle);
    virtual bool cb_end_model(const Handle* handle);
    virtual bool cb_prohibit(const std::vector<const char*>& sites, const Handle* handle);
    virtual bool cb_vref(const std::vector<const char*>& sites, const Handle* handle);
    virtual bool cb_offset(bool in, double time, const double* valid, bool before,
                           const char* clock, const char* level, const Handle* handle);
    virtual bool cb_toffset(const char* group, bool in, double time, const double* valid,
                            bool before, const char* clock, const char* level,
                            const Handle* handle);
    virtual bool cb_roffset(bool in, double time, const double* valid, bool before,
                            const char* clock, const char* regs, const char* level,
                            const Handle* handle);
    virtual bool cb_troffset(const char* group, bool in, double time, const double* valid,
                             bool before, const char* clock, const char* regs, const char* level,
                             const Handle* handle);
    virtual bool cb_tspec_maxdelay(const char* name, bool has_from, bool has_to,
                                   const std::vector<const char*>& points, const char* reference,
                                   bool multiply, double value, bool is_time, int priority,
                                   bool datapathonly, const Handle* handle);
    virtual bool cb_tspec_period(const char* name, const char* group, const char* reference,
                                 bool multiply, double value, bool is_time, bool phase_plus,
                                 double phase, bool low, double duration, double percent,
                                 const double* jitter, int priority, const Handle* handle);
    virtual bool cb_tspec_tig(const char* name, bool has_from, bool has_to,
                              const std::vector<const char*>& points, int priority,
                              const Handle* handle);
    virtual bool cb_tspec_drop_spec(const char* name, const Handle* handle);
    virtual bool cb_timegrp(const char* group,
                            const std::vector<std::pair<const char*, PR_EDGE>>& members,
                            const std::vector<const char*>& excluded, const Handle* handle);
    virtual bool cb_timegrp_areagroup(const char* group, const char* areagroup,
                                      const Handle* handle);
    virtual bool cb_temperature(double celsius, const Handle* handle);
    virtual bool cb_voltage(double volts, const Handle* handle);
    virtual bool cb_default(const Handle* handle);
    // Writes the parser's binding to the debug channel.
    virtual bool dump();
    // Re-binds to another parser's file.
    virtual bool load(Pr_Logical_Parser& other);
    // Re-binds to a file name (null allowed).
    virtual bool load(const char* filename);
    // The parser keeps nothing to write; always false.
    virtual bool write(const char* filename) const;

    // Reads the file from its start and calls the callbacks. True when the file was read,
    // no syntax error occurred and every callback returned true.
    bool parse();
    // Parses text (the file's text read beforehand) instead of opening the file; messages still
    // name the file. Null goes back to reading the file.
    void set_text(std::shared_ptr<const Pr_FileText> text) { text_ = std::move(text); }
    // The file name as given; the empty text when none was given.
    const char* get_filename() const { return filename_.c_str(); }

  protected:
    // During cb_error and cb_syntax_error: the statement that could not be read (its first
    // line and its text up to its ";"); null otherwise.
    const Handle* failed_statement() const { return failed_; }

  private:
    friend class pr_detail::Reader;
    std::string filename_;
    std::shared_ptr<const Pr_FileText> text_;
    const Handle* failed_ = nullptr;
};
