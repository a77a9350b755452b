// JSON string literals for the files and message lines we write, and the byte escapes that
// let a JSON text carry any byte string.
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

// Texts of constraint files and designs are byte strings, not UTF-8. A JSON text we write
// stays valid UTF-8 whatever the bytes: a byte that is not part of a valid UTF-8 sequence is
// written as the escape \uf7XX (code point U+F700 + the byte, so 0xE9 is \uf7e9). Code points
// U+F780 to U+F7FF (private use) therefore stand for single bytes; a text that really holds
// one of them has each of its three UTF-8 bytes escaped, so every byte string reads back
// exactly.
constexpr uint32_t kPort_ByteEscapeFirst = 0xF780;
constexpr uint32_t kPort_ByteEscapeLast = 0xF7FF;

// True when p starts the UTF-8 form of a code point that stands for a byte (EF 9E xx or
// EF 9F xx, U+F780..U+F7FF); p must hold at least two bytes.
inline bool Port_IsByteEscape(const char* p) {
    return static_cast<unsigned char>(p[0]) == 0xEF &&
           (static_cast<unsigned char>(p[1]) == 0x9E || static_cast<unsigned char>(p[1]) == 0x9F);
}

// The byte that the three UTF-8 bytes at p (a byte escape) stand for.
inline char Port_ByteOfEscape(const char* p) {
    return static_cast<char>(0x80 + ((static_cast<unsigned char>(p[1]) - 0x9E) << 6) +
                             (static_cast<unsigned char>(p[2]) - 0x80));
}

// Appends text as a JSON string literal (quotes included): ", \ and control bytes escaped,
// valid UTF-8 copied as it is, other bytes as byte escapes (above).
void Port_AppendJsonString(std::string& out, std::string_view text);

// The bytes a decoded JSON text (valid UTF-8, as a JSON reader gives it) stands for: each
// U+F780..U+F7FF in its UTF-8 form becomes the byte it stands for; everything else is kept.
std::string Port_DecodeByteEscapes(std::string_view utf8);

// Length (2 to 4) of the valid UTF-8 multi-byte sequence at the start of text, or 0 when the
// text does not start with one (overlong forms, surrogates and code points above U+10FFFF are
// not valid).
size_t Port_Utf8SequenceLength(std::string_view text);
