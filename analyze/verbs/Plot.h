#ifndef VANTOR_ANALYZE_VERBS_PLOT_H
#define VANTOR_ANALYZE_VERBS_PLOT_H

#include <CLI/CLI.hpp>

#include "verbs/Invocation.h"

namespace vantor::analyze {

void AddPlot(CLI::App& app, Invocation& invocation);

}  // namespace vantor::analyze

#endif
