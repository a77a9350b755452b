// Reading a large JSON file in pieces (internal to the design readers).
//
// simdjson indexes a whole document before any of it is read: four bytes for every bracket,
// comma, colon and value. A reader that builds a design as it goes would keep that index, about
// the size of the file, beside the design it builds. Instead, one pass over the text (the
// outline) finds the arrays and objects of at least a piece's size and the commas that cut them
// into runs of members of about that size; each run is then indexed and read on its own, so that
// one piece's index is in memory at a time.
#pragma once

#include <simdjson.h>

#include <cstddef>
#include <cstdint>
#include <memory>
#include <vector>

#include "host/design/json_input.h"

namespace Ndm_JsonChunks {

// Files smaller than this are read whole; pieces are about piece bytes. Tests make both small.
struct Sizes {
    size_t chunked_from = Ndm_JsonInput::kWholeBelow;
    size_t piece = size_t{1} << 20;
};
Sizes& GetSizes();
// Whether the outline classifies text with the processor's widest registers when it has them
// (true); tests turn it off to check that both ways give the same outline.
bool& UseWideBlocks();

// A large array or object of the outline: the offsets of its brackets, where its element starts
// in its parent (after the comma or bracket before it: before the key of an object member), the
// commas that cut it into runs, and the large containers directly inside it, in order.
struct Container {
    size_t open = 0, close = 0, element = 0;
    size_t members = 0;  // how many members or elements it has, for readers that reserve room
    bool object = false;
    std::vector<size_t> cuts;
    std::vector<uint32_t> children;
};

struct Outline {
    std::vector<Container> containers;
    uint32_t root = UINT32_MAX;  // the outermost container, when it is large
};

// Outlines text that is one array or object, with matched brackets, closed strings and nothing
// after it but white space; false for any other text, which is better read whole (the parser then
// tells what is wrong with it). Values smaller than piece bytes are not outlined.
bool MakeOutline(const char* data, size_t size, size_t piece, Outline& out);
// The same for a whole input, whose pages are given back as the pass goes (and can be given back
// again by the pass that reads the pieces).
bool MakeOutline(Ndm_JsonInput::Input& input, size_t piece, Outline& out);

// What a piece reader hands on: the members of the large containers, small ones with their
// values, large ones as they begin and end.
class Visitor {
public:
    virtual ~Visitor() = default;
    // A member of the large container being read (key is unset for an array element), with a
    // value small enough to be read at once. False stops the reading (the visitor has reported).
    virtual bool Member(simdjson::ondemand::raw_json_string key, simdjson::ondemand::value value) = 0;
    // A large member begins, an object or an array of that many members. The visitor either
    // takes it whole (a single Member call follows, with the whole value parsed at once) or in
    // parts (its own members follow, then Leave).
    enum class Take { Parts, Whole };
    virtual bool Enter(simdjson::ondemand::raw_json_string key, bool object, size_t members, Take& take) = 0;
    virtual bool Leave() = 0;
};

// Reads an outlined input piece by piece, the outermost container first.
class Reader {
public:
    explicit Reader(Ndm_JsonInput::Input& input) : input_(input) {}
    // True when every piece was read; false after a syntax error (error(), error_offset()) or a
    // visitor's false (error() is SUCCESS then).
    bool Read(const Outline& outline, Visitor& visitor);
    // Byte offset in the input of the parse position, for messages.
    size_t Offset();
    simdjson::error_code error() const { return error_; }
    size_t error_offset() const { return error_offset_; }

private:
    // Reads the members (or elements) between begin and end, between brackets of their own; with
    // key, each element is handed on as a member of that key.
    bool Run(bool object, size_t begin, size_t end, Visitor& visitor,
             const simdjson::ondemand::raw_json_string* key = nullptr);
    bool Whole(simdjson::ondemand::raw_json_string key, const Container& c, Visitor& visitor);
    bool After(const Container& parent, size_t& cursor, size_t& cut, size_t close);
    bool Fail(simdjson::error_code e, size_t offset);

    Ndm_JsonInput::Input& input_;
    simdjson::ondemand::parser parser_;
    simdjson::ondemand::document doc_;
    bool has_doc_ = false;  // doc_ holds a piece
    std::unique_ptr<char[]> run_;  // the run being read, between brackets, with padding
    size_t run_room_ = 0;
    size_t run_base_ = 0;  // input offset of the run's first byte
    size_t run_size_ = 0;
    size_t end_ = 0;  // input offset where the piece being read ends
    simdjson::error_code error_ = simdjson::SUCCESS;
    size_t error_offset_ = 0;
};

// What ReadLarge did: nothing (read is false: the input is small, or not one outlined object, and
// is to be read whole), or read it in pieces, successfully or not (a syntax error, or a visitor
// that reported and stopped, when error is SUCCESS).
struct LargeRead {
    bool read = false, ok = false;
    simdjson::error_code error = simdjson::SUCCESS;
    size_t error_offset = 0;
};

// Reads an input of at least GetSizes().chunked_from bytes that outlines as one object in pieces.
// While it reads, active points at the piece reader, whose Offset() places the visitor's messages.
LargeRead ReadLarge(Ndm_JsonInput::Input& input, Visitor& visitor, Reader*& active);

}  // namespace Ndm_JsonChunks
