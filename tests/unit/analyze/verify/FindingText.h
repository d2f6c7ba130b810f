#ifndef VANTOR_ANALYZE_FINDINGTEXT_H
#define VANTOR_ANALYZE_FINDINGTEXT_H

#include <sstream>
#include <string>
#include <vector>

#include "verify/Report.h"

namespace vantor::analyze {

// What a check finds in a model: the lines of a report, in its order.
inline std::vector<std::string> LinesOf(void (*check)(const BootModel&, Findings&),
                                        const BootModel& model) {
    Findings findings;
    check(model, findings);
    SortFindings(findings);
    std::stringstream text;
    WriteText(findings, text, false);
    std::vector<std::string> lines;
    for (std::string line; std::getline(text, line);) {
        lines.push_back(line);
    }
    return lines;
}

using Lines = std::vector<std::string>;

}  // namespace vantor::analyze

#endif
