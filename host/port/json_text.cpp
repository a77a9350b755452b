#include "host/port/json_text.h"

#include <cstdio>

void Port_AppendJsonString(std::string& out, std::string_view text) {
    out += '"';
    size_t run = 0;  // start of the current run of bytes copied as they are
    for (size_t i = 0; i < text.size(); ++i) {
        unsigned char c = static_cast<unsigned char>(text[i]);
        if (c >= 0x20 && c != '"' && c != '\\' && c != 0x7f) continue;
        out.append(text.data() + run, i - run);
        run = i + 1;
        switch (c) {
            case '"': out += "\\\""; break;
            case '\\': out += "\\\\"; break;
            case '\n': out += "\\n"; break;
            case '\t': out += "\\t"; break;
            case '\r': out += "\\r"; break;
            default: {
                char hex[8];
                std::snprintf(hex, sizeof hex, "\\u%04x", c);
                out += hex;
            }
        }
    }
    out.append(text.data() + run, text.size() - run);
    out += '"';
}
