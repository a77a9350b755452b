// Tokeniser of constraint files: one forward pass over an in-memory file.
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace pr_detail {

// Bump allocator for the texts of one statement. reset() rewinds and keeps the blocks, so
// steady-state parsing allocates nothing. Returned memory stays put until reset().
class Arena {
  public:
    char* alloc(std::size_t n);
    // A NUL-terminated copy; the view excludes the NUL.
    std::string_view copy(std::string_view text);
    void reset() {
        current_ = 0;
        used_ = 0;
    }

  private:
    struct Block {
        std::unique_ptr<char[]> data;
        std::size_t size;
    };
    std::vector<Block> blocks_;
    std::size_t current_ = 0;
    std::size_t used_ = 0;
};

// Reading position; copying it is how the reader rewinds to resynchronise.
struct LexState {
    std::size_t pos = 0;
    int line = 1;
    std::size_t line_start = 0;  // offset of the first byte of the current line
    bool at_line_start = true;   // only blanks since line_start
};

enum class Tok : std::uint8_t {
    Word,
    Semi,
    Eq,
    Bar,
    Comma,
    End,       // end of file
    BadQuote,  // quoted section not closed on its line; text is the rest of the line
    BadByte    // control byte; text is \xHH
};

struct Token {
    Tok kind = Tok::End;
    bool quoted = false;    // a word holding at least one quoted section
    bool in_quote = false;  // BadByte: met inside a quoted section
    int line = 0;
    int col = 0;
    std::size_t begin = 0;  // source range
    std::size_t end = 0;
    std::string_view text;  // NUL-terminated; words without their quote characters
    LexState after;         // position right after the token
};

class Lexer {
  public:
    // A byte-order mark at the very start is skipped.
    Lexer(const char* data, std::size_t size);

    const char* data() const { return data_; }
    std::size_t size() const { return size_; }

    // The next token inside a statement; comments and comment lines are passed over.
    void next(Token& tok, Arena& arena);

    enum class Gap { Statement, CommentLine, End };
    // Between statements: passes over blanks, line ends, empty statements and comments that
    // follow tokens on their line; stops at a comment line, at the first byte of a
    // statement or at the end of the file.
    Gap between();
    // Consumes the comment line at the current position: `text` gets what follows '#' or
    // "//", `line_text` the whole line; both without line end and without NUL bytes.
    void comment_line(std::string& text, std::string& line_text);

    // Passes over bytes up to and including the next ';' outside quoted sections and
    // comments, starting inside a quoted section when `in_quote`. False when the file ends
    // first.
    bool skip_to_semicolon(bool in_quote = false);

    // End of the file, less one line end at its very end.
    std::size_t trimmed_end() const;

    LexState state;

  private:
    std::size_t line_end(std::size_t pos) const;  // offset of the LF ending pos's line, or size
    void word(Token& tok, Arena& arena);

    const char* data_;
    std::size_t size_;
};

}  // namespace pr_detail
