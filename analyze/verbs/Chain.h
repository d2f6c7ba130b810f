#ifndef VANTOR_ANALYZE_VERBS_CHAIN_H
#define VANTOR_ANALYZE_VERBS_CHAIN_H

#include <CLI/CLI.hpp>

#include "verbs/Invocation.h"

namespace vantor::analyze {

// `chain`: the plugins that decided when the boot ended, each with what released it.
void AddChain(CLI::App& app, Invocation& invocation);

}  // namespace vantor::analyze

#endif
