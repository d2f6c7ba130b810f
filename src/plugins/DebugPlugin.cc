#include "plugins/DebugPlugin.h"

#include <sys/wait.h>
#include <syslog.h>

#include <cstdlib>
#include <utility>

#include "plugins/Exceptions.h"

namespace vantor {

DebugPlugin::DebugPlugin(std::string pluginName, const std::list<std::string>& requiredBarriers,
                         const std::list<std::string>& providedBarriers, std::string shellCommand)
    : Plugin(std::move(pluginName)), command(std::move(shellCommand)) {
    apiVersion = 1;
    Require(requiredBarriers);
    Provide(providedBarriers);
}

void DebugPlugin::Start() {
    const int status = std::system(command.c_str());
    if (!WIFEXITED(status) || WEXITSTATUS(status) != 0) {
        syslog(LOG_INFO, "debug injection '%s' returned %#08x", Name().c_str(),
               static_cast<unsigned>(status));
    }
}

bool DebugPlugin::SupportsHostProfile() const { return false; }

void DebugPlugin::ApplyHostProfile() {
    throw NotImplementedException("DebugPlugin::ApplyHostProfile");
}

}  // namespace vantor
