#include <nlohmann/json.hpp>

#include "verify/Report.h"

namespace vantor::analyze {

namespace {

using Json = nlohmann::ordered_json;

Json ToJson(const Finding& finding) {
    Json object;
    object["severity"] = SeverityName(finding.severity);
    object["code"] = finding.code;
    if (!finding.place.path.empty()) {
        object["path"] = finding.place.path;
    }
    if (finding.place.line > 0) {
        object["line"] = finding.place.line;
        if (finding.place.column > 0) {
            object["column"] = finding.place.column;
        }
    }
    object["text"] = finding.text;
    return object;
}

}  // namespace

void WriteJson(const Findings& findings, std::ostream& stream) {
    Json report;
    report["findings"] = Json::array();
    for (const Finding& finding : findings) {
        report["findings"].push_back(ToJson(finding));
    }
    const FindingCounts counts = CountFindings(findings);
    report["summary"]["errors"] = counts.errors;
    report["summary"]["warnings"] = counts.warnings;
    report["summary"]["notes"] = counts.notes;
    stream << report.dump(2, ' ', false, Json::error_handler_t::replace) << '\n';
}

}  // namespace vantor::analyze
