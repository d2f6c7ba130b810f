#ifndef VANTOR_PLUGINS_INVOKEMETHOD_H
#define VANTOR_PLUGINS_INVOKEMETHOD_H

#include <string>

namespace vantor {

class Plugin;

// Runs one method of a plugin by name: "start" or "apply_host_profile". Any other name does nothing
// and succeeds. What the method throws is explained on standard error and makes the result false.
// Called without GlobalLock.
bool InvokeMethod(Plugin& plugin, const std::string& methodName);

}  // namespace vantor

#endif
