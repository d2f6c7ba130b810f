#ifndef VANTOR_ANALYZE_VERIFY_PROVIDERCHECK_H
#define VANTOR_ANALYZE_VERIFY_PROVIDERCHECK_H

#include "model/BootModel.h"
#include "model/Finding.h"

namespace vantor::analyze {

// Barriers that somebody requires and nobody brings about.
// "no-provider" (error): no plugin provides it; the boot raises an alert and does not wait. Names a
// barrier that may have been meant. A note where none of its requirers runs.
// "filtered-provider" (warning): every provider is filtered out, and its requirers run regardless.
void CheckProviders(const BootModel& model, Findings& findings);

}  // namespace vantor::analyze

#endif
