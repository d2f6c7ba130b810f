#include "plugins/PluginFilters.h"

#include <syslog.h>

#include "plugins/FilterRules.h"

namespace vantor {

namespace {

FilteredPlugin Facts(const Plugin& plugin) {
    return {plugin.Name(), plugin.PluginVersion(), plugin.RunOnce(), plugin.RequiredFlags(),
            plugin.DisablingFlags()};
}

bool Say(const FilterVerdict& verdict) {
    if (verdict.KeepsOut()) {
        syslog(verdict.priority, "%s", verdict.message.c_str());
    }
    return verdict.KeepsOut();
}

}  // namespace

bool IsFilteredOut(const Plugin& plugin, const std::set<std::string>& bootFlags,
                   const std::list<std::string>& blacklist) {
    return Say(JudgeFlags(Facts(plugin), bootFlags, blacklist));
}

bool HasAlreadyRun(const Plugin& plugin, std::set<std::string>& runOnceRecord) {
    return Say(JudgeRunOnce(Facts(plugin), runOnceRecord));
}

}  // namespace vantor
