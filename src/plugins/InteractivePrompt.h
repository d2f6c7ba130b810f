#ifndef VANTOR_PLUGINS_INTERACTIVEPROMPT_H
#define VANTOR_PLUGINS_INTERACTIVEPROMPT_H

#include <string>

namespace vantor {

// What interactive mode does before a plugin runs: nothing until every plugin of the run
// configuration's `interactiveModeRequires` has run, and from then on the prompt on standard input
// and output, with its answer carried out (a troubleshooting shell ended, interactive mode left).
// Returns false when the operator skips the plugin. Changes `interactive` and
// `interactiveModeRequires` of the run configuration, without a lock: interactive runs have a
// single worker.
bool PassInteractiveGate(const std::string& pluginName);

}  // namespace vantor

#endif
