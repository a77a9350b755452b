// The case-fallback notice is issued at most once per process; these reach its flag.
#pragma once

// True once the notice has been issued in this process.
bool Ta_LunCaseNoticeIssued();
// Forgets that the notice was issued (for test programs that run many annotators).
void Ta_LunResetCaseNotice();
