#ifndef VANTOR_ANALYZE_VERIFY_CHECKS_H
#define VANTOR_ANALYZE_VERIFY_CHECKS_H

#include "model/BootModel.h"
#include "model/Finding.h"

namespace vantor::analyze {

// Adds to `findings` whatever the checks of this folder find in the graph of a boot. Takes time
// linear in plugins and edges, but for the searches whose limits are told in model/Cycles.h,
// model/ImpliedRequirements.h and model/NearestName.h. The model's barriers are linked.
void CheckGraph(const BootModel& model, Findings& findings);

}  // namespace vantor::analyze

#endif
