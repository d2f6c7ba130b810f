#ifndef VANTOR_SUPPORT_RUNCONFIGRESET_H
#define VANTOR_SUPPORT_RUNCONFIGRESET_H

#include <cstdint>

#include "driver/RunConfig.h"

namespace vantor::support {

// Gives the process's run configuration its initial values again and returns it. For the fixture of
// every test that changes the configuration: it outlives the test.
inline RunConfig& ResetRunConfig() {
    RunConfig& config = RunConfig::Instance();
    static const std::int32_t initialSeed = config.seed;
    config.verbose = false;
    config.parallel = false;
    config.randomize = false;
    config.interactive = false;
    config.trace = false;
    config.threads = 8;
    config.seed = initialSeed;
    config.pluginDirectory.clear();
    config.disabledPlugins.clear();
    config.interactiveModeRequires.clear();
    config.method.clear();
    config.invoke = false;
    return config;
}

}  // namespace vantor::support

#endif
