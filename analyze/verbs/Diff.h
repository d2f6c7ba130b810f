#ifndef VANTOR_ANALYZE_VERBS_DIFF_H
#define VANTOR_ANALYZE_VERBS_DIFF_H

#include <CLI/CLI.hpp>

#include "verbs/Invocation.h"

namespace vantor::analyze {

// `diff`: what is slower, faster, new or gone between two sets of boots; a gate for their length.
void AddDiff(CLI::App& app, Invocation& invocation);

}  // namespace vantor::analyze

#endif
