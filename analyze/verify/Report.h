#ifndef VANTOR_ANALYZE_VERIFY_REPORT_H
#define VANTOR_ANALYZE_VERIFY_REPORT_H

#include <cstddef>
#include <ostream>

#include "model/Finding.h"

namespace vantor::analyze {

// How many findings there are of each severity.
struct FindingCounts {
    std::size_t errors = 0;
    std::size_t warnings = 0;
    std::size_t notes = 0;
};

FindingCounts CountFindings(const Findings& findings);

// Sorts findings by path, line, column, code and text, and takes out those that say the same, so
// that the order in which they were found does not matter.
void SortFindings(Findings& findings);

// Makes every warning an error.
void MakeStrict(Findings& findings);

// "error", "warning" or "note".
const char* SeverityName(Severity severity);

// The three forms of a report. All write the findings in the order they have.
// Text: a line each, "PATH:LINE:COLUMN: error[CODE]: what"; parts that are not known are left out,
// and bytes that would break the line or upset a terminal are written as "\xNN".
void WriteText(const Findings& findings, std::ostream& stream, bool colour);
// An object with "findings" and their "summary"; bytes that are no UTF-8 become U+FFFD.
void WriteJson(const Findings& findings, std::ostream& stream);
// SARIF 2.1.0, as code scanning services read it. `version` is the program's.
void WriteSarif(const Findings& findings, std::ostream& stream, const char* version);

}  // namespace vantor::analyze

#endif
