#ifndef VANTOR_ANALYZE_VERIFY_REQUIREMENTCHECK_H
#define VANTOR_ANALYZE_VERIFY_REQUIREMENTCHECK_H

#include "model/BootModel.h"
#include "model/Finding.h"

namespace vantor::analyze {

// What makes no difference to any boot; notes.
// "unused-barrier": provided, and required by nobody.
// "implied-requirement": a requirement that another one of the plugin implies, or repeats.
void CheckRequirements(const BootModel& model, Findings& findings);

}  // namespace vantor::analyze

#endif
