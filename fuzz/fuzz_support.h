// What the fuzz entries share: a scratch folder of the process, the fixed design, and the
// outcome check. Every entry is an ordinary function, LunFuzz<Name>(data, size), so that the
// fuzzers and the replay test run the same code.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <string_view>

#include "host/design/ndm.h"

class Port_MsgCapture;

int LunFuzzAnnotate(const uint8_t* data, size_t size);
int LunFuzzYosys(const uint8_t* data, size_t size);
int LunFuzzNative(const uint8_t* data, size_t size);
int LunFuzzFilter(const uint8_t* data, size_t size);
int LunFuzzRepository(const uint8_t* data, size_t size);
int LunFuzzExtract(const uint8_t* data, size_t size);

namespace lun_fuzz {

// Path of name inside a folder of this process (made on first use, removed at exit).
std::string Path(const char* name);
// Writes the bytes to the file (replacing it) and returns its path.
std::string Write(const char* name, std::string_view bytes);
// The file's bytes; empty when it cannot be read.
std::string ReadAll(const std::string& path);
// A fresh copy of the example design (examples/blinky).
std::unique_ptr<Ndm_Design> Blinky();
// A round trip that must hold failed: reports it and aborts (a finding).
[[noreturn]] void Fail(const char* what, const std::string& detail);
// The same for a file that did not read back: the last message captured says why.
[[noreturn]] void FailReading(const char* what, const Port_MsgCapture& messages, const std::string& path);
// Runs read twice, on the input at path, whose bytes are data: as such and with the file read in pieces of a few
// bytes (every array and object then a large one, cut at every few commas). On valid JSON the
// two readings must agree: both refuse the input, or both take it and give the same design (the
// same native file). The parser checks malformed JSON only as far as it reads it, so there each
// reading may decide alone. Returns the first reading's design.
std::unique_ptr<Ndm_Design> ReadBothWays(const uint8_t* data, size_t size, const std::string& path,
                                         const std::function<std::unique_ptr<Ndm_Design>()>& read);

}  // namespace lun_fuzz
