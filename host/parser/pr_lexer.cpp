#include "host/parser/pr_lexer.h"

#include <array>
#include <cstring>

namespace pr_detail {

namespace {

enum Class : std::uint8_t { kWord, kBlank, kNewline, kPunct, kQuote, kHash, kControl };

constexpr std::array<std::uint8_t, 256> make_classes() {
    std::array<std::uint8_t, 256> t{};
    for (auto& c : t) c = kWord;
    for (int i = 0; i < 0x20; ++i) t[i] = kControl;
    t[0x7F] = kControl;
    t['\t'] = kBlank;
    t[' '] = kBlank;
    t['\r'] = kBlank;  // a CR before LF is passed over with the line end anyway
    t['\n'] = kNewline;
    t[';'] = kPunct;
    t['='] = kPunct;
    t['|'] = kPunct;
    t[','] = kPunct;
    t['"'] = kQuote;
    t['#'] = kHash;
    return t;
}

constexpr std::array<std::uint8_t, 256> kClass = make_classes();

inline std::uint8_t cls(char c) {
    return kClass[static_cast<unsigned char>(c)];
}

constexpr std::size_t kBlockSize = 64 * 1024;

}  // namespace

char* Arena::alloc(std::size_t n) {
    while (current_ < blocks_.size()) {
        Block& b = blocks_[current_];
        if (b.size - used_ >= n) {
            char* p = b.data.get() + used_;
            used_ += n;
            return p;
        }
        ++current_;
        used_ = 0;
    }
    std::size_t size = n > kBlockSize ? n : kBlockSize;
    blocks_.push_back(Block{std::make_unique_for_overwrite<char[]>(size), size});
    current_ = blocks_.size() - 1;
    used_ = n;
    return blocks_.back().data.get();
}

std::string_view Arena::copy(std::string_view text) {
    char* p = alloc(text.size() + 1);
    if (!text.empty()) std::memcpy(p, text.data(), text.size());
    p[text.size()] = '\0';
    return {p, text.size()};
}

Lexer::Lexer(const char* data, std::size_t size) : data_(data), size_(size) {
    if (size >= 3 && static_cast<unsigned char>(data[0]) == 0xEF &&
        static_cast<unsigned char>(data[1]) == 0xBB &&
        static_cast<unsigned char>(data[2]) == 0xBF) {
        state.pos = 3;
        state.line_start = 3;
    }
}

std::size_t Lexer::line_end(std::size_t pos) const {
    const void* lf = pos < size_ ? std::memchr(data_ + pos, '\n', size_ - pos) : nullptr;
    return lf ? static_cast<std::size_t>(static_cast<const char*>(lf) - data_) : size_;
}

std::size_t Lexer::trimmed_end() const {
    std::size_t e = size_;
    if (e > 0 && data_[e - 1] == '\n') {
        --e;
        if (e > 0 && data_[e - 1] == '\r') --e;
    }
    return e;
}

void Lexer::next(Token& tok, Arena& arena) {
    const char* d = data_;
    std::size_t p = state.pos;
    for (;;) {
        if (p >= size_) {
            state.pos = size_;
            tok.kind = Tok::End;
            tok.quoted = false;
            tok.in_quote = false;
            tok.line = state.line;
            tok.col = static_cast<int>(size_ - state.line_start) + 1;
            tok.begin = tok.end = size_;
            tok.text = {};
            tok.after = state;
            return;
        }
        char c = d[p];
        std::uint8_t k = cls(c);
        if (k == kBlank) {
            ++p;
        } else if (k == kNewline) {
            ++p;
            ++state.line;
            state.line_start = p;
            state.at_line_start = true;
        } else if (k == kHash ||
                   (c == '/' && state.at_line_start && p + 1 < size_ && d[p + 1] == '/')) {
            p = line_end(p);
        } else {
            break;
        }
    }

    tok.line = state.line;
    tok.col = static_cast<int>(p - state.line_start) + 1;
    tok.begin = p;
    tok.quoted = false;
    tok.in_quote = false;
    state.at_line_start = false;
    char c = d[p];
    switch (cls(c)) {
        case kPunct:
            tok.kind = c == ';' ? Tok::Semi : c == '=' ? Tok::Eq : c == '|' ? Tok::Bar : Tok::Comma;
            tok.text = c == ';' ? ";" : c == '=' ? "=" : c == '|' ? "|" : ",";
            tok.end = p + 1;
            state.pos = p + 1;
            break;
        case kControl: {
            static const char hex[] = "0123456789ABCDEF";
            unsigned char b = static_cast<unsigned char>(c);
            char text[4] = {'\\', 'x', hex[b >> 4], hex[b & 15]};
            tok.kind = Tok::BadByte;
            tok.text = arena.copy({text, 4});
            tok.end = p + 1;
            state.pos = p + 1;
            break;
        }
        default:
            state.pos = p;
            word(tok, arena);
            return;
    }
    tok.after = state;
}

void Lexer::word(Token& tok, Arena& arena) {
    const char* d = data_;
    const std::size_t n = size_;
    const std::size_t b = state.pos;
    std::size_t p = b;
    std::size_t quotes = 0;
    for (;;) {
        while (p < n && cls(d[p]) == kWord) ++p;
        if (p >= n || d[p] != '"') break;
        const std::size_t q = p++;
        for (;;) {
            if (p >= n || d[p] == '\n') {
                // Unbalanced quote: the token is the rest of the line; reading goes on with
                // the next line.
                std::size_t e = p;
                if (p < n && e > q + 1 && d[e - 1] == '\r') --e;
                tok.kind = Tok::BadQuote;
                tok.col = static_cast<int>(q - state.line_start) + 1;
                tok.begin = q;
                tok.end = e;
                tok.text = arena.copy({d + q, e - q});
                if (p < n) {
                    state.pos = p + 1;
                    ++state.line;
                    state.line_start = p + 1;
                    state.at_line_start = true;
                } else {
                    state.pos = n;
                }
                tok.after = state;
                return;
            }
            std::uint8_t k = cls(d[p]);
            if (k == kQuote) break;
            if (k == kControl) {
                static const char hex[] = "0123456789ABCDEF";
                unsigned char x = static_cast<unsigned char>(d[p]);
                char text[4] = {'\\', 'x', hex[x >> 4], hex[x & 15]};
                tok.kind = Tok::BadByte;
                tok.in_quote = true;
                tok.col = static_cast<int>(p - state.line_start) + 1;
                tok.begin = p;
                tok.end = p + 1;
                tok.text = arena.copy({text, 4});
                state.pos = p + 1;
                tok.after = state;
                return;
            }
            ++p;
        }
        ++p;
        quotes += 2;
    }

    tok.kind = Tok::Word;
    tok.end = p;
    state.pos = p;
    tok.after = state;
    if (quotes == 0) {
        tok.text = arena.copy({d + b, p - b});
        return;
    }
    tok.quoted = true;
    const std::size_t len = p - b - quotes;
    char* out = arena.alloc(len + 1);
    char* o = out;
    for (std::size_t i = b; i < p; ++i)
        if (d[i] != '"') *o++ = d[i];
    *o = '\0';
    tok.text = {out, len};
}

Lexer::Gap Lexer::between() {
    const char* d = data_;
    std::size_t p = state.pos;
    for (;;) {
        if (p >= size_) {
            state.pos = size_;
            return Gap::End;
        }
        char c = d[p];
        std::uint8_t k = cls(c);
        if (k == kBlank) {
            ++p;
        } else if (k == kNewline) {
            ++p;
            ++state.line;
            state.line_start = p;
            state.at_line_start = true;
        } else if (k == kHash || (c == '/' && p + 1 < size_ && d[p + 1] == '/')) {
            if (state.at_line_start) {
                state.pos = p;
                return Gap::CommentLine;
            }
            if (k != kHash) {  // "//" after a statement on the same line is a word
                state.pos = p;
                return Gap::Statement;
            }
            p = line_end(p);
        } else if (c == ';') {
            ++p;  // empty statement
            state.at_line_start = false;
        } else {
            state.pos = p;
            return Gap::Statement;
        }
    }
}

void Lexer::comment_line(std::string& text, std::string& line_text) {
    const char* d = data_;
    const std::size_t p = state.pos;
    const std::size_t lf = line_end(p);
    std::size_t e = lf;
    if (lf < size_ && e > p && d[e - 1] == '\r') --e;
    const std::size_t t = p + (d[p] == '#' ? 1 : 2);
    auto keep = [d](std::string& out, std::size_t from, std::size_t to) {
        out.clear();
        for (std::size_t i = from; i < to;) {
            const void* nul = std::memchr(d + i, '\0', to - i);
            std::size_t stop =
                nul ? static_cast<std::size_t>(static_cast<const char*>(nul) - d) : to;
            out.append(d + i, stop - i);
            i = stop + 1;
        }
    };
    keep(text, t < e ? t : e, e);
    keep(line_text, state.line_start, e);
    state.pos = lf;
    state.at_line_start = false;
}

bool Lexer::skip_to_semicolon(bool in_quote) {
    const char* d = data_;
    std::size_t p = state.pos;
    bool quoted = in_quote;
    while (p < size_) {
        char c = d[p];
        if (c == '\n') {
            ++p;
            ++state.line;
            state.line_start = p;
            state.at_line_start = true;
            quoted = false;
            continue;
        }
        if (quoted) {
            if (c == '"') quoted = false;
            ++p;
            continue;
        }
        if (c == '#' || (c == '/' && state.at_line_start && p + 1 < size_ && d[p + 1] == '/')) {
            p = line_end(p);
            continue;
        }
        if (c == ';') {
            state.pos = p + 1;
            state.at_line_start = false;
            return true;
        }
        if (c == '"') quoted = true;
        if (cls(c) != kBlank) state.at_line_start = false;
        ++p;
    }
    state.pos = size_;
    return false;
}

}  // namespace pr_detail
