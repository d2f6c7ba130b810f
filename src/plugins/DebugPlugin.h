#ifndef VANTOR_PLUGINS_DEBUGPLUGIN_H
#define VANTOR_PLUGINS_DEBUGPLUGIN_H

#include <list>
#include <string>

#include "plugins/Plugin.h"

namespace vantor {

// A shell command injected into the boot at a chosen place of the dependency graph.
class DebugPlugin : public Plugin {
public:
    // Links the plugin to the barriers of these names.
    DebugPlugin(std::string pluginName, const std::list<std::string>& requiredBarriers,
                const std::list<std::string>& providedBarriers, std::string shellCommand);

    // Runs the command through the system's shell and waits for it. Anything but a normal exit with
    // status 0 is noted in syslog (LOG_INFO). Never throws.
    void Start() override;

    bool SupportsHostProfile() const override;

    // Throws NotImplementedException.
    void ApplyHostProfile() override;

private:
    std::string command;
};

}  // namespace vantor

#endif
