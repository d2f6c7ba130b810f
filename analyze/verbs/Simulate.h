#ifndef VANTOR_ANALYZE_VERBS_SIMULATE_H
#define VANTOR_ANALYZE_VERBS_SIMULATE_H

#include <CLI/CLI.hpp>

#include "verbs/Invocation.h"

namespace vantor::analyze {

// `simulate`: how long the boot would take with other workers, runs or edges.
void AddSimulate(CLI::App& app, Invocation& invocation);

}  // namespace vantor::analyze

#endif
