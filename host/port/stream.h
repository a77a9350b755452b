// Text output stream of the host: writes to a std::ostream it does not own.
#pragma once

#include <ostream>
#include <string>

#include "host/port/string_base.h"

namespace Port {

class Stream {
public:
    explicit Stream(std::ostream& out) : out_(&out) {}
    Stream& operator<<(const char* text) {
        if (text) *out_ << text;
        return *this;
    }
    Stream& operator<<(const std::string& text) {
        *out_ << text;
        return *this;
    }
    Stream& operator<<(const StringBase<char>& text) {
        *out_ << text.str();
        return *this;
    }
    Stream& operator<<(int value) {
        *out_ << value;
        return *this;
    }
    bool good() const { return out_->good(); }

private:
    std::ostream* out_;
};

// Narrow copy of a wide text (new[], the caller releases it), or null for null or for a
// text that cannot be converted. A character up to 0xFF is that byte (so a text made of one
// character per byte, as repository messages are, gives its bytes back); a larger one is its
// UTF-8 form; a surrogate or a value above 0x10FFFF cannot be converted.
char* wcstombs(const wchar_t* text);

}  // namespace Port
