#include "host/port/ut_str.h"

#include <cctype>
#include <cerrno>
#include <climits>
#include <cstdarg>
#include <cstdlib>
#include <cstring>
#include <vector>

#include "host/port/msgman.h"

namespace {

inline unsigned char Fold(unsigned char c) { return (c >= 'A' && c <= 'Z') ? c + 32 : c; }

template <bool kIgnoreCase>
bool SameByte(unsigned char a, unsigned char b) {
    return kIgnoreCase ? Fold(a) == Fold(b) : a == b;
}

// The n bytes of a star-free piece of pattern match the start of text (which holds n bytes).
template <bool kIgnoreCase>
bool PieceAt(const char* text, const char* piece, size_t n) {
    for (size_t i = 0; i < n; ++i)
        if (piece[i] != '?' && !SameByte<kIgnoreCase>(static_cast<unsigned char>(piece[i]),
                                                        static_cast<unsigned char>(text[i])))
            return false;
    return true;
}

constexpr size_t kNowhere = static_cast<size_t>(-1);

// Leftmost start of a star-free piece of n bytes in the len bytes of text, or kNowhere. A long
// piece without "?" is searched with its failure table (Knuth-Morris-Pratt), so that the time
// is linear in len however long the piece: names and patterns can both be long. Short pieces,
// and pieces with "?", are tried at every start.
template <bool kIgnoreCase>
size_t FindPiece(const char* text, size_t len, const char* piece, size_t n, std::vector<size_t>& fail) {
    if (n > len) return kNowhere;
    if (n <= 16 || std::memchr(piece, '?', n)) {
        for (size_t at = 0; at + n <= len; ++at)
            if (PieceAt<kIgnoreCase>(text + at, piece, n)) return at;
        return kNowhere;
    }
    auto same = [&](const char* a, size_t i, size_t k) {
        return SameByte<kIgnoreCase>(static_cast<unsigned char>(a[i]), static_cast<unsigned char>(piece[k]));
    };
    fail.assign(n, 0);
    for (size_t i = 1, k = 0; i < n; ++i) {
        while (k && !same(piece, i, k)) k = fail[k - 1];
        if (same(piece, i, k)) ++k;
        fail[i] = k;
    }
    for (size_t i = 0, k = 0; i < len; ++i) {
        while (k && !same(text, i, k)) k = fail[k - 1];
        if (same(text, i, k)) ++k;
        if (k == n) return i + 1 - n;
    }
    return kNowhere;
}

// The piece before the first star matches the start of the text, the piece after the last
// star its end, and each piece between them is taken at its leftmost place after the one
// before (which leaves the most room to the rest): no backtracking, linear for every pattern
// without "?" between stars.
template <bool kIgnoreCase>
bool GlobMatch(const char* text, const char* pattern) {
    const size_t len = std::strlen(text);
    const char* first_star = std::strchr(pattern, '*');
    if (!first_star) return std::strlen(pattern) == len && PieceAt<kIgnoreCase>(text, pattern, len);
    const size_t head = static_cast<size_t>(first_star - pattern);
    const char* last_star = std::strrchr(pattern, '*');
    const size_t tail = std::strlen(last_star + 1);
    if (head + tail > len || !PieceAt<kIgnoreCase>(text, pattern, head) ||
        !PieceAt<kIgnoreCase>(text + len - tail, last_star + 1, tail))
        return false;
    size_t at = head;
    const size_t end = len - tail;
    std::vector<size_t> fail;
    for (const char* piece = first_star + 1; piece < last_star;) {
        const char* star = std::strchr(piece, '*');
        const size_t n = static_cast<size_t>(star - piece);
        if (n) {
            const size_t found = FindPiece<kIgnoreCase>(text + at, end - at, piece, n, fail);
            if (found == kNowhere) return false;
            at += found + n;
        }
        piece = star + 1;
    }
    return true;
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
