#include "host/port/string_base.h"

#include <algorithm>

#include "host/port/msgman.h"

namespace Port {

namespace {
template <class C>
C FoldChar(C c) {
    return (c >= 'A' && c <= 'Z') ? static_cast<C>(c + 32) : c;
}
template <class C>
bool Contains(const C* set, C c) {
    if (!set) return false;
    for (; *set; ++set)
        if (*set == c) return true;
    return false;
}
}  // namespace

template <class C>
std::vector<StringBase<C>> StringBase<C>::Split(const StringBase& text, const C* delimiters,
                                                bool skip_empty, const C* quote_open,
                                                const C* quote_close) {
    std::vector<StringBase> pieces;
    string_type piece;
    C closing = 0;
    for (C c : text.s_) {
        if (closing) {
            piece += c;
            if (c == closing) closing = 0;
            continue;
        }
        if (Contains(quote_open, c)) {
            // the matching closer sits at the same position in quote_close
            const C* q = quote_open;
            size_t i = 0;
            while (q[i] != c) ++i;
            closing = (quote_close && i < std::char_traits<C>::length(quote_close)) ? quote_close[i] : c;
            piece += c;
            continue;
        }
        if (Contains(delimiters, c)) {
            if (!(skip_empty && piece.empty())) pieces.emplace_back(piece);
            piece.clear();
            continue;
        }
        piece += c;
    }
    if (!(skip_empty && piece.empty())) pieces.emplace_back(piece);
    return pieces;
}

template <class C>
StringBase<C>& StringBase<C>::Trim(const C* chars) {
    size_t b = 0, e = s_.size();
    while (b < e && Contains(chars, s_[b])) ++b;
    while (e > b && Contains(chars, s_[e - 1])) --e;
    s_ = s_.substr(b, e - b);
    return *this;
}

template <class C>
int StringBase<C>::GetIndexOfString(const C* sub, int compare_type, size_t from) const {
    if (!sub) return -1;
    string_type needle(sub);
    if (compare_type == EXACT) {
        size_t pos = s_.find(needle, from);
        return pos == string_type::npos ? -1 : static_cast<int>(pos);
    }
    auto it = std::search(s_.begin() + static_cast<std::ptrdiff_t>(std::min(from, s_.size())),
                          s_.end(), needle.begin(), needle.end(),
                          [](C a, C b) { return FoldChar(a) == FoldChar(b); });
    return it == s_.end() && !needle.empty() ? -1 : static_cast<int>(it - s_.begin());
}

template <class C>
int StringBase<C>::Compare(const C* other, int compare_type) const {
    string_type o = other ? string_type(other) : string_type();
    if (compare_type == EXACT) return s_.compare(o);
    size_t n = std::min(s_.size(), o.size());
    for (size_t i = 0; i < n; ++i) {
        C a = FoldChar(s_[i]), b = FoldChar(o[i]);
        if (a != b) return a < b ? -1 : 1;
    }
    return s_.size() == o.size() ? 0 : (s_.size() < o.size() ? -1 : 1);
}

template <class C>
StringBase<C>& StringBase<C>::doFormat(const char* format, ...) {
    va_list args;
    va_start(args, format);
    std::string text = Port_VFormat(format, args);
    va_end(args);
    s_ = string_type(text.begin(), text.end());
    return *this;
}

template class StringBase<char>;

}  // namespace Port
