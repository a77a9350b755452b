// Statement records handed to the parser's callbacks.
#include "host/parser/pr_logical.h"

namespace pr_detail {

TextList::TextList(const TextList& other) : buf_(other.buf_), offsets_(other.offsets_) {
    relink();
}

TextList& TextList::operator=(const TextList& other) {
    if (this != &other) {
        buf_ = other.buf_;
        offsets_ = other.offsets_;
        relink();
    }
    return *this;
}

TextList::TextList(TextList&& other) noexcept
    : buf_(std::move(other.buf_)), offsets_(std::move(other.offsets_)) {
    relink();
    other.clear();
}

TextList& TextList::operator=(TextList&& other) noexcept {
    if (this != &other) {
        buf_ = std::move(other.buf_);
        offsets_ = std::move(other.offsets_);
        relink();
        other.clear();
    }
    return *this;
}

void TextList::clear() {
    buf_.clear();
    offsets_.clear();
    ptrs_.clear();
}

void TextList::add(std::string_view text) {
    const char* before = buf_.data();
    const std::size_t offset = buf_.size();
    buf_.append(text.data(), text.size());
    buf_.push_back('\0');
    offsets_.push_back(offset);
    if (buf_.data() != before)
        relink();  // the buffer moved: every pointer changes
    else
        ptrs_.push_back(buf_.data() + offset);
}

void TextList::relink() {
    ptrs_.resize(offsets_.size());
    for (std::size_t i = 0; i < offsets_.size(); ++i) ptrs_[i] = buf_.data() + offsets_[i];
}

}  // namespace pr_detail

Pr_Logical_Constraint::~Pr_Logical_Constraint() = default;

namespace {

int hex_value(char c) {
    if (c >= '0' && c <= '9') return c - '0';
    if (c >= 'A' && c <= 'F') return c - 'A' + 10;
    if (c >= 'a' && c <= 'f') return c - 'a' + 10;
    return -1;
}

bool has_prefix_nocase(std::string_view text, std::string_view upper) {
    if (text.size() < upper.size()) return false;
    for (std::size_t i = 0; i < upper.size(); ++i) {
        char c = text[i];
        if (c >= 'a' && c <= 'z') c = static_cast<char>(c - 32);
        if (c != upper[i]) return false;
    }
    return true;
}

}  // namespace

bool Pr_Logical_InitRangeConstraint::parse_key(std::string_view key, const char** prefix,
                                               int* first, int* last) {
    std::size_t p;
    if (has_prefix_nocase(key, "INITP_")) {
        p = 6;
        *prefix = "INITP_";
    } else if (has_prefix_nocase(key, "INIT_")) {
        p = 5;
        *prefix = "INIT_";
    } else {
        return false;
    }
    if (key.size() != p + 6 || key[p + 2] != '.' || key[p + 3] != '.') return false;
    const int a = hex_value(key[p]), b = hex_value(key[p + 1]);
    const int c = hex_value(key[p + 4]), d = hex_value(key[p + 5]);
    if (a < 0 || b < 0 || c < 0 || d < 0) return false;
    *first = a * 16 + b;
    *last = c * 16 + d;
    return true;
}

Pr_Logical_InitRangeConstraint::Pr_Logical_InitRangeConstraint(Pr_Logical_ConstraintType type,
                                                               const char* name, const char* value)
    : Pr_Logical_Constraint(type, name), value_(value ? value : "") {
    expand();
}

void Pr_Logical_InitRangeConstraint::reset(std::string_view name, std::string_view value) {
    set_name(name);
    value_.assign(value.data(), value.size());
    expand();
}

void Pr_Logical_InitRangeConstraint::expand() {
    names_.clear();
    const char* prefix = nullptr;
    int first = 0, last = 0;
    if (!parse_key(get_name(), &prefix, &first, &last)) return;
    static const char hex[] = "0123456789ABCDEF";
    char buf[8];
    const std::string_view pre(prefix);
    for (int i = 0; i < static_cast<int>(pre.size()); ++i) buf[i] = pre[i];
    for (int n = first; n <= last; ++n) {
        buf[pre.size()] = hex[n >> 4];
        buf[pre.size() + 1] = hex[n & 15];
        names_.add({buf, pre.size() + 2});
    }
}

Pr_Logical_OffsetConstraint::Pr_Logical_OffsetConstraint(const char* name, bool in, double time,
                                                         const double* valid, bool before,
                                                         const char* clock, const char* tgname,
                                                         const char* level)
    : Pr_Logical_Constraint(OFFSET, name),
      in_(in),
      time_(time),
      before_(before),
      clock_(clock ? clock : ""),
      has_tg_(tgname != nullptr),
      tgname_(tgname ? tgname : ""),
      level_(level ? level : "") {
    if (valid) valid_ = *valid;
}

Pr_Logical_PeriodConstraint::Pr_Logical_PeriodConstraint(const char* name, double period, bool low,
                                                         double hightime, double highpercent,
                                                         const double* jitter)
    : Pr_Logical_Constraint(PERIOD, name),
      period_(period),
      low_(low),
      hightime_(hightime),
      highpercent_(highpercent) {
    if (jitter) jitter_ = *jitter;
}
