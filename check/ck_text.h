// The board check's findings as text for a person and as JSON lines for a program.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "check/ck_finding.h"

class Ck_BoardCheck;

// "FILE:LINE" of a statement ("FILE" for a whole file).
std::string Ck_Where(const Ck_Ref& ref);

// The names joined with ", ", the first few only: "a, b, c and 7 more".
std::string Ck_NameList(const std::vector<std::string>& names, size_t shown = 10);

// One finding per entry, each as "WHERE: SEVERITY: MESSAGE [KIND]" and the statements it is
// about on the lines below, then the summary. design names the design file, the place of the
// findings about the design alone.
void Ck_WriteText(const Ck_BoardCheck& check, const std::string& design, std::string& out);

// Appends the members "kind" and "severity" of a finding's JSON object.
void Ck_AppendKindJson(std::string& out, Ck_Kind kind);

// Appends the names as a JSON array, the first most of them.
void Ck_AppendJsonNames(std::string& out, const std::vector<std::string>& names, size_t most = SIZE_MAX);

// The summary as a JSON object (docs/check.md lists the fields).
void Ck_AppendSummaryJson(const Ck_Summary& summary, std::string& out);

// One JSON object per finding and a last one with the summary (docs/check.md lists the fields).
void Ck_WriteJsonLines(const Ck_BoardCheck& check, const std::string& design, std::string& out);
