#ifndef VANTOR_DRIVER_RUNCONFIG_H
#define VANTOR_DRIVER_RUNCONFIG_H

#include <boost/filesystem/path.hpp>

#include <cstdint>
#include <list>
#include <string>

namespace vantor {

// The configuration of this run, one for the process. The driver fills it from the command line
// before any plugin runs; from then on it is read without a lock. Only interactive mode changes it
// later (`interactive`, `interactiveModeRequires`), and that mode has a single worker.
class RunConfig {
public:
    // The one instance, created by the first caller and never freed. Takes GlobalLock.
    static RunConfig& Instance();

    RunConfig(const RunConfig&) = delete;
    RunConfig& operator=(const RunConfig&) = delete;

    bool verbose = false;
    bool parallel = false;     // never together with `interactive`
    bool randomize = false;    // draw among equally high ready nodes
    bool interactive = false;  // prompt before each plugin
    bool trace = false;        // report each plugin on standard output
    std::int32_t threads = 8;  // workers; 1 once a command line without --parallel is parsed
    std::int32_t seed;         // reported, not used; seconds since the epoch unless given
    boost::filesystem::path pluginDirectory;         // absolute once the driver has started
    std::list<std::string> disabledPlugins;          // plugin names
    std::list<std::string> interactiveModeRequires;  // plugins to run before the first prompt
    std::string method;   // method to run in place of the usual one; empty: the usual one
    bool invoke = false;  // run `method` of the selected plugins and nothing else

private:
    RunConfig();
};

}  // namespace vantor

#endif
