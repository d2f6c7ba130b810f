#ifndef VANTOR_PLUGINS_FILTERRULES_H
#define VANTOR_PLUGINS_FILTERRULES_H

#include <list>
#include <set>
#include <string>

namespace vantor {

// What the filters look at of a plugin.
struct FilteredPlugin {
    const std::string& name;
    const std::string& version;  // the plugin's own
    bool runOnce;
    const std::set<std::string>& requiredFlags;
    const std::set<std::string>& disablingFlags;
};

// Why a plugin is not to run, as it goes to syslog; without a message it is to run.
struct FilterVerdict {
    int priority = 0;  // of syslog(3)
    std::string message;

    bool KeepsOut() const { return !message.empty(); }
};

// Whether the blacklist or the boot flags keep the plugin from running.
FilterVerdict JudgeFlags(const FilteredPlugin& plugin, const std::set<std::string>& bootFlags,
                         const std::list<std::string>& blacklist);

// Whether the plugin is a run-once plugin whose very version is in the record. A run-once plugin
// that is not in the record is added to it.
//
// The record holds the key (name and version, nothing between) without the characters that a boot
// option cannot carry, but is asked for the key as it is: a plugin whose name or version has such
// characters is never taken for one that has run.
FilterVerdict JudgeRunOnce(const FilteredPlugin& plugin, std::set<std::string>& runOnceRecord);

}  // namespace vantor

#endif
