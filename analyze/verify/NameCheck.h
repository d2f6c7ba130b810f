#ifndef VANTOR_ANALYZE_VERIFY_NAMECHECK_H
#define VANTOR_ANALYZE_VERIFY_NAMECHECK_H

#include "model/BootModel.h"
#include "model/Finding.h"

namespace vantor::analyze {

// "duplicate-name": plugins that share a name. A boot runs each, but no list, message or log tells
// them apart: a warning. Of run-once plugins that share their version too it runs whichever the
// directory lists first, and takes the others for run already: an error.
// One entry that is read twice is no second plugin. "shared-key": run-once plugins of several names
// whose keys are the same, as those of "a" of version "b1" and "ab" of version "1": an error.
void CheckNames(const BootModel& model, Findings& findings);

}  // namespace vantor::analyze

#endif
