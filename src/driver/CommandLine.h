#ifndef VANTOR_DRIVER_COMMANDLINE_H
#define VANTOR_DRIVER_COMMANDLINE_H

#include <list>
#include <optional>
#include <set>
#include <string>

#include "driver/RunConfig.h"

namespace vantor {

// What the command line asks of the driver alone; plugins see only the run configuration.
struct DriverOptions {
    std::list<std::string> selectedPlugins;  // file names; empty: the whole plugin directory
    std::set<std::string> pluginFlags;       // boot flags in force
    std::set<std::string> runOncePlugins;    // keys of run-once plugins that have already run
    std::string pluginDirectory = "/usr/libexec/vantor/plugins";
    bool init = false;  // bring up the log and event daemons, and reload the log at the end
    bool dump = false;  // draw the graph and run nothing
    std::optional<std::string> dumpPath;  // where to; without one the drawing goes nowhere
};

// Parses the command line by getopt_long(3) into `config` and `options`. Returns an exit status
// when the program is to end at once: 0 after --help, 1 after an error, which has been explained on
// standard error; otherwise nothing. Called once, by the main thread, before any other exists.
std::optional<int> ParseCommandLine(int argc, char** argv, RunConfig& config,
                                    DriverOptions& options);

}  // namespace vantor

#endif
