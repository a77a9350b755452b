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
// text that cannot be converted.
char* wcstombs(const wchar_t* text);

}  // namespace Port
