#ifndef VANTOR_ANALYZE_VERBS_GRAPH_H
#define VANTOR_ANALYZE_VERBS_GRAPH_H

#include <CLI/CLI.hpp>

#include "verbs/Invocation.h"

namespace vantor::analyze {

void AddGraph(CLI::App& app, Invocation& invocation);

}  // namespace vantor::analyze

#endif
