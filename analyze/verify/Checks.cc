#include "verify/Checks.h"

#include "verify/CycleCheck.h"
#include "verify/NameCheck.h"
#include "verify/ProviderCheck.h"
#include "verify/RequirementCheck.h"

namespace vantor::analyze {

void CheckGraph(const BootModel& model, Findings& findings) {
    CheckCycles(model, findings);
    CheckProviders(model, findings);
    CheckNames(model, findings);
    CheckRequirements(model, findings);
}

}  // namespace vantor::analyze
