#include "plugins/InvokeMethod.h"

#include <exception>
#include <iostream>

#include "plugins/Plugin.h"

namespace vantor {

bool InvokeMethod(Plugin& plugin, const std::string& methodName) {
    try {
        if (methodName == "start") {
            plugin.Start();
        } else if (methodName == "apply_host_profile") {
            plugin.ApplyHostProfile();
        }
        return true;
    } catch (const std::exception& exception) {
        std::cerr << "unable to invoke method '" + methodName + "' on plugin '" + plugin.Name() +
                         "': " + exception.what() + "\n";
    } catch (...) {
        std::cerr << "unknown exception whilst attempting to execute method '" + methodName +
                         "' on plugin '" + plugin.Name() + "'\n";
    }
    return false;
}

}  // namespace vantor
