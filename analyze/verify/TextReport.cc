#include <string>

#include "verify/Report.h"
#include "verify/Wording.h"

namespace vantor::analyze {

namespace {

constexpr const char* reset = "\x1b[0m";
constexpr const char* bold = "\x1b[1m";

const char* ColourOf(Severity severity) {
    switch (severity) {
    case Severity::Error:
        return "\x1b[1;31m";
    case Severity::Warning:
        return "\x1b[1;35m";
    case Severity::Note:
        break;
    }
    return "\x1b[1;36m";
}

}  // namespace

void WriteText(const Findings& findings, std::ostream& stream, bool colour) {
    for (const Finding& finding : findings) {
        if (const std::string place = Spelled(finding.place); !place.empty()) {
            stream << (colour ? bold : "") << OnOneLine(place) << ':' << (colour ? reset : "")
                   << ' ';
        }
        stream << (colour ? ColourOf(finding.severity) : "") << SeverityName(finding.severity)
               << '[' << finding.code << "]:" << (colour ? reset : "") << ' '
               << OnOneLine(finding.text) << '\n';
    }
}

}  // namespace vantor::analyze
