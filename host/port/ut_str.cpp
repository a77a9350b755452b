#include "host/port/ut_str.h"

#include <cctype>
#include <cerrno>
#include <climits>
#include <cstdarg>
#include <cstdlib>
#include <cstring>

#include "host/port/msgman.h"

namespace {

inline unsigned char Fold(unsigned char c) { return (c >= 'A' && c <= 'Z') ? c + 32 : c; }

template <bool kIgnoreCase>
bool GlobMatch(const char* text, const char* pattern) {
    // Iterative glob with a single backtrack point: linear for the usual patterns.
    const char* star = nullptr;
    const char* resume = nullptr;
    while (*text) {
        unsigned char p = static_cast<unsigned char>(*pattern);
        unsigned char t = static_cast<unsigned char>(*text);
        if (p == '*') {
            while (*pattern == '*') ++pattern;
            if (!std::strchr(pattern, '*')) {
                // After the last star only the end of the text, as long as the rest of the
                // pattern, can match it: no need to try every start (names can be long).
                const size_t rest = std::strlen(pattern), left = std::strlen(text);
                if (rest > left) return false;
                for (text += left - rest; *pattern; ++pattern, ++text) {
                    const unsigned char q = static_cast<unsigned char>(*pattern);
                    const unsigned char c = static_cast<unsigned char>(*text);
                    if (q != '?' && (kIgnoreCase ? Fold(q) != Fold(c) : q != c)) return false;
                }
                return true;
            }
            star = pattern - 1;
            resume = text;
        } else if (p && (p == '?' || (kIgnoreCase ? Fold(p) == Fold(t) : p == t))) {
            ++pattern;
            ++text;
        } else if (star) {
            pattern = star + 1;
            text = ++resume;
        } else {
            return false;
        }
    }
    while (*pattern == '*') ++pattern;
    return *pattern == '\0';
}

}  // namespace

char* UT_STR::Dup(const char* text) {
    if (!text) return nullptr;
    size_t n = std::strlen(text);
    char* copy = new char[n + 1];
    std::memcpy(copy, text, n + 1);
    return copy;
}

char* UT_STR::Upper(char* text) {
    if (text)
        for (char* p = text; *p; ++p)
            if (*p >= 'a' && *p <= 'z') *p = static_cast<char>(*p - 32);
    return text;
}

int UT_STR::Compare(const char* a, const char* b) {
    return std::strcmp(a ? a : "", b ? b : "");
}

int UT_STR::ICompare(const char* a, const char* b) {
    return INCompare(a, b, static_cast<size_t>(-1));
}

int UT_STR::NCompare(const char* a, const char* b, size_t n) {
    return std::strncmp(a ? a : "", b ? b : "", n);
}

int UT_STR::INCompare(const char* a, const char* b, size_t n) {
    const unsigned char* x = reinterpret_cast<const unsigned char*>(a ? a : "");
    const unsigned char* y = reinterpret_cast<const unsigned char*>(b ? b : "");
    for (size_t i = 0; i < n; ++i) {
        int d = Fold(x[i]) - Fold(y[i]);
        if (d != 0 || x[i] == 0) return d;
    }
    return 0;
}

int UT_STR::Match(const char* text, const char* pattern) {
    return GlobMatch<false>(text ? text : "", pattern ? pattern : "") ? 1 : 0;
}

int UT_STR::IMatch(const char* text, const char* pattern) {
    return GlobMatch<true>(text ? text : "", pattern ? pattern : "") ? 1 : 0;
}

int UT_STR::GetToken(char* text, char* token, size_t token_size, const char* delimiters) {
    if (!text || !token || token_size == 0) return 0;
    size_t pos = std::strcspn(text, delimiters ? delimiters : "");
    if (text[pos] == '\0' || pos == 0) return 0;
    size_t n = pos < token_size - 1 ? pos : token_size - 1;
    std::memcpy(token, text, n);
    token[n] = '\0';
    std::memmove(text, text + pos + 1, std::strlen(text + pos + 1) + 1);
    return 1;
}

const char* UT_STR::FindChar(const char* text, char c) {
    return text ? std::strchr(text, c) : nullptr;
}

const char* UT_STR::FindString(const char* text, const char* sub) {
    return (text && sub) ? std::strstr(text, sub) : nullptr;
}

int UT_STR::StrToINT32(const char* text, bool* ok) {
    if (ok) *ok = false;
    if (!text) return -1;
    while (*text == ' ' || *text == '\t') ++text;
    if (!*text) return -1;
    errno = 0;
    char* end = nullptr;
    long long v = std::strtoll(text, &end, 10);
    if (end == text || errno == ERANGE || v < INT_MIN || v > INT_MAX) return -1;
    while (*end == ' ' || *end == '\t') ++end;
    if (*end) return -1;
    if (ok) *ok = true;
    return static_cast<int>(v);
}

char* UT_STR::Cat(const char* a, const char* b) {
    size_t na = Len(a), nb = Len(b);
    char* out = new char[na + nb + 1];
    if (na) std::memcpy(out, a, na);
    if (nb) std::memcpy(out + na, b, nb);
    out[na + nb] = '\0';
    return out;
}

char* UT_STR::Copy(char* dest, const char* src) { return std::strcpy(dest, src ? src : ""); }

char* UT_STR::NCopy(char* dest, const char* src, size_t n) {
    size_t len = std::strlen(src ? src : "");
    if (len > n) len = n;
    if (len) std::memcpy(dest, src, len);
    dest[len] = '\0';
    return dest;
}

size_t UT_STR::Len(const char* text) { return text ? std::strlen(text) : 0; }

char* zepform(const char* format, ...) {
    va_list args;
    va_start(args, format);
    std::string text = Port_VFormat(format, args);
    va_end(args);
    char* out = new char[text.size() + 1];
    std::memcpy(out, text.c_str(), text.size() + 1);
    return out;
}
