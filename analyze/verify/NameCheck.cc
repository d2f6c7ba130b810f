#include "verify/NameCheck.h"

#include <algorithm>
#include <map>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "verify/Wording.h"

namespace vantor::analyze {

namespace {

using Plugins = std::vector<std::size_t>;

// Each debug entry once.
Plugins Distinct(const BootModel& model, const Plugins& plugins) {
    Plugins distinct;
    std::set<std::pair<std::string, int>> entries;
    for (const std::size_t plugin : plugins) {
        const PluginDescription& described = model.plugins[plugin];
        if (described.kind != PluginKind::Debug || described.place.line == 0 ||
            entries.emplace(described.place.path, described.place.line).second) {
            distinct.push_back(plugin);
        }
    }
    return distinct;
}

bool ShareRunOnceKey(const BootModel& model, const Plugins& plugins) {
    std::set<std::string> versions;
    for (const std::size_t plugin : plugins) {
        const PluginDescription& described = model.plugins[plugin];
        if (described.runOnce && !versions.insert(described.pluginVersion).second) {
            return true;
        }
    }
    return false;
}

void Tell(const BootModel& model, const Plugins& plugins, Findings& findings) {
    std::vector<std::string> places;
    for (const std::size_t plugin : plugins) {
        places.push_back(Spelled(model.plugins[plugin].place));
    }
    const PluginDescription& first = model.plugins[plugins.front()];
    const bool runsOne = ShareRunOnceKey(model, plugins);
    findings.push_back({runsOne ? Severity::Error : Severity::Warning, "duplicate-name",
                        first.place,
                        Counted(plugins.size(), "plugin") + " of the name " + Quoted(first) + ": " +
                            Enumerate(places) +
                            (runsOne ? "; of run-once plugins of one name and version the boot "
                                       "runs only the first that the directory lists"
                                     : "")});
}

// A key is a name and a version with nothing between them.
void CheckKeys(const BootModel& model, Findings& findings) {
    std::map<std::string, Plugins> byKey;
    for (std::size_t plugin = 0; plugin < model.plugins.size(); ++plugin) {
        const PluginDescription& described = model.plugins[plugin];
        if (described.runOnce) {
            byKey[described.name + described.pluginVersion].push_back(plugin);
        }
    }
    for (const auto& [key, plugins] : byKey) {
        const PluginDescription& first = model.plugins[plugins.front()];
        const bool severalNames =
            std::any_of(plugins.begin(), plugins.end(), [&, &name = first.name](std::size_t other) {
                return model.plugins[other].name != name;
            });
        if (severalNames) {
            findings.push_back({Severity::Error, "shared-key", first.place,
                                "the run-once plugins " + Enumerate(model, plugins) +
                                    " have one key, \"" + key +
                                    "\", in the record of those that have run: the boot runs only "
                                    "the first that the directory lists"});
        }
    }
}

}  // namespace

void CheckNames(const BootModel& model, Findings& findings) {
    std::map<std::string, Plugins> byName;
    for (std::size_t plugin = 0; plugin < model.plugins.size(); ++plugin) {
        byName[model.plugins[plugin].name].push_back(plugin);
    }
    for (const auto& [name, plugins] : byName) {
        const Plugins distinct = Distinct(model, plugins);
        if (distinct.size() > 1) {
            Tell(model, distinct, findings);
        }
    }
    CheckKeys(model, findings);
}

}  // namespace vantor::analyze
