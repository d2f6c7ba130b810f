#ifndef VANTOR_ANALYZE_VERBS_TRACE_H
#define VANTOR_ANALYZE_VERBS_TRACE_H

#include <CLI/CLI.hpp>

#include "verbs/Invocation.h"

namespace vantor::analyze {

// `trace`: the boot as a file that Perfetto opens.
void AddTrace(CLI::App& app, Invocation& invocation);

}  // namespace vantor::analyze

#endif
