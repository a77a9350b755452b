// The host's string class: a std::basic_string with the splitting, trimming and searching
// operations the library uses.
#pragma once

#include <cstdarg>
#include <string>
#include <vector>

namespace Port {

template <class C>
class StringBase {
public:
    using string_type = std::basic_string<C>;
    // Compare and search modes: exact, or ignoring ASCII case.
    enum CompareType { EXACT = 0, IGNORE_CASE = 1 };

    StringBase() = default;
    StringBase(const C* text) : s_(text ? text : string_type()) {}  // NOLINT: implicit by design
    StringBase(string_type text) : s_(std::move(text)) {}          // NOLINT

    const C* c_str() const { return s_.c_str(); }
    const string_type& str() const { return s_; }
    size_t Length() const { return s_.size(); }
    bool IsEmpty() const { return s_.empty(); }
    StringBase& operator+=(const StringBase& other) { s_ += other.s_; return *this; }
    bool operator==(const StringBase& other) const { return s_ == other.s_; }

    // Cuts text at any of the delimiters; with skip_empty, empty pieces are dropped. A run
    // between a quote_open and the matching quote_close character is never cut (the quotes
    // stay in the piece). Null or empty quote texts mean no quoting.
    static std::vector<StringBase> Split(const StringBase& text, const C* delimiters,
                                         bool skip_empty, const C* quote_open,
                                         const C* quote_close);
    // Removes every leading and trailing character found in chars.
    StringBase& Trim(const C* chars);
    // Keeps the first n characters.
    StringBase& Truncate(size_t n) {
        if (n < s_.size()) s_.resize(n);
        return *this;
    }
    // Index of the first occurrence of sub at or after from, or -1.
    int GetIndexOfString(const C* sub, int compare_type = EXACT, size_t from = 0) const;
    // Three-way comparison.
    int Compare(const C* other, int compare_type = EXACT) const;
    // Replaces the content by printf-like formatting (%I is a decimal integer).
    StringBase& doFormat(const char* format, ...);

private:
    string_type s_;
};

extern template class StringBase<char>;

}  // namespace Port
