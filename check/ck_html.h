// The board check as one self-contained HTML page: the findings at the top, and every statement
// of every file with its line, what it resolved to and its findings. The page holds its data
// as JSON and builds the rows a reader looks at, so that files of tens of thousands of
// statements stay quick to open. docs/check.md describes the page.
#pragma once

#include <string>

class Ck_BoardCheck;

// The page's content; design names the design file.
std::string Ck_HtmlReport(const Ck_BoardCheck& check, const std::string& design);

// Writes the page to path through Port::AtomicFile; false with the reason in error.
bool Ck_WriteHtmlReport(const Ck_BoardCheck& check, const std::string& design, const std::string& path,
                        std::string& error);
