// Input helpers shared by the JSON readers of the design folder (internal to the library).
#pragma once

#include <simdjson.h>

#include <string>
#include <string_view>

#include "host/port/msgman.h"

namespace Ndm_JsonInput {

// Files smaller than this are parsed whole (their pages read in at once when they are mapped);
// larger ones are read in pieces (json_chunks.h), their pages coming in as they are reached.
constexpr size_t kWholeBelow = size_t{32} << 20;

// The message object of the design readers and writers (module "netlist").
inline const Port_MsgManData& Msg() {
    static const Port_MsgManData msg = Port_MsgManData::createObject("Quillmap", "netlist", __LINE__, "1.0");
    return msg;
}

// A whole input file with the padding the parser needs after its end. Large files are mapped
// (no copy, pages read in bulk); small ones are read into a padded buffer.
class Input {
public:
    Input() = default;
    ~Input() { Release(); }
    Input(const Input&) = delete;
    Input& operator=(const Input&) = delete;
    // Opens path; on failure error tells why (from errno).
    bool Open(const char* path, std::string& error);
    void Release();
    // Gives the pages of a mapped file before offset back to the system, a few megabytes at a
    // time: a reader that builds as it goes no longer needs what it has passed (and would read
    // it from the file again if it looked back), so the whole file is never resident at once.
    void DropBefore(size_t offset);
    // Starts giving pages back from the start again, for a second pass over the file.
    void Rewind();
    const char* data() const { return data_; }
    size_t size() const { return size_; }
    simdjson::padded_string_view view() const {
        return simdjson::padded_string_view(data_, size_, size_ + simdjson::SIMDJSON_PADDING);
    }

private:
    simdjson::padded_string copy_;
    void* map_ = nullptr;
    size_t map_size_ = 0;
    size_t dropped_ = 0;  // bytes of the mapped file given back
    const char* data_ = "";
    size_t size_ = 0;
};

// Starts iterating the whole input. Builds with simdjson's development checks (unoptimized
// builds) follow every nesting level up to the parser's depth, 1024 unless told otherwise, and
// stop at a deeper one: there the parser is first given the input's own depth, so that deep
// design files read in every build. Other builds follow no depth and skip that pass.
simdjson::error_code Iterate(simdjson::ondemand::parser& parser, const Input& input,
                             simdjson::ondemand::document& doc);
// The same for size bytes at data, with capacity bytes readable there (size plus padding).
simdjson::error_code Iterate(simdjson::ondemand::parser& parser, const char* data, size_t size, size_t capacity,
                             simdjson::ondemand::document& doc);

// Text of a JSON string from its raw form. Texts without escapes are views into the input;
// others are decoded into scratch. With bytes set, code points U+F780..U+F7FF, escaped or
// literal, are the bytes 0x80..0xFF they stand for (host/port/json_text.h). False for a
// malformed escape.
bool Text(simdjson::ondemand::raw_json_string raw, std::string& scratch, std::string_view& out,
          bool bytes = false);

// Byte offset of the parse position in the input (its size when the parser has finished).
size_t Offset(simdjson::ondemand::document& doc, const Input& input);

// Best byte offset for an error found before iteration starts (bad UTF-8, an unclosed
// string); the input size when none can be told.
size_t EarlyErrorOffset(simdjson::error_code error, const Input& input);
size_t EarlyErrorOffset(simdjson::error_code error, const char* data, size_t size);

// Short reason for a JSON syntax error, e.g. "unclosed string".
const char* SyntaxReason(simdjson::error_code error);

// True for the errors that mean the input is not well-formed JSON (rather than JSON of an
// unexpected shape).
bool IsSyntaxError(simdjson::error_code error);

}  // namespace Ndm_JsonInput
