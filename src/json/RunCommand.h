#ifndef VANTOR_JSON_RUNCOMMAND_H
#define VANTOR_JSON_RUNCOMMAND_H

#include <string>

namespace vantor {

// Runs one command line of the host's management tool, without the tool's own name, through the
// command framework. `operation` and `pluginName` say in the log for whom. A line that does not
// parse, and a command that fails, are logged, one message an error (LOG_ERR); a line that holds
// nothing to execute is passed over. Throws what the framework throws. May run on several threads
// at once: all they share is the dispatcher.
void RunCommand(const std::string& command, const std::string& operation,
                const std::string& pluginName);

}  // namespace vantor

#endif
