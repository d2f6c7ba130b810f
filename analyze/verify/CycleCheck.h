#ifndef VANTOR_ANALYZE_VERIFY_CYCLECHECK_H
#define VANTOR_ANALYZE_VERIFY_CYCLECHECK_H

#include "model/BootModel.h"
#include "model/Finding.h"

namespace vantor::analyze {

// "cycle" (error): plugins that wait for each other, so that the boot never ends; one shortest
// cycle for each group of them. "open-cycle" (note): one that this boot does not hang on, because a
// plugin of it is filtered out or has already run.
void CheckCycles(const BootModel& model, Findings& findings);

}  // namespace vantor::analyze

#endif
