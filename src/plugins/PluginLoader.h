#ifndef VANTOR_PLUGINS_PLUGINLOADER_H
#define VANTOR_PLUGINS_PLUGINLOADER_H

#include <list>
#include <set>
#include <string>

#include "driver/RunConfig.h"
#include "plugins/Plugin.h"

namespace vantor {

// Turns one file of the plugin directory into a plugin, of the kind that the file name's extension
// tells, and appends it to `plugins` unless a filter keeps it out. The plugin's name is the file
// name without its extension and a leading "lib".
//
//   <name>.so     a native plugin
//   <name>.json   a JSON plugin
//   <name>.debug  one debug plugin for each entry of that name in the debug configuration, which
//                 is read afresh for every file; these pass no filter
//
// A plugin that a filter keeps out has been constructed all the same: it stays in the graph, marked
// done, so that its barriers count as provided. A run-once plugin that has already run is marked
// done and queued. `runOnceRecord` gains the keys of the run-once plugins that will run. A file
// that cannot be used is skipped; what is wrong with it goes to syslog and becomes a system alert.
//
// Called by one thread before any worker exists. Of `config` only `pluginDirectory` is read.
void LoadPlugin(const std::string& fileName, PluginQueue& plugins,
                const std::set<std::string>& bootFlags, const std::list<std::string>& blacklist,
                std::set<std::string>& runOnceRecord, const RunConfig& config);

}  // namespace vantor

#endif
