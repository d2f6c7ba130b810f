#ifndef VANTOR_ANALYZE_MODEL_FINDING_H
#define VANTOR_ANALYZE_MODEL_FINDING_H

#include <string>
#include <vector>

#include "model/BootModel.h"

namespace vantor::analyze {

enum class Severity { Error, Warning, Note };

// One thing that is wrong, or worth knowing, about a plugin directory.
struct Finding {
    Severity severity = Severity::Error;
    std::string code;  // stable, as the manual page lists it: "cycle", "no-provider", ...
    Place place;
    std::string text;  // what, and who requires it; one line
};

using Findings = std::vector<Finding>;

}  // namespace vantor::analyze

#endif
