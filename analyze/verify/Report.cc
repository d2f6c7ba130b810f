#include "verify/Report.h"

#include <algorithm>
#include <tuple>

namespace vantor::analyze {

namespace {

auto Key(const Finding& finding) {
    return std::tie(finding.place.path, finding.place.line, finding.place.column, finding.code,
                    finding.text, finding.severity);
}

}  // namespace

FindingCounts CountFindings(const Findings& findings) {
    FindingCounts counts;
    for (const Finding& finding : findings) {
        switch (finding.severity) {
        case Severity::Error:
            ++counts.errors;
            break;
        case Severity::Warning:
            ++counts.warnings;
            break;
        case Severity::Note:
            ++counts.notes;
            break;
        }
    }
    return counts;
}

void SortFindings(Findings& findings) {
    std::sort(findings.begin(), findings.end(),
              [](const Finding& one, const Finding& other) { return Key(one) < Key(other); });
    const auto last =
        std::unique(findings.begin(), findings.end(), [](const Finding& one, const Finding& other) {
            return Key(one) == Key(other);
        });
    findings.erase(last, findings.end());
}

void MakeStrict(Findings& findings) {
    for (Finding& finding : findings) {
        if (finding.severity == Severity::Warning) {
            finding.severity = Severity::Error;
        }
    }
}

const char* SeverityName(Severity severity) {
    switch (severity) {
    case Severity::Error:
        return "error";
    case Severity::Warning:
        return "warning";
    case Severity::Note:
        break;
    }
    return "note";
}

}  // namespace vantor::analyze
