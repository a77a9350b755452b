#include "host/design/json_input.h"

#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <bit>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <memory>

#include "host/port/json_text.h"

namespace Ndm_JsonInput {

namespace {

// Files at least this large are mapped rather than read. Those read whole have their pages read
// in bulk as they are mapped; those read in pieces, in two passes that each give back what they
// have passed, have them come in as they are reached, so the whole file is never resident.
constexpr size_t kMapAtLeast = 1 << 20;

struct FileCloser {
    void operator()(FILE* f) const { std::fclose(f); }
};

int HexDigit(char c) {
    if (c >= '0' && c <= '9') return c - '0';
    if (c >= 'a' && c <= 'f') return c - 'a' + 10;
    if (c >= 'A' && c <= 'F') return c - 'A' + 10;
    return -1;
}

bool Hex4(const char* p, uint32_t& out) {
    out = 0;
    for (int i = 0; i < 4; ++i) {
        int d = HexDigit(p[i]);
        if (d < 0) return false;
        out = out * 16 + static_cast<uint32_t>(d);
    }
    return true;
}

void AppendUtf8(std::string& out, uint32_t cp) {
    if (cp < 0x80) {
        out += static_cast<char>(cp);
    } else if (cp < 0x800) {
        out += static_cast<char>(0xC0 | (cp >> 6));
        out += static_cast<char>(0x80 | (cp & 0x3F));
    } else if (cp < 0x10000) {
        out += static_cast<char>(0xE0 | (cp >> 12));
        out += static_cast<char>(0x80 | ((cp >> 6) & 0x3F));
        out += static_cast<char>(0x80 | (cp & 0x3F));
    } else {
        out += static_cast<char>(0xF0 | (cp >> 18));
        out += static_cast<char>(0x80 | ((cp >> 12) & 0x3F));
        out += static_cast<char>(0x80 | ((cp >> 6) & 0x3F));
        out += static_cast<char>(0x80 | (cp & 0x3F));
    }
}

// Offset of the first byte that does not start a valid UTF-8 sequence, or size.
size_t FirstBadUtf8(const unsigned char* s, size_t size) {
    size_t i = 0;
    while (i < size) {
        unsigned char c = s[i];
        size_t n;
        uint32_t min;
        if (c < 0x80) {
            ++i;
            continue;
        } else if ((c & 0xE0) == 0xC0) {
            n = 1, min = 0x80;
        } else if ((c & 0xF0) == 0xE0) {
            n = 2, min = 0x800;
        } else if ((c & 0xF8) == 0xF0) {
            n = 3, min = 0x10000;
        } else {
            return i;
        }
        if (i + n >= size) return i;
        uint32_t cp = c & (0x3F >> n);
        for (size_t k = 1; k <= n; ++k) {
            if ((s[i + k] & 0xC0) != 0x80) return i;
            cp = (cp << 6) | (s[i + k] & 0x3F);
        }
        if (cp < min || cp > 0x10FFFF || (cp >= 0xD800 && cp <= 0xDFFF)) return i;
        i += n + 1;
    }
    return size;
}

// Calls visit(offset, byte) for every byte outside JSON strings, opening quotes included;
// returns whether the text ends inside a string.
template <class Visit>
bool ForEachOutsideStrings(const char* s, size_t size, Visit&& visit) {
    bool in_string = false;
    for (size_t i = 0; i < size; ++i) {
        const char c = s[i];
        if (in_string) {
            if (c == '\\')
                ++i;
            else if (c == '"')
                in_string = false;
        } else {
            in_string = c == '"';
            visit(i, c);
        }
    }
    return in_string;
}

// Offset of the opening quote of a string that is never closed, or size.
size_t UnclosedQuote(const char* s, size_t size) {
    size_t open = size;
    const bool unclosed = ForEachOutsideStrings(s, size, [&](size_t i, char c) {
        if (c == '"') open = i;
    });
    return unclosed ? open : size;
}

}  // namespace

bool Input::Open(const char* path, std::string& error) {
    Release();
    std::unique_ptr<FILE, FileCloser> file(std::fopen(path, "rb"));
    if (!file) {
        error = std::strerror(errno);
        return false;
    }
    struct stat st {};
    if (::fstat(fileno(file.get()), &st) != 0) {
        error = std::strerror(errno);
        return false;
    }
    if (S_ISDIR(st.st_mode)) {
        error = "it is a directory";
        return false;
    }
    size_t size = static_cast<size_t>(st.st_size);
    if (S_ISREG(st.st_mode) && size >= kMapAtLeast) {
        // An anonymous region with room for the padding, the file mapped over its start: bytes
        // after the end of the file read as zeros.
        size_t page = static_cast<size_t>(::sysconf(_SC_PAGESIZE));
        size_t total = (size + simdjson::SIMDJSON_PADDING + page - 1) / page * page;
        void* region = ::mmap(nullptr, total, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS, -1, 0);
        if (region != MAP_FAILED) {
            void* mapped = ::mmap(region, size, PROT_READ,
                                  MAP_PRIVATE | MAP_FIXED | (size < kWholeBelow ? MAP_POPULATE : 0),
                                  fileno(file.get()), 0);
            if (mapped != MAP_FAILED) {
                map_ = region;
                map_size_ = total;
                data_ = static_cast<const char*>(region);
                size_ = size;
                return true;
            }
            ::munmap(region, total);
        }
    }
    simdjson::padded_string buf(size);
    if (size && buf.data() == nullptr) {
        error = "out of memory";
        return false;
    }
    size_t got = size ? std::fread(buf.data(), 1, size, file.get()) : 0;
    if (got != size) {
        error = std::ferror(file.get()) ? std::strerror(errno) : "the file changed while being read";
        return false;
    }
    copy_ = std::move(buf);
    data_ = copy_.data() ? copy_.data() : "";
    size_ = size;
    return true;
}

void Input::DropBefore(size_t offset) {
    constexpr size_t kStep = size_t{8} << 20;
    if (!map_ || offset < dropped_ + kStep) return;
    const size_t page = static_cast<size_t>(::sysconf(_SC_PAGESIZE));
    const size_t end = std::min(offset, size_) / page * page;
    if (end <= dropped_) return;
    ::madvise(static_cast<char*>(map_) + dropped_, end - dropped_, MADV_DONTNEED);
    dropped_ = end;
}

void Input::Rewind() {
    dropped_ = 0;
}

void Input::Release() {
    if (map_) ::munmap(map_, map_size_);
    map_ = nullptr;
    map_size_ = 0;
    dropped_ = 0;
    copy_ = simdjson::padded_string();
    data_ = "";
    size_ = 0;
}

bool Text(simdjson::ondemand::raw_json_string raw, std::string& scratch, std::string_view& out, bool bytes) {
    const char* begin = raw.raw();
    const char* p = begin;
    // Stage 1 has validated string boundaries: an unescaped quote ends the string. With byte
    // escapes, a literal U+F780..U+F7FF (EF 9E xx, EF 9F xx) needs decoding too.
    //
    // Most texts have neither: eight bytes at a time, up to the first quote, backslash or (with
    // bytes) 0xEF. Reading past the closing quote stays inside the input and its padding.
    constexpr uint64_t kOnes = 0x0101010101010101ull, kHighs = 0x8080808080808080ull;
    auto marks = [](uint64_t word, unsigned char c) {
        const uint64_t x = word ^ (kOnes * c);
        return (x - kOnes) & ~x & kHighs;  // the lowest mark is exact
    };
    for (;;) {
        uint64_t word;
        std::memcpy(&word, p, 8);
        if constexpr (std::endian::native == std::endian::big) word = __builtin_bswap64(word);
        const uint64_t found = marks(word, '"') | marks(word, '\\') | (bytes ? marks(word, 0xEF) : 0);
        if (!found) {
            p += 8;
            continue;
        }
        p += __builtin_ctzll(found) / 8;
        if (*p == '"') {
            out = std::string_view(begin, static_cast<size_t>(p - begin));
            return true;
        }
        if (*p == '\\' || Port_IsByteEscape(p)) break;
        ++p;  // 0xEF starting some other character
    }
    const char* escape = nullptr;
    for (;; ++p) {
        char c = *p;
        if (c == '"') break;
        if (c == '\\') {
            if (!escape) escape = p;
            ++p;
        } else if (bytes && !escape && Port_IsByteEscape(p)) {
            escape = p;
        }
    }
    if (!escape) {
        out = std::string_view(begin, static_cast<size_t>(p - begin));
        return true;
    }
    const char* end = p;
    scratch.assign(begin, static_cast<size_t>(escape - begin));
    for (p = escape; p < end; ++p) {
        if (*p != '\\') {
            if (bytes && end - p >= 3 && Port_IsByteEscape(p)) {
                scratch += Port_ByteOfEscape(p);
                p += 2;
                continue;
            }
            scratch += *p;
            continue;
        }
        char e = *++p;
        switch (e) {
            case '"': scratch += '"'; break;
            case '\\': scratch += '\\'; break;
            case '/': scratch += '/'; break;
            case 'b': scratch += '\b'; break;
            case 'f': scratch += '\f'; break;
            case 'n': scratch += '\n'; break;
            case 'r': scratch += '\r'; break;
            case 't': scratch += '\t'; break;
            case 'u': {
                uint32_t cp;
                if (end - p < 5 || !Hex4(p + 1, cp)) return false;
                p += 4;
                if (cp >= 0xD800 && cp <= 0xDBFF) {
                    uint32_t lo;
                    if (end - p < 7 || p[1] != '\\' || p[2] != 'u' || !Hex4(p + 3, lo) || lo < 0xDC00 ||
                        lo > 0xDFFF)
                        return false;
                    p += 6;
                    cp = 0x10000 + ((cp - 0xD800) << 10) + (lo - 0xDC00);
                } else if (cp >= 0xDC00 && cp <= 0xDFFF) {
                    return false;
                }
                if (bytes && cp >= kPort_ByteEscapeFirst && cp <= kPort_ByteEscapeLast)
                    scratch += static_cast<char>(cp - 0xF700);
                else
                    AppendUtf8(scratch, cp);
                break;
            }
            default: return false;
        }
    }
    out = scratch;
    return true;
}

size_t Offset(simdjson::ondemand::document& doc, const Input& input) {
    const char* at = nullptr;
    if (doc.current_location().get(at) || !at) return input.size();
    if (at < input.data() || at > input.data() + input.size()) return input.size();
    return static_cast<size_t>(at - input.data());
}

size_t EarlyErrorOffset(simdjson::error_code error, const Input& input) {
    return EarlyErrorOffset(error, input.data(), input.size());
}

size_t EarlyErrorOffset(simdjson::error_code error, const char* data, size_t size) {
    if (error == simdjson::UTF8_ERROR) return FirstBadUtf8(reinterpret_cast<const unsigned char*>(data), size);
    if (error == simdjson::UNCLOSED_STRING) return UnclosedQuote(data, size);
    if (error == simdjson::EMPTY) return 0;
    return size;
}

const char* SyntaxReason(simdjson::error_code error) {
    switch (error) {
        case simdjson::EMPTY: return "no JSON value";
        case simdjson::UTF8_ERROR: return "invalid UTF-8";
        case simdjson::UNCLOSED_STRING: return "unclosed string";
        case simdjson::UNESCAPED_CHARS: return "control character inside a string";
        case simdjson::STRING_ERROR: return "malformed string";
        case simdjson::NUMBER_ERROR: return "malformed number";
        case simdjson::T_ATOM_ERROR:
        case simdjson::F_ATOM_ERROR:
        case simdjson::N_ATOM_ERROR: return "malformed literal";
        case simdjson::DEPTH_ERROR: return "nesting too deep";
        case simdjson::INCOMPLETE_ARRAY_OR_OBJECT: return "the text ends inside an array or object";
        case simdjson::TRAILING_CONTENT: return "unexpected text after the JSON value";
        case simdjson::CAPACITY: return "the file is too large (4 GB at most)";
        case simdjson::MEMALLOC: return "out of memory";
        default: return "malformed JSON";
    }
}

bool IsSyntaxError(simdjson::error_code error) {
    return error != simdjson::SUCCESS && error != simdjson::INCORRECT_TYPE &&
           error != simdjson::NUMBER_OUT_OF_RANGE && error != simdjson::NO_SUCH_FIELD;
}

simdjson::error_code Iterate(simdjson::ondemand::parser& parser, const Input& input,
                             simdjson::ondemand::document& doc) {
    return Iterate(parser, input.data(), input.size(), input.size() + simdjson::SIMDJSON_PADDING, doc);
}

simdjson::error_code Iterate(simdjson::ondemand::parser& parser, const char* data, size_t size, size_t capacity,
                             simdjson::ondemand::document& doc) {
#if SIMDJSON_DEVELOPMENT_CHECKS
    size_t depth = 0, deepest = 0;
    ForEachOutsideStrings(data, size, [&](size_t, char c) {
        if (c == '{' || c == '[')
            deepest = std::max(deepest, ++depth);
        else if ((c == '}' || c == ']') && depth)
            --depth;
    });
    if (deepest >= simdjson::DEFAULT_MAX_DEPTH)
        if (simdjson::error_code e = parser.allocate(size, deepest + 1)) return e;
#endif
    return parser.iterate(simdjson::padded_string_view(data, size, capacity)).get(doc);
}

}  // namespace Ndm_JsonInput
