// JSON string literals for the files and message lines we write.
#pragma once

#include <string>
#include <string_view>

// Appends text as a JSON string literal (quotes included): ", \ and control bytes escaped,
// every other byte copied as it is.
void Port_AppendJsonString(std::string& out, std::string_view text);
