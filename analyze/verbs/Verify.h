#ifndef VANTOR_ANALYZE_VERBS_VERIFY_H
#define VANTOR_ANALYZE_VERBS_VERIFY_H

#include <CLI/CLI.hpp>

#include "verbs/Invocation.h"

namespace vantor::analyze {

void AddVerify(CLI::App& app, Invocation& invocation);

}  // namespace vantor::analyze

#endif
