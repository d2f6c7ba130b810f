#ifndef VANTOR_ANALYZE_VERBS_BLAME_H
#define VANTOR_ANALYZE_VERBS_BLAME_H

#include <CLI/CLI.hpp>

#include "verbs/Invocation.h"

namespace vantor::analyze {

// `blame`: a table of what each plugin waited for, how long it ran, and what it cost the boot.
void AddBlame(CLI::App& app, Invocation& invocation);

}  // namespace vantor::analyze

#endif
