#include "plugins/PluginFilters.h"

#include <syslog.h>

#include <algorithm>
#include <iterator>
#include <string_view>
#include <vector>

namespace vantor {

namespace {

using FlagList = std::vector<std::string>;

// Each flag followed by one blank.
std::string Enumerate(const FlagList& flags) {
    std::string text;
    for (const std::string& flag : flags) {
        text += flag + " ";
    }
    return text;
}

FlagList Common(const std::set<std::string>& left, const std::set<std::string>& right) {
    FlagList common;
    std::set_intersection(left.begin(), left.end(), right.begin(), right.end(),
                          std::back_inserter(common));
    return common;
}

FlagList Missing(const std::set<std::string>& wanted, const std::set<std::string>& present) {
    FlagList missing;
    std::set_difference(wanted.begin(), wanted.end(), present.begin(), present.end(),
                        std::back_inserter(missing));
    return missing;
}

// Without every character outside of the class [-a-zA-Z0-9._+]. A library of regular expressions
// would be a quarter of what the program's start takes.
std::string CleanKey(std::string key) {
    static constexpr std::string_view kept =
        "-abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789._+";
    const auto isDropped = [](char byte) { return kept.find(byte) == std::string_view::npos; };
    key.erase(std::remove_if(key.begin(), key.end(), isDropped), key.end());
    return key;
}

}  // namespace

bool IsFilteredOut(const Plugin& plugin, const std::set<std::string>& bootFlags,
                   const std::list<std::string>& blacklist) {
    const char* const name = plugin.Name().c_str();
    if (std::find(blacklist.begin(), blacklist.end(), plugin.Name()) != blacklist.end()) {
        syslog(LOG_INFO, "ignoring plugin '%s' due to blacklist", name);
        return true;
    }
    if (const FlagList common = Common(plugin.DisablingFlags(), bootFlags); !common.empty()) {
        syslog(LOG_WARNING, "ignoring plugin '%s', disabled due to boot flags: %s", name,
               Enumerate(common).c_str());
        return true;
    }
    if (const FlagList missing = Missing(plugin.RequiredFlags(), bootFlags); !missing.empty()) {
        syslog(LOG_WARNING, "ignoring plugin '%s', disabled due to missing required boot flags: %s",
               name, Enumerate(missing).c_str());
        return true;
    }
    return false;
}

bool HasAlreadyRun(const Plugin& plugin, std::set<std::string>& runOnceRecord) {
    if (!plugin.RunOnce()) {
        return false;
    }
    const std::string key = plugin.Name() + plugin.PluginVersion();
    if (runOnceRecord.count(key) != 0) {
        syslog(LOG_DEBUG, "ignoring plugin '%s' because version '%s' has already been run",
               plugin.Name().c_str(), plugin.PluginVersion().c_str());
        return true;
    }
    runOnceRecord.insert(CleanKey(key));
    return false;
}

}  // namespace vantor
