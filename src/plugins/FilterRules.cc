#include "plugins/FilterRules.h"

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

FilterVerdict KeepOut(int priority, const std::string& message) { return {priority, message}; }

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

FilterVerdict JudgeFlags(const FilteredPlugin& plugin, const std::set<std::string>& bootFlags,
                         const std::list<std::string>& blacklist) {
    if (std::find(blacklist.begin(), blacklist.end(), plugin.name) != blacklist.end()) {
        return KeepOut(LOG_INFO, "ignoring plugin '" + plugin.name + "' due to blacklist");
    }
    if (const FlagList common = Common(plugin.disablingFlags, bootFlags); !common.empty()) {
        return KeepOut(LOG_WARNING, "ignoring plugin '" + plugin.name +
                                        "', disabled due to boot flags: " + Enumerate(common));
    }
    if (const FlagList missing = Missing(plugin.requiredFlags, bootFlags); !missing.empty()) {
        return KeepOut(LOG_WARNING,
                       "ignoring plugin '" + plugin.name +
                           "', disabled due to missing required boot flags: " + Enumerate(missing));
    }
    return {};
}

FilterVerdict JudgeRunOnce(const FilteredPlugin& plugin, std::set<std::string>& runOnceRecord) {
    if (!plugin.runOnce) {
        return {};
    }
    const std::string key = plugin.name + plugin.version;
    if (runOnceRecord.count(key) != 0) {
        return KeepOut(LOG_DEBUG, "ignoring plugin '" + plugin.name + "' because version '" +
                                      plugin.version + "' has already been run");
    }
    runOnceRecord.insert(CleanKey(key));
    return {};
}

}  // namespace vantor
