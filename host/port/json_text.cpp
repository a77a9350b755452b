#include "host/port/json_text.h"

#include <cstdio>

size_t Port_Utf8SequenceLength(std::string_view text) {
    auto at = [&](size_t i) { return i < text.size() ? static_cast<unsigned char>(text[i]) : 0u; };
    auto cont = [&](size_t i) { return (at(i) & 0xC0) == 0x80; };
    unsigned c = at(0);
    if (c >= 0xC2 && c <= 0xDF) return cont(1) ? 2 : 0;
    if (c >= 0xE0 && c <= 0xEF) {
        unsigned lo = c == 0xE0 ? 0xA0 : 0x80, hi = c == 0xED ? 0x9F : 0xBF;
        return at(1) >= lo && at(1) <= hi && cont(2) ? 3 : 0;
    }
    if (c >= 0xF0 && c <= 0xF4) {
        unsigned lo = c == 0xF0 ? 0x90 : 0x80, hi = c == 0xF4 ? 0x8F : 0xBF;
        return at(1) >= lo && at(1) <= hi && cont(2) && cont(3) ? 4 : 0;
    }
    return 0;
}

namespace {

void AppendEscape(std::string& out, unsigned code) {
    char hex[8];
    std::snprintf(hex, sizeof hex, "\\u%04x", code);
    out += hex;
}

}  // namespace

std::string Port_DecodeByteEscapes(std::string_view utf8) {
    std::string out;
    out.reserve(utf8.size());
    for (size_t i = 0; i < utf8.size(); ++i) {
        if (i + 2 < utf8.size() && Port_IsByteEscape(utf8.data() + i) &&
            (static_cast<unsigned char>(utf8[i + 2]) & 0xC0) == 0x80) {
            out += Port_ByteOfEscape(utf8.data() + i);
            i += 2;
        } else {
            out += utf8[i];
        }
    }
    return out;
}

void Port_AppendJsonString(std::string& out, std::string_view text) {
    out += '"';
    size_t run = 0;  // start of the current run of bytes copied as they are
    for (size_t i = 0; i < text.size();) {
        unsigned char c = static_cast<unsigned char>(text[i]);
        if (c >= 0x20 && c < 0x7f && c != '"' && c != '\\') {
            ++i;
            continue;
        }
        if (c >= 0x80) {
            size_t n = Port_Utf8SequenceLength(text.substr(i));
            if (n && !(n == 3 && Port_IsByteEscape(text.data() + i))) {
                i += n;
                continue;
            }
        }
        out.append(text.data() + run, i - run);
        switch (c) {
            case '"': out += "\\\""; break;
            case '\\': out += "\\\\"; break;
            case '\n': out += "\\n"; break;
            case '\t': out += "\\t"; break;
            case '\r': out += "\\r"; break;
            default: AppendEscape(out, c < 0x80 ? c : 0xF700 + c);
        }
        run = ++i;
    }
    out.append(text.data() + run, text.size() - run);
    out += '"';
}
