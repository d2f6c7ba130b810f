#ifndef VANTOR_DRIVER_MAINDRIVER_H
#define VANTOR_DRIVER_MAINDRIVER_H

#include <sys/time.h>

#include <cstdint>
#include <exception>

#include "driver/CommandLine.h"
#include "driver/RunConfig.h"
#include "plugins/Plugin.h"

namespace vantor {

// One run of the program, from the parsed command line to the exit status: brings up the init-mode
// services, gathers the plugins, draws or runs their graph and leaves the reports behind. Used
// once, by the main thread; the workers live only within Work().
class MainDriver {
public:
    // Takes the start time and parses the command line.
    MainDriver(int argc, char** argv);

    // Returns the program's exit status: 0 when the plugin work was completed, whatever became of
    // the single plugins.
    int Run();

private:
    void DetachFromCaller() const;
    void Work();
    void LoadPlugins();
    void LoadDirectory();
    void LoadFile(const std::string& fileName);
    bool DumpGraph() const;
    void RunGraph();
    void ExplainFailure(const std::exception& exception) const;

    RunConfig& config;
    DriverOptions options;
    std::optional<int> earlyExit;     // set when the command line ends the program
    timeval startTime{};              // wall clock, before the command line is parsed
    std::uint64_t uptimeSeconds = 0;  // of the kernel, at the same moment
    std::set<std::string> bootFlags;  // the loader's copy of the plugin flags
    PluginQueue plugins;              // in load order, filled by the loader
    PluginQueue nodes;                // what is run, drawn and reported, once loading is complete
    bool succeeded = false;
};

}  // namespace vantor

#endif
