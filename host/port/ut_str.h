// C-string helpers of the host. Buffers returned by Dup, Cat and zepform are allocated with
// new[] and released by the caller with delete[]. Null texts are accepted everywhere and
// behave as the empty text unless said otherwise.
#pragma once

#include <cstddef>

class UT_STR {
public:
    // New copy of text; null for null.
    static char* Dup(const char* text);
    // Upper-cases ASCII letters in place; returns text.
    static char* Upper(char* text);
    // strcmp-like three-way comparisons: exact, ignoring ASCII case, and on the first n bytes.
    static int Compare(const char* a, const char* b);
    static int ICompare(const char* a, const char* b);
    static int NCompare(const char* a, const char* b, size_t n);
    static int INCompare(const char* a, const char* b, size_t n);
    // Non-zero when text matches pattern; "*" matches any run of bytes, "?" any one byte.
    static int Match(const char* text, const char* pattern);
    static int IMatch(const char* text, const char* pattern);  // ignoring ASCII case
    // Splits text at its first delimiter byte: the part before goes to token (at most
    // token_size - 1 bytes, always terminated), the part after moves to the start of text.
    // Returns 1 when a non-empty token was produced, 0 (text unchanged) otherwise.
    static int GetToken(char* text, char* token, size_t token_size, const char* delimiters);
    // First occurrence in text, or null.
    static const char* FindChar(const char* text, char c);
    static const char* FindString(const char* text, const char* sub);
    // Decimal 32-bit integer with optional sign and surrounding blanks; -1 when the text is
    // not exactly such a number or does not fit (ok, when given, tells which).
    static int StrToINT32(const char* text, bool* ok = nullptr);
    // New buffer holding a followed by b.
    static char* Cat(const char* a, const char* b);
    // strcpy; returns dest.
    static char* Copy(char* dest, const char* src);
    // Copies at most n bytes and always terminates (dest holds n + 1 bytes); returns dest.
    static char* NCopy(char* dest, const char* src, size_t n);
    // Length; 0 for null.
    static size_t Len(const char* text);
};

// printf-like formatting into a new buffer (%I is a decimal integer); the caller owns it.
char* zepform(const char* format, ...);
