#ifndef VANTOR_PLUGINS_PLUGINFILTERS_H
#define VANTOR_PLUGINS_PLUGINFILTERS_H

#include <list>
#include <set>
#include <string>

#include "plugins/Plugin.h"

namespace vantor {

// Whether the blacklist or the boot flags keep the plugin from running; if so, says why in syslog.
bool IsFilteredOut(const Plugin& plugin, const std::set<std::string>& bootFlags,
                   const std::list<std::string>& blacklist);

// Whether the plugin is a run-once plugin whose very version is in the record; if so, says it in
// syslog. A run-once plugin that is not in the record is added to it (plugins/FilterRules.h).
bool HasAlreadyRun(const Plugin& plugin, std::set<std::string>& runOnceRecord);

}  // namespace vantor

#endif
