// Input helpers shared by the JSON readers of the design folder (internal to the library).
#pragma once

#include <simdjson.h>

#include <string>
#include <string_view>

namespace Ndm_JsonInput {

// Reads a whole file into a padded buffer; on failure error tells why (from errno).
bool LoadFile(const char* path, simdjson::padded_string& out, std::string& error);

// Text of a JSON string from its raw form. Texts without escapes are views into the input;
// others are decoded into scratch. False for a malformed escape.
bool Text(simdjson::ondemand::raw_json_string raw, std::string& scratch, std::string_view& out);

// Byte offset of the parse position in buf (the end of buf when the parser has finished).
size_t Offset(simdjson::ondemand::document& doc, const simdjson::padded_string& buf);

// Best byte offset for an error found before iteration starts (bad UTF-8, an unclosed
// string); the size of buf when none can be told.
size_t EarlyErrorOffset(simdjson::error_code error, const simdjson::padded_string& buf);

// Short reason for a JSON syntax error, e.g. "unclosed string".
const char* SyntaxReason(simdjson::error_code error);

// True for the errors that mean the input is not well-formed JSON (rather than JSON of an
// unexpected shape).
bool IsSyntaxError(simdjson::error_code error);

}  // namespace Ndm_JsonInput
