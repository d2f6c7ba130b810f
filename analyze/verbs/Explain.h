#ifndef VANTOR_ANALYZE_VERBS_EXPLAIN_H
#define VANTOR_ANALYZE_VERBS_EXPLAIN_H

#include <CLI/CLI.hpp>

#include "verbs/Invocation.h"

namespace vantor::analyze {

void AddExplain(CLI::App& app, Invocation& invocation);

}  // namespace vantor::analyze

#endif
